// Process token privileges.
#pragma once

#include <windows.h>

// Enables "SeDebugPrivilege", "SeBackupPrivilege" and "SeRestorePrivilege";
// 1 only when all three were granted.
BOOL AdjustPrivileges();
// The same on a given token (opened with TOKEN_ADJUST_PRIVILEGES).
BOOL AdjustPrivilegesOf(HANDLE token);
// Enables one privilege of the process token; true when granted.
bool EnablePrivilege(const wchar_t* name);
