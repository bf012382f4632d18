#include "app/ni_handle.h"

#include "app/maintenance_keywords.h"
#include "base/trace.h"
#include "notes/self_update.h"

namespace {

// The temporary update copy keeps the process alive in its hidden window's
// message loop; the quit message carries the result.
int RunUpdateLoop(HINSTANCE instance, int showCommand) {
    if (CreateUpdateWindow(instance, showCommand) == nullptr) {
        return 0;
    }
    MSG message = {};
    BOOL got;
    while ((got = GetMessageW(&message, nullptr, 0, 0)) != 0 && got != -1) {
        TranslateMessage(&message);
        DispatchMessageW(&message);
    }
    if (GetUpdateModeFlag() == 1) {
        FinishUpdate();
    }
    return got == -1 ? 0 : static_cast<int>(message.wParam);
}

}  // namespace

const wchar_t* FindMaintenanceKeyword(const wchar_t* commandLine) {
    if (commandLine == nullptr) {
        return nullptr;
    }
    for (const wchar_t* p = commandLine; *p != L'\0'; p = CharNextW(p)) {
        if (*p == L'-' || *p == L'/') {
            return p + 1;
        }
    }
    return nullptr;
}

int NIHandle(HINSTANCE instance, const wchar_t* commandLine, int showCommand) {
    TraceLevel2Named("NIHandle", TraceNamed("lpCmdLine", commandLine));
    OutputDebugStringW(L"NIHandle:");
    OutputDebugStringW(commandLine ? commandLine : L"");

    SetUpdateModeFlag(0);
    const MaintenanceKeyword* entry =
        FindMaintenanceKeywordEntry(FindMaintenanceKeyword(commandLine));
    if (entry != nullptr) {
        int result = entry->job();
        if (entry->returnsResult && GetUpdateModeFlag() == 0) {
            return result;
        }
    }
    if (GetUpdateModeFlag() == 0) {
        return 0;
    }
    return RunUpdateLoop(instance, showCommand);
}
