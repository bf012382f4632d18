#include "cleanup/suite_products.h"

#include "base/registry.h"
#include "cleanup/packed_guid.h"

const wchar_t* const kSuiteUpgradeCodes[4] = {
    L"D246995CF3A71534DA5CB21A176B54E1",
    L"1A705790D0FBFFE4DBC7B0F099009CD9",
    L"01B86E973310E6B41B32D3838B0D7F54",
    L"B65785237423439438E10A099BA54F48",
};

namespace {

const wchar_t kUpgradeCodesKey[] =
    L"Software\\Microsoft\\Windows\\CurrentVersion\\Installer\\UpgradeCodes\\";
const wchar_t kUninstallKey[] = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\";

}  // namespace

std::vector<CStringEx> ProductsOfUpgradeCode(const wchar_t* packedUpgradeCode, REGSAM view) {
    std::vector<CStringEx> products;
    if (packedUpgradeCode == nullptr) {
        return products;
    }
    CStringEx key(kUpgradeCodesKey);
    key += packedUpgradeCode;
    std::vector<CStringEx> names;
    EnumRegValueNames(HKEY_LOCAL_MACHINE, key.c_str(), names, view);
    for (const CStringEx& name : names) {
        wchar_t braced[MAX_PATH] = {};
        if (PackedGuidStringToGuid(name.c_str(), braced, MAX_PATH)) {
            products.push_back(CStringEx(braced));
        }
    }
    return products;
}

CStringEx UninstallKeyOf(const CStringEx& bracedProductCode) {
    CStringEx key(kUninstallKey);
    key += bracedProductCode;
    return key;
}
