// Enabling and disabling the meeting feature in a 5 MB platform.xml, each
// against baselines measured in the same run on the same file: reading and
// writing its bytes unchanged, and an edit with nothing to change (disable
// with the feature absent: loaded and searched, never written). Usage:
// platform_xml_bench [repetitions]
#include <windows.h>
#include <objbase.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "bench/process_timing.h"
#include "notes/platform_xml.h"

namespace {

const size_t kTargetBytes = 5u * 1024 * 1024;
const SiteXPaths kSites = {L"//site[@url=\"file:../shared/eclipse/\"]",
                           L"//site[@url=\"file:../../shared/eclipse/\"]"};

std::string Feature(const std::string& name, int i) {
    std::string id = "com.example." + name + std::to_string(i);
    // The form the DOM writes back, so the file keeps its size across runs.
    return "<feature id=\"" + id + "\" url=\"features/" + id + "_1.0.0/\" version=\"1.0.0\"/>";
}

// Sites full of features, the shared site among them, about kTargetBytes.
std::string BigConfig() {
    std::string text =
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
        "<config date=\"1300000000000\" transient=\"false\" version=\"3.0\">\n";
    const char* const urls[] = {"platform:/base/", "file:../shared/eclipse/", "file:../extra/"};
    int feature = 0;
    for (size_t site = 0; site < 3; ++site) {
        text += std::string(
                    "<site enabled=\"true\" policy=\"USER-EXCLUDE\" updateable=\"true\" "
                    "url=\"") +
                urls[site] + "\">\n";
        while (text.size() < kTargetBytes * (site + 1) / 3) {
            text += Feature("plugin", feature++);
        }
        text += "</site>\n";
    }
    return text + "</config>\n";
}

std::string ReadAll(const std::wstring& path) {
    std::string bytes;
    HANDLE file = CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                              FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        return bytes;
    }
    LARGE_INTEGER size = {};
    GetFileSizeEx(file, &size);
    bytes.resize(static_cast<size_t>(size.QuadPart));
    DWORD got = 0;
    ReadFile(file, &bytes[0], static_cast<DWORD>(bytes.size()), &got, nullptr);
    bytes.resize(got);
    CloseHandle(file);
    return bytes;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    const int repetitions = argc > 1 ? std::max(1, _wtoi(argv[1])) : 7;
    if (FAILED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED))) {
        std::printf("COM could not be initialised\n");
        return 1;
    }
    std::wstring folder = MakeScratchFolder(L"qm-platform-xml-bench");
    std::wstring path = folder + L"\\platform.xml";
    if (!WriteWholeFile(path, BigConfig())) {
        std::printf("cannot write %ls\n", path.c_str());
        return 1;
    }
    // One round first so the file is in the form the DOM writes back.
    EditPlatformXml(path.c_str(), kSites, true, nullptr);
    EditPlatformXml(path.c_str(), kSites, false, nullptr);

    Series raw{"baseline: read + write the bytes", {}};
    Series unchanged{"baseline: DOM load, nothing to change", {}};
    Series test{"test only (no write)", {}};
    Series enable{"enable (append the feature)", {}};
    Series disable{"disable (remove the feature)", {}};
    bool allOk = true;
    for (int i = 0; i < repetitions; ++i) {
        double start = NowMilliseconds();
        allOk &= WriteWholeFile(path, ReadAll(path));
        raw.ms.push_back(NowMilliseconds() - start);

        start = NowMilliseconds();
        PlatformXmlEdit edit = EditPlatformXml(path.c_str(), kSites, false, nullptr);
        unchanged.ms.push_back(NowMilliseconds() - start);
        allOk &= edit.status == PlatformXmlStatus::kOk && !edit.changed;

        bool listed = true;
        start = NowMilliseconds();
        allOk &= TestPlatformXml(path.c_str(), kSites, &listed) == PlatformXmlStatus::kOk;
        test.ms.push_back(NowMilliseconds() - start);
        allOk &= !listed;

        start = NowMilliseconds();
        edit = EditPlatformXml(path.c_str(), kSites, true, nullptr);
        enable.ms.push_back(NowMilliseconds() - start);
        allOk &= edit.status == PlatformXmlStatus::kOk && edit.changed;

        start = NowMilliseconds();
        edit = EditPlatformXml(path.c_str(), kSites, false, nullptr);
        disable.ms.push_back(NowMilliseconds() - start);
        allOk &= edit.status == PlatformXmlStatus::kOk && edit.changed;
    }
    std::printf("platform.xml of %u bytes, %d repetitions (median ms)\n",
                static_cast<unsigned>(ReadAll(path).size()), repetitions);
    double rawMs = raw.Median();
    double unchangedMs = unchanged.Median();
    for (Series* series : {&raw, &unchanged, &test, &enable, &disable}) {
        double ms = series->Median();
        std::printf("%-44s %9.1f ms  x%.1f of bytes  x%.2f of DOM load\n", series->name, ms,
                    rawMs > 0 ? ms / rawMs : 0.0, unchangedMs > 0 ? ms / unchangedMs : 0.0);
    }
    std::printf("results: %s\n", allOk ? "every edit did what was asked" : "AN EDIT FAILED");
    DeleteFileW(path.c_str());
    RemoveDirectoryW(folder.c_str());
    CoUninitialize();
    return allOk ? 0 : 1;
}
