#include "tests/support/process_wait.h"

#include <tlhelp32.h>

bool AwaitProcessesNamed(const wchar_t* name, DWORD timeoutMs) {
    HANDLE snapshot = CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0);
    if (snapshot == INVALID_HANDLE_VALUE) {
        return false;
    }
    bool allEnded = true;
    PROCESSENTRY32W entry = {};
    entry.dwSize = sizeof(entry);
    for (BOOL more = Process32FirstW(snapshot, &entry); more;
         more = Process32NextW(snapshot, &entry)) {
        if (lstrcmpiW(entry.szExeFile, name) != 0) {
            continue;
        }
        if (HANDLE process = OpenProcess(SYNCHRONIZE, FALSE, entry.th32ProcessID)) {
            allEnded = WaitForSingleObject(process, timeoutMs) == WAIT_OBJECT_0 && allEnded;
            CloseHandle(process);
        }
    }
    CloseHandle(snapshot);
    return allEnded;
}
