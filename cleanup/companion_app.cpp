#include "cleanup/companion_app.h"

#include <windows.h>

#include "base/registry.h"
#include "cleanup/suite_products.h"

const wchar_t kCompanionProductName[] = L"Mirovan Meetings";

namespace {

struct UpgradeLookup {
    int code;  // index into kSuiteUpgradeCodes
    REGSAM view;
};

// The first code is looked up in the 64-bit view only, the others in the
// 64-bit view and then in the 32-bit one.
const UpgradeLookup kLookups[] = {
    {0, KEY_WOW64_64KEY},
    {1, KEY_WOW64_64KEY},
    {1, 0},
    {2, KEY_WOW64_64KEY},
    {2, 0},
    {3, KEY_WOW64_64KEY},
    {3, 0},
};

const int kNameChars = MAX_PATH;

bool FindInstalledName(CStringEx& name) {
    for (const UpgradeLookup& lookup : kLookups) {
        for (const CStringEx& product :
             ProductsOfUpgradeCode(kSuiteUpgradeCodes[lookup.code], lookup.view)) {
            GetRegString(HKEY_LOCAL_MACHINE, UninstallKeyOf(product).c_str(), L"DisplayName", name,
                         lookup.view);
            if (!name.IsEmpty()) {
                return true;
            }
        }
    }
    return false;
}

}  // namespace

bool GetCompanionAppName(CStringEx& name) {
    name.Empty();
    if (!FindInstalledName(name)) {
        GetRegString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\Uninstall", L"AppName", name, 0);
    }
    if (name.GetLength() >= kNameChars) {
        name.Empty();
    }
    return !name.IsEmpty();
}
