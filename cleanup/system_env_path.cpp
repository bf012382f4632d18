#include "cleanup/system_env_path.h"

#include <windows.h>

#include <cstdio>
#include <vector>

#include "base/registry.h"
#include "base/trace.h"
#include "base/win_handles.h"
#include "cleanup/path_entries.h"

namespace {

const wchar_t kEnvironmentKey[] =
    L"SYSTEM\\CurrentControlSet\\Control\\Session Manager\\Environment";
const wchar_t kPathValue[] = L"Path";
const DWORD kBroadcastTimeoutMs = 5000;

// Reads "Path" exactly as stored, REG_SZ or REG_EXPAND_SZ, never expanded
// (GetRegString accepts only REG_SZ).
bool ReadSystemPath(CStringEx& out) {
    out.Empty();
    UniqueHKey key;
    if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, kEnvironmentKey, 0, KEY_QUERY_VALUE, key.put()) !=
        ERROR_SUCCESS) {
        key.reset();
        return false;
    }
    std::vector<wchar_t> data;
    DWORD type = 0;
    DWORD size = 0;
    LONG status = RegQueryValueExW(key.get(), kPathValue, nullptr, &type, nullptr, &size);
    // The value may grow between the two calls; ask again with the new size.
    for (int attempt = 0; attempt < 4 && status == ERROR_SUCCESS; ++attempt) {
        data.assign(size / sizeof(wchar_t) + 1, L'\0');
        DWORD got = size;
        status = RegQueryValueExW(key.get(), kPathValue, nullptr, &type,
                                  reinterpret_cast<BYTE*>(data.data()), &got);
        if (status == ERROR_MORE_DATA) {
            size = got;
            status = ERROR_SUCCESS;
            continue;
        }
        if (status != ERROR_SUCCESS || (type != REG_SZ && type != REG_EXPAND_SZ)) {
            return false;
        }
        // Stored data need not carry its terminator; the text ends at the first one.
        size_t chars = got / sizeof(wchar_t);
        size_t length = 0;
        while (length < chars && data[length] != L'\0') {
            ++length;
        }
        out = CStringEx(data.data(), static_cast<int>(length));
        return true;
    }
    return false;
}

void WriteSystemPath(const wchar_t* text) {
    // A failed write is not reported; the broadcast follows regardless.
    SetRegString(HKEY_LOCAL_MACHINE, kEnvironmentKey, kPathValue, text, 0, REG_EXPAND_SZ);
}

}  // namespace

void RefreshSysEnv() {
    DWORD_PTR result = 0;
    if (SendMessageTimeoutW(HWND_BROADCAST, WM_SETTINGCHANGE, 0,
                            reinterpret_cast<LPARAM>(L"Environment"), SMTO_ABORTIFHUNG,
                            kBroadcastTimeoutMs, &result) == 0) {
        char text[64];
        snprintf(text, sizeof(text), "GetLastError is %lu", GetLastError());
        TraceLevel1(TraceValue(text));
    }
}

void RestoreSysEnvironment() {
    if (GetRegValueType(HKEY_LOCAL_MACHINE, kEnvironmentKey, kPathValue, 0) != REG_SZ) {
        return;
    }
    OutputDebugStringW(
        L"qmMirovanONI: RestoreSysEnvironment: The sys environment is incorrect, restore it.\n");
    CStringEx path;
    if (!ReadSystemPath(path)) {
        return;
    }
    WriteSystemPath(path.c_str());
    RefreshSysEnv();
}

void SetQMInstallPathToSystemEnv(const wchar_t* installFolder) {
    if (installFolder == nullptr) {
        return;
    }
    CStringEx folder = TrimTrailingBackslashes(installFolder);
    if (folder.IsEmpty()) {
        TraceLevel8(TraceValue(
            "CQMCommon::SetQMInstallPathToSystemEnv: Exception QM install path is empty!\n"));
        return;
    }
    CStringEx path;
    if (!ReadSystemPath(path)) {
        return;
    }
    // Whole entries only: C:\Suite\qm2 in the path does not stand for C:\Suite\qm.
    if (PathListHasEntry(path.c_str(), folder.c_str())) {
        RestoreSysEnvironment();
        return;
    }
    WriteSystemPath(AppendPathEntry(path.c_str(), folder.c_str()).c_str());
    RefreshSysEnv();
}

void RemoveQMInstallPathFromSystemEnv(const wchar_t* installFolder) {
    if (installFolder == nullptr) {
        return;
    }
    CStringEx folder = TrimTrailingBackslashes(installFolder);
    if (folder.IsEmpty()) {
        TraceLevel8(TraceValue(
            "CQMCommon::RemoveQMInstallPathFromSystemEnv: Exception QM install path is empty!\n"));
        return;
    }
    CStringEx path;
    if (!ReadSystemPath(path)) {
        return;
    }
    // Whole entries only, so that C:\Suite\qm2 survives the removal of C:\Suite\qm.
    CStringEx remaining = RemovePathEntries(path.c_str(), folder.c_str());
    if (remaining.IsEmpty()) {
        // An empty machine Path leaves every program without the system
        // folders; a Path that held only the suite folder is left as it is.
        TraceLevel4(TraceValue(
            "CQMCommon::RemoveQMInstallPathFromSystemEnv: the Path would be empty, left as it is"));
        return;
    }
    WriteSystemPath(remaining.c_str());
    RefreshSysEnv();
}
