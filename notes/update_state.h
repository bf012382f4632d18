// Process-wide state of the temporary update copy: its folders, the two
// programs it runs and how the protocol with the updater has gone so far.
// Created on first use, on the main thread only.
#pragma once

#include <windows.h>

#include "base/win_handles.h"

struct UpdateState {
    // The running module's folder (the plug-in folder) and the Notes program
    // folder, both known once the hidden window exists.
    wchar_t moduleFolder[MAX_PATH] = {};
    wchar_t notesFolder[MAX_PATH] = {};
    // "~TmpDown.exe" while it runs, and the configuration tool after it
    // succeeded; the final step waits for both.
    UniqueHandle download;
    UniqueHandle config;
    // Set when the updater reported its download finished.
    bool downloadFinished = false;
    // Set when the quit message was posted: its code is the result, and
    // nothing that arrives later may change it.
    bool quitPosted = false;
};

inline UpdateState& CurrentUpdateState() {
    static UpdateState state;
    return state;
}

// 1 when the configuration tool ended with exit code 0 and the update was
// committed, else 0.
inline int g_bUpdateSuccess = 0;
