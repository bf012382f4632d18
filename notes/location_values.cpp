#include "notes/location_values.h"

#include "base/win_handles.h"

const wchar_t* const kNotesKeys[kNotesKeyCount] = {
    L"SOFTWARE\\Lotus\\Notes\\6.0",
    L"SOFTWARE\\Lotus\\Notes\\7.0",
    L"SOFTWARE\\Lotus\\Notes\\8.0",
    L"SOFTWARE\\Lotus\\Notes",
};

namespace {

UniqueHKey OpenKey(HKEY root, const wchar_t* subkey, REGSAM access) {
    UniqueHKey key;
    if (root == nullptr || subkey == nullptr ||
        RegOpenKeyExW(root, subkey, 0, access, key.put()) != ERROR_SUCCESS) {
        key.reset();
    }
    return key;
}

}  // namespace

void ClearLocation(wchar_t* buffer, DWORD capacity) {
    if (buffer != nullptr && capacity > 0) {
        ZeroMemory(buffer, static_cast<SIZE_T>(capacity) * sizeof(wchar_t));
    }
}

bool ReadFittingValue(HKEY key, const wchar_t* name, wchar_t* buffer, DWORD capacity) {
    if (buffer == nullptr || capacity == 0) {
        return false;
    }
    ClearLocation(buffer, capacity);
    if (key == nullptr || name == nullptr) {
        return false;
    }
    DWORD size = 0;
    if (RegQueryValueExW(key, name, nullptr, nullptr, nullptr, &size) != ERROR_SUCCESS) {
        return false;
    }
    const unsigned long long room = static_cast<unsigned long long>(capacity) * sizeof(wchar_t);
    if (size > room) {
        return false;
    }
    DWORD got = size;
    if (size > 0 && RegQueryValueExW(key, name, nullptr, nullptr, reinterpret_cast<BYTE*>(buffer),
                                     &got) != ERROR_SUCCESS) {
        ClearLocation(buffer, capacity);
        return false;
    }
    // A value stored without its terminator fits only when there is room to
    // add one; otherwise the text would run past the buffer.
    DWORD chars = got / sizeof(wchar_t);
    if (chars < capacity) {
        buffer[chars] = L'\0';
    } else if (buffer[capacity - 1] != L'\0') {
        ClearLocation(buffer, capacity);
        return false;
    }
    return true;
}

bool ReadFittingValue(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM access,
                      wchar_t* buffer, DWORD capacity) {
    ClearLocation(buffer, capacity);
    UniqueHKey key = OpenKey(root, subkey, access);
    return key && ReadFittingValue(key.get(), name, buffer, capacity);
}

bool ReadFourByteValue(HKEY key, const wchar_t* name, DWORD* out) {
    if (key == nullptr || name == nullptr || out == nullptr) {
        return false;
    }
    DWORD value = 0;
    DWORD size = sizeof(value);
    if (RegQueryValueExW(key, name, nullptr, nullptr, reinterpret_cast<BYTE*>(&value), &size) !=
            ERROR_SUCCESS ||
        size != sizeof(value)) {
        return false;
    }
    *out = value;
    return true;
}

bool ReadFourByteValue(HKEY root, const wchar_t* subkey, const wchar_t* name, DWORD* out) {
    UniqueHKey key = OpenKey(root, subkey, KEY_QUERY_VALUE);
    return key && ReadFourByteValue(key.get(), name, out);
}

bool CanOpenKey(HKEY root, const wchar_t* subkey) {
    return static_cast<bool>(OpenKey(root, subkey, KEY_QUERY_VALUE));
}
