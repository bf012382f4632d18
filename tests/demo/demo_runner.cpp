// Runs qmMrvONI.exe for the demo and prints what it did: the command line,
// each trace record it wrote (level and text) and its exit code.
//   demo_runner.exe <program folder> <arguments>...
// Each further argument is one command line after the program name; "{caller}"
// in it stands for the handle of a window of the runner's that prints the
// WM_COPYDATA messages it receives, as a calling suite program would get them.
// With QM_DEMO_WATCH_HIVES set to user names (";" between them), it also shows
// what those users' hives hold under SOFTWARE\Mirovan as the program unloads
// them (Wine does not write a hive back to its file).
#include <windows.h>

#include <cstdio>
#include <string>

#include "tests/fakes/caller/feedback_receiver.h"
#include "tests/support/entry_stop.h"
#include "tests/support/file_util.h"
#include "tests/support/program_run.h"

namespace {

void PrintRecordText(const std::string& text) {
    std::string shown;
    for (char ch : text) {
        if (ch == '\n') {
            shown += "\\n";
        } else if (ch == '\r') {
            shown += "\\r";
        } else {
            shown += ch;
        }
    }
    printf("%s", shown.c_str());
}

void PrintLoadedHives(const std::wstring& users) {
    for (size_t start = 0; start < users.size();) {
        size_t end = users.find(L';', start);
        end = end == std::wstring::npos ? users.size() : end;
        std::wstring key = users.substr(start, end - start) + L"\\SOFTWARE\\Mirovan";
        start = end + 1;
        HKEY mirovan = nullptr;
        if (RegOpenKeyExW(HKEY_USERS, key.c_str(), 0, KEY_READ, &mirovan) != ERROR_SUCCESS) {
            continue;
        }
        printf("  as the program unloads HKEY_USERS\\%s, SOFTWARE\\Mirovan holds:",
               Narrow(key.substr(0, key.find(L'\\'))).c_str());
        wchar_t name[256];
        for (DWORD i = 0;; ++i) {
            DWORD size = 256;
            if (RegEnumKeyExW(mirovan, i, name, &size, nullptr, nullptr, nullptr, nullptr) !=
                ERROR_SUCCESS) {
                break;
            }
            printf(" %s", Narrow(name).c_str());
        }
        printf("\n");
        RegCloseKey(mirovan);
    }
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    if (argc < 3) {
        fprintf(stderr, "usage: demo_runner <program folder> <arguments>...\n");
        return 2;
    }
    std::wstring folder = argv[1];
    std::wstring program = JoinPath(folder, L"qmMrvONI.exe");
    std::wstring traceLog = JoinPath(folder, L"demo-trace.log");
    FeedbackWindow caller;
    for (int i = 2; i < argc; ++i) {
        std::wstring arguments = argv[i];
        for (size_t at; (at = arguments.find(L"{caller}")) != std::wstring::npos;) {
            arguments.replace(at, 8, caller.HandleText());
        }
        size_t received = caller.Received().size();
        printf("\n$ qmMrvONI.exe %s\n", Narrow(arguments).c_str());
        DeleteFileW(traceLog.c_str());
        RunResult run;
        wchar_t users[1024] = {};
        GetEnvironmentVariableW(L"QM_DEMO_WATCH_HIVES", users, 1024);
        EntryStop unload(reinterpret_cast<const void*>(
                             GetProcAddress(GetModuleHandleW(L"advapi32.dll"), "RegUnLoadKeyW")),
                         [&users] { PrintLoadedHives(users); });
        DebuggeeHooks hooks;
        hooks.stop = users[0] != L'\0' ? &unload : nullptr;
        RunAsDebuggee(L"\"" + program + L"\" " + arguments,
                      BuildEnvironmentBlock({{L"QM_FAKE_TRACE_LOG", traceLog}}), folder, 120000,
                      &run, hooks);
        for (const TraceRecord& record : ParseTraceLog(ReadFileBytes(traceLog))) {
            printf("  trace [level %lu] ", static_cast<unsigned long>(record.level));
            PrintRecordText(record.text);
            printf("\n");
        }
        std::vector<CopyData> messages = caller.Received();
        for (size_t m = received; m < messages.size(); ++m) {
            printf("  WM_COPYDATA to the caller: %s\n", Narrow(messages[m].text).c_str());
        }
        printf("  exit code: %d\n", run.exitCode);
        fflush(stdout);
    }
    DeleteFileW(traceLog.c_str());
    return 0;
}
