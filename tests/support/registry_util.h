// Registry helpers for arranging and checking a scratch machine. view is 0
// (the 32-bit view of this 32-bit test) or KEY_WOW64_64KEY.
#pragma once

#include <windows.h>

#include <optional>
#include <string>
#include <vector>

bool RegPutString(HKEY root, const std::wstring& key, const wchar_t* name,
                  const std::wstring& value, REGSAM view = 0, DWORD type = REG_SZ);
bool RegPutDword(HKEY root, const std::wstring& key, const wchar_t* name, DWORD value,
                 REGSAM view = 0);
bool RegMakeKey(HKEY root, const std::wstring& key, REGSAM view = 0);
bool RegHasKey(HKEY root, const std::wstring& key, REGSAM view = 0);
bool RegHasValue(HKEY root, const std::wstring& key, const wchar_t* name, REGSAM view = 0);
// The text of a REG_SZ, REG_EXPAND_SZ or REG_MULTI_SZ value (the last with
// its inner terminators) and its type.
std::optional<std::wstring> RegGetString(HKEY root, const std::wstring& key, const wchar_t* name,
                                         REGSAM view = 0, DWORD* type = nullptr);
std::optional<DWORD> RegGetDword(HKEY root, const std::wstring& key, const wchar_t* name,
                                 REGSAM view = 0);
void RegRemoveTree(HKEY root, const std::wstring& key, REGSAM view = 0);
void RegRemoveValue(HKEY root, const std::wstring& key, const wchar_t* name, REGSAM view = 0);

// Saves one value at construction and puts it back (or removes it) at the end.
class RegValueGuard {
public:
    RegValueGuard(HKEY root, std::wstring key, std::wstring name, REGSAM view = 0);
    ~RegValueGuard();
    RegValueGuard(const RegValueGuard&) = delete;
    RegValueGuard& operator=(const RegValueGuard&) = delete;

private:
    HKEY m_root;
    std::wstring m_key;
    std::wstring m_name;
    REGSAM m_view;
    bool m_existed = false;
    DWORD m_type = 0;
    std::vector<BYTE> m_data;
};
