#include "cleanup/shortcuts.h"

#include <windows.h>
#include <shlobj.h>
#include <shlwapi.h>
// shlwapi's name macro would turn CStringEx::PathAppend into another name.
#undef PathAppend

#include "base/os_version.h"
#include "base/proc_address.h"
#include "base/registry.h"
#include "base/suite_key.h"
#include "base/trace.h"
#include "cleanup/companion_app.h"
#include "cleanup/link_folder.h"
#include "cleanup/shell_link.h"
#include "cleanup/shortcut_places.h"
#include "cleanup/shortcut_texts.h"

namespace {

const wchar_t kOneClickExe[] = L"qmoneclk.exe";
const wchar_t kInstallerExe[] = L"qminst.exe";
const wchar_t kResLibrary[] = L"qmRes.dll";
const wchar_t kOI3ResLibrary[] = L"qmOI3Res.dll";
const wchar_t kSettingsArguments[] = L"/OpenSetting=1";
const wchar_t kHelpArguments[] = L"/help for quillmark tools";
const int kOneClickIcon = 0;
const int kHelpIcon = 2;
const int kSettingsIcon = 3;

const int kProgramFolders[] = {CSIDL_PROGRAMS, CSIDL_COMMON_PROGRAMS};
const int kDesktops[] = {CSIDL_DESKTOP, CSIDL_COMMON_DESKTOPDIRECTORY};

using IsWow64ProcessFn = BOOL(WINAPI*)(HANDLE process, PBOOL wow64);

struct Shortcut {
    CStringEx name;
    CStringEx target;
    CStringEx arguments;
    CStringEx iconPath;
    int iconIndex;
};

CStringEx InRoot(const CStringEx& root, const wchar_t* fileName) {
    CStringEx path(root);
    CStringEx::PathAppend(path, fileName);
    return path;
}

const wchar_t* OrNull(const CStringEx& text) {
    return text.IsEmpty() ? nullptr : text.c_str();
}

HRESULT CreateShortcut(HWND owner, const CStringEx& folder, const Shortcut& shortcut,
                       const CStringEx& root) {
    CStringEx linkPath;
    if (!LinkPathIn(folder, shortcut.name, linkPath)) {
        return E_FAIL;
    }
    return CreateLink(owner, folder.c_str(), shortcut.target.c_str(), linkPath.c_str(),
                      OrNull(shortcut.arguments), OrNull(shortcut.iconPath), shortcut.iconIndex,
                      root.c_str());
}

// UpdateLinkName to folder\name.lnk; without a usable name nothing is
// renamed, but the result still tells whether the folder holds shortcuts.
int RenameLinks(HWND owner, const CStringEx& folder, const CStringEx& target,
                const wchar_t* arguments, const CStringEx& name) {
    CStringEx newPath;
    if (!LinkPathIn(folder, name, newPath)) {
        newPath.Empty();
    }
    return UpdateLinkName(owner, folder.c_str(), target.c_str(), arguments, OrNull(newPath));
}

bool RunsUnderWow64() {
    auto isWow64Process =
        GetProcAs<IsWow64ProcessFn>(GetModuleHandleW(L"kernel32"), "IsWow64Process");
    BOOL wow64 = FALSE;
    return isWow64Process != nullptr && isWow64Process(GetCurrentProcess(), &wow64) && wow64;
}

// The suite's root folder, when it holds "qmRes.dll" (which the texts and the
// icons need), and that library's path.
bool FindRootWithResources(CStringEx& root, CStringEx& resLibrary) {
    if (!GetShortcutRoot(root)) {
        return false;
    }
    resLibrary = InRoot(root, kResLibrary);
    return PathFileExistsW(resLibrary.c_str()) != FALSE;
}

// Runs work(programs, folder) for the suite's folder named folderName in the
// user's and in the common program folder, where there is one to work in.
template <typename Work>
void ForEachSuiteFolder(const ActiveUserFolders& folders, const CStringEx& folderName, Work work) {
    for (int csidl : kProgramFolders) {
        CStringEx programs;
        CStringEx folder;
        if (folders.Get(csidl, programs) && SuiteFolderIn(programs, folderName, folder)) {
            work(programs, folder);
        }
    }
}

// The calling account's own shell folder, as a 32-bit process sees it.
bool OwnSpecialFolder(int csidl, CStringEx& path) {
    wchar_t folder[MAX_PATH] = {};
    if (!SHGetSpecialFolderPathW(nullptr, folder, csidl, FALSE)) {
        return false;
    }
    path = folder;
    return true;
}

}  // namespace

void AddShortcuts() {
    CStringEx root;
    CStringEx resLibrary;
    CStringEx productCode;
    if (!FindRootWithResources(root, resLibrary) ||
        !GetRegString(HKEY_LOCAL_MACHINE, kSuiteKey, L"ProductCode", productCode, 0) ||
        productCode.IsEmpty()) {
        return;
    }
    const SuiteTextLibrary res(root, kResLibrary);
    const SuiteTextLibrary oi3(root, kOI3ResLibrary);
    CStringEx msiexec;
    if (!GetMsiexecPath(msiexec)) {
        return;
    }
    CStringEx companion;
    const CStringEx folderName = GetCompanionAppName(companion) ? oi3.Text(kSuiteFolderNameId)
                                                                : CStringEx(kCompanionProductName);
    const CStringEx oneClick = InRoot(root, kOneClickExe);
    const CStringEx installer = InRoot(root, kInstallerExe);
    CStringEx uninstallArguments(L"/x ");
    uninstallArguments += productCode;
    const Shortcut shortcuts[] = {
        {res.Text(kOneClickNameId), oneClick, CStringEx(), oneClick, kOneClickIcon},
        {oi3.Text(kSettingsNameId), installer, kSettingsArguments, resLibrary, kSettingsIcon},
        {oi3.Text(kHelpNameId), installer, kHelpArguments, resLibrary, kHelpIcon},
        {oi3.Text(kUninstallNameId), msiexec, uninstallArguments, CStringEx(), 0},
    };
    const Shortcut& oneClickShortcut = shortcuts[0];

    HWND owner = GetActiveWindow();
    const ActiveUserFolders folders;
    ForEachSuiteFolder(folders, folderName, [&](const CStringEx&, const CStringEx& folder) {
        if (GetFileAttributesW(folder.c_str()) == INVALID_FILE_ATTRIBUTES) {
            CreateDirectoryW(folder.c_str(), nullptr);
        }
        for (const Shortcut& shortcut : shortcuts) {
            CreateShortcut(owner, folder, shortcut, root);
        }
    });
    CStringEx desktop;
    if (!folders.Get(CSIDL_COMMON_DESKTOPDIRECTORY, desktop) ||
        FAILED(CreateShortcut(owner, desktop, oneClickShortcut, root))) {
        if (folders.Get(CSIDL_DESKTOP, desktop)) {
            CreateShortcut(owner, desktop, oneClickShortcut, root);
        }
    }
    NotifyShellOfShortcuts();
}

int UpdateShortcuts() {
    CStringEx root;
    CStringEx resLibrary;
    if (!FindRootWithResources(root, resLibrary)) {
        return 0;
    }
    const SuiteTextLibrary res(root, kResLibrary);
    const SuiteTextLibrary oi3(root, kOI3ResLibrary);
    const CStringEx oneClickName = res.Text(kOneClickNameId);
    const CStringEx settingsName = oi3.Text(kSettingsNameId);
    const CStringEx newFolderName = oi3.Text(kSuiteFolderNameId);
    const CStringEx oldFolderName = InstalledFolderName();
    const CStringEx oneClick = InRoot(root, kOneClickExe);
    const CStringEx installer = InRoot(root, kInstallerExe);

    HWND owner = GetActiveWindow();
    const ActiveUserFolders folders;
    ForEachSuiteFolder(
        folders, oldFolderName, [&](const CStringEx& programs, const CStringEx& oldFolder) {
            UpdateLinkIcon(owner, oldFolder.c_str(), oneClick.c_str(), nullptr, oneClick.c_str(),
                           kOneClickIcon);
            UpdateLinkIcon(owner, oldFolder.c_str(), installer.c_str(), kSettingsArguments,
                           resLibrary.c_str(), kSettingsIcon);
            RenameLinks(owner, oldFolder, oneClick, nullptr, oneClickName);
            RenameLinks(owner, oldFolder, installer, kSettingsArguments, settingsName);
            CStringEx newFolder;
            if (oldFolderName.CompareNoCase(newFolderName.c_str()) != 0 &&
                !IsFolderEmpty(oldFolder.c_str()) &&
                SuiteFolderIn(programs, newFolderName, newFolder)) {
                MoveLinkTargetIcon(owner, oldFolder.c_str(), newFolder.c_str(), nullptr);
            }
        });
    int desktopResult = 0;
    for (int csidl : kDesktops) {
        CStringEx desktop;
        folders.Get(csidl, desktop);
        UpdateLinkIcon(owner, desktop.c_str(), oneClick.c_str(), nullptr, oneClick.c_str(),
                       kOneClickIcon);
        if (RenameLinks(owner, desktop, oneClick, nullptr, oneClickName) != 0) {
            desktopResult = 1;
        }
    }
    NotifyShellOfShortcuts();
    return desktopResult;
}

void MoveShortcuts() {
    wchar_t wow64[MAX_PATH] = {};
    if (!MrvGetSystemWow64Directory(wow64, MAX_PATH)) {
        TraceLevel1(TraceValue("MoveShortcuts: MrvGetSystemWow64Directory failed!\n"));
        return;
    }
    CStringEx root;
    if (!GetShortcutRoot(root) || !RunsUnderWow64()) {
        return;
    }
    const CStringEx folderName = InstalledFolderName();
    if (!IsPlainName(folderName)) {
        return;
    }
    HWND owner = GetActiveWindow();
    const ActiveUserFolders folders;
    CStringEx own;
    CStringEx source;
    CStringEx common;
    CStringEx destination;
    if (OwnSpecialFolder(CSIDL_PROGRAMS, own)) {
        CStringEx::PathAppend(own, folderName.c_str());
        if (Wow64ProfileFolder(wow64, own, source) && folders.Get(CSIDL_COMMON_PROGRAMS, common) &&
            SuiteFolderIn(common, folderName, destination)) {
            MoveLinkTargetIcon(owner, source.c_str(), destination.c_str(), nullptr);
        }
    }
    if (OwnSpecialFolder(CSIDL_DESKTOP, own) && Wow64ProfileFolder(wow64, own, source) &&
        folders.Get(CSIDL_COMMON_DESKTOPDIRECTORY, destination)) {
        MoveLinkTargetIcon(owner, source.c_str(), destination.c_str(), folderName.c_str());
    }
}

void UnInstallShortcuts() {
    CStringEx root;
    CStringEx msiexec;
    if (!GetShortcutRoot(root) || !GetMsiexecPath(msiexec)) {
        return;
    }
    const CStringEx oneClick = InRoot(root, kOneClickExe);
    const CStringEx installer = InRoot(root, kInstallerExe);
    const CStringEx folderName = InstalledFolderName();
    const LinkRule rules[] = {
        {oneClick.c_str(), nullptr},
        {installer.c_str(), kSettingsArguments},
        {installer.c_str(), kHelpArguments},
        {msiexec.c_str(), nullptr},
    };

    HWND owner = GetActiveWindow();
    const ActiveUserFolders folders;
    ForEachSuiteFolder(folders, folderName, [&](const CStringEx&, const CStringEx& folder) {
        DeleteLinksByTargets(owner, folder.c_str(), rules, sizeof(rules) / sizeof(rules[0]));
        if (IsFolderEmpty(folder.c_str())) {
            RemoveDirectoryW(folder.c_str());
        }
    });
    for (int csidl : kDesktops) {
        CStringEx desktop;
        if (folders.Get(csidl, desktop)) {
            DeleteLinksByTarget(owner, desktop.c_str(), oneClick.c_str(), nullptr);
        }
    }
    NotifyShellOfShortcuts();
}
