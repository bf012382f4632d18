// Shared by the stand-in programs: what they were started with, recorded in
// the calls log as "<file name> started: <arguments> | <working folder>".
#pragma once

#include <windows.h>

#include <string>

#include "tests/fakes/common/fake_recorder.h"

namespace fake {

inline std::string Narrow(const std::wstring& text) {
    if (text.empty()) {
        return std::string();
    }
    int bytes = WideCharToMultiByte(CP_ACP, 0, text.c_str(), -1, nullptr, 0, nullptr, nullptr);
    std::string out(bytes > 0 ? bytes : 1, '\0');
    WideCharToMultiByte(CP_ACP, 0, text.c_str(), -1, &out[0], bytes, nullptr, nullptr);
    out.resize(out.size() - 1);
    return out;
}

// The command line after the program's own name.
inline std::wstring Arguments() {
    const wchar_t* p = GetCommandLineW();
    if (*p == L'"') {
        for (++p; *p != L'\0' && *p != L'"'; ++p) {
        }
        if (*p == L'"') {
            ++p;
        }
    } else {
        while (*p != L'\0' && *p != L' ' && *p != L'\t') {
            ++p;
        }
    }
    while (*p == L' ' || *p == L'\t') {
        ++p;
    }
    return p;
}

inline std::string OwnFileName() {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, path, MAX_PATH);
    const wchar_t* name = path;
    for (const wchar_t* p = path; *p != L'\0'; ++p) {
        if (*p == L'\\' || *p == L'/') {
            name = p + 1;
        }
    }
    return Narrow(name);
}

// "<file name> <what>" in the calls log.
inline void RecordEvent(const std::string& what) {
    RecordCall(OwnFileName() + " " + what);
}

inline void RecordStart() {
    wchar_t folder[MAX_PATH] = {};
    GetCurrentDirectoryW(MAX_PATH, folder);
    RecordEvent("started: " + Narrow(Arguments()) + " | " + Narrow(folder));
}

}  // namespace fake
