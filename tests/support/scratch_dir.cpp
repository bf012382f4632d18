#include "tests/support/scratch_dir.h"

#include <windows.h>

#include "tests/support/file_util.h"

ScratchDir::ScratchDir(const wchar_t* tag) {
    static unsigned counter = 0;
    wchar_t temp[MAX_PATH] = {};
    GetTempPathW(MAX_PATH, temp);
    do {
        m_path = std::wstring(temp) + L"qm-" + tag + L"-" + std::to_wstring(GetCurrentProcessId()) +
                 L"-" + std::to_wstring(++counter);
    } while (!CreateDirectoryW(m_path.c_str(), nullptr));
}

ScratchDir::~ScratchDir() {
    RemoveTree(m_path);
}

std::wstring ScratchDir::Sub(const std::wstring& rel, bool makeDir) const {
    std::wstring full = JoinPath(m_path, rel);
    if (makeDir) {
        MakeDirs(full);
    }
    return full;
}
