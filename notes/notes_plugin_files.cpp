// Copying the Notes plug-in's files into the Notes program folder: the
// install-time copy from the suite folder and the completion after a
// self-update.
#include "notes/notes_plugin_files.h"

#include "base/trace.h"
#include "base/win_handles.h"
#include "notes/plugin_file_lists.h"
#include "notes/plugin_paths.h"

namespace {

// True when FindFirstFileW finds path.
bool IsFound(const wchar_t* path) {
    WIN32_FIND_DATAW data;
    UniqueFindHandle find(FindFirstFileW(path, &data));
    return find.valid();
}

}  // namespace

bool CopyNotesPluginFiles(const wchar_t* notesFolder, const wchar_t* installFolder) {
    TraceLevel1(TraceValue("CopyNotesPluginFiles"), TraceNamed("lpszSrc", installFolder),
                TraceNamed("lpszDst", notesFolder));
    if (notesFolder == nullptr || installFolder == nullptr) {
        TraceLevel8(TraceValue("NIHandle:CopyNotesPluginFiles: Input Para is NULL!"));
        return false;
    }
    if (!IsUsableFolder(notesFolder) || !IsUsableFolder(installFolder)) {
        return false;
    }
    for (const wchar_t* name : kPluginFiles) {
        if (IsSameFileName(name, kSharedUrlLibrary) || IsSameFileName(name, kPluginDatabase)) {
            continue;
        }
        wchar_t source[MAX_PATH];
        wchar_t target[MAX_PATH];
        // A name whose full path would be too long is skipped, never cut
        // short into some other file's name.
        if (!JoinFilePath(installFolder, name, source) ||
            !JoinFilePath(notesFolder, name, target)) {
            TraceLevel4(TraceValue("CopyNotesPluginFiles: path too long"),
                        TraceNamed("name", name));
            continue;
        }
        CopyFileWithBackup(source, target, FALSE);
    }
    return true;
}

bool CopyPluginRemainedFiles(const wchar_t* notesFolder, const wchar_t* pluginFolder) {
    TraceLevel1(TraceValue("CopyPluginRemainedFiles"), TraceNamed("strSrc", pluginFolder),
                TraceNamed("strDst", notesFolder));
    if (!IsUsableFolder(notesFolder) || !IsUsableFolder(pluginFolder)) {
        return false;
    }
    for (const wchar_t* name : kPluginFiles) {
        wchar_t source[MAX_PATH];
        wchar_t target[MAX_PATH];
        if (!JoinFilePath(pluginFolder, name, source) || !JoinFilePath(notesFolder, name, target)) {
            return false;
        }
        if (!IsFound(target) && !CopyFileW(source, target, FALSE)) {
            return false;
        }
    }
    return true;
}
