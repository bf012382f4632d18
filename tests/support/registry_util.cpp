#include "tests/support/registry_util.h"

namespace {

class Key {
public:
    Key(HKEY root, const std::wstring& path, REGSAM access, bool create) {
        LONG rc = create ? RegCreateKeyExW(root, path.c_str(), 0, nullptr, 0, access, nullptr,
                                           &m_key, nullptr)
                         : RegOpenKeyExW(root, path.c_str(), 0, access, &m_key);
        if (rc != ERROR_SUCCESS) {
            m_key = nullptr;
        }
    }
    ~Key() {
        if (m_key) {
            RegCloseKey(m_key);
        }
    }
    HKEY get() const { return m_key; }

private:
    HKEY m_key = nullptr;
};

bool PutValue(HKEY root, const std::wstring& key, const wchar_t* name, DWORD type, const void* data,
              DWORD size, REGSAM view) {
    Key k(root, key, KEY_WRITE | view, true);
    return k.get() && RegSetValueExW(k.get(), name, 0, type, static_cast<const BYTE*>(data),
                                     size) == ERROR_SUCCESS;
}

bool ReadRaw(HKEY root, const std::wstring& key, const wchar_t* name, REGSAM view, DWORD* type,
             std::vector<BYTE>* data) {
    Key k(root, key, KEY_READ | view, false);
    if (!k.get()) {
        return false;
    }
    DWORD size = 0;
    if (RegQueryValueExW(k.get(), name, nullptr, type, nullptr, &size) != ERROR_SUCCESS) {
        return false;
    }
    data->assign(size + 4, 0);
    return RegQueryValueExW(k.get(), name, nullptr, type, data->data(), &size) == ERROR_SUCCESS;
}

}  // namespace

bool RegPutString(HKEY root, const std::wstring& key, const wchar_t* name,
                  const std::wstring& value, REGSAM view, DWORD type) {
    return PutValue(root, key, name, type, value.c_str(),
                    static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)), view);
}

bool RegPutDword(HKEY root, const std::wstring& key, const wchar_t* name, DWORD value,
                 REGSAM view) {
    return PutValue(root, key, name, REG_DWORD, &value, sizeof(value), view);
}

bool RegPutMultiString(HKEY root, const std::wstring& key, const wchar_t* name,
                       const std::vector<std::wstring>& values, REGSAM view) {
    std::wstring block;
    for (const std::wstring& value : values) {
        block += value;
        block += L'\0';
    }
    block += L'\0';
    return PutValue(root, key, name, REG_MULTI_SZ, block.data(),
                    static_cast<DWORD>(block.size() * sizeof(wchar_t)), view);
}

bool RegMakeKey(HKEY root, const std::wstring& key, REGSAM view) {
    Key k(root, key, KEY_WRITE | view, true);
    return k.get() != nullptr;
}

bool RegHasKey(HKEY root, const std::wstring& key, REGSAM view) {
    Key k(root, key, KEY_QUERY_VALUE | view, false);
    return k.get() != nullptr;
}

bool RegHasValue(HKEY root, const std::wstring& key, const wchar_t* name, REGSAM view) {
    Key k(root, key, KEY_QUERY_VALUE | view, false);
    return k.get() &&
           RegQueryValueExW(k.get(), name, nullptr, nullptr, nullptr, nullptr) == ERROR_SUCCESS;
}

std::optional<std::wstring> RegGetString(HKEY root, const std::wstring& key, const wchar_t* name,
                                         REGSAM view, DWORD* type) {
    DWORD valueType = 0;
    std::vector<BYTE> data;
    if (!ReadRaw(root, key, name, view, &valueType, &data)) {
        return std::nullopt;
    }
    if (type) {
        *type = valueType;
    }
    if (valueType != REG_SZ && valueType != REG_EXPAND_SZ && valueType != REG_MULTI_SZ) {
        return std::nullopt;
    }
    std::wstring text(reinterpret_cast<const wchar_t*>(data.data()),
                      (data.size() - 4) / sizeof(wchar_t));
    while (!text.empty() && text.back() == L'\0') {
        text.pop_back();
    }
    return text;
}

std::vector<std::wstring> RegGetMultiString(HKEY root, const std::wstring& key, const wchar_t* name,
                                            REGSAM view) {
    std::vector<std::wstring> values;
    std::optional<std::wstring> block = RegGetString(root, key, name, view);
    if (!block) {
        return values;
    }
    size_t start = 0;
    while (start <= block->size()) {
        size_t end = block->find(L'\0', start);
        if (end == std::wstring::npos) {
            end = block->size();
        }
        values.push_back(block->substr(start, end - start));
        start = end + 1;
    }
    return values;
}

std::optional<DWORD> RegGetDword(HKEY root, const std::wstring& key, const wchar_t* name,
                                 REGSAM view) {
    DWORD type = 0;
    std::vector<BYTE> data;
    if (!ReadRaw(root, key, name, view, &type, &data) || type != REG_DWORD) {
        return std::nullopt;
    }
    return *reinterpret_cast<const DWORD*>(data.data());
}

void RegRemoveTree(HKEY root, const std::wstring& key, REGSAM view) {
    Key k(root, key, KEY_ALL_ACCESS | view, false);
    if (!k.get()) {
        return;
    }
    for (;;) {
        wchar_t name[512];
        DWORD size = 512;
        if (RegEnumKeyExW(k.get(), 0, name, &size, nullptr, nullptr, nullptr, nullptr) !=
            ERROR_SUCCESS) {
            break;
        }
        RegRemoveTree(root, key + L"\\" + name, view);
        if (RegHasKey(root, key + L"\\" + name, view)) {
            break;  // could not remove it; avoid spinning
        }
    }
    RegDeleteKeyExW(root, key.c_str(), view, 0);
}

void RegRemoveValue(HKEY root, const std::wstring& key, const wchar_t* name, REGSAM view) {
    Key k(root, key, KEY_SET_VALUE | view, false);
    if (k.get()) {
        RegDeleteValueW(k.get(), name);
    }
}

RegValueGuard::RegValueGuard(HKEY root, std::wstring key, std::wstring name, REGSAM view)
    : m_root(root), m_key(std::move(key)), m_name(std::move(name)), m_view(view) {
    m_existed = ReadRaw(m_root, m_key, m_name.c_str(), m_view, &m_type, &m_data);
    if (m_existed) {
        m_data.resize(m_data.size() - 4);
    }
}

RegValueGuard::~RegValueGuard() {
    if (m_existed) {
        PutValue(m_root, m_key, m_name.c_str(), m_type, m_data.data(),
                 static_cast<DWORD>(m_data.size()), m_view);
    } else {
        RegRemoveValue(m_root, m_key, m_name.c_str(), m_view);
    }
}
