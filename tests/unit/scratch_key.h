// A uniquely named registry key for one test, removed with its subkeys in
// both views at the end (after lifting any access it was denied).
#pragma once

#include <windows.h>
#include <sddl.h>

#include <string>
#include <vector>

#include "tests/support/registry_util.h"

class ScratchKey {
public:
    ScratchKey(HKEY root, const std::wstring& parent)
        : m_root(root),
          m_path(parent + L"\\QMTest-" + std::to_wstring(GetCurrentProcessId()) + L"-" +
                 std::to_wstring(++Counter())) {
        RegMakeKey(m_root, m_path);
    }
    ~ScratchKey() {
        for (const std::wstring& rel : m_restricted) {
            SetDacl(Sub(rel), L"D:P(A;;KA;;;WD)");
        }
        RegRemoveTree(m_root, m_path, 0);
        RegRemoveTree(m_root, m_path, KEY_WOW64_64KEY);
    }
    ScratchKey(const ScratchKey&) = delete;
    ScratchKey& operator=(const ScratchKey&) = delete;

    const std::wstring& path() const { return m_path; }
    std::wstring Sub(const std::wstring& rel) const {
        return rel.empty() ? m_path : m_path + L"\\" + rel;
    }
    // Puts the DACL of `sddl` on path\rel (lifted again at the end); true when set.
    bool Restrict(const std::wstring& rel, const wchar_t* sddl) {
        m_restricted.push_back(rel);
        return SetDacl(Sub(rel), sddl);
    }

private:
    bool SetDacl(const std::wstring& key, const wchar_t* sddl) const {
        PSECURITY_DESCRIPTOR descriptor = nullptr;
        HKEY handle = nullptr;
        bool ok = ConvertStringSecurityDescriptorToSecurityDescriptorW(sddl, SDDL_REVISION_1,
                                                                       &descriptor, nullptr) &&
                  RegOpenKeyExW(m_root, key.c_str(), 0, WRITE_DAC, &handle) == ERROR_SUCCESS &&
                  RegSetKeySecurity(handle, DACL_SECURITY_INFORMATION, descriptor) == ERROR_SUCCESS;
        RegCloseKey(handle);
        LocalFree(descriptor);
        return ok;
    }
    static unsigned& Counter() {
        static unsigned counter = 0;
        return counter;
    }

    HKEY m_root;
    std::wstring m_path;
    std::vector<std::wstring> m_restricted;
};
