// Timing whole processes from start to exit, for the benchmarks.
#pragma once

#include <windows.h>

#include <algorithm>
#include <string>
#include <vector>

// Mean wall time in milliseconds of `runs` runs of commandLine (started,
// waited for, closed), after `warmUp` unmeasured runs.
double MeanProcessMilliseconds(const std::wstring& commandLine, int runs, int warmUp = 3);

// build/bin, seen from a benchmark program in build/bin/bench.
std::wstring BenchBinDir();

// The program as installed, in %TEMP%\folderName with the trace stand-in
// beside it (which writes nothing without its log variable); removed at the end.
class ProgramCopy {
public:
    explicit ProgramCopy(const wchar_t* folderName);
    ~ProgramCopy();
    ProgramCopy(const ProgramCopy&) = delete;
    ProgramCopy& operator=(const ProgramCopy&) = delete;
    const std::wstring& folder() const { return m_folder; }
    // The program's path in quotes, for a command line.
    std::wstring Quoted() const { return L"\"" + m_program + L"\""; }

private:
    std::wstring m_folder;
    std::wstring m_program;
};

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
