// The Sametime plug-in's files for Sametime 7, Sametime 8 and the Sametime
// embedded in Notes 8 and later, and the Eclipse configuration stamp.
#pragma once

#include <windows.h>

bool CopySametimePluginFiles(const wchar_t* sametimeFolder, const wchar_t* installFolder);
bool CopySametime8PluginFiles(const wchar_t* sametimeFolder, const wchar_t* installFolder);
bool CopyEmbeddedST8PluginFiles(const wchar_t* notesFolder, const wchar_t* installFolder);
bool CopyEmbeddedST8FilesForMultiUser(const wchar_t* installFolder);
bool RemoveSametimePluginFiles(const wchar_t* sametimeFolder);
bool RemoveSametime8PluginFiles(const wchar_t* sametimeFolder);
bool RemoveEmbeddedST8PluginFiles(const wchar_t* notesFolder);
bool RemoveSametimePluginFilesAfterPCReboot();
void DeleteSametimeStampFile();
