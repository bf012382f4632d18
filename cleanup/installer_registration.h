// Windows Installer registrations of the old Notes and Outlook integrations.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

// Upgrade-code subkeys of the old integrations.
extern const wchar_t kOldNotesUpgradeCode[];    // "UpgradeCodes\39A1..."
extern const wchar_t kOldOutlookUpgradeCode[];  // "UpgradeCodes\E469..."

// Removes the products listed under the upgrade code, their uninstall entries
// and the upgrade-code key: the console user's registration, the machine's,
// and the machine's copy under CurrentVersion\Installer.
void DelInstallerKeyByUpgrade(const wchar_t* upgradeSubkey);
// The same in the calling account's own HKEY_CURRENT_USER only, for
// deployments that run in the user's own context.
void DelInstallerKeyOnCurrentUserForSMS(const wchar_t* upgradeSubkey);
// "Products\<code>" and "Features\<code>" below an open installer key.
void DelProductAndFeatures(HKEY installerKey, const wchar_t* packedCode);
// root\...\Uninstall\{braced code}.
void DelUninstallEntry(HKEY root, const wchar_t* packedCode);
// Calls "ModifyAdminMsiVersion" of the suite's installer-check library.
void ModifyAdminMsiDisplayVersion();
