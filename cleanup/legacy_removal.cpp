#include "cleanup/legacy_removal.h"

// Filled in with the legacy component removal.
void InstallSmartTag() {}
void UninstallSmartTag() {}
void ClearOldRMenuReg() {}
void RemoveOldOIInstallFiles() {}
void RemoveOldOIRegistry(HKEY) {}
void UnRegisterOldClassIDs() {}
void RegQM64BitAddin() {}
