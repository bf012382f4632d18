// DeleteAllCurUserReg over 200 profile hives against a loop that only loads
// and unloads the same hives, in the same run: the cost of the cleanup itself
// (the walk, access checks, deletions) on top of what loading each hive costs
// anyway. Each hive is a modest user profile: the suite's key with a few
// settings beside 3,000 keys of other programs (a fresh Windows profile holds
// a few thousand keys, one in use tens of thousands). Prints both times per
// round, the medians and the fastest rounds' ratio (goal: at most 1.3).
#include <windows.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <algorithm>
#include <cstdio>
#include <string>

#include "base/privileges.h"
#include "base/registry_delete.h"
#include "bench/process_timing.h"
#include "cleanup/user_registry_cleanup.h"

namespace {

const int kProfiles = 200;
const int kRounds = 7;
const int kOtherKeys = 3000;
const wchar_t kSource[] = L"Software\\QMBench-HiveSource";

std::wstring ProfilesFolder() {
    wchar_t own[MAX_PATH] = {};
    SHGetFolderPathW(nullptr, CSIDL_PROFILE, nullptr, 0, own);
    PathRemoveFileSpecW(own);
    return own;
}

std::wstring UserName(int i) {
    return L"QMBench-" + std::to_wstring(i);
}

void PutValue(const std::wstring& key, const wchar_t* name) {
    HKEY made = nullptr;
    if (RegCreateKeyExW(HKEY_CURRENT_USER, key.c_str(), 0, nullptr, 0, KEY_ALL_ACCESS, nullptr,
                        &made, nullptr) == ERROR_SUCCESS) {
        RegSetValueExW(made, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(L"value"), 12);
        RegCloseKey(made);
    }
}

// One user's settings: the suite's key with a few settings below it, and
// the keys of other programs.
bool SaveHives(const std::wstring& profiles) {
    const std::wstring source = kSource;
    for (const wchar_t* sub : {L"General", L"Meeting", L"Notes", L"Sametime"}) {
        for (const wchar_t* name : {L"a", L"b", L"c", L"d", L"e"}) {
            PutValue(source + L"\\SOFTWARE\\Mirovan\\QmkTools\\" + sub, name);
        }
    }
    for (int i = 0; i < kOtherKeys; ++i) {
        std::wstring key = source + L"\\SOFTWARE\\Vendor" + std::to_wstring(i % 50) + L"\\Program" +
                           std::to_wstring(i);
        for (const wchar_t* name : {L"a", L"b", L"c"}) {
            PutValue(key, name);
        }
    }
    HKEY key = nullptr;
    RegOpenKeyExW(HKEY_CURRENT_USER, source.c_str(), 0, KEY_READ, &key);
    bool saved = true;
    for (int i = 0; i < kProfiles; ++i) {
        std::wstring folder = profiles + L"\\" + UserName(i);
        CreateDirectoryW(folder.c_str(), nullptr);
        std::wstring file = folder + L"\\NTUSER.DAT";
        DeleteFileW(file.c_str());
        saved = saved && RegSaveKeyW(key, file.c_str(), nullptr) == ERROR_SUCCESS;
    }
    RegCloseKey(key);
    CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, kSource, 0);
    return saved;
}

void RemoveProfiles(const std::wstring& profiles) {
    for (int i = 0; i < kProfiles; ++i) {
        std::wstring folder = profiles + L"\\" + UserName(i);
        DeleteFileW((folder + L"\\NTUSER.DAT").c_str());
        RemoveDirectoryW(folder.c_str());
    }
}

// The baseline: each hive loaded and unloaded, nothing else.
int LoadAndUnload(const std::wstring& profiles) {
    int loaded = 0;
    for (int i = 0; i < kProfiles; ++i) {
        std::wstring name = UserName(i);
        std::wstring file = profiles + L"\\" + name + L"\\NTUSER.DAT";
        if (RegLoadKeyW(HKEY_USERS, name.c_str(), file.c_str()) == ERROR_SUCCESS) {
            ++loaded;
            RegUnLoadKeyW(HKEY_USERS, name.c_str());
        }
    }
    return loaded;
}

}  // namespace

int wmain() {
    if (!AdjustPrivileges()) {
        std::printf("the backup and restore privileges are needed\n");
        return 1;
    }
    const std::wstring profiles = ProfilesFolder();
    Series ours{"DeleteAllCurUserReg", {}};
    Series baseline{"load and unload", {}};
    // Each round's two runs follow each other, so their ratio is what the
    // machine's changing load disturbs least.
    Series ratios{"ratio", {}};
    std::printf("DeleteAllCurUserReg vs load and unload only, %d profile hives\n", kProfiles);
    // One unmeasured round: the first walk also loads the shell's own parts.
    for (int round = 0; round <= kRounds; ++round) {
        if (!SaveHives(profiles)) {
            std::printf("round %d: could not save the hives\n", round);
            RemoveProfiles(profiles);
            return 1;
        }
        double start = NowMilliseconds();
        int loaded = LoadAndUnload(profiles);
        baseline.ms.push_back(NowMilliseconds() - start);
        start = NowMilliseconds();
        DeleteAllCurUserReg(L"SOFTWARE\\Mirovan\\QmkTools", nullptr, nullptr);
        ours.ms.push_back(NowMilliseconds() - start);
        if (round == 0) {
            ours.ms.clear();
            baseline.ms.clear();
            continue;
        }
        ratios.ms.push_back(ours.ms.back() / baseline.ms.back());
        std::printf(
            "round %d: %d hives  load/unload %8.1f ms  DeleteAllCurUserReg %8.1f ms  "
            "ratio %.3f\n",
            round, loaded, baseline.ms.back(), ours.ms.back(), ratios.ms.back());
    }
    RemoveProfiles(profiles);
    double ourMedian = ours.Median();
    double baseMedian = baseline.Median();
    std::printf("median: DeleteAllCurUserReg %.1f ms, load/unload %.1f ms; median ratio %.3f\n",
                ourMedian, baseMedian, ratios.Median());
    // The fastest round of each is the one least disturbed by the machine's
    // other work: their ratio is the cleanup's own cost.
    double ourBest = *std::min_element(ours.ms.begin(), ours.ms.end());
    double baseBest = *std::min_element(baseline.ms.begin(), baseline.ms.end());
    std::printf(
        "best: DeleteAllCurUserReg %.1f ms, load/unload %.1f ms, the cleanup adds %.3f ms "
        "per hive; ratio %.3f (goal <= 1.3)\n",
        ourBest, baseBest, (ourBest - baseBest) / kProfiles, ourBest / baseBest);
    return 0;
}
