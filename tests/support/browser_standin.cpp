#include "tests/support/browser_standin.h"

#include <windows.h>

#include "tests/support/file_util.h"
#include "tests/support/test_paths.h"

namespace {

const std::wstring kClassKey = L"SOFTWARE\\Classes\\CLSID\\{0002DF01-0000-0000-C000-000000000046}";
const std::wstring kLocalServerKey = kClassKey + L"\\LocalServer32";
const std::wstring kInprocServerKey = kClassKey + L"\\InprocServer32";

}  // namespace

BrowserStandIn::BrowserStandIn(const std::wstring& folder, BrowserServer server)
    : m_script(JoinPath(folder, L"page.txt")),
      m_log(JoinPath(folder, L"browser.log")),
      m_localServer32(HKEY_LOCAL_MACHINE, kLocalServerKey, L""),
      m_localServer64(HKEY_LOCAL_MACHINE, kLocalServerKey, L"", KEY_WOW64_64KEY) {
    SetPage("");
    // Wine would start its own browser from either view: both name ours.
    std::wstring program = server == BrowserServer::kMissing ? JoinPath(folder, L"none.exe")
                                                             : FakePath(L"iexplore.exe");
    for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
        RegPutString(HKEY_LOCAL_MACHINE, kLocalServerKey, L"",
                     L"\"" + program + L"\" \"" + m_script + L"\"", view);
    }
    if (server == BrowserServer::kInProcess) {
        RegPutString(HKEY_LOCAL_MACHINE, kInprocServerKey, L"", FakePath(L"iexplore_inproc.dll"));
        SetEnvironmentVariableW(L"QM_FAKE_PAGE_SCRIPT", m_script.c_str());
    }
}

BrowserStandIn::~BrowserStandIn() {
    RegRemoveTree(HKEY_LOCAL_MACHINE, kInprocServerKey);
    SetEnvironmentVariableW(L"QM_FAKE_PAGE_SCRIPT", nullptr);
}

void BrowserStandIn::SetPage(const std::string& lines) const {
    DeleteFileW(m_log.c_str());
    WriteFileBytes(m_script, "log " + Narrow(m_log) + "\n" + lines);
}

std::string BrowserStandIn::Calls() const {
    return ReadFileBytes(m_log);
}
