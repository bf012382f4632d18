// Whole-entry editing of a ';'-separated search path such as the machine-wide
// "Path". An entry names a folder when the two are equal without regard to
// case and to trailing backslashes; a longer entry that merely contains the
// folder's text (C:\Suite\qm2 for C:\Suite\qm) is a different folder. Every
// entry that is not removed is kept character for character, %VARIABLES%
// included.
#pragma once

#include "base/string_ex.h"

// folder without its trailing backslashes.
CStringEx TrimTrailingBackslashes(const wchar_t* folder);

// True when one entry of pathList names folder.
bool PathListHasEntry(const wchar_t* pathList, const wchar_t* folder);

// pathList without its trailing ';', then ";" and folder. An empty list
// becomes folder alone, so the path never starts with an empty entry.
CStringEx AppendPathEntry(const wchar_t* pathList, const wchar_t* folder);

// pathList with its trailing ';' removed, without every entry that names
// folder, and with leading ';' removed. removedCount (may be null) receives
// the number of entries taken out.
CStringEx RemovePathEntries(const wchar_t* pathList, const wchar_t* folder,
                            int* removedCount = nullptr);
