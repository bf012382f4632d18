// Runs qmMrvONI.exe the way an installer does, from a scratch install folder
// that also holds the test stand-ins, and collects what it did: the exit
// code, its debugger output (the program runs as a debuggee) and the records
// the trace stand-in received.
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

// Parses the stand-in's log format.
std::vector<TraceRecord> ParseTraceLog(const std::string& bytes);

struct RunResult {
    int exitCode = 0;
    bool timedOut = false;
    bool crashed = false;  // an exception reached the last chance
    std::vector<std::string> debugOutput;
    std::vector<TraceRecord> traces;
    std::vector<DWORD> firstChanceExceptions;

    // The texts of all records, joined.
    std::string TraceText() const;
    // Records whose text equals `text` exactly.
    int CountTraces(const std::string& text) const;
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

enum class TraceLibrary {
    kBoth,     // exports both entry points
    kRawOnly,  // exports only "MRVTRACERAWA"
    kNone,     // no trace library beside the program
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
    std::wstring traceLogPath() const { return m_folder + L"\\trace.log"; }
    std::wstring callsLogPath() const { return m_folder + L"\\calls.log"; }

    // Extra environment for every run.
    void SetEnv(const std::wstring& name, const std::wstring& value) { m_env[name] = value; }

    // Runs with `arguments` as the command line after the program name.
    // Trace and calls logs are emptied first.
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

// Environment block of this process with `overrides` applied (names compared
// without regard to case).
std::vector<wchar_t> BuildEnvironmentBlock(const std::map<std::wstring, std::wstring>& overrides);

// Runs a command line as a debuggee until it exits (or is killed after
// timeoutMs) and fills result (exit code, debugger output, exceptions).
void RunAsDebuggee(const std::wstring& commandLine, const std::vector<wchar_t>& environment,
                   const std::wstring& workingDir, DWORD timeoutMs, RunResult* result,
                   const DebuggeeHooks& hooks = {});
