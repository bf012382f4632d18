// Timing whole processes from start to exit, for the benchmarks.
#pragma once

#include <windows.h>

#include <algorithm>
#include <string>
#include <vector>

// Mean wall time in milliseconds of `runs` runs of commandLine (started,
// waited for, closed), after `warmUp` unmeasured runs.
double MeanProcessMilliseconds(const std::wstring& commandLine, int runs, int warmUp = 3);

// Milliseconds since an arbitrary start, with sub-millisecond resolution.
double NowMilliseconds();

// Runs commandLine with its input and output on NUL and waits for it; its exit
// code, or -1 when it could not be started.
int RunQuietly(const std::wstring& commandLine);

// build/bin, seen from a benchmark in build/bin/bench.
std::wstring BuildBinDir();

// The folder name in the temporary folder, created when missing.
std::wstring MakeScratchFolder(const wchar_t* name);

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

// Creates or replaces the file with exactly these bytes.
bool WriteWholeFile(const std::wstring& path, const std::string& bytes);

// Measurements of one kind, in milliseconds.
struct Series {
    const char* name;
    std::vector<double> ms;
    double Median() {
        std::sort(ms.begin(), ms.end());
        return ms.empty() ? 0.0 : ms[ms.size() / 2];
    }
};
