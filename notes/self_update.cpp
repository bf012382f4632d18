#include "notes/self_update.h"

#include <shlwapi.h>

#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"
#include "notes/update_file_names.h"
#include "notes/update_process_start.h"

namespace {

int g_updateModeFlag = 0;

// Each folder counts only when it is an existing folder given by a full path:
// an empty or relative one would aim the copies and deletions at the current
// folder.
bool FindPluginFolder(wchar_t (&folder)[MAX_PATH]) {
    return GetNIPath(folder, MAX_PATH) && IsUsableFolder(folder);
}

bool FindNotesFolder(wchar_t (&folder)[MAX_PATH]) {
    return GetNotesPath(folder, MAX_PATH) && IsUsableFolder(folder);
}

void DeleteIn(const wchar_t* folder, const wchar_t* name) {
    wchar_t path[MAX_PATH];
    if (JoinFilePath(folder, name, path)) {
        DeleteFileW(path);
    }
}

// Replaces targetFolder\targetName by a fresh copy of sourceFolder\sourceName.
void ReplaceByCopy(const wchar_t* sourceFolder, const wchar_t* sourceName,
                   const wchar_t* targetFolder, const wchar_t* targetName) {
    wchar_t source[MAX_PATH];
    wchar_t target[MAX_PATH];
    if (JoinFilePath(sourceFolder, sourceName, source) &&
        JoinFilePath(targetFolder, targetName, target)) {
        DeleteFileW(target);
        CopyFileW(source, target, FALSE);
    }
}

}  // namespace

int GetUpdateModeFlag() {
    return g_updateModeFlag;
}

void SetUpdateModeFlag(int flag) {
    g_updateModeFlag = flag;
}

bool IsTemporaryUpdateCopy() {
    wchar_t path[MAX_PATH] = {};
    if (GetModuleFileNameW(nullptr, path, MAX_PATH) == 0) {
        return false;
    }
    return lstrcmpiW(PathFindFileNameW(path), kTemporaryProgramFileName) == 0;
}

int LaunchTemporaryUpdateCopy() {
    wchar_t plugin[MAX_PATH] = {};
    wchar_t notes[MAX_PATH] = {};
    wchar_t copy[MAX_PATH] = {};
    UniqueHandle process;
    bool started = false;
    if (FindPluginFolder(plugin) && FindNotesFolder(notes)) {
        ReplaceByCopy(notes, kUpdaterFileName, plugin, kTemporaryUpdaterFileName);
        ReplaceByCopy(notes, kInstalledProgramFileName, plugin, kTemporaryProgramFileName);
        started = JoinFilePath(plugin, kTemporaryProgramFileName, copy) &&
                  StartUpdateProcess(copy, L"-nupdate", nullptr, SW_HIDE, &process);
    }
    if (!started) {
        TraceLevel1(TraceValue("\nLaunching ~MrvONI.exe process failed.\n"));
        return -1;
    }
    return 0;
}

void DeleteTemporaryUpdateCopies() {
    wchar_t plugin[MAX_PATH] = {};
    if (FindPluginFolder(plugin)) {
        DeleteIn(plugin, kTemporaryUpdaterFileName);
        DeleteIn(plugin, kTemporaryProgramFileName);
    }
}
