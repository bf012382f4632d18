// The suite's 64-bit add-in libraries, registered and unregistered through
// the 64-bit regsvr32: a 32-bit process cannot load them itself.
#include <windows.h>
#include <shellapi.h>

#include "base/os_version.h"
#include "base/path_api.h"
#include "base/trace.h"
#include "base/win_handles.h"
#include "cleanup/legacy_removal.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"

namespace {

const wchar_t* const k64BitAddins[] = {
    L"qmolkadd64.dll", L"qmMrvMS64.dll", L"qmMrvRM64.dll", L"qmonecli64.dll", L"qmMrvst64.dll",
};

// "C:\Windows\SysWOW64\regsvr32.exe": the 32-bit regsvr32, which hands a
// 64-bit library on to the 64-bit one. Empty on 32-bit Windows.
CStringEx Wow64Regsvr32() {
    wchar_t folder[MAX_PATH] = {};
    if (!MrvGetSystemWow64Directory(folder, MAX_PATH)) {
        TraceLevel1(TraceValue("Reg64BitDLL: MrvGetSystemWow64Directory failed!\n"));
        return CStringEx();
    }
    CStringEx path(folder);
    CStringEx::PathAppend(path, L"regsvr32.exe");
    if (!IsRegularFile(path.c_str())) {
        CStringEx line;
        line.Format(L"Reg64BitDLL: cannot find [%s]!\n", path.c_str());
        TraceLevel1(TraceValue(line));
        return CStringEx();
    }
    return path;
}

}  // namespace

BOOL Reg64BitDLL(const wchar_t* library, const wchar_t* option) {
    if (library == nullptr || option == nullptr) {
        TraceLevel1(TraceValue("Reg64BitDLL: input para is NULL!\n"));
        return FALSE;
    }
    CStringEx regsvr32 = Wow64Regsvr32();
    if (regsvr32.IsEmpty()) {
        return FALSE;
    }
    wchar_t shortPath[MAX_PATH] = {};
    if (GetShortPathNameW(regsvr32.c_str(), shortPath, MAX_PATH) == 0) {
        wcsncpy(shortPath, regsvr32.c_str(), MAX_PATH - 1);
    }
    CStringEx parameters;
    parameters.Format(L"/s %s \"%s\"", option, library);
    // regsvr32 works in the library's own folder, where the library's own
    // dependencies lie.
    CStringEx folder(library);
    CPathApi::RemoveFileSpec(folder);

    SHELLEXECUTEINFOW execute = {};
    execute.cbSize = sizeof(execute);
    // No error box: under an installer nobody would close it.
    execute.fMask = SEE_MASK_NOCLOSEPROCESS | SEE_MASK_DOENVSUBST | SEE_MASK_FLAG_NO_UI;
    execute.lpVerb = L"open";
    execute.lpFile = shortPath;
    execute.lpParameters = parameters.c_str();
    execute.lpDirectory = folder.IsEmpty() ? nullptr : folder.c_str();
    execute.nShow = SW_SHOW;
    if (!ShellExecuteExW(&execute) || execute.hProcess == nullptr) {
        CStringEx line;
        line.Format(L"Reg64BitDLL: ShellExecuteEx failed, error=%d\n",
                    static_cast<int>(GetLastError()));
        TraceLevel1(TraceValue(line));
        return FALSE;
    }
    UniqueHandle process(execute.hProcess);
    WaitForSingleObject(process.get(), INFINITE);
    return TRUE;
}

void RegQM64BitAddin() {
    wchar_t install[kLocationCapacity] = {};
    if (!GetQMInstallPath(install, kLocationCapacity)) {
        return;
    }
    for (const wchar_t* name : k64BitAddins) {
        wchar_t path[MAX_PATH];
        if (!JoinFilePath(install, name, path) || !IsRegularFile(path)) {
            CStringEx line;
            line.Format(L"RegQM64BitAddin: [%s] is not existed!\n", path);
            TraceLevel1(TraceValue(line));
            continue;
        }
        Reg64BitDLL(path, L"/u");
    }
}
