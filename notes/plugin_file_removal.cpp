// Removing the Notes plug-in's files: the current generation from the Notes
// folder, the previous generation from the Notes folder and from its own
// install folder, and leftover files matching a pattern.
#include <wchar.h>

#include "base/trace.h"
#include "base/win_handles.h"
#include "notes/notes_plugin_files.h"
#include "notes/plugin_file_lists.h"
#include "notes/plugin_paths.h"

namespace {

// Deletes folder\name when it exists; failures are ignored.
void DeleteListedFile(const wchar_t* folder, const wchar_t* name) {
    wchar_t path[MAX_PATH];
    if (JoinFilePath(folder, name, path) && IsRegularFile(path)) {
        DeleteFileW(path);
    }
}

// A pattern names files of the one folder: no path steps, no drive.
bool IsPlainPattern(const wchar_t* pattern) {
    return pattern[0] != L'\0' && wcspbrk(pattern, L"\\/:") == nullptr;
}

}  // namespace

bool RemoveNotesPluginFiles(const wchar_t* notesFolder) {
    TraceLevel1(TraceValue("RemoveNotesPluginFiles"), TraceNamed("lpszFilePath", notesFolder));
    if (notesFolder == nullptr) {
        TraceLevel8(TraceValue("NIHandle:RemoveNotesPluginFiles: Input Para is NULL!"));
        return false;
    }
    if (!IsUsableFolder(notesFolder)) {
        return false;
    }
    for (const wchar_t* name : kPluginFiles) {
        if (!IsSameFileName(name, kSharedUrlLibrary)) {
            DeleteListedFile(notesFolder, name);
        }
    }
    return true;
}

bool RemoveOldNotesPluginFiles(const wchar_t* notesFolder) {
    TraceLevel1(TraceValue("RemoveOldNotesPluginFiles"), TraceNamed("lpszFilePath", notesFolder));
    if (notesFolder == nullptr) {
        TraceLevel8(TraceValue("RemoveOldNotesPluginFiles: Input Para is NULL!"));
        return false;
    }
    if (!IsUsableFolder(notesFolder)) {
        return false;
    }
    for (const wchar_t* name : kOldPluginFiles) {
        wchar_t path[MAX_PATH];
        if (!JoinFilePath(notesFolder, name, path)) {
            continue;
        }
        DeleteFileW(path);
        // Still there: in use; it goes at the next restart.
        if (IsRegularFile(path)) {
            MoveFileExW(path, nullptr, MOVEFILE_DELAY_UNTIL_REBOOT);
        }
    }
    return true;
}

bool DeleteInstallFolder(const wchar_t* folder) {
    TraceLevel1(TraceValue("DeleteInstallFolder"), TraceNamed("lpszFilePath", folder));
    if (folder == nullptr) {
        TraceLevel8(TraceValue("DeleteInstallFolder: Input Para is NULL!"));
        return false;
    }
    if (!IsUsableFolder(folder)) {
        return false;
    }
    TraceLevel1(TraceValue("Param lpszFilePath:"), TraceValue(folder));
    for (const wchar_t* name : kOldPluginFiles) {
        DeleteListedFile(folder, name);
    }
    for (const wchar_t* name : kOldInstallExtraFiles) {
        DeleteListedFile(folder, name);
    }
    // Only an empty folder goes; anything foreign keeps it.
    RemoveDirectoryW(folder);
    return true;
}

bool RemoveFilesSpecPostfix(const wchar_t* folder, const wchar_t* pattern) {
    TraceLevel1(TraceValue("RemoveFilesSpecPostfix"), TraceNamed("lpszFilePath", folder));
    if (folder == nullptr || pattern == nullptr) {
        TraceLevel1(TraceValue("RemoveFilesSpecPostfix: input para is NULL!\n"));
        return false;
    }
    if (!IsUsableFolder(folder)) {
        TraceLevel1(TraceValue("RemoveFilesSpecPostfix: Spec file path is not existed!\n"));
        return false;
    }
    wchar_t search[MAX_PATH];
    if (!IsPlainPattern(pattern) || !JoinFilePath(folder, pattern, search)) {
        return false;
    }
    WIN32_FIND_DATAW found;
    UniqueFindHandle find(FindFirstFileW(search, &found));
    if (!find) {
        return true;
    }
    do {
        if ((found.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) == 0) {
            DeleteListedFile(folder, found.cFileName);
        }
    } while (FindNextFileW(find.get(), &found));
    return true;
}
