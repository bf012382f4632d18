// Runs qmMrvONI.exe as an installer does, from a scratch folder that also holds
// the stand-ins, and collects its exit code, debugger output and trace records.
#pragma once

#include <windows.h>

#include <map>
#include <string>
#include <vector>

struct TraceRecord {
    std::string entry;  // "RESIDENT" or "RAWA"
    DWORD level = 0;
    std::string tag;  // "QM" or "(null)"
    std::string text;
};

// The records of a trace stand-in's log file.
std::vector<TraceRecord> ReadTraceLog(const std::wstring& path);

struct RunResult {
    int exitCode = 0;
    bool timedOut = false;
    bool crashed = false;  // an exception reached its last chance
    std::vector<std::string> debugOutput;
    std::vector<TraceRecord> traces;

    std::string TraceText() const;                   // the texts of all records, joined
    int CountTraces(const std::string& text) const;  // records whose text is exactly `text`
    bool HasTrace(const std::string& text) const { return CountTraces(text) > 0; }
    bool HasTraceContaining(const std::string& part) const;
    bool HasDebugOutput(const std::string& text) const;
};

class EntryStop;

// Extras of a run: the primary token to start the program with (instead of
// the test's own), and a stop at a system function's entry.
struct DebuggeeHooks {
    HANDLE token = nullptr;
    EntryStop* stop = nullptr;
};

// Runs commandLine as a debuggee in workingDir until it ends (or is killed
// after timeoutMs).
RunResult RunDebuggee(const std::wstring& commandLine, const std::wstring& workingDir,
                      DWORD timeoutMs, const DebuggeeHooks& hooks = {});

enum class TraceLibrary {
    kBoth,  // exports both entry points
    kNone,  // no trace library beside the program
};

struct ProgramOptions {
    TraceLibrary traceLibrary = TraceLibrary::kBoth;
    bool withSuiteLibrary = true;            // qmusredt.dll beside the program
    std::wstring exeName = L"qmMrvONI.exe";  // the copy's file name
};

class ProgramUnderTest {
public:
    // Copies the program and stand-ins into folder (created when missing).
    ProgramUnderTest(const std::wstring& folder, const ProgramOptions& options = {});

    const std::wstring& folder() const { return m_folder; }
    const std::wstring& exePath() const { return m_exePath; }
    std::wstring callsLogPath() const { return m_folder + L"\\calls.log"; }

    // Extra environment for every run; an empty value removes the variable.
    void SetEnv(const std::wstring& name, const std::wstring& value) { m_env[name] = value; }

    // Runs with `arguments` after the quoted program path, in its folder.
    RunResult Run(const std::wstring& arguments, DWORD timeoutMs = 60000,
                  const DebuggeeHooks& hooks = {});
    // Runs with exactly this command line (program name included).
    RunResult RunRaw(const std::wstring& commandLine, DWORD timeoutMs = 60000,
                     const DebuggeeHooks& hooks = {});

private:
    std::wstring m_folder;
    std::wstring m_exePath;
    std::map<std::wstring, std::wstring> m_env;
};
