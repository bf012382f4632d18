#include "tests/support/browser_standin.h"

#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kBrowserClassKey[] =
    L"SOFTWARE\\Classes\\CLSID\\{0002DF01-0000-0000-C000-000000000046}";

std::wstring ClassSubKey(const wchar_t* sub) {
    return std::wstring(kBrowserClassKey) + L"\\" + sub;
}

}  // namespace

BrowserStandIn::BrowserStandIn(const std::wstring& folder, BrowserServer server)
    : m_script(JoinPath(folder, L"page.txt")), m_log(JoinPath(folder, L"browser.log")) {
    MakeDirs(folder);
    SetPage("");
    std::wstring localServer;
    if (server == BrowserServer::kMissing) {
        localServer = L"\"" + JoinPath(folder, L"no such browser.exe") + L"\"";
    } else {
        // Even an in-process registration keeps the local server pointing at
        // the stand-in: Wine would otherwise start its own browser.
        localServer = L"\"" + FakePath(L"iexplore.exe") + L"\" \"" + m_script + L"\"";
    }
    const std::wstring localKey = ClassSubKey(L"LocalServer32");
    m_localServer32 = std::make_unique<RegValueGuard>(HKEY_LOCAL_MACHINE, localKey, L"");
    m_localServer64 =
        std::make_unique<RegValueGuard>(HKEY_LOCAL_MACHINE, localKey, L"", KEY_WOW64_64KEY);
    for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
        RegPutString(HKEY_LOCAL_MACHINE, localKey, L"", localServer, view);
    }
    if (server == BrowserServer::kInProcess) {
        RegPutString(HKEY_LOCAL_MACHINE, ClassSubKey(L"InprocServer32"), L"",
                     FakePath(L"iexplore_inproc.dll"));
    }
}

BrowserStandIn::~BrowserStandIn() {
    RegRemoveTree(HKEY_LOCAL_MACHINE, ClassSubKey(L"InprocServer32"));
}

void BrowserStandIn::ServeTo(ProgramUnderTest& program) const {
    program.SetEnv(L"QM_FAKE_PAGE_SCRIPT", m_script);
}

void BrowserStandIn::SetPage(const std::string& lines) const {
    DeleteFileW(m_log.c_str());
    WriteFileBytes(m_script, "log " + Narrow(m_log) + "\n" + lines);
}

std::string BrowserStandIn::Calls() const {
    return ReadFileBytes(m_log);
}
