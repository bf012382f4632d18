// Adding and removing the suite folder in a machine "Path" of 32,000
// characters, against baselines measured in the same run: reading the value
// and writing it back unchanged, and the change broadcast alone (each add or
// remove ends with one). The text edits alone are timed too. The value is put
// back as it was. Usage: env_path_bench [repetitions]
#include <windows.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "bench/process_timing.h"
#include "cleanup/path_entries.h"
#include "cleanup/system_env_path.h"

namespace {

const wchar_t kEnvironment[] = L"SYSTEM\\CurrentControlSet\\Control\\Session Manager\\Environment";
const size_t kPathChars = 32000;
const wchar_t kSuite[] = L"C:\\Program Files\\Mirovan\\Quillmark Tools";

struct RawValue {
    bool present = false;
    DWORD type = 0;
    std::vector<BYTE> data;
};

RawValue ReadRaw() {
    RawValue value;
    HKEY key = nullptr;
    if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, kEnvironment, 0, KEY_QUERY_VALUE, &key) !=
        ERROR_SUCCESS) {
        return value;
    }
    DWORD size = 0;
    if (RegQueryValueExW(key, L"Path", nullptr, &value.type, nullptr, &size) == ERROR_SUCCESS) {
        value.data.resize(size);
        value.present = RegQueryValueExW(key, L"Path", nullptr, &value.type, value.data.data(),
                                         &size) == ERROR_SUCCESS;
    }
    RegCloseKey(key);
    return value;
}

bool WriteRaw(const RawValue& value) {
    HKEY key = nullptr;
    if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, kEnvironment, 0, KEY_SET_VALUE, &key) != ERROR_SUCCESS) {
        return false;
    }
    LONG rc = value.present ? RegSetValueExW(key, L"Path", 0, value.type, value.data.data(),
                                             static_cast<DWORD>(value.data.size()))
                            : RegDeleteValueW(key, L"Path");
    RegCloseKey(key);
    return rc == ERROR_SUCCESS;
}

RawValue FromText(const std::wstring& text) {
    RawValue value;
    value.present = true;
    value.type = REG_EXPAND_SZ;
    const BYTE* bytes = reinterpret_cast<const BYTE*>(text.c_str());
    value.data.assign(bytes, bytes + (text.size() + 1) * sizeof(wchar_t));
    return value;
}

std::wstring LongPath() {
    std::wstring text = L"%SystemRoot%\\system32;%SystemRoot%;%SystemRoot%\\System32\\Wbem";
    for (int i = 0; text.size() < kPathChars; ++i) {
        text += L";C:\\Program Files\\Vendor " + std::to_wstring(i) + L"\\bin";
    }
    text.resize(kPathChars);
    if (text.back() == L';' || text.back() == L'\\') {
        text.back() = L'x';
    }
    return text;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    const int repetitions = argc > 1 ? std::max(1, _wtoi(argv[1])) : 21;
    const RawValue original = ReadRaw();
    const std::wstring path = LongPath();
    if (!WriteRaw(FromText(path))) {
        std::printf("cannot write the machine Path (administrator rights?)\n");
        return 1;
    }

    Series raw{"baseline: read + write back unchanged", {}};
    Series broadcast{"baseline: change broadcast alone", {}};
    Series add{"add the suite folder", {}};
    Series remove{"remove the suite folder", {}};
    Series textAdd{"text only: append entry", {}};
    Series textRemove{"text only: remove entries", {}};
    bool allOk = true;
    std::wstring withSuite = path + L";" + kSuite;
    for (int i = 0; i < repetitions; ++i) {
        double start = NowMilliseconds();
        allOk &= WriteRaw(ReadRaw());
        raw.ms.push_back(NowMilliseconds() - start);

        start = NowMilliseconds();
        RefreshSysEnv();
        broadcast.ms.push_back(NowMilliseconds() - start);

        start = NowMilliseconds();
        SetQMInstallPathToSystemEnv(kSuite);
        add.ms.push_back(NowMilliseconds() - start);
        RawValue after = ReadRaw();
        allOk &= after.data.size() == (withSuite.size() + 1) * sizeof(wchar_t) &&
                 after.type == REG_EXPAND_SZ;

        start = NowMilliseconds();
        RemoveQMInstallPathFromSystemEnv(kSuite);
        remove.ms.push_back(NowMilliseconds() - start);
        allOk &= ReadRaw().data == FromText(path).data;

        start = NowMilliseconds();
        CStringEx appended = AppendPathEntry(path.c_str(), kSuite);
        textAdd.ms.push_back(NowMilliseconds() - start);
        start = NowMilliseconds();
        CStringEx removed = RemovePathEntries(withSuite.c_str(), kSuite);
        textRemove.ms.push_back(NowMilliseconds() - start);
        allOk &= withSuite == appended.c_str() && path == removed.c_str();
    }
    WriteRaw(original);

    std::printf("machine Path of %u characters, %d repetitions (median ms)\n",
                static_cast<unsigned>(path.size()), repetitions);
    double rawMs = raw.Median();
    double broadcastMs = broadcast.Median();
    for (Series* series : {&raw, &broadcast, &add, &remove, &textAdd, &textRemove}) {
        double ms = series->Median();
        std::printf("%-40s %8.3f ms  x%.2f of read+write  x%.2f of read+write+broadcast\n",
                    series->name, ms, rawMs > 0 ? ms / rawMs : 0.0,
                    rawMs + broadcastMs > 0 ? ms / (rawMs + broadcastMs) : 0.0);
    }
    std::printf("results: %s\n", allOk ? "every change did what was asked" : "A CHANGE FAILED");
    return allOk ? 0 : 1;
}
