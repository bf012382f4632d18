// Runs qmMrvONI.exe for the demo and prints what it did: the command line,
// each trace record it wrote (level and text) and its exit code.
//   demo_runner.exe <program folder> <arguments>...
// Each further argument is one command line after the program name; "{caller}"
// in it stands for the handle of a window of the runner's that prints the
// WM_COPYDATA messages it receives, as a calling suite program would get them.
// When QM_DEMO_AWAIT names executables (separated by ";"), the programs the
// run started under those names are waited for, so their records show too.
// With QM_DEMO_WATCH_HIVES set to user names (";" between them), it also shows
// what those users' hives hold under SOFTWARE\Mirovan as the program unloads
// them (Wine does not write a hive back to its file).
//   demo_runner.exe --trace <trace log>
// prints the records of runs started by others (an installer's custom actions).
#include <windows.h>

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

#include "tests/fakes/caller/feedback_receiver.h"
#include "tests/support/entry_stop.h"
#include "tests/support/file_util.h"
#include "tests/support/process_wait.h"
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

void PrintRecords(const std::wstring& traceLog) {
    for (const TraceRecord& record : ReadTraceLog(traceLog)) {
        printf("  trace [level %lu] ", static_cast<unsigned long>(record.level));
        PrintRecordText(record.text);
        printf("\n");
    }
}

// The names listed in an environment variable (";" between them).
std::vector<std::wstring> Listed(const wchar_t* variable) {
    wchar_t names[1024] = {};
    std::vector<std::wstring> listed;
    if (GetEnvironmentVariableW(variable, names, 1024) >= 1024) {
        return listed;
    }
    std::wstring list = names;
    for (size_t start = 0, end; start < list.size(); start = end + 1) {
        end = std::min(list.find(L';', start), list.size());
        listed.push_back(list.substr(start, end - start));
    }
    return listed;
}

void AwaitStartedPrograms() {
    for (const std::wstring& name : Listed(L"QM_DEMO_AWAIT")) {
        AwaitProcessesNamed(name.c_str(), 120000);
    }
}

// What each watched user's hive holds under SOFTWARE\Mirovan, if loaded.
void PrintLoadedHives(const std::vector<std::wstring>& users) {
    for (const std::wstring& user : users) {
        HKEY mirovan = nullptr;
        if (RegOpenKeyExW(HKEY_USERS, (user + L"\\SOFTWARE\\Mirovan").c_str(), 0, KEY_READ,
                          &mirovan) != ERROR_SUCCESS) {
            continue;
        }
        printf("  as the program unloads HKEY_USERS\\%s, SOFTWARE\\Mirovan holds:",
               Narrow(user).c_str());
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
    if (argc == 3 && std::wstring(argv[1]) == L"--trace") {
        PrintRecords(argv[2]);
        return 0;
    }
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
        const std::vector<std::wstring> users = Listed(L"QM_DEMO_WATCH_HIVES");
        EntryStop unload(reinterpret_cast<const void*>(
                             GetProcAddress(GetModuleHandleW(L"advapi32.dll"), "RegUnLoadKeyW")),
                         [&users] { PrintLoadedHives(users); });
        DebuggeeHooks hooks;
        hooks.stop = users.empty() ? nullptr : &unload;
        SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", traceLog.c_str());  // for the program
        RunResult run = RunDebuggee(L"\"" + program + L"\" " + arguments, folder, 120000, hooks);
        AwaitStartedPrograms();
        PrintRecords(traceLog);
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
