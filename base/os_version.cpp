#include "base/os_version.h"

#include <shlwapi.h>

#include "base/proc_address.h"

namespace {
int g_osVersionClass = kOSUnknown;
BOOL g_is64Bit = FALSE;
bool g_is64BitKnown = false;
}  // namespace

int ClassifyOSVersion(DWORD platformId, DWORD major, DWORD minor) {
    if (platformId == VER_PLATFORM_WIN32_WINDOWS && major == 4) {
        if (minor == 0) {
            return kOSWin95;
        }
        if (minor == 10) {
            return kOSWin98;
        }
        if (minor == 90) {
            return kOSWinMe;
        }
        return kOSUnknown;
    }
    if (platformId == VER_PLATFORM_WIN32_NT) {
        if (major < 5) {
            return kOSWinNT4;
        }
        if (major == 5 && minor == 0) {
            return kOSWin2000;
        }
        if (major == 5 && minor == 1) {
            return kOSWinXP;
        }
        if (major >= 6) {
            return kOSVistaOrLater;
        }
    }
    return kOSUnknown;
}

int GetOSVersionClass() {
    if (g_osVersionClass != kOSUnknown) {
        return g_osVersionClass;
    }
    OSVERSIONINFOEXW extended = {};
    extended.dwOSVersionInfoSize = sizeof(extended);
    OSVERSIONINFOW& info = reinterpret_cast<OSVERSIONINFOW&>(extended);
    if (!GetVersionExW(&info)) {
        OSVERSIONINFOW plain = {};
        plain.dwOSVersionInfoSize = sizeof(plain);
        if (!GetVersionExW(&plain)) {
            return kOSUnknown;
        }
        info = plain;
    }
    g_osVersionClass =
        ClassifyOSVersion(info.dwPlatformId, info.dwMajorVersion, info.dwMinorVersion);
    return g_osVersionClass;
}

BOOL Is64BitFromWow64Lookup(BOOL found, DWORD error) {
    if (found) {
        return TRUE;
    }
    return error == ERROR_CALL_NOT_IMPLEMENTED ? FALSE : TRUE;
}

BOOL Is64BitSystem() {
    if (!g_is64BitKnown) {
        wchar_t folder[MAX_PATH] = {};
        BOOL found = MrvGetSystemWow64Directory(folder, MAX_PATH) != 0;
        g_is64Bit = Is64BitFromWow64Lookup(found, found ? 0 : GetLastError());
        g_is64BitKnown = true;
    }
    return g_is64Bit;
}

UINT MrvGetSystemWow64Directory(wchar_t* buffer, UINT sizeChars) {
    using GetSystemWow64DirectoryWFn = UINT(WINAPI*)(LPWSTR, UINT);
    auto getWow64Directory = GetProcAs<GetSystemWow64DirectoryWFn>(
        GetModuleHandleW(L"Kernel32.dll"), "GetSystemWow64DirectoryW");
    if (getWow64Directory == nullptr) {
        SetLastError(ERROR_CALL_NOT_IMPLEMENTED);
        return 0;
    }
    UINT length = getWow64Directory(buffer, sizeChars);
    return (length == 0 || length >= sizeChars) ? 0 : 1;
}

HMODULE LoadSystemLibrary(const wchar_t* fileName) {
    if (fileName == nullptr) {
        return nullptr;
    }
    wchar_t path[MAX_PATH] = {};
    if (!MrvGetSystemWow64Directory(path, MAX_PATH)) {
        UINT length = GetSystemDirectoryW(path, MAX_PATH);
        if (length == 0 || length >= MAX_PATH) {
            return nullptr;
        }
    }
    if (!PathAppendW(path, fileName)) {
        return nullptr;
    }
    return LoadLibraryW(path);
}
