// A host symbolic link planted in the test's Wine prefix: Windows calls under
// Wine cannot make a junction or symbolic link, but a host link to a folder
// shows to Windows programs as a directory reparse point, and writes through
// it reach its target. Made and removed with the host's ln and rm.
#pragma once

#include <string>

class HostLink {
public:
    // link (which must not exist) points to target (an existing folder).
    HostLink(const std::wstring& link, const std::wstring& target);
    ~HostLink();  // removes the link, never what it points to
    HostLink(const HostLink&) = delete;
    HostLink& operator=(const HostLink&) = delete;

    // True once Windows calls see the link as a reparse point.
    bool ok() const { return m_ok; }

private:
    std::wstring m_link;
    bool m_ok = false;
};
