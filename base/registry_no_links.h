// Registry work confined to one hive. A registry symbolic link planted in a
// hive (a key whose "SymbolicLinkValue" names another key, anywhere in the
// registry) is never followed here: a process that cleans another user's
// hive with administrator rights must not be steered into the machine's keys.
#pragma once

#include <windows.h>

// Deletes root\path with everything below it. A link met below the key is
// deleted itself, never its target; a link among the path's own components
// refuses the whole deletion, since the key then lies in another hive. Stops
// with 0 at the first subkey that cannot be deleted; nothing is rolled back.
BOOL DeleteKeyTreeNoLinks(HKEY root, const wchar_t* path);

// Deletes a value of root\path when no component of the path is a link.
BOOL DeleteValueNoLinks(HKEY root, const wchar_t* path, const wchar_t* name);
