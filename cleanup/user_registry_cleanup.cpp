#include "cleanup/user_registry_cleanup.h"

#include <windows.h>

#include "base/registry.h"
#include "base/registry_delete.h"
#include "base/user_profile.h"

namespace {
const wchar_t kRunKey[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
const wchar_t kRunOnceKey[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Runonce";
}  // namespace

// Best effort: each step runs whatever the one before it did.
void ClearCurUserQMReg() {
    HKEY root = GetUserRegRoot();
    if (root == nullptr) {
        root = HKEY_CURRENT_USER;
    }
    DeleteRegValue(root, kRunKey, L"QMOneClick", 0);
    DeleteRegValue(root, kRunKey, L"QMIM.exe", 0);
    DeleteRegValue(root, kRunKey, L"qmmsgfrm.exe", 0);
    RecursDeleteRegisterKey(root, L"Software\\Mirovan", L"QmkTools");
    DeleteRegValue(root, kRunOnceKey, L"Mirovan_QM", 0);
}
