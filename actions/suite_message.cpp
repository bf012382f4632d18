#include "actions/suite_message.h"

#include <shlwapi.h>

#include "base/path_api.h"
#include "base/proc_address.h"
#include "base/win_handles.h"

namespace {

using QclMessageBoxFn = int(WINAPI*)(HWND, const wchar_t*, const wchar_t*, UINT);

}  // namespace

int ShowSuiteMessage(HWND owner, const wchar_t* text, const wchar_t* caption, UINT style) {
    CStringEx root;
    CPathApi::GetQMRootPath(root);
    if (root.IsEmpty()) {
        return 0;
    }
    wchar_t libraryPath[MAX_PATH] = {};
    if (PathCombineW(libraryPath, root.c_str(), L"qmONIUI.dll") == nullptr) {
        return 0;
    }
    UniqueModule library(LoadLibraryW(libraryPath));
    if (!library) {
        return 0;
    }
    auto messageBox = GetProcAs<QclMessageBoxFn>(library.get(), "QclMessageBox");
    if (messageBox == nullptr) {
        return 0;
    }
    return messageBox(owner, text, caption, style);
}
