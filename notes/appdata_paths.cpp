// The suite's data folders "<AppData>\Mirovan\Quillmark Tools", per user and
// for all users, created on first use.
#include <shlobj.h>

#include <string>

#include "base/com_owners.h"
#include "base/reparse_guard.h"
#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"

namespace {

const size_t kAppDataLimitChars = 2 * MAX_PATH;

}  // namespace

bool GetMrvQMDataPath(int csidl, const char* caller, const wchar_t* name, CStringEx& out) {
    const std::string who(caller);
    if (name == nullptr) {
        TraceLevel1(TraceValue(who + ": input para was NULL!"));
        return false;
    }
    wchar_t folder[MAX_PATH] = {};
    {
        UniqueCoTaskMem itemList;
        PIDLIST_ABSOLUTE pidl = nullptr;
        HRESULT hr = SHGetSpecialFolderLocation(nullptr, csidl, &pidl);
        itemList.reset(pidl);
        if (FAILED(hr) || pidl == nullptr || !SHGetPathFromIDListW(pidl, folder)) {
            TraceLevel1(TraceValue(who + ": SHGetSpecialFolderLocation FAILED!"));
            return false;
        }
    }
    if (wcsnlen(folder, MAX_PATH) >= kAppDataLimitChars) {
        TraceLevel1(TraceValue(who + ": Get FilePath was overload!"));
        return false;
    }
    wchar_t mirovan[MAX_PATH];
    wchar_t suite[MAX_PATH];
    wchar_t path[MAX_PATH];
    bool built = JoinFilePath(folder, L"Mirovan", mirovan) &&
                 JoinFilePath(mirovan, L"Quillmark Tools", suite);
    if (built && name[0] == L'\0') {
        wcscpy(path, suite);
    } else if (built) {
        built = JoinFilePath(suite, name, path);
    }
    if (!built) {
        TraceLevel1(TraceValue(who + ": Get FilePath was overload!"));
        return false;
    }
    // The folders are the user's: a link planted in them would carry the
    // caller's file work elsewhere.
    if (!IsFreeOfReparsePoints(folder, path)) {
        return false;
    }
    // An existing folder is fine; a folder that cannot be created shows in
    // the caller's own file work.
    CreateDirectoryW(mirovan, nullptr);
    CreateDirectoryW(suite, nullptr);
    TraceLevel1(TraceValue(caller), TraceNamed("strFilePath", path));
    out = path;
    return true;
}

bool GetAppDataMrvQMPath(const wchar_t* name, CStringEx& out) {
    return GetMrvQMDataPath(CSIDL_APPDATA, "GetAppDataMrvQMPath", name, out);
}
