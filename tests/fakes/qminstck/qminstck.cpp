// Stand-in for the suite's installer-check library: records the call of its
// one export and the folder it was loaded from.
#include <windows.h>

#include <string>

#include "tests/fakes/common/fake_recorder.h"

namespace {
HMODULE g_module = nullptr;
}

extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
    if (reason == DLL_PROCESS_ATTACH) {
        g_module = instance;
    }
    return TRUE;
}

extern "C" int __cdecl ModifyAdminMsiVersion() {
    char path[MAX_PATH] = {};
    GetModuleFileNameA(g_module, path, MAX_PATH);
    fake::RecordCall(std::string("ModifyAdminMsiVersion from ") + path);
    return 1;
}
