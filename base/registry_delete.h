// Deleting registry keys with their subkeys. Three ways, each with its own
// rules, plus the guarded deletions in other users' hives under HKEY_USERS.
// None is redirected to the console user.
#pragma once

#include <windows.h>

class CRegistry {
public:
    CRegistry() = default;
    virtual ~CRegistry() = default;

    // Deletes root\subkey and everything below it. Stops with 0 (keeping the
    // key) at the first subkey that cannot be deleted; nothing is rolled back.
    // A null or empty subkey gives 0: a whole root is never deleted.
    static BOOL RecurDeleteKey(HKEY root, const wchar_t* subkey, REGSAM view);
};

// Removes root\parent\child with its whole subtree (SHDeleteKeyW).
BOOL RecursDeleteRegisterKey(HKEY root, const wchar_t* parent, const wchar_t* child);

// Depth-limited deletion with a 20 s budget per level: depth 0 removes the
// whole tree; a positive depth keeps the key and the levels below it down to
// that depth (depth 1 keeps the key and its direct subkeys). Returns a
// registry error code, 0 when deleted, -1 when the key itself was kept
// (ERROR_FILE_NOT_FOUND for a missing key, ERROR_INVALID_PARAMETER for a
// null or empty name or a negative depth).
LONG DeleteRegKeyTree(HKEY root, const wchar_t* subkey, int depth);

// The millisecond clock of DeleteRegKeyTree's budget; tests replace it to
// drive the budget without waiting. Null puts GetTickCount back.
using RegistryTickSource = DWORD (*)();
void SetRegistryDeleteTickSource(RegistryTickSource source);

// Deletes HKEY_USERS\userKeyName\subkey when the access check allows it.
// Neither deletion follows a registry link out of the user's hive
// (DeleteKeyTreeNoLinks, DeleteValueNoLinks).
BOOL RemoveRegKey(const wchar_t* userKeyName, const wchar_t* subkey);
// Deletes a value of HKEY_USERS\userKeyName\subkey when allowed.
BOOL RemoveRegValue(const wchar_t* userKeyName, const wchar_t* subkey, const wchar_t* valueName);
