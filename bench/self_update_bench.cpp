// The self-update's road from the updater's "download finished" message to
// the start of the final command, in the temporary copy with the stand-in
// updater and configuration tool (which ends at once with 0), against the
// floor of that road measured in the same run: starting the configuration
// tool, waiting for it and starting the final command, one after the other.
// The waits of the protocol are meant to be event-driven: the road may add at
// most 100 ms to that floor.
#include <windows.h>
#include <shlwapi.h>

#include <cstdio>
#include <sstream>
#include <string>

#include "bench/process_timing.h"
#include "notes/update_process_start.h"

namespace {

const wchar_t kNotesKey[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
const wchar_t kNIKey[] = L"SOFTWARE\\mirovan\\NI";

void PutString(const wchar_t* key, const std::wstring& value) {
    RegSetKeyValueW(HKEY_LOCAL_MACHINE, key, L"Path", REG_SZ, value.c_str(),
                    static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)));
}

// The counter ticks a stand-in recorded for `what` ("<file> <event>"), or -1.
double Moment(const std::wstring& log, const std::string& what) {
    HANDLE file = CreateFileW(log.c_str(), GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE,
                              nullptr, OPEN_EXISTING, 0, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        return -1;
    }
    char buffer[4096];
    DWORD got = 0;
    ReadFile(file, buffer, sizeof(buffer), &got, nullptr);
    CloseHandle(file);
    std::istringstream lines(std::string(buffer, got));
    for (std::string line; std::getline(lines, line);) {
        if (line.compare(0, what.size(), what) == 0) {
            return std::stod(line.substr(what.size() + 1));
        }
    }
    return -1;
}

// Waits until the stand-in has recorded `what`; its ticks, or -1 after 10 s.
double AwaitMoment(const std::wstring& log, const std::string& what) {
    for (int i = 0; i < 1000; ++i) {
        double ticks = Moment(log, what);
        if (ticks >= 0) {
            return ticks;
        }
        Sleep(10);
    }
    return -1;
}

double TicksToMs(double ticks) {
    LARGE_INTEGER frequency;
    QueryPerformanceFrequency(&frequency);
    return ticks * 1000.0 / static_cast<double>(frequency.QuadPart);
}

double TicksNow() {
    LARGE_INTEGER now;
    QueryPerformanceCounter(&now);
    return static_cast<double>(now.QuadPart);
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    int runs = argc > 1 ? _wtoi(argv[1]) : 10;
    if (runs <= 0) {
        runs = 10;
    }
    std::wstring bin = BenchBinDir();
    wchar_t temp[MAX_PATH] = {};
    GetTempPathW(MAX_PATH, temp);
    std::wstring root = std::wstring(temp) + L"qm-self-update-bench";
    std::wstring notes = root + L"\\Lotus\\Notes";
    std::wstring plugin = root + L"\\NI\\Notes";
    std::wstring times = root + L"\\times.log";
    for (const std::wstring& folder : {root, root + L"\\Lotus", notes, root + L"\\NI", plugin}) {
        CreateDirectoryW(folder.c_str(), nullptr);
    }
    const std::wstring copies[][2] = {
        {bin + L"\\qmMrvONI.exe", plugin + L"\\~MrvONI.exe"},
        {bin + L"\\fakes\\mrvtrace.dll", plugin + L"\\mrvtrace.dll"},
        {bin + L"\\fakes\\qmniupd.exe", plugin + L"\\~TmpDown.exe"},
        {bin + L"\\fakes\\qmnwcfg.exe", plugin + L"\\qmnwcfg.exe"},
        // Records the start of the final command.
        {bin + L"\\fakes\\qmnwcfg.exe", notes + L"\\qmMrvONI.exe"},
    };
    for (const auto& copy : copies) {
        CopyFileW(copy[0].c_str(), copy[1].c_str(), FALSE);
    }
    PutString(kNotesKey, notes);
    PutString(kNIKey, plugin);
    SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", nullptr);
    SetEnvironmentVariableW(L"QM_FAKE_CALLS_LOG", nullptr);
    SetEnvironmentVariableW(L"QM_FAKE_UPDATER", L"post-wait");
    SetEnvironmentVariableW(L"QM_FAKE_CONFIG_EXIT", L"0");
    SetEnvironmentVariableW(L"QM_FAKE_TIMES_LOG", times.c_str());

    Series road{"1125 to final command", {}};
    Series floor{"floor: start tool, wait, start final", {}};
    const std::wstring copy = L"\"" + plugin + L"\\~MrvONI.exe\" -nupdate";
    for (int i = 0; i < runs + 1; ++i) {  // the first round warms up
        DeleteFileW(times.c_str());
        RunToExit(copy);
        double posted = Moment(times, "~TmpDown.exe posted");
        double final = AwaitMoment(times, "qmMrvONI.exe started");

        DeleteFileW(times.c_str());
        double start = TicksNow();
        UniqueHandle tool;
        UniqueHandle last;
        if (StartUpdateProcess((plugin + L"\\qmnwcfg.exe").c_str(), L"-update", notes.c_str(),
                               SW_SHOW, &tool)) {
            WaitForSingleObject(tool.get(), INFINITE);
        }
        StartUpdateProcess((notes + L"\\qmMrvONI.exe").c_str(), L"-nendupdate", nullptr, SW_HIDE,
                           &last);
        double floorEnd = AwaitMoment(times, "qmMrvONI.exe started");
        if (last) {
            WaitForSingleObject(last.get(), INFINITE);
        }
        if (i == 0 || posted < 0 || final < 0 || floorEnd < 0) {
            continue;
        }
        road.ms.push_back(TicksToMs(final - posted));
        floor.ms.push_back(TicksToMs(floorEnd - start));
    }

    if (road.ms.empty() || floor.ms.empty()) {
        printf("self-update road: no complete run\n");
        return 1;
    }
    double roadMs = road.Median();
    double floorMs = floor.Median();
    printf("self-update road, median of %d runs (ms)\n", static_cast<int>(road.ms.size()));
    printf("  %-40s %8.2f  (min %.2f, max %.2f)\n", road.name, roadMs, road.ms.front(),
           road.ms.back());
    printf("  %-40s %8.2f  (min %.2f, max %.2f)\n", floor.name, floorMs, floor.ms.front(),
           floor.ms.back());
    printf("added by the protocol: %.2f ms (goal: at most 100) %s\n", roadMs - floorMs,
           roadMs - floorMs <= 100.0 ? "MET" : "NOT MET");

    RegDeleteTreeW(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Lotus");
    RegDeleteTreeW(HKEY_LOCAL_MACHINE, L"SOFTWARE\\mirovan");
    for (const auto& copy : copies) {
        DeleteFileW(copy[1].c_str());
    }
    DeleteFileW(times.c_str());
    for (const std::wstring& folder : {plugin, root + L"\\NI", notes, root + L"\\Lotus", root}) {
        RemoveDirectoryW(folder.c_str());
    }
    return 0;
}
