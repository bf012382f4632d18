// What earlier releases and separately installed integrations left behind.
#pragma once

#include <windows.h>

// The Office smart-tag action key under HKEY_CURRENT_USER, in both registry
// views on 64-bit Windows.
void InstallSmartTag();
void UninstallSmartTag();
// The old context-menu classes and share-menu handler of the calling account.
void ClearOldRMenuReg();
void RemoveOldOIInstallFiles();
void RemoveOldOIRegistry(HKEY root);
void RemoveUpdTempFolder();
void UnRegisterOldClassIDs();
void RegQM64BitAddin();
