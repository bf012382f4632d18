#include "cleanup/installer_registration.h"

const wchar_t kOldNotesUpgradeCode[] = L"UpgradeCodes\\39A1EB3B91C93B54EAD80FE3C665084C";
const wchar_t kOldOutlookUpgradeCode[] = L"UpgradeCodes\\E4698B57199D4B241AF129150B2CCAE2";

// The registration cleanup arrives with the installer registration work.
void DelInstallerKeyByUpgrade(const wchar_t*) {}
void DelInstallerKeyOnCurrentUserForSMS(const wchar_t*) {}
void ModifyAdminMsiDisplayVersion() {}
