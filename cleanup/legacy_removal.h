// What earlier releases and separately installed integrations left behind.
#pragma once

#include <windows.h>

// The Office smart-tag action key under HKEY_CURRENT_USER, in both registry
// views on 64-bit Windows.
void InstallSmartTag();
void UninstallSmartTag();
// The old context-menu classes and share-menu handler of the calling account.
void ClearOldRMenuReg();
// Schedules the old Outlook integration's files and folder for deletion at
// the next restart (old_outlook_files.cpp).
void RemoveOldOIInstallFiles();
void RemoveOldOIRegistry(HKEY root);
void RemoveUpdTempFolder();
// The retired browser and Office add-ins' COM registrations of the machine.
void UnRegisterOldClassIDs();
// Unregisters the suite's 64-bit add-in libraries present in the install
// folder (addin_registration.cpp).
void RegQM64BitAddin();
// Runs the 64-bit regsvr32 with "/s", option and the quoted library path, in
// the library's folder, and waits for it; 0 on 32-bit Windows.
BOOL Reg64BitDLL(const wchar_t* library, const wchar_t* option);
