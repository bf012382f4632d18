// Process token privileges.
#pragma once

#include <windows.h>

// Enables "SeDebugPrivilege", "SeBackupPrivilege" and "SeRestorePrivilege";
// 1 only when all three were granted.
BOOL AdjustPrivileges();
// Enables one privilege of the process token; true when granted.
bool EnablePrivilege(const wchar_t* name);
