#include "app/startup.h"

#include <shlwapi.h>

#include "base/proc_address.h"
#include "base/trace.h"
#include "base/win_handles.h"

namespace {

using NtSetInformationProcessFn = LONG(WINAPI*)(HANDLE process, ULONG infoClass, PVOID info,
                                                ULONG length);
using GetModuleHandleExWFn = BOOL(WINAPI*)(DWORD flags, LPCWSTR name, HMODULE* module);

const ULONG kProcessExecuteFlags = 34;
const ULONG kMemExecuteOptionEnable = 2;
const DWORD kFromAddress = 4;  // GET_MODULE_HANDLE_EX_FLAG_FROM_ADDRESS

}  // namespace

int DisableDEP() {
    UniqueModule ntdll(LoadLibraryW(L"ntdll.dll"));
    if (!ntdll) {
        TraceLevel8(TraceValue("qmMrvONI.exe: DisableDEP: LoadLibrary ntdll.dll failed!\n"));
        return 0;
    }
    auto setInformation =
        GetProcAs<NtSetInformationProcessFn>(ntdll.get(), "NtSetInformationProcess");
    if (setInformation == nullptr) {
        return 0;
    }
    ULONG flags = kMemExecuteOptionEnable;
    setInformation(GetCurrentProcess(), kProcessExecuteFlags, &flags, sizeof(flags));
    return 1;
}

FARPROC LoadSuiteLibraryExport(const char* exportName, HMODULE* moduleHandle) {
    UniqueModule kernel32(LoadLibraryA("kernel32.dll"));
    if (!kernel32) {
        return nullptr;
    }
    auto getModuleHandleEx = GetProcAs<GetModuleHandleExWFn>(kernel32.get(), "GetModuleHandleExW");
    if (getModuleHandleEx == nullptr) {
        return nullptr;
    }
    HMODULE self = nullptr;
    if (!getModuleHandleEx(kFromAddress, reinterpret_cast<LPCWSTR>(&LoadSuiteLibraryExport),
                           &self) ||
        self == nullptr) {
        return nullptr;
    }
    wchar_t path[MAX_PATH] = {};
    DWORD length = GetModuleFileNameW(self, path, MAX_PATH);
    if (length == 0 || length >= MAX_PATH) {
        return nullptr;
    }
    wchar_t* lastSlash = StrRChrW(path, nullptr, L'\\');
    if (lastSlash == nullptr) {
        return nullptr;
    }
    *lastSlash = L'\0';
    const wchar_t kName[] = L"\\qmusredt.dll";
    if (lstrlenW(path) + lstrlenW(kName) >= MAX_PATH) {
        return nullptr;
    }
    lstrcatW(path, kName);
    HMODULE library = LoadLibraryW(path);
    if (moduleHandle != nullptr) {
        *moduleHandle = library;
    }
    if (library == nullptr || exportName == nullptr) {
        return nullptr;
    }
    return GetProcAddress(library, exportName);
}

SuiteLibraryHolder::SuiteLibraryHolder(int load) {
    if (load == 1) {
        LoadSuiteLibraryExport("isTrustCert", &m_module);
    }
}

SuiteLibraryHolder::~SuiteLibraryHolder() {
    End();
}

void SuiteLibraryHolder::End() {
    if (m_module != nullptr) {
        FreeLibrary(m_module);
        m_module = nullptr;
    }
}
