// Shared by the test stand-ins: appends what a stand-in received to the file
// named by an environment variable, one WriteFile call per entry so entries
// from several processes do not interleave.
#pragma once

#include <windows.h>

#include <string>

namespace fake {

inline std::wstring EnvironmentValue(const wchar_t* name) {
    wchar_t value[4096];
    DWORD length = GetEnvironmentVariableW(name, value, 4096);
    if (length == 0 || length >= 4096) {
        return std::wstring();
    }
    return std::wstring(value, length);
}

inline void AppendToFileNamedBy(const wchar_t* variable, const std::string& entry) {
    std::wstring path = EnvironmentValue(variable);
    if (path.empty()) {
        return;
    }
    HANDLE file = CreateFileW(path.c_str(), FILE_APPEND_DATA, FILE_SHARE_READ | FILE_SHARE_WRITE,
                              nullptr, OPEN_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        return;
    }
    DWORD written = 0;
    WriteFile(file, entry.data(), static_cast<DWORD>(entry.size()), &written, nullptr);
    CloseHandle(file);
}

// One line in the calls log named by QM_FAKE_CALLS_LOG.
inline void RecordCall(const std::string& line) {
    AppendToFileNamedBy(L"QM_FAKE_CALLS_LOG", line + "\n");
}

}  // namespace fake
