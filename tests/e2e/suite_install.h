// The suite as Windows Installer registers it, and the suite's root folder
// with the files its shortcuts use, for the shortcut and UI language tests.
#pragma once

#include <windows.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace suite_install {

const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kUpgradeCodes[] =
    L"Software\\Microsoft\\Windows\\CurrentVersion\\Installer\\UpgradeCodes\\";
const wchar_t* const kUpgradeCode[] = {
    L"D246995CF3A71534DA5CB21A176B54E1",
    L"1A705790D0FBFFE4DBC7B0F099009CD9",
    L"01B86E973310E6B41B32D3838B0D7F54",
    L"B65785237423439438E10A099BA54F48",
};
// One product code in its packed and braced forms.
const wchar_t kPackedProduct[] = L"39A1EB3B91C93B54EAD80FE3C665084C";
const wchar_t kBracedProduct[] = L"{B3BE1A93-9C19-45B3-AE8D-F03E6C5680C4}";
const std::wstring kUninstallEntry =
    std::wstring(L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\") + kBracedProduct;

// A product filed under kUpgradeCode[code] (upgrade code in upgradeView, its
// uninstall entry in entryView), removed again at the end.
class InstalledProduct {
public:
    InstalledProduct(int code, REGSAM upgradeView, REGSAM entryView)
        : m_upgradeKey(std::wstring(kUpgradeCodes) + kUpgradeCode[code]),
          m_upgradeView(upgradeView),
          m_entryView(entryView) {
        RegPutString(HKEY_LOCAL_MACHINE, m_upgradeKey, kPackedProduct, L"", m_upgradeView);
        RegMakeKey(HKEY_LOCAL_MACHINE, kUninstallEntry, m_entryView);
    }
    ~InstalledProduct() {
        RegRemoveTree(HKEY_LOCAL_MACHINE, m_upgradeKey, m_upgradeView);
        RegRemoveTree(HKEY_LOCAL_MACHINE, kUninstallEntry, m_entryView);
    }
    InstalledProduct(const InstalledProduct&) = delete;
    InstalledProduct& operator=(const InstalledProduct&) = delete;

    REGSAM entryView() const { return m_entryView; }

private:
    std::wstring m_upgradeKey;
    REGSAM m_upgradeView;
    REGSAM m_entryView;
};

// Puts the resource libraries of a stand-in release ("" for the current one,
// "oldrelease\\" or "badtexts\\") into the root folder.
inline void UseTexts(const std::wstring& root, const std::wstring& variant = L"") {
    for (const wchar_t* library : {L"qmRes.dll", L"qmOI3Res.dll"}) {
        CopyFileW(FakePath((variant + library).c_str()).c_str(), JoinPath(root, library).c_str(),
                  FALSE);
    }
}

// Makes root the suite's root folder, holding the programs the shortcuts
// point at and the current texts.
inline void InstallSuite(const std::wstring& root, const wchar_t* productCode) {
    for (const wchar_t* program : {L"qmoneclk.exe", L"qminst.exe"}) {
        CopyFileW(FakePath(program).c_str(), JoinPath(root, program).c_str(), FALSE);
    }
    UseTexts(root);
    RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", root);
    RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"ProductCode", productCode);
}

}  // namespace suite_install
