#include "tests/support/host_link.h"

#include <windows.h>

#include "tests/support/host_shell.h"

namespace {

bool IsLink(const std::wstring& path) {
    DWORD attributes = GetFileAttributesW(path.c_str());
    return attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_REPARSE_POINT);
}

}  // namespace

HostLink::HostLink(const std::wstring& link, const std::wstring& target) : m_link(link) {
    const std::string hostLink = HostPath(link);
    const std::string hostTarget = HostPath(target);
    m_ok = !hostLink.empty() && !hostTarget.empty() &&
           RunHostShell("ln -s -- \"$1\" \"$2\"", {hostTarget, hostLink}) == 0 && IsLink(link);
}

HostLink::~HostLink() {
    if (IsLink(m_link)) {
        RunHostShell("rm -f -- \"$1\"", {HostPath(m_link)});
    }
}
