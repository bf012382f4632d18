// Puts the browser stand-in (build/bin/fakes/iexplore*) in the place of
// Internet Explorer's class for the lifetime of the object, in both registry
// views, and puts back what was there. The page it shows comes from a page
// script (see tests/fakes/browser/page_script.h); its calls go to their own
// log.
#pragma once

#include <windows.h>

#include <memory>
#include <string>

#include "tests/support/registry_util.h"

class ProgramUnderTest;

enum class BrowserServer {
    kInProcess,    // the class's in-process server
    kLocalServer,  // a process of its own, as Internet Explorer is
    kMissing,      // the local server's program does not exist
};

class BrowserStandIn {
public:
    // The page script and the calls log live in folder (created when missing).
    BrowserStandIn(const std::wstring& folder, BrowserServer server);
    ~BrowserStandIn();
    BrowserStandIn(const BrowserStandIn&) = delete;
    BrowserStandIn& operator=(const BrowserStandIn&) = delete;

    // The in-process stand-in finds its page script through the program's
    // environment.
    void ServeTo(ProgramUnderTest& program) const;
    // Writes the page script: `lines` after the calls-log line.
    void SetPage(const std::string& lines) const;
    // The calls the stand-in recorded since SetPage.
    std::string Calls() const;

    const std::wstring& scriptPath() const { return m_script; }

private:
    std::wstring m_script;
    std::wstring m_log;
    std::unique_ptr<RegValueGuard> m_localServer32;
    std::unique_ptr<RegValueGuard> m_localServer64;
};
