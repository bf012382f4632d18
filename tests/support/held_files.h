// Files as other processes hold them, and the delete-at-restart list.
#pragma once

#include <windows.h>

#include <string>

// How a loaded library is held: others may read and rename it, not write it.
constexpr DWORD kLikeALoadedLibrary = FILE_SHARE_READ | FILE_SHARE_DELETE;

// A handle the test holds on a file, as a running process would.
class HeldOpen {
public:
    HeldOpen(const std::wstring& path, DWORD share);
    ~HeldOpen();
    HeldOpen(const HeldOpen&) = delete;
    HeldOpen& operator=(const HeldOpen&) = delete;

    bool ok() const { return m_handle != INVALID_HANDLE_VALUE; }
    // What the holder reads from the start of its file (up to 256 bytes).
    std::string Read() const;

private:
    HANDLE m_handle;
};

// True when path is listed for deletion at the next restart.
bool IsPendingDelete(const std::wstring& path);
// How many paths are listed for deletion or renaming at the next restart.
size_t PendingDeleteCount();
