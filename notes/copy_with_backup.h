// Copying a file over one that may be in use, without ever losing the file
// that was there. The system calls go through FileCopyPlatform so tests can
// make single steps fail and fix the clock.
#pragma once

#include <windows.h>

class FileCopyPlatform {
public:
    virtual ~FileCopyPlatform() = default;

    virtual BOOL CopyOne(const wchar_t* from, const wchar_t* to, BOOL failIfExists);
    // MoveFileExW; a null `to` with MOVEFILE_DELAY_UNTIL_REBOOT schedules a deletion.
    virtual BOOL Rename(const wchar_t* from, const wchar_t* to, DWORD flags);
    virtual BOOL Remove(const wchar_t* path);
    virtual void Now(SYSTEMTIME* localTime);
};

// The real calls.
FileCopyPlatform& SystemFileCopyPlatform();

// target + ".Y.M.D.h.m.s.bak" from the local time, without zero padding;
// false when the name would not fit MAX_PATH characters.
bool FormatBackupName(const wchar_t* target, const SYSTEMTIME& localTime, wchar_t (&out)[MAX_PATH]);

// CopyFileWithBackup with the given platform:
//   - a missing target is copied to directly;
//   - an existing target is never written in place: the source is first copied
//     to a staging file beside it, which then replaces the target;
//   - a target that cannot be replaced (in use) is renamed aside to its
//     time-stamped backup, the staging file takes its name and the backup is
//     scheduled for deletion at restart; a backup name already taken by any
//     file fails the copy and leaves everything as it was;
//   - when that last step fails the backup is moved back; if even that fails
//     the backup stays, unscheduled, so the original content survives.
bool CopyFileWithBackup(FileCopyPlatform& platform, const wchar_t* source, const wchar_t* target,
                        BOOL failIfExists);
