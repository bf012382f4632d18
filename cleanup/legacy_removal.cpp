#include "cleanup/legacy_removal.h"

#include "base/os_version.h"
#include "base/registry.h"
#include "base/registry_delete.h"
#include "base/trace.h"

// These keys belong to the calling account's own HKEY_CURRENT_USER: none of
// the operations below is redirected to the console user.
namespace {

const wchar_t kSmartTagActionKey[] =
    L"Software\\Microsoft\\Office\\Common\\Smart Tag\\Actions\\"
    L"{0A4C50AC-AD3F-4245-B324-3C8696A3408A}";
const wchar_t kOldRMenuClassKey[] = L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu";
const wchar_t kOldRMenuClass1Key[] = L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu.1";
const wchar_t kOldShareMenuKey[] =
    L"SOFTWARE\\Classes\\*\\shellex\\ContextMenuHandlers\\MirovanShareMenu";
const wchar_t kOldOutlookGeneralKey[] = L"Software\\Mirovan_Outlook\\General";

}  // namespace

void InstallSmartTag() {
    CreateRegKey(HKEY_CURRENT_USER, kSmartTagActionKey, 0);
    if (Is64BitSystem()) {
        CreateRegKey(HKEY_CURRENT_USER, kSmartTagActionKey, KEY_WOW64_64KEY);
    }
}

void UninstallSmartTag() {
    CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, kSmartTagActionKey, 0);
    if (Is64BitSystem()) {
        CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, kSmartTagActionKey, KEY_WOW64_64KEY);
    }
}

void ClearOldRMenuReg() {
    DeleteRegValue(HKEY_CURRENT_USER, kOldRMenuClassKey, L"CurVer", 0);
    DeleteRegValue(HKEY_CURRENT_USER, kOldRMenuClassKey, L"CLSID", 0);
    CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, kOldRMenuClassKey, 0);
    DeleteRegValue(HKEY_CURRENT_USER, kOldRMenuClass1Key, L"CLSID", 0);
    CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, kOldRMenuClass1Key, 0);
    CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, kOldShareMenuKey, 0);
}

void RemoveOldOIRegistry(HKEY root) {
    TraceLevel1(TraceValue("RemoveOldOIRegistry(HKEY hMainKey)."));
    DeleteRegValue(root, kOldOutlookGeneralKey, L"NoSchedulePermission", 0);
}

void UnRegisterOldClassIDs() {
    const wchar_t kOldToolbarClass[] = L"{90E2BA2E-DD1B-4cde-9134-7A8B86D33CA7}";
    const wchar_t* const kRetiredKeys[] = {
        L"SOFTWARE\\Classes\\CLSID\\{90E2BA2E-DD1B-4cde-9134-7A8B86D33CA7}",
        L"SOFTWARE\\Classes\\QmOneCli.MrvIEToolbar.1",
        L"SOFTWARE\\Classes\\QmOneCli.MrvIEToolbar",
        nullptr,  // the toolbar's value, in its turn
        L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Explorer\\Browser Helper Objects\\"
        L"{90E2BA2E-DD1B-4cde-9134-7A8B86D33CA7}",
        L"SOFTWARE\\Classes\\CLSID\\{0A4C50AC-AD3F-4245-B324-3C8696A3408A}",
        L"SOFTWARE\\Classes\\QmMrvst.MrvAction.1",
        L"SOFTWARE\\Classes\\QmMrvst.MrvAction",
    };
    for (const wchar_t* key : kRetiredKeys) {
        if (key == nullptr) {
            DeleteRegValue(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Microsoft\\Internet Explorer\\Toolbar",
                           kOldToolbarClass, 0);
        } else {
            CRegistry::RecurDeleteKey(HKEY_LOCAL_MACHINE, key, 0);
        }
    }
}
