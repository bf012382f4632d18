// Where the suite's shortcuts live and what they point at: the suite's root
// folder, msiexec.exe, the Start-menu folder, and the shell folders of the
// user of the active session.
#pragma once

#include <windows.h>

#include "base/string_ex.h"
#include "base/win_handles.h"

// The suite's root folder; false when there is none or it is relative (a
// relative folder would name whatever the working folder holds).
bool GetShortcutRoot(CStringEx& root);

// msiexec.exe of the 32-bit system folder: the WOW64 system folder, or the
// system folder where there is none. False, logged, when neither is found.
bool GetMsiexecPath(CStringEx& path);

// The Start-menu folder name of the installed shortcuts: the companion
// application's installed name, else its product name.
CStringEx InstalledFolderName();

// special\name, when name is plain, the result fits a path and nothing below
// special on the way to it is a reparse point.
bool SuiteFolderIn(const CStringEx& special, const CStringEx& name, CStringEx& folder);

// The special folders (CSIDL) as the shell gives them to the user of the
// active session, or to the calling account when there is no such user.
// The session user's token is held for the object's lifetime.
class ActiveUserFolders {
public:
    ActiveUserFolders();
    bool Get(int csidl, CStringEx& path) const;

private:
    UniqueHandle m_token;
};

// Asks the shell to refresh after the shortcuts changed.
void NotifyShellOfShortcuts();

// The folder that a 32-bit process running as the system account reaches
// through profilePath (one of its own shell folders): the WOW64 system
// folder, a backslash, and profilePath from "config" on. False when
// profilePath holds no "config".
bool Wow64ProfileFolder(const wchar_t* wow64Dir, const CStringEx& profilePath, CStringEx& folder);
