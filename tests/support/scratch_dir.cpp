#include "tests/support/scratch_dir.h"

#include <windows.h>

#include "tests/support/file_util.h"

ScratchDir::ScratchDir(const wchar_t* tag) {
    static unsigned counter = 0;
    wchar_t temp[MAX_PATH] = {};
    GetTempPathW(MAX_PATH, temp);
    wchar_t name[MAX_PATH];
    for (;;) {
        _snwprintf(name, MAX_PATH, L"%lsqm-%ls-%lu-%u", temp, tag, GetCurrentProcessId(),
                   ++counter);
        name[MAX_PATH - 1] = L'\0';
        if (CreateDirectoryW(name, nullptr)) {
            break;
        }
    }
    m_path = name;
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
