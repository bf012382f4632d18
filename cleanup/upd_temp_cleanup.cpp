// The update temporary folder "upd_temp" under the suite install folder, and
// the "*_upd_temp" leftovers of an interrupted update.
#include <shlwapi.h>

#include "base/trace.h"
#include "cleanup/legacy_removal.h"
#include "notes/notes_plugin_files.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"

namespace {

const wchar_t kLeftoverPattern[] = L"*_upd_temp";

// Empties a subfolder of upd_temp of its leftovers and removes it when empty.
void RemoveUpdTempSubfolder(const wchar_t* updTemp, const wchar_t* name) {
    wchar_t folder[MAX_PATH];
    if (JoinFilePath(updTemp, name, folder) && PathIsDirectoryW(folder)) {
        RemoveFilesSpecPostfix(folder, kLeftoverPattern);
        RemoveDirectoryW(folder);
    }
}

}  // namespace

void RemoveUpdTempFolder() {
    wchar_t install[kLocationCapacity] = {};
    if (!GetQMInstallPath(install, kLocationCapacity) || install[0] == L'\0') {
        TraceLevel1(TraceValue("RemoveUpdTempFolder: GetQMInstallPath is empty!\n"));
        return;
    }
    if (!IsUsableFolder(install)) {
        TraceLevel1(TraceValue("RemoveUpdTempFolder: qm install path is not existed!\n"));
        return;
    }
    wchar_t updTemp[MAX_PATH];
    if (!JoinFilePath(install, L"upd_temp", updTemp)) {
        return;
    }
    RemoveFilesSpecPostfix(updTemp, kLeftoverPattern);
    RemoveUpdTempSubfolder(updTemp, L"components");
    RemoveUpdTempSubfolder(updTemp, L"chrome");
    RemoveFilesSpecPostfix(install, L"*_upd_temp.*");
    // Only an empty folder goes.
    RemoveDirectoryW(updTemp);
}
