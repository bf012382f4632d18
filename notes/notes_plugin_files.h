// The Notes plug-in's files in the Notes program folder: copying them in with
// backups of locked files, completing, and removing them.
#pragma once

#include <windows.h>

// Copies source to target; a target that cannot be overwritten (a loaded
// library) is renamed aside to a time-stamped backup first, which is deleted
// at the next restart. True when the target now holds the source's content.
bool CopyFileWithBackup(const wchar_t* source, const wchar_t* target, BOOL failIfExists);
// True when the file exists and can be opened for reading and writing.
bool IsFileAllowRW(const wchar_t* path);
bool CopyNotesPluginFiles(const wchar_t* notesFolder, const wchar_t* installFolder);
bool CopyPluginRemainedFiles(const wchar_t* notesFolder, const wchar_t* pluginFolder);
bool RemoveNotesPluginFiles(const wchar_t* notesFolder);
bool RemoveOldNotesPluginFiles(const wchar_t* notesFolder);
bool DeleteInstallFolder(const wchar_t* folder);
// Deletes the files (not folders) matching pattern in folder.
bool RemoveFilesSpecPostfix(const wchar_t* folder, const wchar_t* pattern);
