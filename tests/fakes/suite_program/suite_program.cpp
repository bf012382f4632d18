// Stand-in for the suite programs the shortcuts point at (qmoneclk.exe,
// qminst.exe): records its file name and command line when started.
#include <windows.h>

#include <string>

#include "tests/fakes/common/fake_recorder.h"

int WINAPI wWinMain(HINSTANCE, HINSTANCE, LPWSTR commandLine, int) {
    char name[MAX_PATH] = {};
    GetModuleFileNameA(nullptr, name, MAX_PATH);
    const char* slash = strrchr(name, '\\');
    int length = WideCharToMultiByte(CP_ACP, 0, commandLine, -1, nullptr, 0, nullptr, nullptr);
    std::string arguments(length > 0 ? length - 1 : 0, '\0');
    if (length > 1) {
        WideCharToMultiByte(CP_ACP, 0, commandLine, -1, &arguments[0], length, nullptr, nullptr);
    }
    fake::RecordCall(std::string(slash != nullptr ? slash + 1 : name) + " started " + arguments);
    return 0;
}
