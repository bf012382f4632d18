#include "notes/self_update.h"

#include <shlwapi.h>

#include "base/trace.h"

namespace {
int g_updateModeFlag = 0;
}  // namespace

int GetUpdateModeFlag() {
    return g_updateModeFlag;
}

void SetUpdateModeFlag(int flag) {
    g_updateModeFlag = flag;
}

bool IsTemporaryUpdateCopy() {
    wchar_t path[MAX_PATH] = {};
    if (GetModuleFileNameW(nullptr, path, MAX_PATH) == 0) {
        return false;
    }
    return lstrcmpiW(PathFindFileNameW(path), L"~MrvONI.exe") == 0;
}

// The temporary copies, the hidden window and the protocol with the updater
// arrive with the self-update work. Until then no copy is started, so the
// launch reports its failure.
int LaunchTemporaryUpdateCopy() {
    TraceLevel1(TraceValue("\nLaunching ~MrvONI.exe process failed.\n"));
    return -1;
}

HWND CreateUpdateWindow(HINSTANCE /*instance*/, int /*showCommand*/) {
    return nullptr;
}

void FinishUpdate() {}

void DeleteTemporaryUpdateCopies() {}
