// Windows Installer registrations of the old Notes and Outlook integrations.
#pragma once

#include "base/string_ex.h"

// Upgrade-code subkeys of the old integrations.
extern const wchar_t kOldNotesUpgradeCode[];    // "UpgradeCodes\39A1..."
extern const wchar_t kOldOutlookUpgradeCode[];  // "UpgradeCodes\E469..."

void DelInstallerKeyByUpgrade(const wchar_t* upgradeSubkey);
void DelInstallerKeyOnCurrentUserForSMS(const wchar_t* upgradeSubkey);
void ModifyAdminMsiDisplayVersion();
