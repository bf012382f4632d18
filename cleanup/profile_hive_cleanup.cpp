// The suite's settings in every user profile of the machine: each profile's
// NTUSER.DAT is loaded under HKEY_USERS in turn, cleaned and unloaded, then
// the calling account's own HKEY_CURRENT_USER is cleaned. Problems go to the
// debugger output only.
#include <windows.h>
#include <shlobj.h>

#include "base/object_security.h"
#include "base/privileges.h"
#include "base/registry.h"
#include "base/registry_delete.h"
#include "base/reparse_guard.h"
#include "base/string_ex.h"
#include "base/win_handles.h"
#include "cleanup/user_registry_cleanup.h"

namespace {

const size_t kProfilePathChars = 520;

// A profile hive loaded under HKEY_USERS\<name> for the life of this object:
// whatever happens while it is loaded, it is unloaded again.
class LoadedProfileHive {
public:
    LoadedProfileHive(const wchar_t* name, const wchar_t* file)
        : m_name(name), m_result(RegLoadKeyW(HKEY_USERS, name, file)) {}
    ~LoadedProfileHive() {
        if (m_result == ERROR_SUCCESS) {
            RegUnLoadKeyW(HKEY_USERS, m_name);
        }
    }
    LoadedProfileHive(const LoadedProfileHive&) = delete;
    LoadedProfileHive& operator=(const LoadedProfileHive&) = delete;

    LONG result() const { return m_result; }

private:
    const wchar_t* m_name;
    LONG m_result;
};

// The folder that holds all profile folders: the one above the calling
// account's own profile (the system profile when run as the system account).
bool GetProfilesFolder(CStringEx& folder) {
    PIDLIST_ABSOLUTE items = nullptr;
    if (FAILED(SHGetSpecialFolderLocation(nullptr, CSIDL_PROFILE, &items))) {
        OutputDebugStringW(L"NIHandle::DeleteAllCurUserReg: SHGetSpecialFolderLocation FAILED!\n");
        return false;
    }
    wchar_t path[kProfilePathChars] = {};
    BOOL found = SHGetPathFromIDListW(items, path);
    CoTaskMemFree(items);
    if (!found) {
        OutputDebugStringW(L"NIHandle::DeleteAllCurUserReg: SHGetPathFromIDList Failed!\n");
        return false;
    }
    const wchar_t* own = path;
    if (own[0] == L'/' && own[1] == L'/') {
        own += 2;
    }
    if (own[0] == L'/') {
        ++own;
    }
    const wchar_t* lastSeparator = wcsrchr(own, L'\\');
    if (lastSeparator == nullptr) {
        OutputDebugStringW(L"NIHandle::DeleteAllCurUserReg: Get FilePath was overload!\n");
        return false;
    }
    folder = CStringEx(own, static_cast<int>(lastSeparator - own));
    return true;
}

// A folder of the profiles folder, not "." or "..". Linked folders (a
// junction would lead the walk out of the profiles folder) are refused by the
// caller.
bool IsProfileFolderEntry(const WIN32_FIND_DATAW& entry) {
    return (entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) != 0 &&
           wcscmp(entry.cFileName, L".") != 0 && wcscmp(entry.cFileName, L"..") != 0;
}

void CleanProfileHive(const CStringEx& profiles, const wchar_t* user, const wchar_t* subkey,
                      const wchar_t* value1, const wchar_t* value2) {
    CStringEx folder;
    folder.Format(L"%s\\%s", profiles.c_str(), user);
    if (!IsFreeOfReparsePoints(profiles.c_str(), folder.c_str())) {
        return;
    }
    CStringEx hiveFile;
    hiveFile.Format(L"%s\\NTUSER.DAT", folder.c_str());
    LoadedProfileHive hive(user, hiveFile.c_str());
    if (hive.result() != ERROR_SUCCESS) {
        // In use (a logged-on user's) or missing: skipped.
        CStringEx line;
        line.Format(L"NIHandle::DeleteAllCurUserReg: RegLoadKey failed!user = %s,error = %d", user,
                    static_cast<int>(hive.result()));
        OutputDebugStringW(line.c_str());
        return;
    }
    if (value1 == nullptr && value2 == nullptr) {
        RemoveRegKey(user, subkey);
    }
    if (value1 != nullptr) {
        RemoveRegValue(user, subkey, value1);
    }
    if (value2 != nullptr) {
        RemoveRegValue(user, subkey, value2);
    }
}

void ReportOwnHiveDenied(const CObjectSecurity& security) {
    CStringEx line;
    line.Format(L"remove current_user's QM failed!DeleteAllow %d",
                static_cast<int>(security.GetLastError()));
    OutputDebugStringW(line.c_str());
}

// The calling account's own HKEY_CURRENT_USER, not redirected.
void CleanOwnHive(const wchar_t* subkey, const wchar_t* value1, const wchar_t* value2) {
    CObjectSecurity security(HKEY_CURRENT_USER, subkey);
    if (value1 == nullptr && value2 == nullptr) {
        if (!security.CanDelete()) {
            ReportOwnHiveDenied(security);
        } else if (!CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, subkey, 0)) {
            OutputDebugStringW(L"remove currentuser's QM RegDeleteKey Failed!");
        }
        return;
    }
    if (!security.CanWrite()) {
        ReportOwnHiveDenied(security);
        return;
    }
    BOOL last = TRUE;
    if (value1 != nullptr) {
        last = DeleteRegValue(HKEY_CURRENT_USER, subkey, value1, 0);
    }
    if (value2 != nullptr) {
        last = DeleteRegValue(HKEY_CURRENT_USER, subkey, value2, 0);
    }
    if (!last) {
        OutputDebugStringW(L"remove currentuser's QM RegDeleteValue Failed!");
    }
}

}  // namespace

void DeleteAllCurUserReg(const wchar_t* subkey, const wchar_t* value1, const wchar_t* value2) {
    // An empty subkey would name whole hives.
    if (subkey == nullptr || subkey[0] == L'\0') {
        return;
    }
    // Loading another user's hive needs the backup and restore privileges.
    if (!AdjustPrivileges()) {
        OutputDebugStringW(L"NIHandle::DeleteAllCurUserReg: AdjustPrivileges failed.\n");
        return;
    }
    CStringEx profiles;
    if (!GetProfilesFolder(profiles)) {
        return;
    }
    CStringEx pattern;
    pattern.Format(L"%s\\*.*", profiles.c_str());
    WIN32_FIND_DATAW entry = {};
    // Closed on every path, whatever the steps below do.
    UniqueFindHandle walk(FindFirstFileW(pattern.c_str(), &entry));
    if (!walk) {
        OutputDebugStringW(L"NIHandle::DeleteAllCurUserReg: FindFirstFile failed!\n");
        return;
    }
    do {
        if (IsProfileFolderEntry(entry)) {
            CleanProfileHive(profiles, entry.cFileName, subkey, value1, value2);
        }
    } while (FindNextFileW(walk.get(), &entry));
    CleanOwnHive(subkey, value1, value2);
}
