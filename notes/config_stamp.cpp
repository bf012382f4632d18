#include "notes/config_stamp.h"

#include <windows.h>

#include "base/reparse_guard.h"
#include "base/string_ex.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"
#include "notes/sametime_layout.h"
#include "notes/sametime_plugin_files.h"

namespace {

const wchar_t kStamp[] = L"last.config.stamp";
const wchar_t kStampBackup[] = L"last.config.stamp.bak";
const wchar_t kUpdateConfigFolder[] = L"configuration\\org.eclipse.update";

}  // namespace

void RenameConfigStamp(const wchar_t* configFolder) {
    // An empty folder would put the stamp work into the current directory.
    if (IsEmptyText(configFolder)) {
        return;
    }
    CStringEx backup = JoinLocalPath(configFolder, kStampBackup);
    if (IsRegularFile(backup.c_str())) {
        DeleteFileW(backup.c_str());
    }
    CStringEx stamp = JoinLocalPath(configFolder, kStamp);
    MoveFileW(stamp.c_str(), backup.c_str());
}

void ResetEclipseConfigStamp(const wchar_t* baseFolder) {
    if (IsEmptyText(baseFolder)) {
        return;
    }
    // baseFolder may be the user's Notes data folder: the stamp work never
    // follows a reparse point below it.
    CStringEx folder = JoinLocalPath(baseFolder, kUpdateConfigFolder);
    CStringEx stamp = JoinLocalPath(folder.c_str(), kStamp);
    if (IsUsableFolder(folder.c_str()) && IsFreeOfReparsePoints(baseFolder, stamp.c_str())) {
        RenameConfigStamp(folder.c_str());
    }
}

void DeleteSametimeStampFile() {
    wchar_t sametime[kLargeLocationCapacity] = {};
    DWORD version = sametime_layout::kPresetVersion;
    if (GetSametimePath(sametime, kLargeLocationCapacity, &version)) {
        ResetEclipseConfigStamp(sametime);
    }
    wchar_t data[kLargeLocationCapacity] = {};
    DWORD notesVersion = sametime_layout::kPresetVersion;
    if (GetEmbeddedSTDataPath(data, kLargeLocationCapacity, &notesVersion)) {
        ResetEclipseConfigStamp(data);
    }
}
