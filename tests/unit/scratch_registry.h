// Scratch registry keys for unit tests: a uniquely named key below a parent
// such as HKCU\Software or HKLM\SOFTWARE, removed in both registry views when
// the test ends, after any restrictive security a test put on its keys has
// been lifted again.
#pragma once

#include <windows.h>
#include <sddl.h>

#include <string>
#include <vector>

#include "tests/support/registry_util.h"

namespace scratch_registry {

inline std::wstring UniqueName(const wchar_t* tag) {
    static unsigned counter = 0;
    wchar_t name[96];
    _snwprintf(name, 96, L"QMTest-%s-%lu-%lu-%u", tag, GetCurrentProcessId(), GetTickCount(),
               ++counter);
    name[95] = L'\0';
    return name;
}

// Puts the security descriptor `sddl` (its DACL) on root\key; true when set.
inline bool SetKeyDacl(HKEY root, const std::wstring& key, const wchar_t* sddl, REGSAM view = 0) {
    PSECURITY_DESCRIPTOR descriptor = nullptr;
    if (!ConvertStringSecurityDescriptorToSecurityDescriptorW(sddl, SDDL_REVISION_1, &descriptor,
                                                              nullptr)) {
        return false;
    }
    HKEY handle = nullptr;
    bool ok = RegOpenKeyExW(root, key.c_str(), 0, WRITE_DAC | view, &handle) == ERROR_SUCCESS;
    if (ok) {
        ok = RegSetKeySecurity(handle, DACL_SECURITY_INFORMATION, descriptor) == ERROR_SUCCESS;
        RegCloseKey(handle);
    }
    LocalFree(descriptor);
    return ok;
}

// Read-only for everyone: opening for writing or deleting is refused.
constexpr const wchar_t kReadOnlyDacl[] = L"D:P(A;;KR;;;WD)";
// Everything but DELETE.
constexpr const wchar_t kNoDeleteDacl[] = L"D:P(D;;SD;;;WD)(A;;KA;;;WD)";
constexpr const wchar_t kFullAccessDacl[] = L"D:P(A;;KA;;;WD)";

}  // namespace scratch_registry

class ScratchKey {
public:
    // parent\QMTest-tag-..., created in each of the given views.
    ScratchKey(HKEY root, const std::wstring& parent, const wchar_t* tag,
               std::vector<REGSAM> views = {0})
        : m_root(root),
          m_path(parent + L"\\" + scratch_registry::UniqueName(tag)),
          m_views(std::move(views)) {
        for (REGSAM view : m_views) {
            RegMakeKey(m_root, m_path, view);
        }
    }
    ~ScratchKey() {
        for (const Restricted& r : m_restricted) {
            scratch_registry::SetKeyDacl(m_root, r.key, scratch_registry::kFullAccessDacl, r.view);
        }
        for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
            RegRemoveTree(m_root, m_path, view);
        }
    }
    ScratchKey(const ScratchKey&) = delete;
    ScratchKey& operator=(const ScratchKey&) = delete;

    HKEY root() const { return m_root; }
    const std::wstring& path() const { return m_path; }
    // path\rel
    std::wstring Sub(const std::wstring& rel) const { return m_path + L"\\" + rel; }

    // Puts a DACL on path\rel, lifted again before the removal.
    bool Restrict(const std::wstring& rel, const wchar_t* sddl, REGSAM view = 0) {
        std::wstring key = rel.empty() ? m_path : Sub(rel);
        m_restricted.push_back({key, view});
        return scratch_registry::SetKeyDacl(m_root, key, sddl, view);
    }

private:
    struct Restricted {
        std::wstring key;
        REGSAM view;
    };
    HKEY m_root;
    std::wstring m_path;
    std::vector<REGSAM> m_views;
    std::vector<Restricted> m_restricted;
};
