// Shared by the test stand-ins: appends what a stand-in received to the file
// named by an environment variable, one WriteFile call per entry so entries
// from several processes do not interleave.
#pragma once

#include <windows.h>

#include <cstdio>
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

inline void AppendToFile(const std::wstring& path, const std::string& entry) {
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

inline void AppendToFileNamedBy(const wchar_t* variable, const std::string& entry) {
    AppendToFile(EnvironmentValue(variable), entry);
}

// Milliseconds on the machine-wide performance counter: comparable between
// processes, for the benchmarks.
inline double CounterMilliseconds() {
    LARGE_INTEGER now, frequency;
    QueryPerformanceCounter(&now);
    QueryPerformanceFrequency(&frequency);
    return static_cast<double>(now.QuadPart) * 1000.0 / static_cast<double>(frequency.QuadPart);
}

// line followed by " @<ms>" (CounterMilliseconds).
inline std::string Stamped(const std::string& line) {
    char stamp[64];
    snprintf(stamp, sizeof(stamp), " @%.3f", CounterMilliseconds());
    return line + stamp;
}

// One line in the calls log named by QM_FAKE_CALLS_LOG, stamped when
// QM_FAKE_STAMP_CALLS is "1".
inline void RecordCall(const std::string& line) {
    bool stamp = EnvironmentValue(L"QM_FAKE_STAMP_CALLS") == L"1";
    AppendToFileNamedBy(L"QM_FAKE_CALLS_LOG", (stamp ? Stamped(line) : line) + "\n");
}

}  // namespace fake
