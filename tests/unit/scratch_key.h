// A uniquely named registry key for one test, removed with its subkeys in
// both views at the end.
#pragma once

#include <windows.h>

#include <string>

#include "tests/support/registry_util.h"

class ScratchKey {
public:
    ScratchKey(HKEY root, const std::wstring& parent) : m_root(root) {
        static unsigned counter = 0;
        m_path = parent + L"\\QMTest-" + std::to_wstring(GetCurrentProcessId()) + L"-" +
                 std::to_wstring(++counter);
        RegMakeKey(m_root, m_path);
    }
    ~ScratchKey() {
        RegRemoveTree(m_root, m_path, 0);
        RegRemoveTree(m_root, m_path, KEY_WOW64_64KEY);
    }
    ScratchKey(const ScratchKey&) = delete;
    ScratchKey& operator=(const ScratchKey&) = delete;

    const std::wstring& path() const { return m_path; }
    std::wstring Sub(const std::wstring& rel) const {
        return rel.empty() ? m_path : m_path + L"\\" + rel;
    }

private:
    HKEY m_root;
    std::wstring m_path;
};
