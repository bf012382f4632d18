#include "tests/support/host_shell.h"

#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"

namespace {

// One argument of a Windows command line, as Wine splits it into the host's
// argv: in quotes, inner quotes escaped.
std::wstring Quoted(const std::string& text) {
    std::wstring quoted = L"\"";
    for (wchar_t ch : Widen(text)) {
        quoted += ch == L'"' ? std::wstring(L"\\\"") : std::wstring(1, ch);
    }
    return quoted + L"\"";
}

}  // namespace

std::string HostPath(const std::wstring& windowsPath) {
    using UnixNameFn = char*(CDECL*)(const wchar_t*);
    auto unixName = reinterpret_cast<UnixNameFn>(reinterpret_cast<void*>(
        GetProcAddress(GetModuleHandleW(L"kernel32.dll"), "wine_get_unix_file_name")));
    char* name = unixName != nullptr ? unixName(windowsPath.c_str()) : nullptr;
    std::string path = name != nullptr ? name : "";
    if (name != nullptr) {
        HeapFree(GetProcessHeap(), 0, name);
    }
    return path;
}

int RunHostShell(const std::string& script, const std::vector<std::string>& args, DWORD timeoutMs) {
    ScratchDir scratch(L"sh");
    const std::wstring status = scratch.Sub(L"status");
    // $0 is the status file, written whole once the script has ended.
    std::wstring line = L"sh -c " +
                        Quoted(script + "\necho $? >\"$0.part\" && mv \"$0.part\" \"$0\"") + L" " +
                        Quoted(HostPath(status));
    for (const std::string& arg : args) {
        line += L" " + Quoted(arg);
    }
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessW(L"Z:\\bin\\sh", &line[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr,
                        &startup, &process)) {
        return -1;
    }
    CloseHandle(process.hThread);  // null for a host program, as is the process
    CloseHandle(process.hProcess);
    for (DWORD start = GetTickCount(); !FileExists(status); Sleep(50)) {
        if (GetTickCount() - start > timeoutMs) {
            return -1;
        }
    }
    return atoi(ReadFileBytes(status).c_str());
}
