// Scratch registry state for unit tests: uniquely named keys, removed in both
// views at the end, and saved trees loaded as hives under HKEY_USERS.
#pragma once

#include <windows.h>
#include <sddl.h>

#include <string>
#include <vector>

#include "tests/support/registry_util.h"

inline std::wstring UniqueRegName(const wchar_t* tag) {
    static unsigned counter = 0;
    return L"QMTest-" + std::wstring(tag) + L"-" + std::to_wstring(GetCurrentProcessId()) + L"-" +
           std::to_wstring(GetTickCount()) + L"-" + std::to_wstring(++counter);
}

// Puts the DACL of `sddl` on root\key; true when set.
inline bool SetKeyDacl(HKEY root, const std::wstring& key, const wchar_t* sddl) {
    PSECURITY_DESCRIPTOR descriptor = nullptr;
    if (!ConvertStringSecurityDescriptorToSecurityDescriptorW(sddl, SDDL_REVISION_1, &descriptor,
                                                              nullptr)) {
        return false;
    }
    HKEY handle = nullptr;
    bool ok = RegOpenKeyExW(root, key.c_str(), 0, WRITE_DAC, &handle) == ERROR_SUCCESS;
    if (ok) {
        ok = RegSetKeySecurity(handle, DACL_SECURITY_INFORMATION, descriptor) == ERROR_SUCCESS;
        RegCloseKey(handle);
    }
    LocalFree(descriptor);
    return ok;
}

constexpr wchar_t kReadOnlyDacl[] = L"D:P(A;;KR;;;WD)";
constexpr wchar_t kNoDeleteDacl[] = L"D:P(D;;SD;;;WD)(A;;KA;;;WD)";  // all but DELETE
constexpr wchar_t kFullAccessDacl[] = L"D:P(A;;KA;;;WD)";

// parent\QMTest-tag-..., created in view 0.
class ScratchKey {
public:
    ScratchKey(HKEY root, const std::wstring& parent, const wchar_t* tag)
        : m_root(root), m_path(parent + L"\\" + UniqueRegName(tag)) {
        RegMakeKey(m_root, m_path);
    }
    ~ScratchKey() {
        for (const std::wstring& key : m_restricted) {
            SetKeyDacl(m_root, key, kFullAccessDacl);
        }
        RegRemoveTree(m_root, m_path, 0);
        RegRemoveTree(m_root, m_path, KEY_WOW64_64KEY);
    }
    ScratchKey(const ScratchKey&) = delete;
    ScratchKey& operator=(const ScratchKey&) = delete;

    const std::wstring& path() const { return m_path; }
    std::wstring Sub(const std::wstring& rel) const { return m_path + L"\\" + rel; }
    // Puts a DACL on path\rel (rel may be empty), lifted again before removal.
    bool Restrict(const std::wstring& rel, const wchar_t* sddl) {
        m_restricted.push_back(rel.empty() ? m_path : Sub(rel));
        return SetKeyDacl(m_root, m_restricted.back(), sddl);
    }

private:
    HKEY m_root;
    std::wstring m_path;
    std::vector<std::wstring> m_restricted;
};

// Another user's NTUSER.DAT: a scratch tree with the given string values,
// saved with RegSaveKeyW and loaded as HKEY_USERS\<name> (the caller holds the
// backup and restore privileges); unloaded and its file deleted at the end.
class LoadedHive {
public:
    struct Value {
        std::wstring key;
        const wchar_t* name;
        const wchar_t* text;
    };
    explicit LoadedHive(const std::vector<Value>& values) : m_name(UniqueRegName(L"hive")) {
        wchar_t temp[MAX_PATH] = {};
        GetTempPathW(MAX_PATH, temp);
        m_file = temp + m_name + L".dat";
        ScratchKey source(HKEY_CURRENT_USER, L"Software", L"hivesrc");
        for (const Value& value : values) {
            RegPutString(HKEY_CURRENT_USER, source.Sub(value.key), value.name, value.text);
        }
        HKEY key = nullptr;
        if (RegOpenKeyExW(HKEY_CURRENT_USER, source.path().c_str(), 0, KEY_READ, &key) ==
            ERROR_SUCCESS) {
            m_saved = RegSaveKeyW(key, m_file.c_str(), nullptr);
            RegCloseKey(key);
        }
        if (m_saved == ERROR_SUCCESS) {
            m_loaded = RegLoadKeyW(HKEY_USERS, m_name.c_str(), m_file.c_str());
        }
    }
    ~LoadedHive() {
        if (m_loaded == ERROR_SUCCESS) {
            RegUnLoadKeyW(HKEY_USERS, m_name.c_str());
        }
        DeleteFileW(m_file.c_str());
    }
    LoadedHive(const LoadedHive&) = delete;
    LoadedHive& operator=(const LoadedHive&) = delete;

    bool ok() const { return m_saved == ERROR_SUCCESS && m_loaded == ERROR_SUCCESS; }
    std::string error() const {
        return "save " + std::to_string(m_saved) + " load " + std::to_string(m_loaded);
    }
    const std::wstring& name() const { return m_name; }
    // name\rel, below HKEY_USERS.
    std::wstring Key(const std::wstring& rel) const { return m_name + L"\\" + rel; }

private:
    std::wstring m_name;
    std::wstring m_file;
    LONG m_saved = ERROR_INVALID_FUNCTION;
    LONG m_loaded = ERROR_INVALID_FUNCTION;
};
