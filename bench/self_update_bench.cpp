// The self-update's road from the updater's "download finished" message to
// the start of the final command, in the temporary copy with the stand-in
// updater and configuration tool (which ends at once with 0), against the
// floor of that road measured in the same run: starting the configuration
// tool, waiting for it and starting the final command, one after the other.
// The waits of the protocol are meant to be event-driven: the road may add at
// most 100 ms to that floor. Usage: self_update_bench [runs]
#include <windows.h>

#include <cstdio>
#include <string>

#include "bench/process_timing.h"
#include "notes/update_process_start.h"
#include "tests/fakes/common/call_stamps.h"
#include "tests/support/file_util.h"
#include "tests/support/process_wait.h"
#include "tests/support/program_run.h"
#include "tests/support/registry_util.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

const char kFinalStart[] = "qmMrvONI.exe started";

// Milliseconds from the updater's report to the final command's start.
double Road(const std::wstring& copy, const std::wstring& calls) {
    DeleteFileW(calls.c_str());
    RunQuietly(L"\"" + copy + L"\" -nupdate");
    AwaitProcessesNamed(L"qmMrvONI.exe", 60000);
    std::string log = ReadFileBytes(calls);
    double posted = fake::CallStamp(log, "~TmpDown.exe posted");
    double final = fake::CallStamp(log, kFinalStart);
    return posted < 0 || final < 0 ? -1 : final - posted;
}

// Milliseconds to start the tool, wait for it and start the final command.
double Floor(const std::wstring& tool, const std::wstring& final, const std::wstring& notes,
             const std::wstring& calls) {
    DeleteFileW(calls.c_str());
    double start = NowMilliseconds();
    UniqueHandle process;
    if (StartUpdateProcess(tool.c_str(), L"-update", notes.c_str(), SW_SHOW, &process)) {
        WaitForSingleObject(process.get(), INFINITE);
    }
    if (StartUpdateProcess(final.c_str(), L"-nendupdate", nullptr, SW_HIDE, &process)) {
        WaitForSingleObject(process.get(), INFINITE);
    }
    double started = fake::CallStamp(ReadFileBytes(calls), kFinalStart);
    return started < 0 ? -1 : started - start;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    int runs = argc > 1 ? _wtoi(argv[1]) : 10;
    if (runs <= 0) {
        runs = 10;
    }
    ScratchDir scratch(L"bench-selfupdate");
    std::wstring notes = scratch.Sub(L"Lotus\\Notes", true);
    std::wstring plugin = scratch.Sub(L"NI\\Notes", true);
    std::wstring calls = scratch.Sub(L"calls.log");
    ProgramOptions options;
    options.exeName = L"~MrvONI.exe";
    ProgramUnderTest copy(plugin, options);
    std::wstring tool = JoinPath(plugin, L"qmnwcfg.exe");
    std::wstring final = JoinPath(notes, L"qmMrvONI.exe");  // records its start
    CopyFileW(FakePath(L"qmniupd.exe").c_str(), JoinPath(plugin, L"~TmpDown.exe").c_str(), FALSE);
    CopyFileW(FakePath(L"qmnwcfg.exe").c_str(), tool.c_str(), FALSE);
    CopyFileW(FakePath(L"qmnwcfg.exe").c_str(), final.c_str(), FALSE);
    RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Lotus\\Notes\\8.0", L"Path", notes);
    RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\mirovan\\NI", L"Path", plugin);
    SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", nullptr);
    SetEnvironmentVariableW(L"QM_FAKE_CALLS_LOG", calls.c_str());
    SetEnvironmentVariableW(L"QM_FAKE_STAMP_CALLS", L"1");
    SetEnvironmentVariableW(L"QM_FAKE_UPDATER", L"post-wait");
    SetEnvironmentVariableW(L"QM_FAKE_CONFIG_EXIT", L"0");

    Series road{"1125 to final command", {}};
    Series floor{"floor: start tool, wait, start final", {}};
    Road(copy.exePath(), calls);  // warm-up
    for (int i = 0; i < runs; ++i) {
        double roadMs = Road(copy.exePath(), calls);
        double floorMs = Floor(tool, final, notes, calls);
        if (roadMs >= 0 && floorMs >= 0) {
            road.ms.push_back(roadMs);
            floor.ms.push_back(floorMs);
        }
    }
    RegRemoveTree(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Lotus");
    RegRemoveTree(HKEY_LOCAL_MACHINE, L"SOFTWARE\\mirovan");
    if (road.ms.empty()) {
        printf("self-update road: no complete run\n");
        return 1;
    }

    double roadMs = road.Median();
    double floorMs = floor.Median();
    printf("self-update road, median of %d runs (ms)\n", static_cast<int>(road.ms.size()));
    for (Series* series : {&road, &floor}) {
        printf("  %-40s %8.2f  (min %.2f, max %.2f)\n", series->name, series->Median(),
               series->ms.front(), series->ms.back());
    }
    printf("added by the protocol: %.2f ms (goal: at most 100) %s\n", roadMs - floorMs,
           roadMs - floorMs <= 100.0 ? "MET" : "NOT MET");
    return 0;
}
