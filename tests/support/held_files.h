// Files as other processes hold them, and the delete-at-restart list.
#pragma once

#include <windows.h>

#include <string>

#include "base/win_handles.h"

// How a loaded library is held: others may read and rename it, not write it.
constexpr DWORD kLikeALoadedLibrary = FILE_SHARE_READ | FILE_SHARE_DELETE;

// A handle the test holds on a file, as a running process would.
class HeldOpen {
public:
    HeldOpen(const std::wstring& path, DWORD share)
        : m_handle(CreateFileW(path.c_str(), GENERIC_READ, share, nullptr, OPEN_EXISTING,
                               FILE_ATTRIBUTE_NORMAL, nullptr)) {}

    bool ok() const { return m_handle.valid(); }
    // What the holder reads from the start of its file (up to 256 bytes).
    std::string Read() const;

private:
    UniqueFileHandle m_handle;
};

// True when path is listed for deletion at the next restart.
bool IsPendingDelete(const std::wstring& path);
// How many paths are listed for deletion or renaming at the next restart.
size_t PendingDeleteCount();
