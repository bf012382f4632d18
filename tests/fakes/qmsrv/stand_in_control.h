// How a test or benchmark drives the stand-in Suite service: registers it in
// the prefix as an out-of-process COM server for the lifetime of this object,
// writes its script, reads its log. Servers still running at the end are
// waited for (then ended) and the registration is removed.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

// One entry of the stand-in's log: kind "call", "event", "advise",
// "unadvise", "create" or "server"; a call's last argument is its time.
struct ServiceEntry {
    std::string kind;
    std::string name;
    std::vector<std::string> args;  // "(null)" for a null document
};

std::vector<ServiceEntry> ParseServiceLog(const std::string& bytes);

class ServiceStandIn {
public:
    // standInExe: qmSrv.exe (its type library beside it); the script and log
    // go to folder, and this process's environment names them, for a server
    // it starts. Set the same variables for programs started otherwise.
    ServiceStandIn(const std::wstring& standInExe, const std::wstring& folder);
    ~ServiceStandIn();
    ServiceStandIn(const ServiceStandIn&) = delete;
    ServiceStandIn& operator=(const ServiceStandIn&) = delete;

    bool registered() const { return m_registered; }
    const std::wstring& scriptPath() const { return m_script; }
    const std::wstring& logPath() const { return m_log; }
    bool Register() { return Run(L"-RegServer"); }
    bool Unregister() { return Run(L"-UnregServer"); }

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

private:
    bool Run(const wchar_t* argument);

    std::wstring m_exe;
    std::wstring m_script;
    std::wstring m_log;
    bool m_registered = false;
};
