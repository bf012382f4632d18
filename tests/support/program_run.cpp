#include "tests/support/program_run.h"

#include <algorithm>
#include <cstdio>

#include "tests/support/entry_stop.h"
#include "tests/support/file_util.h"
#include "tests/support/test_paths.h"

std::vector<TraceRecord> ReadTraceLog(const std::wstring& path) {
    // Each record is "<entry> <level> <tag> <length>\n<text>\n".
    const std::string bytes = ReadFileBytes(path);
    std::vector<TraceRecord> records;
    for (size_t pos = 0; pos < bytes.size();) {
        char entry[32] = {}, tag[32] = {};
        unsigned long level = 0;
        unsigned length = 0;
        size_t lineEnd = bytes.find('\n', pos);
        if (lineEnd == std::string::npos ||
            sscanf(bytes.substr(pos, lineEnd - pos).c_str(), "%31s %lu %31s %u", entry, &level, tag,
                   &length) != 4 ||
            lineEnd + 1 + length > bytes.size()) {
            break;
        }
        records.push_back({entry, level, tag, bytes.substr(lineEnd + 1, length)});
        pos = lineEnd + 1 + length + 1;
    }
    return records;
}

std::string RunResult::TraceText() const {
    std::string all;
    for (const TraceRecord& record : traces) {
        all += record.text;
    }
    return all;
}

int RunResult::CountTraces(const std::string& text) const {
    return static_cast<int>(std::count_if(traces.begin(), traces.end(),
                                          [&](const TraceRecord& r) { return r.text == text; }));
}

bool RunResult::HasTraceContaining(const std::string& part) const {
    return std::any_of(traces.begin(), traces.end(), [&](const TraceRecord& r) {
        return r.text.find(part) != std::string::npos;
    });
}

bool RunResult::HasDebugOutput(const std::string& text) const {
    return std::find(debugOutput.begin(), debugOutput.end(), text) != debugOutput.end();
}

namespace {

std::string ReadDebugString(HANDLE process, const OUTPUT_DEBUG_STRING_INFO& info) {
    std::vector<wchar_t> text(std::min<SIZE_T>(info.nDebugStringLength, 1u << 20) + 1, L'\0');
    SIZE_T unit = info.fUnicode ? sizeof(wchar_t) : 1;
    ReadProcessMemory(process, info.lpDebugStringData, text.data(), (text.size() - 1) * unit,
                      nullptr);
    return info.fUnicode ? Narrow(text.data()) : reinterpret_cast<const char*>(text.data());
}

}  // namespace

RunResult RunDebuggee(const std::wstring& commandLine, const std::wstring& workingDir,
                      DWORD timeoutMs, const DebuggeeHooks& hooks) {
    RunResult result;
    std::wstring line = commandLine;
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    const bool created =
        hooks.token != nullptr
            ? CreateProcessAsUserW(hooks.token, nullptr, &line[0], nullptr, nullptr, FALSE,
                                   DEBUG_ONLY_THIS_PROCESS, nullptr, workingDir.c_str(), &startup,
                                   &process)
            : CreateProcessW(nullptr, &line[0], nullptr, nullptr, FALSE, DEBUG_ONLY_THIS_PROCESS,
                             nullptr, workingDir.c_str(), &startup, &process);
    if (!created) {
        result.exitCode = -9999;
        result.crashed = true;
        return result;
    }
    const DWORD start = GetTickCount();
    for (bool exited = false; !exited;) {
        DEBUG_EVENT event;
        if (!WaitForDebugEvent(&event, 200)) {
            if (!result.timedOut && GetTickCount() - start > timeoutMs) {
                TerminateProcess(process.hProcess, 0xDEAD);
                result.timedOut = true;
            }
            continue;
        }
        DWORD status = DBG_CONTINUE;
        switch (event.dwDebugEventCode) {
            case OUTPUT_DEBUG_STRING_EVENT:
                result.debugOutput.push_back(
                    ReadDebugString(process.hProcess, event.u.DebugString));
                break;
            case EXCEPTION_DEBUG_EVENT: {
                if (hooks.stop != nullptr && hooks.stop->OnException(process.hProcess, event)) {
                    break;
                }
                const DWORD code = event.u.Exception.ExceptionRecord.ExceptionCode;
                if (code != EXCEPTION_BREAKPOINT && code != 0x4000001F /* WOW64 breakpoint */) {
                    status = DBG_EXCEPTION_NOT_HANDLED;
                    result.crashed = result.crashed || !event.u.Exception.dwFirstChance;
                }
                break;
            }
            case CREATE_PROCESS_DEBUG_EVENT:
                CloseHandle(event.u.CreateProcessInfo.hFile);
                break;
            case LOAD_DLL_DEBUG_EVENT:
                CloseHandle(event.u.LoadDll.hFile);
                break;
            case EXIT_PROCESS_DEBUG_EVENT:
                result.exitCode = static_cast<int>(event.u.ExitProcess.dwExitCode);
                exited = true;
                break;
        }
        ContinueDebugEvent(event.dwProcessId, event.dwThreadId, status);
    }
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
    return result;
}

ProgramUnderTest::ProgramUnderTest(const std::wstring& folder, const ProgramOptions& options)
    : m_folder(folder), m_exePath(JoinPath(folder, options.exeName)) {
    MakeDirs(m_folder);
    CopyFileW(BuiltProgramPath().c_str(), m_exePath.c_str(), FALSE);
    if (options.traceLibrary != TraceLibrary::kNone) {
        CopyFileW(FakePath(L"mrvtrace.dll").c_str(), JoinPath(folder, L"mrvtrace.dll").c_str(),
                  FALSE);
    }
    if (options.withSuiteLibrary) {
        CopyFileW(FakePath(L"qmusredt.dll").c_str(), JoinPath(folder, L"qmusredt.dll").c_str(),
                  FALSE);
    }
    m_env[L"QM_FAKE_TRACE_LOG"] = folder + L"\\trace.log";
    m_env[L"QM_FAKE_CALLS_LOG"] = callsLogPath();
}

RunResult ProgramUnderTest::Run(const std::wstring& arguments, DWORD timeoutMs,
                                const DebuggeeHooks& hooks) {
    return RunRaw(L"\"" + m_exePath + L"\"" + (arguments.empty() ? L"" : L" " + arguments),
                  timeoutMs, hooks);
}

RunResult ProgramUnderTest::RunRaw(const std::wstring& commandLine, DWORD timeoutMs,
                                   const DebuggeeHooks& hooks) {
    // The program inherits this process's environment, changed for the run.
    std::map<std::wstring, std::wstring> saved;
    for (const auto& [name, value] : m_env) {
        std::vector<wchar_t> old(32768);
        saved[name] = GetEnvironmentVariableW(name.c_str(), old.data(), 32768) ? old.data() : L"";
        SetEnvironmentVariableW(name.c_str(), value.empty() ? nullptr : value.c_str());
    }
    DeleteFileW(m_env[L"QM_FAKE_TRACE_LOG"].c_str());
    DeleteFileW(callsLogPath().c_str());
    RunResult result = RunDebuggee(commandLine, m_folder, timeoutMs, hooks);
    result.traces = ReadTraceLog(m_env[L"QM_FAKE_TRACE_LOG"]);
    for (const auto& [name, value] : saved) {
        SetEnvironmentVariableW(name.c_str(), value.empty() ? nullptr : value.c_str());
    }
    return result;
}
