// Windows Installer registrations of the old Notes and Outlook integrations,
// removed straight from the registry by upgrade code, and the installer-check
// library's hand-over.
#include "cleanup/installer_registration.h"

#include <windows.h>

#include "base/path_api.h"
#include "base/proc_address.h"
#include "base/registry_delete.h"
#include "base/trace.h"
#include "base/user_profile.h"
#include "base/win_handles.h"
#include "cleanup/packed_guid.h"

const wchar_t kOldNotesUpgradeCode[] = L"UpgradeCodes\\39A1EB3B91C93B54EAD80FE3C665084C";
const wchar_t kOldOutlookUpgradeCode[] = L"UpgradeCodes\\E4698B57199D4B241AF129150B2CCAE2";

namespace {

const wchar_t kUserInstallerKey[] = L"SOFTWARE\\Microsoft\\Installer\\";
const wchar_t kMachineInstallerKey[] = L"SOFTWARE\\Classes\\Installer\\";
const wchar_t kUpgradeCopiesKey[] = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Installer\\";
const wchar_t kUninstallKey[] = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall";
const DWORD kNameChars = MAX_PATH;

// The open key, or the registry's error code (RegOpenKeyExW does not set the
// thread's last error, so that code is the one worth logging).
LONG OpenKey(HKEY root, const wchar_t* path, REGSAM access, UniqueHKey& key) {
    LONG result = RegOpenKeyExW(root, path, 0, access, key.put());
    if (result != ERROR_SUCCESS) {
        key.release();  // nothing was opened
    }
    return result;
}

void LogUpgradeIdFailed(const wchar_t* operation, LONG error) {
    CStringEx line;
    line.Format(L"%s: RegOpenKeyEx UpgradeID FAILED, Error = %d\n", operation,
                static_cast<int>(error));
    TraceLevel4(TraceValue(line));
}

// Calls done(code) for each value name of the upgrade-code key, the packed
// product code of one installed product of that family; stops at the first
// name that cannot be read.
template <typename Done>
void ForEachProductCode(HKEY upgradeKey, Done done) {
    wchar_t code[kNameChars];
    for (DWORD index = 0;; ++index) {
        DWORD size = kNameChars;
        if (RegEnumValueW(upgradeKey, index, code, &size, nullptr, nullptr, nullptr, nullptr) !=
            ERROR_SUCCESS) {
            return;
        }
        done(code);
    }
}

CStringEx BracedCode(const wchar_t* packedCode) {
    wchar_t braced[kNameChars] = {};
    PackedGuidToGuid(packedCode, braced, kNameChars);
    return CStringEx(braced);
}

// One registration below root\installerPath: remove(installer key, code) for
// each product listed under the upgrade code, then the upgrade-code key itself
// (which fails harmlessly while it still has subkeys). Failures are logged
// for `operation`, or silently passed over when it is null.
template <typename Remove>
void RemoveRegistration(HKEY root, const wchar_t* installerPath, const wchar_t* upgradeSubkey,
                        REGSAM access, const wchar_t* operation, Remove remove) {
    UniqueHKey installer;
    if (OpenKey(root, installerPath, access, installer) != ERROR_SUCCESS) {
        if (operation != nullptr) {
            TraceLevel4(TraceValue(
                "DelInstallerKeyByUpgrade: RegOpenKeyEx CURRENT_USER_INSTALLER_KEY FAILED!\n"));
        }
        return;
    }
    CStringEx upgradePath(installerPath);
    upgradePath += upgradeSubkey;
    UniqueHKey upgrade;
    LONG opened = OpenKey(root, upgradePath.c_str(), access, upgrade);
    if (opened == ERROR_SUCCESS) {
        ForEachProductCode(upgrade.get(),
                           [&](const wchar_t* code) { remove(installer.get(), code); });
        upgrade.reset();
    } else if (operation != nullptr) {
        LogUpgradeIdFailed(operation, opened);
    }
    RegDeleteKeyW(installer.get(), upgradeSubkey);
}

// The console user's (logged) or the machine's (silent) registration.
void DelRegistrationByUpgrade(HKEY root, const wchar_t* installerPath, const wchar_t* upgradeSubkey,
                              bool logged) {
    RemoveRegistration(root, installerPath, upgradeSubkey, KEY_ALL_ACCESS,
                       logged ? L"DelInstallerKeyByUpgrade" : nullptr,
                       [root](HKEY installer, const wchar_t* code) {
                           DelProductAndFeatures(installer, code);
                           DelUninstallEntry(root, code);
                       });
}

}  // namespace

void DelProductAndFeatures(HKEY installerKey, const wchar_t* packedCode) {
    for (const wchar_t* list : {L"Products", L"Features"}) {
        UniqueHKey key;
        if (OpenKey(installerKey, list, KEY_ALL_ACCESS, key) == ERROR_SUCCESS) {
            DeleteRegKeyTree(key.get(), packedCode, 0);
        }
    }
}

void DelUninstallEntry(HKEY root, const wchar_t* packedCode) {
    UniqueHKey uninstall;
    if (OpenKey(root, kUninstallKey, KEY_ALL_ACCESS, uninstall) == ERROR_SUCCESS) {
        DeleteRegKeyTree(uninstall.get(), BracedCode(packedCode).c_str(), 0);
    }
}

void DelInstallerKeyByUpgrade(const wchar_t* upgradeSubkey) {
    HKEY userRoot = GetUserRegRoot();
    if (userRoot == nullptr) {
        TraceLevel8(
            TraceValue("DelInstallerKeyByUpgrade: Delete current user key failed, can not get "
                       "current user key!\n"));
    } else {
        TraceLevel1(TraceValue("DelInstallerKeyByUpgrade: Delete Current user key!\n"));
        CStringEx line;
        line.Format(L"DelInstallerKeyByUpgrade : hCurKey = %d\n",
                    static_cast<int>(reinterpret_cast<INT_PTR>(userRoot)));
        TraceLevel1(TraceValue(line));
        DelRegistrationByUpgrade(userRoot, kUserInstallerKey, upgradeSubkey, true);
    }
    DelRegistrationByUpgrade(HKEY_LOCAL_MACHINE, kMachineInstallerKey, upgradeSubkey, false);

    UniqueHKey copies;
    if (OpenKey(HKEY_LOCAL_MACHINE, kUpgradeCopiesKey, KEY_ALL_ACCESS, copies) == ERROR_SUCCESS) {
        DeleteRegKeyTree(copies.get(), upgradeSubkey, 0);
    }
}

void DelInstallerKeyOnCurrentUserForSMS(const wchar_t* upgradeSubkey) {
    RemoveRegistration(HKEY_CURRENT_USER, kUserInstallerKey, upgradeSubkey, KEY_READ,
                       L"DelInstallerKeyOnCurrentUserForSMS", [](HKEY, const wchar_t* code) {
                           for (const wchar_t* list : {L"Products", L"Features"}) {
                               CStringEx path(kUserInstallerKey);
                               CStringEx::PathAppend(path, list);
                               CStringEx::PathAppend(path, code);
                               CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, path.c_str(), 0);
                           }
                           CStringEx entry(kUninstallKey);
                           CStringEx::PathAppend(entry, BracedCode(code).c_str());
                           CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, entry.c_str(), 0);
                       });
}

void ModifyAdminMsiDisplayVersion() {
    CStringEx library;
    CPathApi::GetQMRootPath(library);
    UniqueModule module;
    if (!library.IsEmpty()) {
        CStringEx::PathAppend(library, L"qminstck.dll");
        module.reset(LoadLibraryW(library.c_str()));
    } else {
        // By name: the program's own folder and the system folders, never the
        // current folder or the search path, where anyone may plant a library.
        module.reset(LoadLibraryExW(L"qminstck.dll", nullptr, LOAD_LIBRARY_SEARCH_DEFAULT_DIRS));
    }
    using ModifyAdminMsiVersionFn = int(__cdecl*)();
    auto modify = GetProcAs<ModifyAdminMsiVersionFn>(module.get(), "ModifyAdminMsiVersion");
    if (modify != nullptr) {
        modify();
    }
}
