// Stand-in for a running program, built as OUTLOOK.EXE, qmoneclk.exe and
// qminst.exe.
// Started with "-stay" it just runs until it is ended; otherwise it records
// its command line (without its own name) in the calls log and ends.
#include <windows.h>

#include <string>

#include "tests/fakes/common/fake_recorder.h"
#include "tests/fakes/common/fake_text.h"

namespace {

// The command line after the program's own name and the one space behind it.
std::wstring Arguments() {
    const wchar_t* line = GetCommandLineW();
    if (*line == L'"') {
        line = wcschr(line + 1, L'"');
        line = line ? line + 1 : L"";
    } else {
        while (*line != L'\0' && *line != L' ') {
            ++line;
        }
    }
    if (*line == L' ') {
        ++line;
    }
    return line;
}

}  // namespace

int WINAPI wWinMain(HINSTANCE, HINSTANCE, wchar_t*, int) {
    std::wstring arguments = Arguments();
    if (arguments == L"-stay") {
        Sleep(INFINITE);
        return 0;
    }
    wchar_t self[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, self, MAX_PATH);
    const wchar_t* name = wcsrchr(self, L'\\');
    fake::RecordCall(fake::Utf8((std::wstring(name ? name + 1 : self) + L" " + arguments).c_str()));
    return 0;
}
