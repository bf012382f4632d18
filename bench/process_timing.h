// Timing whole processes from start to exit, for the benchmarks.
#pragma once

#include <windows.h>

#include <algorithm>
#include <string>
#include <vector>

// Mean wall time in milliseconds of `runs` runs of commandLine (started,
// waited for, closed), after `warmUp` unmeasured runs.
double MeanProcessMilliseconds(const std::wstring& commandLine, int runs, int warmUp = 3);

// Runs commandLine and waits for it to end.
void RunToExit(const std::wstring& commandLine);

// Milliseconds since an arbitrary start, with sub-millisecond resolution.
double NowMilliseconds();

// Measurements of one kind, in milliseconds.
struct Series {
    const char* name;
    std::vector<double> ms;
    double Median() {
        std::sort(ms.begin(), ms.end());
        return ms.empty() ? 0.0 : ms[ms.size() / 2];
    }
};
