// CZipMvt::CompressFile of 20 trace files of 2 MiB each against minizip's own
// command-line tool (built from the same minizip source) zipping the same
// files in the same run. Ours runs in this process; the tool's time is taken
// from its start to its exit, less the start and exit of an empty program.
// Prints both throughputs per round and the ratio ours / minizip (goal: at
// least 0.9).
#include <windows.h>

#include <cstdio>
#include <string>
#include <vector>

#include "actions/zip_mvt.h"
#include "bench/process_timing.h"

namespace {

const int kFiles = 20;
const DWORD kFileSize = 2 * 1024 * 1024;
const int kRounds = 11;

// Trace-like text: records with varying numbers, as the trace library writes.
std::string TraceText(int seed) {
    std::string text;
    text.reserve(kFileSize);
    char line[160];
    for (unsigned i = 0; text.size() < kFileSize; ++i) {
        unsigned mixed = (i * 2654435761u) ^ static_cast<unsigned>(seed * 40503);
        int length = snprintf(line, sizeof(line),
                              "%02u:%02u:%02u.%03u [%5u] QM level %u CMeeting::Step%u state=%u "
                              "value=0x%08X\r\n",
                              (i / 3600000) % 24, (i / 60000) % 60, (i / 1000) % 60, i % 1000,
                              mixed % 65536, 1u << (mixed % 4), mixed % 97, mixed % 13, mixed);
        text.append(line, static_cast<size_t>(length));
    }
    text.resize(kFileSize);
    return text;
}

DWORD SizeOf(const std::wstring& path) {
    WIN32_FILE_ATTRIBUTE_DATA data = {};
    return GetFileAttributesExW(path.c_str(), GetFileExInfoStandard, &data) ? data.nFileSizeLow : 0;
}

// Milliseconds from the start of commandLine to its exit, its output discarded.
double QuietProcessMilliseconds(const std::wstring& commandLine) {
    double start = NowMilliseconds();
    RunQuietly(commandLine);
    return NowMilliseconds() - start;
}

double MiBPerSecond(double milliseconds) {
    return milliseconds > 0 ? (kFiles * 2.0) * 1000.0 / milliseconds : 0.0;
}

}  // namespace

int wmain() {
    std::wstring bin = BuildBinDir();
    wchar_t temp[MAX_PATH] = {};
    GetTempPathW(MAX_PATH, temp);
    std::wstring folder = std::wstring(temp) + L"qm-zip-bench";
    CreateDirectoryW(folder.c_str(), nullptr);

    std::vector<CStringEx> paths;
    std::wstring toolFiles;
    for (int i = 0; i < kFiles; ++i) {
        std::wstring path = folder + L"\\trace" + std::to_wstring(i) + L".mvt";
        if (!WriteWholeFile(path, TraceText(i))) {
            printf("could not write %ls\n", path.c_str());
            return 1;
        }
        paths.push_back(CStringEx(path.c_str()));
        toolFiles += L" \"" + path + L"\"";
    }
    std::wstring ourZip = folder + L"\\ours.zip";
    std::wstring toolZip = folder + L"\\minizip.zip";
    std::wstring tool =
        L"\"" + bin + L"\\bench\\minizip.exe\" -o -j \"" + toolZip + L"\"" + toolFiles;
    std::wstring empty = L"\"" + bin + L"\\bench\\empty_program.exe\"";

    Series ours{"CZipMvt::CompressFile", {}};
    Series minizip{"minizip.exe", {}};
    double startMs = 0;
    for (int i = 0; i < 10; ++i) {
        startMs += QuietProcessMilliseconds(empty) / 10;
    }
    for (int round = 0; round < kRounds; ++round) {
        // Alternate which goes first, so drift of the machine hits both alike.
        if (round % 2 == 1) {
            minizip.ms.push_back(QuietProcessMilliseconds(tool) - startMs);
        }
        CZipMvt zip;
        double start = NowMilliseconds();
        BOOL made = zip.CompressFile(paths, ourZip.c_str());
        ours.ms.push_back(NowMilliseconds() - start);
        if (round % 2 == 0) {
            minizip.ms.push_back(QuietProcessMilliseconds(tool) - startMs);
        }
        printf("round %d: ours %.0f ms (%.1f MiB/s), minizip %.0f ms (%.1f MiB/s)%s\n", round + 1,
               ours.ms.back(), MiBPerSecond(ours.ms.back()), minizip.ms.back(),
               MiBPerSecond(minizip.ms.back()), made ? "" : " [zip not made]");
    }
    printf("empty program start to exit: %.1f ms (taken off minizip's times)\n", startMs);
    printf("zip sizes: ours %lu bytes, minizip %lu bytes, of %d x %lu bytes\n",
           static_cast<unsigned long>(SizeOf(ourZip)), static_cast<unsigned long>(SizeOf(toolZip)),
           kFiles, static_cast<unsigned long>(kFileSize));
    double oursMedian = ours.Median();
    double toolMedian = minizip.Median();
    printf("median: ours %.1f MiB/s, minizip %.1f MiB/s, ratio ours/minizip %.2f (goal >= 0.9)\n",
           MiBPerSecond(oursMedian), MiBPerSecond(toolMedian),
           MiBPerSecond(oursMedian) / MiBPerSecond(toolMedian));

    for (const CStringEx& path : paths) {
        DeleteFileW(path.c_str());
    }
    DeleteFileW(ourZip.c_str());
    DeleteFileW(toolZip.c_str());
    RemoveDirectoryW(folder.c_str());
    return 0;
}
