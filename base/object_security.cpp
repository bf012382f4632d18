#include "base/object_security.h"

#include <cwchar>

#include "base/privileges.h"
#include "base/win_handles.h"

namespace {

// Longest object name (file path or registry name) that is checked; a longer
// one is refused rather than cut, which would check a different object.
const size_t kMaxObjectNameChars = 256;

const DWORD kOwnerGroupDacl =
    OWNER_SECURITY_INFORMATION | GROUP_SECURITY_INFORMATION | DACL_SECURITY_INFORMATION;

// The hive names GetNamedSecurityInfoW understands; null for other roots.
const wchar_t* HiveName(HKEY root) {
    if (root == HKEY_CLASSES_ROOT) {
        return L"CLASSES_ROOT";
    }
    if (root == HKEY_CURRENT_USER) {
        return L"CURRENT_USER";
    }
    if (root == HKEY_LOCAL_MACHINE) {
        return L"MACHINE";
    }
    if (root == HKEY_USERS) {
        return L"USERS";
    }
    return nullptr;
}

// Taking ownership lets an administrator read descriptors it could not
// otherwise; without the privilege the check still runs. Once enabled it
// stays enabled for the process, so the token is adjusted only once (the
// profile cleanup builds one of these objects for every user's hive).
void EnableTakeOwnership() {
    static const bool enabled = EnablePrivilege(L"SeTakeOwnershipPrivilege");
    (void)enabled;
}

GENERIC_MAPPING MappingFor(SE_OBJECT_TYPE type) {
    if (type == SE_FILE_OBJECT) {
        return GENERIC_MAPPING{0x120089, 0x120116, 0x1200A0, 0x1F01FF};
    }
    return GENERIC_MAPPING{KEY_READ, KEY_WRITE, KEY_EXECUTE, KEY_ALL_ACCESS};
}

}  // namespace

CObjectSecurity::CObjectSecurity(const wchar_t* filePath) {
    EnableTakeOwnership();
    if (filePath == nullptr || filePath[0] == L'\0') {
        m_lastError = ERROR_INVALID_PARAMETER;
        return;
    }
    if (wcslen(filePath) > kMaxObjectNameChars) {
        m_lastError = ERROR_FILENAME_EXCED_RANGE;
        return;
    }
    wcscpy(m_filePath, filePath);
    m_objectType = SE_FILE_OBJECT;
    Load();
}

CObjectSecurity::CObjectSecurity(HKEY root, const wchar_t* subkey) {
    EnableTakeOwnership();
    const wchar_t* hive = HiveName(root);
    if (hive == nullptr || subkey == nullptr) {
        m_lastError = ERROR_INVALID_PARAMETER;
        return;
    }
    size_t length = wcslen(hive) + (subkey[0] != L'\0' ? 1 + wcslen(subkey) : 0);
    if (length > kMaxObjectNameChars) {
        m_lastError = ERROR_FILENAME_EXCED_RANGE;
        return;
    }
    if (subkey[0] != L'\0') {
        _snwprintf(m_registryName, MAX_PATH, L"%s\\%s", hive, subkey);
    } else {
        wcscpy(m_registryName, hive);
    }
    m_registryName[MAX_PATH - 1] = L'\0';
    m_objectType = SE_REGISTRY_KEY;
    Load();
}

CObjectSecurity::~CObjectSecurity() {
    if (m_descriptor != nullptr) {
        LocalFree(m_descriptor);
    }
}

void CObjectSecurity::Load() {
    wchar_t* name = m_objectType == SE_FILE_OBJECT ? m_filePath : m_registryName;
    m_lastError = GetNamedSecurityInfoW(name, m_objectType, kOwnerGroupDacl, nullptr, nullptr,
                                        nullptr, nullptr, &m_descriptor);
    if (m_lastError != ERROR_SUCCESS) {
        m_descriptor = nullptr;
    }
}

BOOL CObjectSecurity::CheckAccess(DWORD mask) {
    if (m_descriptor == nullptr) {
        return FALSE;
    }
    UniqueHandle processToken;
    if (!OpenProcessToken(GetCurrentProcess(), TOKEN_DUPLICATE | TOKEN_QUERY | READ_CONTROL,
                          processToken.put())) {
        return FALSE;
    }
    UniqueHandle impersonation;
    if (!DuplicateToken(processToken.get(), SecurityImpersonation, impersonation.put())) {
        return FALSE;
    }
    GENERIC_MAPPING mapping = MappingFor(m_objectType);
    DWORD desired = mask;
    MapGenericMask(&desired, &mapping);
    // Room for one privilege, as an access check of these masks needs no more.
    union {
        PRIVILEGE_SET set;
        BYTE bytes[20];
    } privileges = {};
    DWORD privilegesSize = sizeof(privileges.bytes);
    DWORD granted = 0;
    BOOL status = FALSE;
    if (!AccessCheck(m_descriptor, impersonation.get(), desired, &mapping, &privileges.set,
                     &privilegesSize, &granted, &status)) {
        return FALSE;
    }
    return status ? TRUE : FALSE;
}

BOOL CObjectSecurity::CanDelete() {
    return CheckAccess(m_objectType == SE_FILE_OBJECT ? DELETE : (DELETE | KEY_SET_VALUE));
}

BOOL CObjectSecurity::CanWrite() {
    return CheckAccess(2);
}
