#include "tests/support/held_files.h"

#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"

std::string HeldOpen::Read() const {
    SetFilePointer(m_handle.get(), 0, nullptr, FILE_BEGIN);
    char buffer[256];
    DWORD got = 0;
    ReadFile(m_handle.get(), buffer, sizeof(buffer), &got, nullptr);
    return std::string(buffer, got);
}

namespace {

// The list as "\0<source>\0<destination>\0...\0\0" in upper case: a path
// slated for deletion stands as "\0\??\<PATH>\0\0".
std::wstring PendingList() {
    std::wstring list =
        L'\0' +
        RegGetString(HKEY_LOCAL_MACHINE, kSessionManagerKey, L"PendingFileRenameOperations")
            .value_or(L"") +
        std::wstring(2, L'\0');
    CharUpperBuffW(&list[0], static_cast<DWORD>(list.size()));
    return list;
}

}  // namespace

bool IsPendingDelete(const std::wstring& path) {
    std::wstring wanted = L'\0' + std::wstring(L"\\??\\") + path + std::wstring(2, L'\0');
    CharUpperBuffW(&wanted[0], static_cast<DWORD>(wanted.size()));
    return PendingList().find(wanted) != std::wstring::npos;
}

size_t PendingDeleteCount() {
    const std::wstring list = PendingList();
    size_t count = 0;
    for (size_t at = list.find(L"\\??\\"); at != std::wstring::npos;
         at = list.find(L"\\??\\", at + 1)) {
        ++count;
    }
    return count;
}
