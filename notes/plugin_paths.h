// Paths of the plug-in files: joining a folder and a file name without ever
// cutting the result short, and the test that a folder may be worked in.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

// out = folder, one backslash, relative. Fails with out empty when folder is
// missing or empty, when relative is empty, rooted, holds a drive colon or a
// ".." step (so the result never leaves folder), or when the result would not
// fit MAX_PATH characters with its terminator.
bool JoinFilePath(const wchar_t* folder, const wchar_t* relative, wchar_t (&out)[MAX_PATH]);

// True for a full path: "X:\..." or "\\server\share...". An empty, relative
// ("rel", ".", "..") or drive-relative ("C:rel", "\rel") path names a place
// relative to the working folder or its drive, so it never qualifies.
bool IsFullFolderPath(const wchar_t* folder);

// True for an existing folder named by a full path shorter than MAX_PATH.
bool IsUsableFolder(const wchar_t* folder);

// True for a null or empty text.
inline bool IsEmptyText(const wchar_t* text) {
    return text == nullptr || *text == L'\0';
}

// True when path names an existing file (not a folder).
bool IsRegularFile(const wchar_t* path);

// folder\relative with exactly one backslash between them, as a string (no
// length limit: a path too long for the file functions makes them fail).
inline CStringEx JoinLocalPath(const wchar_t* folder, const wchar_t* relative) {
    CStringEx path(folder);
    CStringEx::PathAppend(path, relative);
    return path;
}
