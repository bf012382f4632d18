#include "version/qm_version.h"

#include "base/com_owners.h"
#include "base/ms_dom.h"
#include "base/registry.h"
#include "base/suite_key.h"
#include "base/untrusted_xml_load.h"
#include "notes/plugin_paths.h"

namespace {

const wchar_t kUninstallKey[] =
    L"Software\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\QuillmarkTools";
const wchar_t kVersionFile[] = L"QM.xml";
const wchar_t kCurrentVersionPath[] = L"QM/VersionInfo/CurrentVersion";

// A "Path" that is empty or relative would name the working folder (under an
// installer, the system folder): it counts as absent.
bool ReadFolder(HKEY root, const wchar_t* key, REGSAM view, wchar_t* folder, DWORD capacity) {
    return GetRegString(root, key, L"Path", folder, capacity, view) && IsFullFolderPath(folder);
}

bool ReadNonEmpty(HKEY root, const wchar_t* name, REGSAM view, CStringEx& value) {
    return GetRegString(root, kSuiteKey, name, value, view) && !value.IsEmpty();
}

}  // namespace

BOOL GetQMInstallFolder(wchar_t* lpszFolder, DWORD capacity) {
    if (lpszFolder == nullptr || capacity == 0) {
        return FALSE;
    }
    if (ReadFolder(HKEY_LOCAL_MACHINE, kSuiteKey, KEY_WOW64_32KEY, lpszFolder, capacity) ||
        ReadFolder(HKEY_CURRENT_USER, kSuiteKey, 0, lpszFolder, capacity)) {
        return TRUE;
    }
    CStringEx uninstall;
    if (GetRegString(HKEY_CURRENT_USER, kUninstallKey, L"UninstallString", uninstall, 0) &&
        !uninstall.IsEmpty() &&
        ReadFolder(HKEY_CURRENT_USER, kUninstallKey, 0, lpszFolder, capacity)) {
        return TRUE;
    }
    lpszFolder[0] = L'\0';
    return FALSE;
}

BOOL GetQMVersionFromXml(CStringEx& strVersion) {
    strVersion.Empty();
    wchar_t folder[MAX_PATH] = {};
    if (!GetQMInstallFolder(folder, MAX_PATH)) {
        return FALSE;
    }
    const CStringEx path = JoinLocalPath(folder, kVersionFile);
    if (!IsRegularFile(path.c_str())) {
        return FALSE;
    }
    ComPtr<IUnknown> doc;
    ComPtr<IUnknown> node;
    UniqueBstr query(SysAllocString(kCurrentVersionPath));
    if (FAILED(CMSDom::MSDomCreate(doc.GetAddressOf())) ||
        LoadUntrustedXmlFile(doc.Get(), path.c_str()) != UntrustedXmlRead::kOk ||
        FAILED(CMSDom::SelectSingleChild(doc.Get(), query.get(), node.GetAddressOf())) ||
        FAILED(CMSDom::GetNodeValue(node.Get(), strVersion))) {
        strVersion.Empty();
        return FALSE;
    }
    return TRUE;
}

BOOL GetQMBuildNumber(CStringEx& strVersion) {
    if ((GetQMVersionFromXml(strVersion) && !strVersion.IsEmpty()) ||
        ReadNonEmpty(HKEY_CURRENT_USER, L"BuildNumber", 0, strVersion) ||
        ReadNonEmpty(HKEY_LOCAL_MACHINE, L"BuildNumber", KEY_WOW64_32KEY, strVersion)) {
        return TRUE;
    }
    strVersion.Empty();
    return FALSE;
}
