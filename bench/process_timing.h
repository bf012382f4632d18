// Timing whole processes from start to exit, for the benchmarks.
#pragma once

#include <windows.h>

#include <string>

// Mean wall time in milliseconds of `runs` runs of commandLine (started,
// waited for, closed), after `warmUp` unmeasured runs.
double MeanProcessMilliseconds(const std::wstring& commandLine, int runs, int warmUp = 3);

// Milliseconds since an arbitrary start, with sub-millisecond resolution.
double NowMilliseconds();
