// Starts a program of the self-update through the shell.
#pragma once

#include <windows.h>

#include "base/win_handles.h"

// Starts exePath (by its short 8.3 path when it has one) with parameters in
// workingFolder (null: the caller's), shown as showCommand, and hands back its
// process handle. A failed start never opens the shell's error box: nobody may
// be at the screen to close it. False when the program could not be started.
bool StartUpdateProcess(const wchar_t* exePath, const wchar_t* parameters,
                        const wchar_t* workingFolder, int showCommand, UniqueHandle* process);
