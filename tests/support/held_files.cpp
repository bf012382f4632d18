#include "tests/support/held_files.h"

#include <vector>

#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"

HeldOpen::HeldOpen(const std::wstring& path, DWORD share)
    : m_handle(CreateFileW(path.c_str(), GENERIC_READ, share, nullptr, OPEN_EXISTING,
                           FILE_ATTRIBUTE_NORMAL, nullptr)) {}

HeldOpen::~HeldOpen() {
    if (ok()) {
        CloseHandle(m_handle);
    }
}

std::string HeldOpen::Read() const {
    SetFilePointer(m_handle, 0, nullptr, FILE_BEGIN);
    char buffer[256];
    DWORD got = 0;
    ReadFile(m_handle, buffer, sizeof(buffer), &got, nullptr);
    return std::string(buffer, got);
}

bool IsPendingDelete(const std::wstring& path) {
    std::vector<std::wstring> list =
        RegGetMultiString(HKEY_LOCAL_MACHINE, kSessionManagerKey, L"PendingFileRenameOperations");
    // Pairs of (source, destination); the empty destination of the last pair
    // reads as the list's end.
    for (size_t i = 0; i < list.size(); i += 2) {
        std::wstring from = list[i];
        if (from.compare(0, 4, L"\\??\\") == 0) {
            from = from.substr(4);
        }
        if (lstrcmpiW(from.c_str(), path.c_str()) == 0 &&
            (i + 1 == list.size() || list[i + 1].empty())) {
            return true;
        }
    }
    return false;
}

size_t PendingDeleteCount() {
    size_t count = 0;
    for (const std::wstring& entry : RegGetMultiString(HKEY_LOCAL_MACHINE, kSessionManagerKey,
                                                       L"PendingFileRenameOperations")) {
        count += entry.empty() ? 0 : 1;
    }
    return count;
}
