// Where Sametime Connect is installed and where the Sametime clients keep
// their Eclipse configuration.
#include <shlobj.h>
#include <shlwapi.h>
#include <wchar.h>

#include "base/reparse_guard.h"
#include "base/trace.h"
#include "base/win_handles.h"
#include "notes/location_values.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"
#include "notes/sametime_path_search.h"

namespace {

const wchar_t kUninstallKey[] = L"software\\microsoft\\windows\\CurrentVersion\\Uninstall\\";
const wchar_t kSametimeConnect[] = L"Sametime Connect";
const DWORD kEntryTextChars = MAX_PATH;

const wchar_t* const kPlatformXmlOfProfile[] = {
    L"Lotus\\Sametime\\.config\\org.eclipse.update\\platform.xml",
    L"IBM\\Sametime\\.config\\org.eclipse.update\\platform.xml",
};

DWORD SystemTicks() {
    return GetTickCount();
}

}  // namespace

bool GetSametimePathWithClock(wchar_t* lpszPath, DWORD capacity, DWORD* version, TickSource ticks) {
    if (lpszPath == nullptr && version == nullptr) {
        TraceLevel8(TraceValue("CQMCommon::GetSametimePath: Input Para is NULL!"));
        return false;
    }
    ClearLocation(lpszPath, capacity);
    const DWORD start = ticks();
    UniqueHKey uninstall;
    if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, kUninstallKey, 0, KEY_READ, uninstall.put()) !=
        ERROR_SUCCESS) {
        uninstall.reset();
        return false;
    }
    for (DWORD index = 0;; ++index) {
        // Unsigned difference: correct across the tick counter's wrap-around.
        if (ticks() - start > kSametimeSearchBudgetMs) {
            break;
        }
        wchar_t name[kEntryTextChars];
        DWORD nameChars = kEntryTextChars;
        LONG rc = RegEnumKeyExW(uninstall.get(), index, name, &nameChars, nullptr, nullptr, nullptr,
                                nullptr);
        if (rc == ERROR_NO_MORE_ITEMS) {
            break;
        }
        if (rc != ERROR_SUCCESS) {
            continue;  // a name too long for the buffer is no Sametime entry
        }
        UniqueHKey entry;
        if (RegOpenKeyExW(uninstall.get(), name, 0, KEY_READ, entry.put()) != ERROR_SUCCESS) {
            entry.reset();
            continue;
        }
        wchar_t displayName[kEntryTextChars];
        if (!ReadFittingValue(entry.get(), L"DisplayName", displayName, kEntryTextChars) ||
            wcsstr(displayName, kSametimeConnect) == nullptr) {
            continue;
        }
        // An entry whose install folder is missing, does not fit the
        // caller's buffer or is relative (it would name a place in the
        // working folder) names no usable folder: keep looking rather than
        // report it as found.
        if (lpszPath != nullptr &&
            (!ReadFittingValue(entry.get(), L"InstallLocation", lpszPath, capacity) ||
             !IsFullFolderPath(lpszPath))) {
            ClearLocation(lpszPath, capacity);
            continue;
        }
        DWORD major = 0;
        if (version != nullptr && ReadFourByteValue(entry.get(), L"VersionMajor", &major)) {
            *version = major;
        }
        return true;
    }
    return false;
}

bool GetSametimePath(wchar_t* lpszPath, DWORD capacity, DWORD* version) {
    return GetSametimePathWithClock(lpszPath, capacity, version, &SystemTicks);
}

bool GetSametimeConfigPath(int profile, CStringEx& out) {
    out.Empty();
    if (profile != 0 && profile != 1) {
        return false;
    }
    wchar_t appData[MAX_PATH] = {};
    wchar_t path[MAX_PATH] = {};
    // The profile belongs to the user: a link planted in it must not carry
    // the configuration edit elsewhere.
    if (!SHGetSpecialFolderPathW(nullptr, appData, CSIDL_APPDATA, TRUE) ||
        !JoinFilePath(appData, kPlatformXmlOfProfile[profile], path) || !PathFileExistsW(path) ||
        !IsFreeOfReparsePoints(appData, path)) {
        TraceLevel8(TraceValue("GetSametimeConfigPath: platform.xml file can not be found!"));
        return false;
    }
    out = path;
    return true;
}
