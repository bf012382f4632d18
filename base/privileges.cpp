#include "base/privileges.h"

#include "base/win_handles.h"

namespace {

const wchar_t* const kMaintenancePrivileges[] = {
    L"SeDebugPrivilege",
    L"SeBackupPrivilege",
    L"SeRestorePrivilege",
};
const DWORD kMaintenancePrivilegeCount = 3;

// TOKEN_PRIVILEGES with room for all three entries.
struct ThreePrivileges {
    DWORD PrivilegeCount;
    LUID_AND_ATTRIBUTES Privileges[kMaintenancePrivilegeCount];
};

}  // namespace

BOOL AdjustPrivilegesOf(HANDLE token) {
    if (token == nullptr) {
        return FALSE;
    }
    ThreePrivileges privileges = {};
    privileges.PrivilegeCount = kMaintenancePrivilegeCount;
    for (DWORD i = 0; i < kMaintenancePrivilegeCount; ++i) {
        if (!LookupPrivilegeValueW(nullptr, kMaintenancePrivileges[i],
                                   &privileges.Privileges[i].Luid)) {
            return FALSE;
        }
        privileges.Privileges[i].Attributes = SE_PRIVILEGE_ENABLED;
    }
    // AdjustTokenPrivileges succeeds with ERROR_NOT_ALL_ASSIGNED when the
    // token lacks one of them; only a clean error code means all were enabled.
    SetLastError(ERROR_SUCCESS);
    BOOL adjusted = AdjustTokenPrivileges(
        token, FALSE, reinterpret_cast<TOKEN_PRIVILEGES*>(&privileges), 0, nullptr, nullptr);
    return adjusted && GetLastError() == ERROR_SUCCESS ? TRUE : FALSE;
}

BOOL AdjustPrivileges() {
    UniqueHandle token;
    if (!OpenProcessToken(GetCurrentProcess(), TOKEN_ADJUST_PRIVILEGES, token.put())) {
        return FALSE;
    }
    return AdjustPrivilegesOf(token.get());
}

bool EnablePrivilege(const wchar_t* name) {
    if (name == nullptr || name[0] == L'\0') {
        return false;
    }
    UniqueHandle token;
    if (!OpenProcessToken(GetCurrentProcess(), TOKEN_ADJUST_PRIVILEGES | TOKEN_QUERY,
                          token.put())) {
        return false;
    }
    TOKEN_PRIVILEGES privilege = {};
    privilege.PrivilegeCount = 1;
    privilege.Privileges[0].Attributes = SE_PRIVILEGE_ENABLED;
    if (!LookupPrivilegeValueW(nullptr, name, &privilege.Privileges[0].Luid)) {
        return false;
    }
    SetLastError(ERROR_SUCCESS);
    return AdjustTokenPrivileges(token.get(), FALSE, &privilege, 0, nullptr, nullptr) &&
           GetLastError() == ERROR_SUCCESS;
}
