// Stand-in for the suite library the program holds for its lifetime. Its load
// and unload are recorded in the calls log; "isTrustCert" records any call.
#include <windows.h>

#include "tests/fakes/common/fake_recorder.h"

extern "C" BOOL WINAPI DllMain(HINSTANCE, DWORD reason, LPVOID) {
    if (reason == DLL_PROCESS_ATTACH) {
        fake::RecordCall("qmusredt.dll loaded");
    } else if (reason == DLL_PROCESS_DETACH) {
        fake::RecordCall("qmusredt.dll unloaded");
    }
    return TRUE;
}

extern "C" int __cdecl isTrustCert() {
    fake::RecordCall("qmusredt.dll isTrustCert");
    return 1;
}
