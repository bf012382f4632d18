#include "tests/support/test_paths.h"

#include <windows.h>
#include <shlwapi.h>

std::wstring TestBinDir() {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, path, MAX_PATH);
    PathRemoveFileSpecW(path);  // build/bin/tests
    PathRemoveFileSpecW(path);  // build/bin
    return path;
}

std::wstring BuiltProgramPath() {
    return TestBinDir() + L"\\qmMrvONI.exe";
}

std::wstring FakePath(const wchar_t* rel) {
    return TestBinDir() + L"\\fakes\\" + rel;
}
