#include "actions/trace_folder.h"

#include <shlwapi.h>

#include <memory>
#include <new>

#include "base/proc_address.h"
#include "base/win_handles.h"

namespace {

const DWORD kCsidlInternetCache = 32;
// Owner, group, discretionary ACL and the integrity label.
const SECURITY_INFORMATION kFolderSecurity = 23;
const DWORD kThreadTokenAccess = TOKEN_QUERY | TOKEN_DUPLICATE;
const DWORD kCreateFilesAccess = FILE_WRITE_DATA | FILE_APPEND_DATA;

using SHGetSpecialFolderPathFn = BOOL(WINAPI*)(HWND, wchar_t*, int, BOOL);

bool IsNT(const OSVERSIONINFOW& version) {
    return version.dwPlatformId == VER_PLATFORM_WIN32_NT;
}

// Reverts the thread's impersonation on every path.
class SelfImpersonation {
public:
    SelfImpersonation() : m_active(ImpersonateSelf(SecurityImpersonation) != FALSE) {}
    ~SelfImpersonation() {
        if (m_active) {
            RevertToSelf();
        }
    }
    SelfImpersonation(const SelfImpersonation&) = delete;
    SelfImpersonation& operator=(const SelfImpersonation&) = delete;

    bool active() const { return m_active; }

private:
    bool m_active;
};

}  // namespace

BOOL IsFolderWritable(const wchar_t* path, const OSVERSIONINFOW& versionInfo) {
    if (path == nullptr || !PathFileExistsW(path)) {
        return FALSE;
    }
    if (!IsNT(versionInfo)) {
        return TRUE;
    }
    DWORD needed = 0;
    if (GetFileSecurityW(path, kFolderSecurity, nullptr, 0, &needed) ||
        GetLastError() != ERROR_INSUFFICIENT_BUFFER || needed == 0) {
        return FALSE;
    }
    std::unique_ptr<BYTE[]> descriptor(new (std::nothrow) BYTE[needed]());
    if (!descriptor ||
        !GetFileSecurityW(path, kFolderSecurity, descriptor.get(), needed, &needed)) {
        return FALSE;
    }
    SelfImpersonation impersonation;
    if (!impersonation.active()) {
        return FALSE;
    }
    UniqueHandle token;
    if (!OpenThreadToken(GetCurrentThread(), kThreadTokenAccess, TRUE, token.put())) {
        return FALSE;
    }
    GENERIC_MAPPING mapping = {FILE_GENERIC_READ, FILE_GENERIC_WRITE, FILE_GENERIC_EXECUTE,
                               FILE_ALL_ACCESS};
    DWORD desired = kCreateFilesAccess;
    MapGenericMask(&desired, &mapping);
    union {
        PRIVILEGE_SET set;
        BYTE bytes[sizeof(PRIVILEGE_SET) + 3 * sizeof(LUID_AND_ATTRIBUTES)];
    } privileges = {};
    DWORD privilegesSize = sizeof(privileges);
    DWORD granted = 0;
    BOOL status = FALSE;
    if (!AccessCheck(descriptor.get(), token.get(), desired, &mapping, &privileges.set,
                     &privilegesSize, &granted, &status)) {
        return FALSE;
    }
    return status ? TRUE : FALSE;
}

BOOL FindTraceFolder(wchar_t* buffer, DWORD size) {
    if (buffer == nullptr || size == 0) {
        return FALSE;
    }
    OSVERSIONINFOW version = {};
    version.dwOSVersionInfoSize = sizeof(version);
    if (!GetVersionExW(&version)) {
        return FALSE;
    }
    DWORD length = GetTempPathW(size, buffer);
    if (length == 0 || length >= size) {
        buffer[0] = L'\0';
    } else if (IsFolderWritable(buffer, version)) {
        return TRUE;
    }
    // Vista runs protected-mode programs at low integrity: their temporary
    // folder is "Low" below the usual one.
    if (IsNT(version) && version.dwMinorVersion == 0 && buffer[0] != L'\0' &&
        PathAppendW(buffer, L"Low") && IsFolderWritable(buffer, version)) {
        return TRUE;
    }
    wchar_t shellPath[MAX_PATH] = {};
    UINT systemLength = GetSystemDirectoryW(shellPath, MAX_PATH);
    if (systemLength == 0 || systemLength >= MAX_PATH || !PathAppendW(shellPath, L"shell32.dll")) {
        return FALSE;
    }
    UniqueModule shell(LoadLibraryW(shellPath));
    auto specialFolderPath =
        GetProcAs<SHGetSpecialFolderPathFn>(shell.get(), "SHGetSpecialFolderPath");
    wchar_t cache[MAX_PATH] = {};
    if (specialFolderPath != nullptr && size >= MAX_PATH &&
        specialFolderPath(nullptr, cache, kCsidlInternetCache, FALSE)) {
        lstrcpynW(buffer, cache, static_cast<int>(size));
        return IsFolderWritable(buffer, version);
    }
    if (IsNT(version) && version.dwMajorVersion >= 6 && version.dwMinorVersion == 0 &&
        buffer[0] != L'\0' && PathAppendW(buffer, L"Low")) {
        return IsFolderWritable(buffer, version);
    }
    return FALSE;
}
