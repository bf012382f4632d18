// The old Outlook integration's files, scheduled for deletion at the next
// restart: its folder is found through its registered in-process server.
#include <windows.h>
#include <shlwapi.h>

#include "base/path_api.h"
#include "base/registry.h"
#include "base/trace.h"
#include "cleanup/legacy_removal.h"
#include "notes/plugin_paths.h"

namespace {

const wchar_t kOldOutlookServerKey[] =
    L"CLSID\\{061E7FF2-9750-46FB-AFD6-245CE0AB8549}\\InprocServer32";

const wchar_t* const kOldOutlookFiles[] = {
    L"qmcodec.dll",  L"OI3Inst.dll",         L"OI3Main.dll",   L"OI3Res.dll",
    L"OI31Upd.exe",  L"oimain10.dll",        L"oimain11.dll",  L"oimain12.dll",
    L"olkaddin.dll", L"olkupdat.exe",        L"OlkUpRes.dll",  L"ONIUI.dll",
    L"MRVOIURL.dll", L"mirovan_ball_32.ico", L"mirovanoi.chm", L"MirovanONI.exe",
};

// The folder of the old integration's main library.
bool GetOldOIInstallPath(CStringEx& folder) {
    GetRegString(HKEY_CLASSES_ROOT, kOldOutlookServerKey, L"", folder, 0);
    if (folder.IsEmpty()) {
        TraceLevel1(TraceValue("GetOldOIInstallPath: InprocServer32 path is empty!\n"));
        return false;
    }
    CPathApi::RemoveFileSpec(folder);
    return true;
}

bool DeleteAtRestart(const wchar_t* path) {
    return MoveFileExW(path, nullptr, MOVEFILE_DELAY_UNTIL_REBOOT) != FALSE;
}

void LogScheduleFailure(const wchar_t* what) {
    CStringEx line;
    line.Format(L"RemoveOldOIInstallFiles: MoveFileEx FAILED: delete Old OI %s error=%d\n", what,
                static_cast<int>(GetLastError()));
    TraceLevel1(TraceValue(line));
}

// The part of folder before its last component named "327" (the release
// folder the old installer made), or empty. A longer name such as "3270" is
// another folder.
CStringEx PathBeforeReleaseFolder(const CStringEx& folder) {
    const wchar_t* text = folder.c_str();
    for (int at = folder.GetLength() - 4; at >= 0; --at) {
        if (wcsncmp(text + at, L"\\327", 4) == 0 &&
            (text[at + 4] == L'\0' || text[at + 4] == L'\\')) {
            return folder.Left(at);
        }
    }
    return CStringEx();
}

}  // namespace

void RemoveOldOIInstallFiles() {
    CStringEx folder;
    if (!GetOldOIInstallPath(folder)) {
        TraceLevel1(TraceValue("RemoveOldOIInstallFiles: GetOldOIInstallPath FAILED!\n"));
        return;
    }
    if (!IsUsableFolder(folder.c_str())) {
        TraceLevel1(TraceValue("RemoveOldOIInstallFiles: OI Install Path was not existed!\n"));
        return;
    }
    for (const wchar_t* name : kOldOutlookFiles) {
        wchar_t path[MAX_PATH];
        if (JoinFilePath(folder.c_str(), name, path) && PathFileExistsW(path) &&
            !DeleteAtRestart(path)) {
            LogScheduleFailure(L"file");
        }
    }
    if (!DeleteAtRestart(folder.c_str())) {
        LogScheduleFailure(L"folder");
    }
    CStringEx above = PathBeforeReleaseFolder(folder);
    if (IsUsableFolder(above.c_str())) {
        DeleteAtRestart(above.c_str());
    }
}
