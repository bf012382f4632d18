// The one-click road from process start to the library's method call
// ("JoinMeeting"), median of 20 runs, against the start-to-exit time of a
// minimal Windows program measured in the same run.
// Usage: one_click_bench [runs]
#include <windows.h>

#include <cstdio>
#include <string>

#include "bench/process_timing.h"
#include "tests/fakes/common/call_stamps.h"
#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

// Milliseconds from CreateProcess to the stamped method call, or -1.
double StartToCall(const std::wstring& exe, const std::wstring& callsLog) {
    DeleteFileW(callsLog.c_str());
    std::wstring line = L"\"" + exe + L"\" <CmdLine><Action>JoinMeeting</Action></CmdLine>";
    // The program inherits this process's variables.
    SetEnvironmentVariableW(L"QM_FAKE_CALLS_LOG", callsLog.c_str());
    SetEnvironmentVariableW(L"QM_FAKE_STAMP_CALLS", L"1");
    SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", nullptr);
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    double start = NowMilliseconds();
    if (!CreateProcessW(nullptr, &line[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup,
                        &process)) {
        return -1;
    }
    WaitForSingleObject(process.hProcess, 60000);
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
    double called = fake::CallStamp(ReadFileBytes(callsLog), "JoinMeeting");
    return called < 0 ? -1 : called - start;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    int runs = argc > 1 ? _wtoi(argv[1]) : 20;
    if (runs <= 0) {
        runs = 20;
    }
    ScratchDir scratch(L"bench-oneclick");
    ProgramUnderTest program(scratch.Sub(L"bin"));
    CopyFileW(FakePath(L"qmMrvMS.DLL").c_str(), JoinPath(program.folder(), L"qmMrvMS.DLL").c_str(),
              FALSE);
    std::wstring calls = scratch.Sub(L"calls.log");
    std::wstring empty = L"\"" + TestBinDir() + L"\\bench\\empty_program.exe\"";

    Series oneClick{"start -> JoinMeeting", {}};
    Series baseline{"empty program start -> exit", {}};
    StartToCall(program.exePath(), calls);  // warm-up
    for (int i = 0; i < runs; ++i) {
        double ms = StartToCall(program.exePath(), calls);
        if (ms >= 0) {
            oneClick.ms.push_back(ms);
        }
        baseline.ms.push_back(MeanProcessMilliseconds(empty, 1, 0));
    }
    double ours = oneClick.Median();
    double floor = baseline.Median();
    printf("one-click, median of %d runs (ms)\n", runs);
    printf("  %-32s %8.2f\n", baseline.name, floor);
    printf("  %-32s %8.2f\n", oneClick.name, ours);
    printf("ratio start-to-call / empty program: %.2f\n", floor > 0 ? ours / floor : 0.0);
    return 0;
}
