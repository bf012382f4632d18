// Where the presence status files are: the template in the suite's install
// folder, and the local file a configured "file" URL names, with the checks
// that keep work on it inside the folder it was meant for.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

// "MirovanStatus.xml" in the suite's install folder; false when the folder is
// unknown.
bool GetStatusTemplatePath(CStringEx& out);

// Replaces path by a copy of the template in one step; false when the
// template is missing or the copy failed (path is then as it was).
bool CopyStatusTemplate(const wchar_t* path);

// The local path of a "file" URL: the first "file://" deleted, then leading
// "//" and "/" stripped, forward slashes made back slashes, and "." and ".."
// steps resolved. False unless that is a full path ("X:\..." or "\\...").
bool StatusFilePathFromUrl(const wchar_t* url, CStringEx& path);

// True when file work on path may go on. A path inside a folder users can
// write (the user profiles, the roaming, local and all-users application
// data) must not pass a reparse point below that folder; a path elsewhere is
// an administrator's choice and taken as it is.
bool IsStatusPathSafe(const wchar_t* path);
