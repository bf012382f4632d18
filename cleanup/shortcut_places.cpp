#include "cleanup/shortcut_places.h"

#include <shlobj.h>
#include <shlwapi.h>
// shlwapi's name macro would turn CStringEx::PathAppend into another name.
#undef PathAppend

#include "base/call_process.h"
#include "base/os_version.h"
#include "base/path_api.h"
#include "base/reparse_guard.h"
#include "base/trace.h"
#include "cleanup/companion_app.h"
#include "cleanup/shortcut_texts.h"

bool GetShortcutRoot(CStringEx& root) {
    CPathApi::GetQMRootPath(root);
    return !root.IsEmpty() && root.GetLength() < MAX_PATH && !PathIsRelativeW(root.c_str());
}

bool GetMsiexecPath(CStringEx& path) {
    wchar_t folder[MAX_PATH] = {};
    // Without a WOW64 folder (32-bit Windows) the 32-bit msiexec.exe is the
    // system folder's; the Windows folder holds none.
    if (!MrvGetSystemWow64Directory(folder, MAX_PATH)) {
        UINT length = GetSystemDirectoryW(folder, MAX_PATH);
        if (length == 0 || length >= MAX_PATH) {
            TraceLevel1(TraceValue("GetSystemWindowsDirectory failed!\n"));
            return false;
        }
    }
    path = folder;
    CStringEx::PathAppend(path, L"msiexec.exe");
    return true;
}

CStringEx InstalledFolderName() {
    CStringEx name;
    if (!GetCompanionAppName(name)) {
        name = kCompanionProductName;
    }
    return name;
}

bool SuiteFolderIn(const CStringEx& special, const CStringEx& name, CStringEx& folder) {
    if (special.IsEmpty() || !IsPlainName(name)) {
        return false;
    }
    folder = special;
    CStringEx::PathAppend(folder, name.c_str());
    return folder.GetLength() < MAX_PATH && IsFreeOfReparsePoints(special.c_str(), folder.c_str());
}

ActiveUserFolders::ActiveUserFolders() : m_token(CQMCallProcess::GetActiveSessionUserToken()) {}

bool ActiveUserFolders::Get(int csidl, CStringEx& path) const {
    wchar_t folder[MAX_PATH] = {};
    if (SHGetFolderPathW(GetActiveWindow(), csidl, m_token.get(), SHGFP_TYPE_DEFAULT, folder) !=
            S_OK ||
        folder[0] == L'\0') {
        path.Empty();
        return false;
    }
    path = folder;
    return true;
}

void NotifyShellOfShortcuts() {
    SHChangeNotify(SHCNE_ALLEVENTS, SHCNF_IDLIST, nullptr, nullptr);
}

bool Wow64ProfileFolder(const wchar_t* wow64Dir, const CStringEx& profilePath, CStringEx& folder) {
    int at = profilePath.Find(L"config");
    if (wow64Dir == nullptr || wow64Dir[0] == L'\0' || at < 0) {
        return false;
    }
    folder = wow64Dir;
    folder += L'\\';
    folder += profilePath.Mid(at);
    return folder.GetLength() < MAX_PATH;
}
