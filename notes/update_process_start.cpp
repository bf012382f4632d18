#include "notes/update_process_start.h"

#include <shellapi.h>

#include "base/trace.h"

bool StartUpdateProcess(const wchar_t* exePath, const wchar_t* parameters,
                        const wchar_t* workingFolder, int showCommand, UniqueHandle* process) {
    process->reset();
    wchar_t shortPath[MAX_PATH] = {};
    DWORD shortChars = GetShortPathNameW(exePath, shortPath, MAX_PATH);
    SHELLEXECUTEINFOW info = {};
    info.cbSize = sizeof(info);
    // Without SEE_MASK_FLAG_NO_UI a failed start waits behind an error box
    // that a hidden update run never gets closed.
    info.fMask = SEE_MASK_NOCLOSEPROCESS | SEE_MASK_DOENVSUBST | SEE_MASK_FLAG_NO_UI;
    info.lpFile = (shortChars > 0 && shortChars < MAX_PATH) ? shortPath : exePath;
    info.lpParameters = parameters;
    info.lpDirectory = workingFolder;
    info.nShow = showCommand;
    if (!ShellExecuteExW(&info)) {
        DWORD error = GetLastError();
        TraceLevel4(TraceValue("StartUpdateProcess: ShellExecuteExW failed"),
                    TraceNamed("lpFile", exePath), TraceNamed("dwError", error));
        return false;
    }
    process->reset(info.hProcess);
    return true;
}
