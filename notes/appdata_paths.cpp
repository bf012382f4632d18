// The suite's per-user data folder "<roaming AppData>\Mirovan\Quillmark Tools",
// created on first use.
#include <shlobj.h>

#include "base/com_owners.h"
#include "base/reparse_guard.h"
#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"

namespace {

const size_t kAppDataLimitChars = 2 * MAX_PATH;

}  // namespace

bool GetAppDataMrvQMPath(const wchar_t* name, CStringEx& out) {
    if (name == nullptr) {
        TraceLevel1(TraceValue("GetAppDataMrvQMPath: input para was NULL!"));
        return false;
    }
    wchar_t folder[MAX_PATH] = {};
    {
        UniqueCoTaskMem itemList;
        PIDLIST_ABSOLUTE pidl = nullptr;
        HRESULT hr = SHGetSpecialFolderLocation(nullptr, CSIDL_APPDATA, &pidl);
        itemList.reset(pidl);
        if (FAILED(hr) || pidl == nullptr || !SHGetPathFromIDListW(pidl, folder)) {
            TraceLevel1(TraceValue("GetAppDataMrvQMPath: SHGetSpecialFolderLocation FAILED!"));
            return false;
        }
    }
    if (wcsnlen(folder, MAX_PATH) >= kAppDataLimitChars) {
        TraceLevel1(TraceValue("GetAppDataMrvQMPath: Get FilePath was overload!"));
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
        TraceLevel1(TraceValue("GetAppDataMrvQMPath: Get FilePath was overload!"));
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
    TraceLevel1(TraceValue("GetAppDataMrvQMPath"), TraceNamed("strFilePath", path));
    out = path;
    return true;
}
