// The Notes plug-in's self-update from temporary copies.
#pragma once

#include <windows.h>

// Process-wide update-mode flag: 1 in the temporary copy ("~MrvONI.exe").
int GetUpdateModeFlag();
void SetUpdateModeFlag(int flag);

// True when the running module's file name is "~MrvONI.exe" (any case).
bool IsTemporaryUpdateCopy();
// Copies the updater and this program to their temporary names and starts the
// temporary copy with "-nupdate"; 0 when started, -1 when the start failed.
int LaunchTemporaryUpdateCopy();
// The hidden window of the temporary copy; null when it cannot be created.
HWND CreateUpdateWindow(HINSTANCE instance, int showCommand);
// After the message loop: waits for the children and starts the installed
// program with "-nendupdate" or "-nendupdatefail".
void FinishUpdate();
// Deletes "~TmpDown.exe" and "~MrvONI.exe" from the plug-in folder.
void DeleteTemporaryUpdateCopies();
