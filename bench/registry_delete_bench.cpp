// CRegistry::RecurDeleteKey on a tree of 10,000 keys (10 x 10 x 100 below
// one key, 10,110 with the inner ones) against the system's own "reg.exe delete <key> /f" of the
// same tree, started as a process and waited for. Prints both times per round and the ratio ours /
// reg.exe (goal: at most 1.0).
#include <windows.h>

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

#include "bench/process_timing.h"
#include "base/registry_delete.h"

namespace {

const int kRounds = 5;
const int kFirstLevel = 10;
const int kSecondLevel = 10;
const int kLeaves = 100;

bool MakeKey(HKEY parent, const std::wstring& name, HKEY* out) {
    return RegCreateKeyExW(parent, name.c_str(), 0, nullptr, 0, KEY_ALL_ACCESS, nullptr, out,
                           nullptr) == ERROR_SUCCESS;
}

// Builds HKCU\tree with 10 x 10 x 100 keys below it (10,000 leaves, 10,110
// keys in all); the count of keys made.
int BuildTree(const std::wstring& tree) {
    HKEY top = nullptr;
    if (!MakeKey(HKEY_CURRENT_USER, tree, &top)) {
        return 0;
    }
    int made = 0;
    for (int i = 0; i < kFirstLevel; ++i) {
        HKEY first = nullptr;
        if (!MakeKey(top, L"level1_" + std::to_wstring(i), &first)) {
            continue;
        }
        ++made;
        for (int j = 0; j < kSecondLevel; ++j) {
            HKEY second = nullptr;
            if (!MakeKey(first, L"level2_" + std::to_wstring(j), &second)) {
                continue;
            }
            ++made;
            for (int k = 0; k < kLeaves; ++k) {
                HKEY leaf = nullptr;
                if (MakeKey(second, L"leaf_" + std::to_wstring(k), &leaf)) {
                    RegCloseKey(leaf);
                    ++made;
                }
            }
            RegCloseKey(second);
        }
        RegCloseKey(first);
    }
    RegCloseKey(top);
    return made;
}

bool KeyExists(const std::wstring& tree) {
    HKEY key = nullptr;
    if (RegOpenKeyExW(HKEY_CURRENT_USER, tree.c_str(), 0, KEY_READ, &key) != ERROR_SUCCESS) {
        return false;
    }
    RegCloseKey(key);
    return true;
}

// reg.exe with its output discarded; its exit code, or -1.
int RunReg(const std::wstring& tree) {
    wchar_t system[MAX_PATH] = {};
    GetSystemDirectoryW(system, MAX_PATH);
    std::wstring exe = std::wstring(system) + L"\\reg.exe";
    return RunQuietly(L"\"" + exe + L"\" delete \"HKCU\\" + tree + L"\" /f");
}

double Median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

}  // namespace

int wmain() {
    std::wstring tree = L"Software\\QMBench-" + std::to_wstring(GetCurrentProcessId()) + L"\\Tree";
    std::vector<double> ours;
    std::vector<double> theirs;
    std::printf("RecurDeleteKey vs reg.exe delete /f, tree of %d x %d x %d keys\n", kFirstLevel,
                kSecondLevel, kLeaves);
    for (int round = 1; round <= kRounds; ++round) {
        int made = BuildTree(tree);
        double start = NowMilliseconds();
        BOOL deleted = CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, tree.c_str(), 0);
        double ourMs = NowMilliseconds() - start;
        if (!deleted || KeyExists(tree)) {
            std::printf("round %d: RecurDeleteKey failed\n", round);
            return 1;
        }

        int madeAgain = BuildTree(tree);
        start = NowMilliseconds();
        int regExit = RunReg(tree);
        double regMs = NowMilliseconds() - start;
        if (regExit != 0 || KeyExists(tree)) {
            std::printf("round %d: reg.exe failed (exit %d)\n", round, regExit);
            return 1;
        }
        ours.push_back(ourMs);
        theirs.push_back(regMs);
        std::printf(
            "round %d: %d / %d keys  RecurDeleteKey %8.1f ms  reg.exe %8.1f ms  ratio %.3f\n",
            round, made, madeAgain, ourMs, regMs, ourMs / regMs);
    }
    // What reg.exe costs without a tree: its process start and one deletion.
    std::vector<double> startOnly;
    for (int round = 0; round < kRounds; ++round) {
        HKEY single = nullptr;
        if (MakeKey(HKEY_CURRENT_USER, tree, &single)) {
            RegCloseKey(single);
        }
        double start = NowMilliseconds();
        RunReg(tree);
        startOnly.push_back(NowMilliseconds() - start);
    }
    double ourMedian = Median(ours);
    double regMedian = Median(theirs);
    double regStart = Median(startOnly);
    std::printf("median: RecurDeleteKey %.1f ms, reg.exe %.1f ms, ratio %.3f (goal <= 1.0)\n",
                ourMedian, regMedian, ourMedian / regMedian);
    std::printf("reg.exe on a single key: %.1f ms; without that, ratio %.3f\n", regStart,
                ourMedian / (regMedian - regStart));
    RegDeleteKeyW(HKEY_CURRENT_USER,
                  (L"Software\\QMBench-" + std::to_wstring(GetCurrentProcessId())).c_str());
    return 0;
}
