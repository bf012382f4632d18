// Runs qmMrvONI.exe for the demo and prints what it did: the command line,
// each trace record it wrote (level and text) and its exit code.
//   demo_runner.exe <program folder> <arguments>...
// Each further argument is one command line after the program name; "{caller}"
// in it stands for the handle of a window of the runner's that prints the
// WM_COPYDATA messages it receives, as a calling suite program would get them.
// When QM_DEMO_AWAIT names executables (separated by ";"), the programs the
// run started under those names are waited for, so their records show too.
//   demo_runner.exe --trace <trace log>
// prints the records of runs started by others (an installer's custom actions).
#include <windows.h>

#include <algorithm>
#include <cstdio>
#include <string>

#include "tests/fakes/caller/feedback_receiver.h"
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
    for (const TraceRecord& record : ParseTraceLog(ReadFileBytes(traceLog))) {
        printf("  trace [level %lu] ", static_cast<unsigned long>(record.level));
        PrintRecordText(record.text);
        printf("\n");
    }
}

void AwaitStartedPrograms() {
    wchar_t names[1024] = {};
    if (GetEnvironmentVariableW(L"QM_DEMO_AWAIT", names, 1024) >= 1024) {
        return;
    }
    std::wstring list = names;
    for (size_t start = 0, end; start < list.size(); start = end + 1) {
        end = std::min(list.find(L';', start), list.size());
        AwaitProcessesNamed(list.substr(start, end - start).c_str(), 120000);
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
        RunResult run;
        RunAsDebuggee(L"\"" + program + L"\" " + arguments,
                      BuildEnvironmentBlock({{L"QM_FAKE_TRACE_LOG", traceLog}}), folder, 120000,
                      &run);
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
