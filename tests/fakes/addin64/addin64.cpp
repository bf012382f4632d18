// Stand-in for the suite's 64-bit add-in libraries, built for x86-64 and
// copied under each add-in's name. regsvr32's calls are recorded with the
// library's name and the folder regsvr32 worked in.
#include <windows.h>

#include <string>

#include "tests/fakes/common/fake_recorder.h"

namespace {

HMODULE g_module = nullptr;

std::string Narrow(const wchar_t* text) {
    char buffer[1024] = {};
    WideCharToMultiByte(CP_ACP, 0, text, -1, buffer, sizeof(buffer) - 1, nullptr, nullptr);
    return buffer;
}

HRESULT Record(const char* call) {
    wchar_t library[MAX_PATH] = {};
    GetModuleFileNameW(g_module, library, MAX_PATH);
    wchar_t folder[MAX_PATH] = {};
    GetCurrentDirectoryW(MAX_PATH, folder);
    fake::RecordCall(Narrow(library) + " " + call + " in " + Narrow(folder) + " by " +
                     Narrow(GetCommandLineW()));
    return S_OK;
}

}  // namespace

extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
    if (reason == DLL_PROCESS_ATTACH) {
        g_module = instance;
    }
    return TRUE;
}

extern "C" HRESULT WINAPI DllRegisterServer() {
    return Record("DllRegisterServer");
}

extern "C" HRESULT WINAPI DllUnregisterServer() {
    return Record("DllUnregisterServer");
}
