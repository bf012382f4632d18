#include "base/path_api.h"

#include <shlwapi.h>

void CPathApi::GetResFilePath(HMODULE module, const wchar_t* fileName, CStringEx& out) {
    if (fileName == nullptr) {
        OutputDebugStringW(L"\nCPathApi::GetResFilePath: Invalid Input!\n");
        return;
    }
    wchar_t path[MAX_PATH] = {};
    DWORD length = GetModuleFileNameW(module, path, MAX_PATH);
    if (length == 0 || length >= MAX_PATH) {
        out.Empty();
        return;
    }
    PathRemoveFileSpecW(path);
    if (!PathAppendW(path, fileName)) {
        out.Empty();
        return;
    }
    out = path;
}

void CPathApi::RemoveFileSpec(CStringEx& path) {
    wchar_t* buffer = path.GetBuffer(-1);
    if (buffer == nullptr) {
        return;
    }
    PathRemoveFileSpecW(buffer);
    path.ReleaseBuffer(-1);
}
