#include "presence/status_paths.h"

#include <shlobj.h>
#include <userenv.h>

#include <string>

#include "base/reparse_guard.h"
#include "base/staged_file.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"
#include "presence/custom_status.h"

namespace {

const wchar_t kTemplateFile[] = L"MirovanStatus.xml";

std::wstring ShellFolder(int csidl) {
    wchar_t folder[MAX_PATH] = {};
    return SUCCEEDED(SHGetFolderPathW(nullptr, csidl, nullptr, SHGFP_TYPE_CURRENT, folder)) ? folder
                                                                                            : L"";
}

std::wstring ProfilesFolder() {
    wchar_t folder[MAX_PATH] = {};
    DWORD size = MAX_PATH;
    return GetProfilesDirectoryW(folder, &size) ? folder : L"";
}

// True when path lies inside folder (not equal to it).
bool IsInside(const std::wstring& folder, const wchar_t* path) {
    size_t length = folder.size();
    while (length > 0 && folder[length - 1] == L'\\') {
        --length;
    }
    return length > 0 && wcslen(path) > length + 1 &&
           CompareStringOrdinal(path, static_cast<int>(length), folder.c_str(),
                                static_cast<int>(length), TRUE) == CSTR_EQUAL &&
           path[length] == L'\\';
}

}  // namespace

bool GetStatusTemplatePath(CStringEx& out) {
    wchar_t folder[MAX_PATH] = {};
    if (!GetQMInstallPath(folder, MAX_PATH)) {
        out.Empty();
        return false;
    }
    out = JoinLocalPath(folder, kTemplateFile);
    return true;
}

bool CopyStatusTemplate(const wchar_t* path) {
    CStringEx source;
    if (!GetStatusTemplatePath(source) || !IsRegularFile(source.c_str())) {
        return false;
    }
    StagedFile staged(path);
    return staged.Begin() && CopyFileW(source.c_str(), staged.Path(), FALSE) && staged.Commit();
}

bool StatusFilePathFromUrl(const wchar_t* url, CStringEx& path) {
    path.Empty();
    if (url == nullptr) {
        return false;
    }
    CStringEx text(url);
    int scheme = text.Find(L"file://");
    if (scheme >= 0) {
        text.Delete(scheme, 7);
    }
    while (text.GetAt(0) == L'/' && text.GetAt(1) == L'/') {
        text.Delete(0, 2);
    }
    while (text.GetAt(0) == L'/') {
        text.Delete(0, 1);
    }
    text.Replace(L'/', L"\\");
    wchar_t full[MAX_PATH] = {};
    DWORD length = 0;
    if (!IsFullFolderPath(text.c_str()) ||
        (length = GetFullPathNameW(text.c_str(), MAX_PATH, full, nullptr)) == 0 ||
        length >= MAX_PATH) {
        return false;
    }
    path = full;
    return true;
}

bool IsStatusPathSafe(const wchar_t* path) {
    std::wstring root;
    for (const std::wstring& folder :
         {ProfilesFolder(), ShellFolder(CSIDL_COMMON_APPDATA), ShellFolder(CSIDL_APPDATA),
          ShellFolder(CSIDL_LOCAL_APPDATA)}) {
        if (IsInside(folder, path) && folder.size() > root.size()) {
            root = folder;
        }
    }
    return root.empty() || IsFreeOfReparsePoints(root.c_str(), path);
}

bool CMOCCustomStatusInstall::GetAllUserAppDataMrvQMFilePath(const wchar_t* name, CStringEx& out) {
    return GetMrvQMDataPath(CSIDL_COMMON_APPDATA,
                            "CMOCCustomStatusInstall::GetAllUserAppDataMrvQMFilePath", name, out);
}

bool CMOCCustomStatusInstall::GetAppDataMrvQMPath(const wchar_t* name, CStringEx& out) {
    return GetMrvQMDataPath(CSIDL_APPDATA, "CMOCCustomStatusInstall::GetAppDataMrvQMPath", name,
                            out);
}
