// Start-to-exit time of "qmMrvONI.exe -nosuchkeyword" against a minimal
// Windows program and against a program that only initialises COM.
#include <windows.h>
#include <shlwapi.h>

#include <cstdio>
#include <string>

#include "bench/process_timing.h"

namespace {

std::wstring Quoted(const std::wstring& path) {
    return L"\"" + path + L"\"";
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    int runs = argc > 1 ? _wtoi(argv[1]) : 40;
    if (runs <= 0) {
        runs = 40;
    }
    std::wstring bin = BuildBinDir();
    ProgramCopy program(L"qm-startup-bench");

    std::wstring empty = Quoted(bin + L"\\bench\\empty_program.exe") + L" -nosuchkeyword";
    std::wstring floor = Quoted(bin + L"\\bench\\com_floor_program.exe") + L" -nosuchkeyword";
    std::wstring ours = program.Quoted() + L" -nosuchkeyword";

    // Interleave rounds so drift of the machine hits all three alike.
    double emptyMs = 0, floorMs = 0, oursMs = 0;
    const int rounds = 4;
    for (int round = 0; round < rounds; ++round) {
        emptyMs += MeanProcessMilliseconds(empty, runs / rounds + 1);
        floorMs += MeanProcessMilliseconds(floor, runs / rounds + 1);
        oursMs += MeanProcessMilliseconds(ours, runs / rounds + 1);
    }
    emptyMs /= rounds;
    floorMs /= rounds;
    oursMs /= rounds;

    printf("start-up, mean of %d runs each (ms)\n", (runs / rounds + 1) * rounds);
    printf("  empty program                  %8.2f\n", emptyMs);
    printf("  COM-only program               %8.2f\n", floorMs);
    printf("  qmMrvONI.exe -nosuchkeyword    %8.2f\n", oursMs);
    printf("ratio qmMrvONI / empty program:  %.2f (goal: at most 1.20) %s\n", oursMs / emptyMs,
           oursMs / emptyMs <= 1.2 ? "MET" : "NOT MET");
    printf("ratio qmMrvONI / COM-only:       %.2f\n", oursMs / floorMs);

    return 0;
}
