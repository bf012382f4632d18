// The suite's Windows Installer registrations: its four upgrade codes, in
// the order every lookup tries them, and the products Windows Installer
// filed under an upgrade code.
#pragma once

#include <windows.h>

#include <vector>

#include "base/string_ex.h"

// Packed upgrade codes, oldest lookup first.
extern const wchar_t* const kSuiteUpgradeCodes[4];

// The braced product codes listed as value names of HKLM
// "Software\Microsoft\Windows\CurrentVersion\Installer\UpgradeCodes\<code>"
// in the given registry view, in the order listed. A name that is not a
// packed code (32 characters) is left out.
std::vector<CStringEx> ProductsOfUpgradeCode(const wchar_t* packedUpgradeCode, REGSAM view);

// "SOFTWARE\Microsoft\Windows\CurrentVersion\Uninstall\" and the braced code.
CStringEx UninstallKeyOf(const CStringEx& bracedProductCode);
