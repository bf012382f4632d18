// Puts the browser stand-in (build/bin/fakes/iexplore*) in the place of
// Internet Explorer's class in both registry views while the object lives.
// Its page comes from a page script (tests/fakes/browser/page_script.h).
#pragma once

#include <string>

#include "tests/support/registry_util.h"

enum class BrowserServer {
    kInProcess,    // the class's in-process server
    kLocalServer,  // a process of its own, as Internet Explorer is
    kMissing,      // the local server's program does not exist
};

class BrowserStandIn {
public:
    BrowserStandIn(const std::wstring& folder, BrowserServer server);
    ~BrowserStandIn();
    BrowserStandIn(const BrowserStandIn&) = delete;
    BrowserStandIn& operator=(const BrowserStandIn&) = delete;

    // Writes the page script and empties the log of the browser's calls.
    void SetPage(const std::string& lines) const;
    std::string Calls() const;

private:
    std::wstring m_script;
    std::wstring m_log;
    RegValueGuard m_localServer32;
    RegValueGuard m_localServer64;
};
