#include "tests/support/registry_util.h"

#include "base/win_handles.h"

namespace {

UniqueHKey Open(HKEY root, const std::wstring& key, REGSAM access, bool create = false) {
    UniqueHKey k;
    LONG rc = create ? RegCreateKeyExW(root, key.c_str(), 0, nullptr, 0, access, nullptr, k.put(),
                                       nullptr)
                     : RegOpenKeyExW(root, key.c_str(), 0, access, k.put());
    if (rc != ERROR_SUCCESS) {
        k.release();
    }
    return k;
}

bool PutValue(HKEY root, const std::wstring& key, const wchar_t* name, DWORD type, const void* data,
              size_t bytes, REGSAM view) {
    UniqueHKey k = Open(root, key, KEY_WRITE | view, true);
    return k && RegSetValueExW(k.get(), name, 0, type, static_cast<const BYTE*>(data),
                               static_cast<DWORD>(bytes)) == ERROR_SUCCESS;
}

// The value's bytes and type; false when it cannot be read.
bool GetValue(HKEY root, const std::wstring& key, const wchar_t* name, REGSAM view, DWORD* type,
              std::vector<BYTE>* data) {
    UniqueHKey k = Open(root, key, KEY_READ | view);
    DWORD size = 0;
    if (!k || RegQueryValueExW(k.get(), name, nullptr, type, nullptr, &size) != ERROR_SUCCESS) {
        return false;
    }
    data->assign(size, 0);
    return RegQueryValueExW(k.get(), name, nullptr, type, data->data(), &size) == ERROR_SUCCESS;
}

}  // namespace

bool RegPutString(HKEY root, const std::wstring& key, const wchar_t* name,
                  const std::wstring& value, REGSAM view, DWORD type) {
    return PutValue(root, key, name, type, value.c_str(), (value.size() + 1) * sizeof(wchar_t),
                    view);
}

bool RegPutDword(HKEY root, const std::wstring& key, const wchar_t* name, DWORD value,
                 REGSAM view) {
    return PutValue(root, key, name, REG_DWORD, &value, sizeof(value), view);
}

bool RegMakeKey(HKEY root, const std::wstring& key, REGSAM view) {
    return Open(root, key, KEY_WRITE | view, true).valid();
}

bool RegHasKey(HKEY root, const std::wstring& key, REGSAM view) {
    return Open(root, key, KEY_QUERY_VALUE | view).valid();
}

bool RegHasValue(HKEY root, const std::wstring& key, const wchar_t* name, REGSAM view) {
    UniqueHKey k = Open(root, key, KEY_QUERY_VALUE | view);
    return k &&
           RegQueryValueExW(k.get(), name, nullptr, nullptr, nullptr, nullptr) == ERROR_SUCCESS;
}

std::optional<std::wstring> RegGetString(HKEY root, const std::wstring& key, const wchar_t* name,
                                         REGSAM view, DWORD* type) {
    DWORD valueType = 0;
    std::vector<BYTE> data;
    if (!GetValue(root, key, name, view, &valueType, &data) ||
        (valueType != REG_SZ && valueType != REG_EXPAND_SZ && valueType != REG_MULTI_SZ)) {
        return std::nullopt;
    }
    if (type != nullptr) {
        *type = valueType;
    }
    std::wstring text(reinterpret_cast<const wchar_t*>(data.data()), data.size() / sizeof(wchar_t));
    while (!text.empty() && text.back() == L'\0') {
        text.pop_back();
    }
    return text;
}

std::optional<DWORD> RegGetDword(HKEY root, const std::wstring& key, const wchar_t* name,
                                 REGSAM view) {
    DWORD type = 0;
    std::vector<BYTE> data;
    if (!GetValue(root, key, name, view, &type, &data) || type != REG_DWORD || data.size() != 4) {
        return std::nullopt;
    }
    return *reinterpret_cast<const DWORD*>(data.data());
}

void RegRemoveTree(HKEY root, const std::wstring& key, REGSAM view) {
    if (UniqueHKey k = Open(root, key, KEY_ALL_ACCESS | view)) {
        RegDeleteTreeW(k.get(), nullptr);
    }
    RegDeleteKeyExW(root, key.c_str(), view, 0);
}

void RegRemoveValue(HKEY root, const std::wstring& key, const wchar_t* name, REGSAM view) {
    if (UniqueHKey k = Open(root, key, KEY_SET_VALUE | view)) {
        RegDeleteValueW(k.get(), name);
    }
}

RegValueGuard::RegValueGuard(HKEY root, std::wstring key, std::wstring name, REGSAM view)
    : m_root(root), m_key(std::move(key)), m_name(std::move(name)), m_view(view) {
    m_existed = GetValue(m_root, m_key, m_name.c_str(), m_view, &m_type, &m_data);
}

RegValueGuard::~RegValueGuard() {
    if (m_existed) {
        PutValue(m_root, m_key, m_name.c_str(), m_type, m_data.data(), m_data.size(), m_view);
    } else {
        RegRemoveValue(m_root, m_key, m_name.c_str(), m_view);
    }
}
