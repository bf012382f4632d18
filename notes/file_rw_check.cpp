// Whether a file may be read and written, as the Sametime code asks before
// editing a configuration file.
#include <shlwapi.h>
#include <stdio.h>

#include "base/trace.h"
#include "notes/notes_plugin_files.h"

bool IsFileAllowRW(const wchar_t* path) {
    TraceLevel1(TraceValue("IsFileAllowRW"), TraceNamed("lpszFilePath", path));
    if (path == nullptr) {
        TraceLevel1(TraceValue("IsFileAllowRW: input para is NULL!\n"));
        return false;
    }
    if (!PathFileExistsW(path)) {
        TraceLevel1(TraceValue("IsFileAllowRW: File path is not existed!\n"));
        return false;
    }
    // "r+" opens for reading and writing without truncating.
    FILE* file = _wfopen(path, L"r+");
    if (file == nullptr) {
        TraceLevel1(TraceValue("IsFileAllowRW: _tfopen failed with Read and write!\n"));
        return false;
    }
    fclose(file);
    return true;
}
