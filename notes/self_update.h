// The Notes plug-in's self-update from temporary copies.
#pragma once

#include <windows.h>

// Process-wide update-mode flag: 1 in the temporary copy ("~MrvONI.exe").
int GetUpdateModeFlag();
void SetUpdateModeFlag(int flag);

// True when the running module's file name is "~MrvONI.exe" (any case).
bool IsTemporaryUpdateCopy();
// Copies the updater and this program from the Notes folder to their
// temporary names in the plug-in folder and starts the temporary copy hidden
// with "-nupdate"; 0 when started, -1 (logged) when it could not be.
int LaunchTemporaryUpdateCopy();
// The hidden window of the temporary copy, which starts the updater; null when
// the window or the updater cannot be created.
HWND CreateUpdateWindow(HINSTANCE instance, int showCommand);
// After the message loop: waits up to 30 s for each program the copy started
// (ending it after that) and starts the installed program hidden with
// "-nendupdate" after a committed update, else "-nendupdatefail".
void FinishUpdate();
// Deletes "~TmpDown.exe" and "~MrvONI.exe" from the plug-in folder.
void DeleteTemporaryUpdateCopies();
