// The suite as its installer leaves it, for the shortcut and UI language
// tests: a product filed under one of the suite's upgrade codes, and the
// root folder with the programs and resource libraries the shortcuts use.
#pragma once

#include <windows.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace suite_install {

const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t* const kUpgradeCodes[] = {
    L"D246995CF3A71534DA5CB21A176B54E1", L"1A705790D0FBFFE4DBC7B0F099009CD9",
    L"01B86E973310E6B41B32D3838B0D7F54", L"B65785237423439438E10A099BA54F48"};
// The product's uninstall entry: its code {B3BE1A93-...}, packed below.
const std::wstring kUninstallEntry =
    L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\"
    L"{B3BE1A93-9C19-45B3-AE8D-F03E6C5680C4}";

inline std::wstring UpgradeKey(int code) {
    return std::wstring(
               L"Software\\Microsoft\\Windows\\CurrentVersion\\Installer\\UpgradeCodes\\") +
           kUpgradeCodes[code];
}

// The product under upgrade code `code` (in upgradeView), with its uninstall
// entry (in entryView).
inline void RegisterProduct(int code, REGSAM upgradeView, REGSAM entryView) {
    RegPutString(HKEY_LOCAL_MACHINE, UpgradeKey(code), L"39A1EB3B91C93B54EAD80FE3C665084C", L"",
                 upgradeView);
    RegMakeKey(HKEY_LOCAL_MACHINE, kUninstallEntry, entryView);
}

inline void RemoveProducts() {
    for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
        for (int code = 0; code < 4; ++code) {
            RegRemoveTree(HKEY_LOCAL_MACHINE, UpgradeKey(code), view);
        }
        RegRemoveTree(HKEY_LOCAL_MACHINE, kUninstallEntry, view);
    }
}

// The resource libraries of a stand-in release ("" for the current one,
// "oldrelease\\" or "badtexts\\") in the root folder.
inline void UseTexts(const std::wstring& root, const std::wstring& variant = L"") {
    for (const wchar_t* library : {L"qmRes.dll", L"qmOI3Res.dll"}) {
        CopyFileW(FakePath((variant + library).c_str()).c_str(), JoinPath(root, library).c_str(),
                  FALSE);
    }
}

// root as the suite's root folder, holding the programs the shortcuts point
// at and the current texts.
inline void InstallSuite(const std::wstring& root, const wchar_t* productCode) {
    for (const wchar_t* program : {L"qmoneclk.exe", L"qminst.exe"}) {
        CopyFileW(FakePath(program).c_str(), JoinPath(root, program).c_str(), FALSE);
    }
    UseTexts(root);
    RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", root);
    RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"ProductCode", productCode);
}

}  // namespace suite_install
