// The suite's root folder as the clean-up, shortcut, one-click and problem
// report code asks for it: the suite's "Path" string, or else the folder of
// the suite service's registered executable.
#include "base/os_version.h"
#include "base/path_api.h"
#include "base/registry.h"
#include "base/suite_key.h"

namespace {

const wchar_t kServer32Key[] = L"CLSID\\{A12A21B3-CFDA-497E-98C0-CE60D4D108C8}\\LocalServer32";
const wchar_t kServer32KeyWow64[] =
    L"Wow6432Node\\CLSID\\{A12A21B3-CFDA-497E-98C0-CE60D4D108C8}\\LocalServer32";

}  // namespace

bool CPathApi::GetQMRootPath(CStringEx& out) {
    CStringEx root;
    // The user's value stands in only when the machine has none at all, not
    // when the machine's value is empty.
    if (!GetRegString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", root, 0)) {
        GetRegString(HKEY_CURRENT_USER, kSuiteKey, L"Path", root, 0);
    }
    if (root.IsEmpty()) {
        OutputDebugStringW(L"CPathApi::GetQMRootPath, This case shouldn't be excuted!");
        const wchar_t* server = Is64BitSystem() ? kServer32KeyWow64 : kServer32Key;
        GetRegString(HKEY_CLASSES_ROOT, server, L"", root, 0);
        root.TrimLeft(L'"');
        root.TrimRight(L'"');
        RemoveFileSpec(root);
    }
    out = root;
    return true;
}
