#include "notes/copy_with_backup.h"

#include <stdio.h>
#include <wchar.h>

#include "base/trace.h"
#include "notes/notes_plugin_files.h"
#include "notes/plugin_paths.h"

namespace {

// How many staging names are tried before giving up.
const int kStagingAttempts = 32;

// The folder part of path (up to, not including, the last separator) in out.
bool FolderOf(const wchar_t* path, wchar_t (&out)[MAX_PATH]) {
    const wchar_t* slash = wcsrchr(path, L'\\');
    const wchar_t* forward = wcsrchr(path, L'/');
    if (forward != nullptr && (slash == nullptr || forward > slash)) {
        slash = forward;
    }
    if (slash == nullptr || slash == path || slash - path >= MAX_PATH) {
        return false;
    }
    size_t chars = static_cast<size_t>(slash - path);
    wmemcpy(out, path, chars);
    out[chars] = L'\0';
    // "C:\x" keeps its root separator.
    if (chars == 2 && out[1] == L':') {
        out[2] = L'\\';
        out[3] = L'\0';
    }
    return true;
}

// Copies source to a new file with a free name beside target; false when no
// complete copy could be made (nothing is left behind then).
bool MakeStagingCopy(FileCopyPlatform& platform, const wchar_t* source, const wchar_t* target,
                     wchar_t (&staging)[MAX_PATH]) {
    wchar_t folder[MAX_PATH];
    if (!FolderOf(target, folder)) {
        return false;
    }
    unsigned seed = static_cast<unsigned>(GetTickCount() ^ (GetCurrentProcessId() << 8));
    for (int attempt = 0; attempt < kStagingAttempts; ++attempt) {
        wchar_t name[16];
        _snwprintf(name, 16, L"~qm%04X.tmp", (seed + static_cast<unsigned>(attempt)) & 0xFFFF);
        name[15] = L'\0';
        if (!JoinFilePath(folder, name, staging)) {
            return false;
        }
        if (GetFileAttributesW(staging) != INVALID_FILE_ATTRIBUTES) {
            continue;  // someone else's
        }
        if (platform.CopyOne(source, staging, TRUE)) {
            return true;
        }
        DWORD error = GetLastError();
        if (error == ERROR_FILE_EXISTS || error == ERROR_ALREADY_EXISTS) {
            continue;  // taken meanwhile
        }
        // A copy that failed part-way may have left a piece behind.
        platform.Remove(staging);
        return false;
    }
    return false;
}

}  // namespace

BOOL FileCopyPlatform::CopyOne(const wchar_t* from, const wchar_t* to, BOOL failIfExists) {
    return CopyFileW(from, to, failIfExists);
}

BOOL FileCopyPlatform::Rename(const wchar_t* from, const wchar_t* to, DWORD flags) {
    return MoveFileExW(from, to, flags);
}

BOOL FileCopyPlatform::Remove(const wchar_t* path) {
    return DeleteFileW(path);
}

void FileCopyPlatform::Now(SYSTEMTIME* localTime) {
    GetLocalTime(localTime);
}

FileCopyPlatform& SystemFileCopyPlatform() {
    static FileCopyPlatform platform;
    return platform;
}

bool FormatBackupName(const wchar_t* target, const SYSTEMTIME& localTime,
                      wchar_t (&out)[MAX_PATH]) {
    out[0] = L'\0';
    if (target == nullptr || target[0] == L'\0') {
        return false;
    }
    int written = _snwprintf(out, MAX_PATH, L"%ls.%d.%d.%d.%d.%d.%d.bak", target, localTime.wYear,
                             localTime.wMonth, localTime.wDay, localTime.wHour, localTime.wMinute,
                             localTime.wSecond);
    if (written < 0 || written >= MAX_PATH) {
        out[0] = L'\0';
        return false;
    }
    return true;
}

bool CopyFileWithBackup(FileCopyPlatform& platform, const wchar_t* source, const wchar_t* target,
                        BOOL failIfExists) {
    if (!IsRegularFile(source) || target == nullptr || target[0] == L'\0' ||
        wcsnlen(target, MAX_PATH) >= MAX_PATH) {
        return false;
    }
    if (!IsRegularFile(target)) {
        // Nothing there to lose (or a folder, which the copy refuses).
        return platform.CopyOne(source, target, failIfExists) != FALSE;
    }
    if (failIfExists) {
        SetLastError(ERROR_FILE_EXISTS);
        return false;
    }

    // The target is never opened for writing: a copy that fails part-way
    // must not leave it cut short.
    wchar_t staging[MAX_PATH];
    if (!MakeStagingCopy(platform, source, target, staging)) {
        TraceLevel4(TraceValue("CopyFileWithBackup: cannot copy the source beside the target"),
                    TraceNamed("lpszFilePath", target));
        return false;
    }
    if (platform.Rename(staging, target, MOVEFILE_REPLACE_EXISTING)) {
        return true;
    }

    // In use (a loaded library can be renamed but not replaced).
    SYSTEMTIME now;
    platform.Now(&now);
    wchar_t backup[MAX_PATH];
    if (!FormatBackupName(target, now, backup)) {
        platform.Remove(staging);
        TraceLevel4(TraceValue("CopyFileWithBackup: backup name too long"),
                    TraceNamed("lpszFilePath", target));
        return false;
    }
    // Whatever already has the backup name stays: it may be the only copy of
    // an earlier original, and a backup slated for deletion at restart would
    // take this original with it should it have to stay there.
    if (GetFileAttributesW(backup) != INVALID_FILE_ATTRIBUTES) {
        platform.Remove(staging);
        TraceLevel4(TraceValue("CopyFileWithBackup: backup name taken"),
                    TraceNamed("lpszFilePath", backup));
        return false;
    }
    if (!platform.Rename(target, backup, 0)) {
        DWORD error = GetLastError();
        platform.Remove(staging);
        TraceLevel4(TraceValue("CopyFileWithBackup: cannot rename the target aside"),
                    TraceNamed("error", error), TraceNamed("lpszFilePath", target));
        return false;
    }
    if (platform.Rename(staging, target, 0)) {
        if (!platform.Rename(backup, nullptr, MOVEFILE_DELAY_UNTIL_REBOOT)) {
            DWORD error = GetLastError();
            TraceLevel4(TraceValue("CopyFileWithBackup: cannot delete the backup at restart"),
                        TraceNamed("error", error), TraceNamed("lpszFilePath", backup));
        }
        return true;
    }
    platform.Remove(staging);
    if (!platform.Rename(backup, target, MOVEFILE_REPLACE_EXISTING)) {
        // The original stays under the backup name and is not scheduled for
        // deletion, so nothing is lost.
        DWORD error = GetLastError();
        TraceLevel8(TraceValue("CopyFileWithBackup: cannot move the backup back"),
                    TraceNamed("error", error), TraceNamed("lpszFilePath", backup));
    }
    return false;
}

bool CopyFileWithBackup(const wchar_t* source, const wchar_t* target, BOOL failIfExists) {
    TraceLevel1(TraceValue("CopyFileWithBackup"), TraceNamed("lpszFilePath", source),
                TraceNamed("lpszFilePath", target));
    return CopyFileWithBackup(SystemFileCopyPlatform(), source, target, failIfExists);
}
