#include "notes/product_locations.h"

// Filled in with the product location lookups.
bool GetQMInstallPath(wchar_t*, DWORD) {
    return false;
}
bool GetQMInstallPathFromReg(HKEY, wchar_t*, DWORD) {
    return false;
}
bool GetNotesPath(wchar_t*, DWORD) {
    return false;
}
DWORD GetNotesVersion() {
    return 6;
}
bool GetNIPath(wchar_t*, DWORD) {
    return false;
}
bool GetNIPathAnyUser(wchar_t*, DWORD) {
    return false;
}
bool GetNotesMultiUser(DWORD*) {
    return false;
}
bool IsCitrixServer() {
    return false;
}
bool GetEmbeddedSTPath(wchar_t*, DWORD, DWORD*) {
    return false;
}
bool GetEmbeddedSTDataPath(wchar_t*, DWORD, DWORD*) {
    return false;
}
bool GetSametimePath(wchar_t*, DWORD, DWORD*) {
    return false;
}
bool GetSametimeConfigPath(int, CStringEx&) {
    return false;
}
bool GetAppDataMrvQMPath(const wchar_t*, CStringEx&) {
    return false;
}

#include "base/path_api.h"

bool CPathApi::GetQMRootPath(CStringEx& out) {
    out.Empty();
    return true;
}
