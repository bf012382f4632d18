#include "tests/support/host_link.h"

#include <windows.h>

#include "tests/support/file_util.h"
#include "tests/support/host_shell.h"

namespace {

// The quoted host name of a Windows path.
std::wstring QuotedHostPath(const std::wstring& path) {
    std::string host = HostPath(path);
    return host.empty() ? std::wstring() : L"\"" + Widen(host) + L"\"";
}

bool IsLink(const std::wstring& path) {
    DWORD attributes = GetFileAttributesW(path.c_str());
    return attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_REPARSE_POINT);
}

// Starts a host program and waits up to 10 s for link to be there or gone
// (Wine gives no handle that waits for a host program).
bool RunHost(const wchar_t* program, std::wstring arguments, const std::wstring& link,
             bool present) {
    std::wstring line = std::wstring(program) + L" " + arguments;
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessW(program, &line[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup,
                        &process)) {
        return false;
    }
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
    for (int i = 0; i < 200 && IsLink(link) != present; ++i) {
        Sleep(50);
    }
    return IsLink(link) == present;
}

}  // namespace

HostLink::HostLink(const std::wstring& link, const std::wstring& target) : m_link(link) {
    std::wstring hostLink = QuotedHostPath(link);
    std::wstring hostTarget = QuotedHostPath(target);
    m_ok = !hostLink.empty() && !hostTarget.empty() &&
           RunHost(L"Z:\\bin\\ln", L"-s -- " + hostTarget + L" " + hostLink, link, true);
}

HostLink::~HostLink() {
    if (IsLink(m_link)) {
        RunHost(L"Z:\\bin\\rm", L"-f -- " + QuotedHostPath(m_link), m_link, false);
    }
}
