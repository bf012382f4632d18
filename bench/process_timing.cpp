#include "bench/process_timing.h"

#include <vector>

void RunToExit(const std::wstring& commandLine) {
    std::vector<wchar_t> line(commandLine.begin(), commandLine.end());
    line.push_back(L'\0');
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessW(nullptr, line.data(), nullptr, nullptr, FALSE, 0, nullptr, nullptr,
                        &startup, &process)) {
        return;
    }
    WaitForSingleObject(process.hProcess, INFINITE);
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
}

double NowMilliseconds() {
    LARGE_INTEGER frequency, now;
    QueryPerformanceFrequency(&frequency);
    QueryPerformanceCounter(&now);
    return static_cast<double>(now.QuadPart) * 1000.0 / static_cast<double>(frequency.QuadPart);
}

double MeanProcessMilliseconds(const std::wstring& commandLine, int runs, int warmUp) {
    for (int i = 0; i < warmUp; ++i) {
        RunToExit(commandLine);
    }
    double start = NowMilliseconds();
    for (int i = 0; i < runs; ++i) {
        RunToExit(commandLine);
    }
    return (NowMilliseconds() - start) / runs;
}
