// Work on the shortcuts of one folder, chosen by what they point at: delete,
// give a new icon, rename, move. A shortcut matches a rule when its target
// equals the rule's target (both in short form, without regard to case)
// and, when the rule names arguments, its arguments equal them (without
// regard to case). A file that cannot be read as a shortcut never matches.
#pragma once

#include <windows.h>

#include <stddef.h>

#include "base/string_ex.h"

// What a shortcut must point at; arguments null for any arguments.
struct LinkRule {
    const wchar_t* target;
    const wchar_t* arguments;
};

// Deletes each shortcut ("*.lnk") of folder that matches. 1 when one was
// deleted, 0 when none, E_FAIL when the folder holds no shortcut.
int DeleteLinksByTarget(HWND owner, const wchar_t* folder, const wchar_t* target,
                        const wchar_t* arguments);
// The same for several rules at once: a shortcut goes when any rule matches.
// Each shortcut is read once.
int DeleteLinksByTargets(HWND owner, const wchar_t* folder, const LinkRule* rules, size_t count);

// Gives each matching shortcut the icon and saves it. 1 when one was saved,
// 0 when none, E_FAIL when the folder holds no shortcut.
int UpdateLinkIcon(HWND owner, const wchar_t* folder, const wchar_t* target,
                   const wchar_t* arguments, const wchar_t* iconPath, int iconIndex);

// Renames each matching shortcut whose path differs from newLinkPath to it.
// 1 when one was renamed, 0 when the folder holds shortcuts but none was
// renamed (or no new path is given), E_FAIL when the folder holds no
// "*.lnk" or folder or target is missing.
int UpdateLinkName(HWND owner, const wchar_t* folder, const wchar_t* target,
                   const wchar_t* arguments, const wchar_t* newLinkPath);

// Moves the shortcuts of srcDir into dstDir (created when missing), each by
// a copy that replaces and, once copied, a delete; with linkName only the
// shortcut linkName + ".lnk" (any case). Without a link name, srcDir is
// removed when that leaves it empty; with one it is a folder of other
// things (a desktop) and stays.
void MoveLinkTargetIcon(HWND owner, const wchar_t* srcDir, const wchar_t* dstDir,
                        const wchar_t* linkName);

// 1 for a null or missing path or a folder without entries, else 0.
int IsFolderEmpty(const wchar_t* path);
