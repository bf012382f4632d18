// The stand-in Suite service (build/bin/fakes/qmSrv.exe) registered in the
// test's prefix as an out-of-process COM server for the lifetime of this
// object, scripted through a scratch file, with the log of what it received.
// Servers still running at the end are waited for (then ended) and the
// registration is removed.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

#include "tests/support/program_run.h"

// One entry of the stand-in's log: kind "call", "event", "advise",
// "unadvise", "create" or "server"; a call's last argument is the time.
struct ServiceEntry {
    std::string kind;
    std::string name;
    std::vector<std::string> args;  // "(null)" for a null document
};

std::vector<ServiceEntry> ParseServiceLog(const std::string& bytes);

class ServiceStandIn {
public:
    // Scratch files go to folder; the program gets the variables that name them.
    ServiceStandIn(const std::wstring& folder, ProgramUnderTest* program = nullptr);
    ~ServiceStandIn();
    ServiceStandIn(const ServiceStandIn&) = delete;
    ServiceStandIn& operator=(const ServiceStandIn&) = delete;

    bool registered() const { return m_registered; }
    // Replaces the script and empties the log.
    void SetScript(const std::string& text);
    std::vector<ServiceEntry> Log() const;
    // The calls only, in order, or those of one method.
    std::vector<ServiceEntry> Calls(const std::string& method = "") const;
    std::vector<std::string> CallNames() const;
    // Time (performance counter, ms) of the first entry of kind/name, or -1.
    double TimeOf(const std::string& kind, const std::string& name) const;

    // Waits until no stand-in server runs any more (ends them after timeoutMs).
    static void WaitForServersToEnd(DWORD timeoutMs = 10000);
    static bool RunStandIn(const wchar_t* argument);

private:
    std::wstring m_script;
    std::wstring m_log;
    bool m_registered = false;
};

// Performance counter in ms, comparable with the stand-in's times.
double CounterMs();
