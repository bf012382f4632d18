// The suite's per-user data folder "<roaming AppData>\Mirovan\Quillmark Tools",
// created on first use.
#include <shlobj.h>

#include "base/com_owners.h"
#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"

namespace {

const size_t kAppDataLimitChars = 2 * MAX_PATH;

// folder = folder joined with name; false when that would not fit.
bool Append(wchar_t (&folder)[MAX_PATH], const wchar_t* name) {
    wchar_t joined[MAX_PATH];
    if (!JoinFilePath(folder, name, joined)) {
        return false;
    }
    wcscpy(folder, joined);
    return true;
}

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
    // An existing folder is fine; a folder that cannot be created shows in
    // the caller's own file work.
    bool built = Append(folder, L"Mirovan");
    if (built) {
        CreateDirectoryW(folder, nullptr);
        built = Append(folder, L"Quillmark Tools");
    }
    if (built) {
        CreateDirectoryW(folder, nullptr);
        built = name[0] == L'\0' || Append(folder, name);
    }
    if (!built) {
        TraceLevel1(TraceValue("GetAppDataMrvQMPath: Get FilePath was overload!"));
        return false;
    }
    TraceLevel1(TraceValue("GetAppDataMrvQMPath"), TraceNamed("strFilePath", folder));
    out = folder;
    return true;
}
