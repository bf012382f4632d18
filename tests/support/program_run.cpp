#include "tests/support/program_run.h"

#include <algorithm>
#include <cstdlib>
#include <cwctype>

#include "tests/support/entry_stop.h"
#include "tests/support/file_util.h"
#include "tests/support/test_paths.h"

std::vector<TraceRecord> ParseTraceLog(const std::string& bytes) {
    std::vector<TraceRecord> records;
    size_t pos = 0;
    while (pos < bytes.size()) {
        size_t lineEnd = bytes.find('\n', pos);
        if (lineEnd == std::string::npos) {
            break;
        }
        std::string header = bytes.substr(pos, lineEnd - pos);
        TraceRecord record;
        char entry[32] = {}, tag[32] = {};
        unsigned long level = 0;
        unsigned length = 0;
        if (sscanf(header.c_str(), "%31s %lu %31s %u", entry, &level, tag, &length) != 4) {
            break;
        }
        record.entry = entry;
        record.level = level;
        record.tag = tag;
        pos = lineEnd + 1;
        if (pos + length > bytes.size()) {
            break;
        }
        record.text = bytes.substr(pos, length);
        pos += length + 1;  // the text and its separating line feed
        records.push_back(record);
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

std::wstring UpperCase(std::wstring text) {
    for (wchar_t& ch : text) {
        ch = static_cast<wchar_t>(towupper(ch));
    }
    return text;
}

std::string ReadDebugString(HANDLE process, const OUTPUT_DEBUG_STRING_INFO& info) {
    SIZE_T length = info.nDebugStringLength;
    if (length == 0 || length > (1u << 20)) {
        return std::string();
    }
    std::string text;
    if (info.fUnicode) {
        std::wstring wide(length, L'\0');
        SIZE_T got = 0;
        ReadProcessMemory(process, info.lpDebugStringData, &wide[0], length * sizeof(wchar_t),
                          &got);
        wide.resize(got / sizeof(wchar_t));
        text = Narrow(wide);
    } else {
        text.assign(length, '\0');
        SIZE_T got = 0;
        ReadProcessMemory(process, info.lpDebugStringData, &text[0], length, &got);
        text.resize(got);
    }
    while (!text.empty() && text.back() == '\0') {
        text.pop_back();
    }
    return text;
}

}  // namespace

std::vector<wchar_t> BuildEnvironmentBlock(const std::map<std::wstring, std::wstring>& overrides) {
    std::map<std::wstring, std::pair<std::wstring, std::wstring>> byUpperName;
    wchar_t* strings = GetEnvironmentStringsW();
    for (const wchar_t* p = strings; p && *p; p += wcslen(p) + 1) {
        std::wstring entry = p;
        size_t eq = entry.find(L'=', 1);
        if (eq == std::wstring::npos) {
            continue;
        }
        std::wstring name = entry.substr(0, eq);
        byUpperName[UpperCase(name)] = {name, entry.substr(eq + 1)};
    }
    FreeEnvironmentStringsW(strings);
    for (const auto& item : overrides) {
        if (item.second.empty()) {
            byUpperName.erase(UpperCase(item.first));
        } else {
            byUpperName[UpperCase(item.first)] = {item.first, item.second};
        }
    }
    std::vector<wchar_t> block;
    for (const auto& item : byUpperName) {
        std::wstring entry = item.second.first + L"=" + item.second.second;
        block.insert(block.end(), entry.begin(), entry.end());
        block.push_back(L'\0');
    }
    block.push_back(L'\0');
    return block;
}

void RunAsDebuggee(const std::wstring& commandLine, const std::vector<wchar_t>& environment,
                   const std::wstring& workingDir, DWORD timeoutMs, RunResult* result,
                   const DebuggeeHooks& hooks) {
    std::vector<wchar_t> mutableLine(commandLine.begin(), commandLine.end());
    mutableLine.push_back(L'\0');
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    const DWORD flags = DEBUG_ONLY_THIS_PROCESS | CREATE_UNICODE_ENVIRONMENT;
    void* block = const_cast<wchar_t*>(environment.data());
    const wchar_t* folder = workingDir.empty() ? nullptr : workingDir.c_str();
    BOOL created =
        hooks.token != nullptr
            ? CreateProcessAsUserW(hooks.token, nullptr, mutableLine.data(), nullptr, nullptr,
                                   FALSE, flags, block, folder, &startup, &process)
            : CreateProcessW(nullptr, mutableLine.data(), nullptr, nullptr, FALSE, flags, block,
                             folder, &startup, &process);
    if (!created) {
        result->exitCode = -9999;
        result->crashed = true;
        return;
    }
    DWORD start = GetTickCount();
    bool exited = false;
    bool killed = false;
    while (!exited) {
        DEBUG_EVENT event;
        if (!WaitForDebugEvent(&event, 200)) {
            if (!killed && GetTickCount() - start > timeoutMs) {
                TerminateProcess(process.hProcess, 0xDEAD);
                killed = true;
                result->timedOut = true;
            }
            continue;
        }
        DWORD continueStatus = DBG_CONTINUE;
        switch (event.dwDebugEventCode) {
            case OUTPUT_DEBUG_STRING_EVENT:
                result->debugOutput.push_back(
                    ReadDebugString(process.hProcess, event.u.DebugString));
                break;
            case EXCEPTION_DEBUG_EVENT: {
                if (hooks.stop != nullptr && hooks.stop->OnException(process.hProcess, event)) {
                    break;
                }
                const EXCEPTION_RECORD& record = event.u.Exception.ExceptionRecord;
                if (record.ExceptionCode == EXCEPTION_BREAKPOINT ||
                    record.ExceptionCode == 0x4000001F /* WOW64 breakpoint */) {
                    break;
                }
                continueStatus = DBG_EXCEPTION_NOT_HANDLED;
                if (event.u.Exception.dwFirstChance) {
                    result->firstChanceExceptions.push_back(record.ExceptionCode);
                } else {
                    result->crashed = true;
                }
                break;
            }
            case CREATE_PROCESS_DEBUG_EVENT:
                if (event.u.CreateProcessInfo.hFile) {
                    CloseHandle(event.u.CreateProcessInfo.hFile);
                }
                break;
            case LOAD_DLL_DEBUG_EVENT:
                if (event.u.LoadDll.hFile) {
                    CloseHandle(event.u.LoadDll.hFile);
                }
                break;
            case EXIT_PROCESS_DEBUG_EVENT:
                result->exitCode = static_cast<int>(event.u.ExitProcess.dwExitCode);
                exited = true;
                break;
            default:
                break;
        }
        ContinueDebugEvent(event.dwProcessId, event.dwThreadId, continueStatus);
    }
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
}

ProgramUnderTest::ProgramUnderTest(const std::wstring& folder, const ProgramOptions& options)
    : m_folder(folder), m_exePath(JoinPath(folder, options.exeName)) {
    MakeDirs(m_folder);
    CopyFileW(BuiltProgramPath().c_str(), m_exePath.c_str(), FALSE);
    if (options.traceLibrary == TraceLibrary::kBoth) {
        CopyFileW(FakePath(L"mrvtrace.dll").c_str(), JoinPath(folder, L"mrvtrace.dll").c_str(),
                  FALSE);
    } else if (options.traceLibrary == TraceLibrary::kRawOnly) {
        CopyFileW(FakePath(L"rawonly\\mrvtrace.dll").c_str(),
                  JoinPath(folder, L"mrvtrace.dll").c_str(), FALSE);
    }
    if (options.withSuiteLibrary) {
        CopyFileW(FakePath(L"qmusredt.dll").c_str(), JoinPath(folder, L"qmusredt.dll").c_str(),
                  FALSE);
    }
    m_env[L"QM_FAKE_TRACE_LOG"] = traceLogPath();
    m_env[L"QM_FAKE_CALLS_LOG"] = callsLogPath();
}

RunResult ProgramUnderTest::Run(const std::wstring& arguments, DWORD timeoutMs,
                                const DebuggeeHooks& hooks) {
    std::wstring line = L"\"" + m_exePath + L"\"";
    if (!arguments.empty()) {
        line += L" " + arguments;
    }
    return RunRaw(line, timeoutMs, hooks);
}

RunResult ProgramUnderTest::RunRaw(const std::wstring& commandLine, DWORD timeoutMs,
                                   const DebuggeeHooks& hooks) {
    DeleteFileW(traceLogPath().c_str());
    DeleteFileW(callsLogPath().c_str());
    RunResult result;
    RunAsDebuggee(commandLine, BuildEnvironmentBlock(m_env), m_folder, timeoutMs, &result, hooks);
    result.traces = ParseTraceLog(ReadFileBytes(traceLogPath()));
    return result;
}
