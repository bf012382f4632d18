// The suite's own install folder, as the Notes and Sametime code finds it.
#include "notes/product_locations.h"

#include "base/suite_key.h"
#include "base/trace.h"
#include "notes/location_values.h"

namespace {

const wchar_t kSuitePathValue[] = L"Path";

}  // namespace

bool GetQMInstallPathFromReg(HKEY root, wchar_t* lpszPath, DWORD capacity) {
    if (lpszPath == nullptr) {
        TraceLevel8(TraceValue("GetQMInstallPathFromReg: Input Para is NULL!"));
        return false;
    }
    return ReadFittingValue(root, kSuiteKey, kSuitePathValue, KEY_QUERY_VALUE, lpszPath, capacity);
}

bool GetQMInstallPath(wchar_t* lpszPath, DWORD capacity) {
    if (lpszPath == nullptr) {
        TraceLevel8(TraceValue("GetQMInstallPath: Input Para is NULL!"));
        return false;
    }
    if (GetQMInstallPathFromReg(HKEY_LOCAL_MACHINE, lpszPath, capacity)) {
        return true;
    }
    TraceLevel8(TraceValue("Can not find PATH!"));
    return GetQMInstallPathFromReg(HKEY_CURRENT_USER, lpszPath, capacity);
}
