// The installer's whole road: msiexec installs the suite's package (ten
// custom actions) and removes it (seven), on a machine with Notes 8, Sametime
// Connect 8 and a Sametime profile; against the same package whose custom
// actions run an empty program, measured in the same run. The program's fixed
// pauses (1000 ms after most keywords' start message, 500 ms for
// addshortcuts) are counted apart: what remains is the program's own share.
// Usage: installer_road_bench [rounds]
#include <windows.h>

#include <cstdio>
#include <string>

#include "bench/process_timing.h"
#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/scratch_dir.h"

namespace {

const wchar_t kProductCode[] = L"{5C0F3A1E-7B2D-4E69-9A41-2D8E6B7C1F30}";
// The pauses of the keywords each road runs.
const double kInstallPausesMs = 7 * 1000 + 500;  // all but the two Sametime enables
const double kUninstallPausesMs = 4 * 1000;      // delnifiles, delsametimefiles,
                                                 // smsuninstallsmarttag, delallqmfiles

struct Road {
    Series install{"install", {}};
    Series uninstall{"uninstall", {}};
};

void RunRoad(const std::wstring& package, Road* road) {
    double start = NowMilliseconds();
    int installed = RunQuietly(L"msiexec.exe /i \"" + package + L"\" /qn");
    double middle = NowMilliseconds();
    int removed = RunQuietly(std::wstring(L"msiexec.exe /x ") + kProductCode + L" /qn");
    double end = NowMilliseconds();
    if (installed != 0 || removed != 0) {
        printf("  msiexec failed: install %d, uninstall %d\n", installed, removed);
    }
    if (road != nullptr) {
        road->install.ms.push_back(middle - start);
        road->uninstall.ms.push_back(end - middle);
    }
}

void SeedMachine(const ScratchDir& scratch) {
    const wchar_t kNotes[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
    const std::wstring kSametime =
        L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\QMTestSametimeBench";
    RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Path", scratch.Sub(L"Notes", true));
    RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"DataPath", scratch.Sub(L"Notes\\Data", true));
    RegPutString(HKEY_LOCAL_MACHINE, kSametime, L"DisplayName", L"IBM Lotus Sametime Connect 8.5");
    RegPutString(HKEY_LOCAL_MACHINE, kSametime, L"InstallLocation", scratch.Sub(L"Sametime", true));
    RegPutDword(HKEY_LOCAL_MACHINE, kSametime, L"VersionMajor", 8);
    for (const wchar_t* folder : {L"Sametime\\rcp", L"Sametime\\shared\\eclipse\\plugins",
                                  L"Sametime\\shared\\eclipse\\features"}) {
        MakeDirs(scratch.Sub(folder));
    }
    WriteFileBytes(JoinPath(RoamingAppData(),
                            L"Lotus\\Sametime\\.config\\org.eclipse.update\\"
                            L"platform.xml"),
                   "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<config version=\"3.0\">\n"
                   "<site enabled=\"true\" url=\"file:../shared/eclipse/\">\n</site>\n</config>\n");
}

void Report(const char* name, Series& series, int runs, double pausesMs, double baselineMs) {
    double share = series.Median() - baselineMs - pausesMs;
    printf(
        "  %-9s %6.0f ms, empty program %4.0f ms, pauses %4.0f ms: program's own share %4.0f ms"
        " (%2.0f ms in each of %d runs)\n",
        name, series.Median(), baselineMs, pausesMs, share, share / runs, runs);
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    int rounds = argc > 1 ? _wtoi(argv[1]) : 3;
    if (rounds <= 0) {
        rounds = 3;
    }
    std::wstring installers = JoinPath(BuildBinDir(), L"installer");
    std::wstring suite = JoinPath(installers, L"QuillmarkTools.msi");
    std::wstring empty = JoinPath(installers, L"QuillmarkTools-empty.msi");
    ScratchDir scratch(L"bench");
    ClearProductState();
    SeedMachine(scratch);

    RunRoad(empty, nullptr);  // msiexec's first start in the prefix
    Road program, baseline;
    for (int i = 0; i < rounds; ++i) {
        RunRoad(suite, &program);
        RunRoad(empty, &baseline);
    }
    printf("Installer road, median of %d rounds (msiexec /i then /x, /qn):\n", rounds);
    Report("install", program.install, 10, kInstallPausesMs, baseline.install.Median());
    Report("uninstall", program.uninstall, 7, kUninstallPausesMs, baseline.uninstall.Median());

    ClearProductState();
    return 0;
}
