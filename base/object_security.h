// Access check of the current process against a file's or a registry key's
// security descriptor.
#pragma once

#include <windows.h>
#include <aclapi.h>

class CObjectSecurity {
public:
    // Names of at most 256 characters are checked; a longer one is refused
    // (no descriptor, GetLastError() gives ERROR_FILENAME_EXCED_RANGE) rather
    // than cut, which would check another object. A null name, or a root
    // other than the four named, gives ERROR_INVALID_PARAMETER.
    //
    // For a file (path copied).
    explicit CObjectSecurity(const wchar_t* filePath);
    // For a registry key: HKEY_CLASSES_ROOT, HKEY_CURRENT_USER,
    // HKEY_LOCAL_MACHINE or HKEY_USERS and a subkey ("USERS\<subkey>").
    CObjectSecurity(HKEY root, const wchar_t* subkey);
    virtual ~CObjectSecurity();
    CObjectSecurity(const CObjectSecurity&) = delete;
    CObjectSecurity& operator=(const CObjectSecurity&) = delete;

    // 1 when the process token is granted `mask`; 0 without a descriptor.
    BOOL CheckAccess(DWORD mask);
    BOOL CanDelete();
    BOOL CanWrite();
    // The result of the last GetNamedSecurityInfoW.
    DWORD GetLastError() const { return m_lastError; }

private:
    void Load();

    PSECURITY_DESCRIPTOR m_descriptor = nullptr;
    SE_OBJECT_TYPE m_objectType = SE_UNKNOWN_OBJECT_TYPE;
    DWORD m_lastError = 0;
    wchar_t m_filePath[MAX_PATH] = {};
    wchar_t m_registryName[MAX_PATH] = {};
};
