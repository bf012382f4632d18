#include "base/registry.h"

#include "base/os_version.h"
#include "base/user_profile.h"

HKEY RedirectedRoot(HKEY root) {
    if (root == HKEY_CURRENT_USER && GetOSVersionClass() == kOSVistaOrLater) {
        HKEY userRoot = GetUserRegRoot();
        return userRoot != nullptr ? userRoot : HKEY_CURRENT_USER;
    }
    return root;
}

namespace {

const REGSAM kReadWrite = KEY_READ | KEY_WRITE;  // 0x2001F

UniqueHKey OpenKey(HKEY root, const wchar_t* subkey, REGSAM access) {
    UniqueHKey key;
    if (RegOpenKeyExW(root, subkey, 0, access, key.put()) != ERROR_SUCCESS) {
        key.release();  // nothing was opened
    }
    return key;
}

bool QueryValueInfo(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM view, DWORD* type,
                    DWORD* size) {
    if (root == nullptr || subkey == nullptr || name == nullptr) {
        return false;
    }
    UniqueHKey key = OpenKey(RedirectedRoot(root), subkey, KEY_READ | view);
    return key && RegQueryValueExW(key.get(), name, nullptr, type, nullptr, size) == ERROR_SUCCESS;
}

// A REG_SZ may be stored without its terminator: the text read must still
// end inside the buffer (which was zeroed before the read).
bool TerminateText(wchar_t* buffer, DWORD sizeChars, DWORD bytesRead) {
    DWORD chars = bytesRead / sizeof(wchar_t);
    if (chars < sizeChars) {
        buffer[chars] = L'\0';
        return true;
    }
    return buffer[sizeChars - 1] == L'\0';
}

// Opens for writing, or creates the key in the same view.
UniqueHKey OpenForWrite(HKEY root, const wchar_t* subkey, REGSAM view) {
    UniqueHKey key = OpenKey(root, subkey, KEY_WRITE | view);
    if (!key) {
        key = CreateRegKey(root, subkey, view);
    }
    return key;
}

}  // namespace

UniqueHKey CreateRegKey(HKEY root, const wchar_t* subkey, REGSAM view) {
    UniqueHKey key;
    if (root == nullptr || subkey == nullptr ||
        RegCreateKeyExW(root, subkey, 0, nullptr, REG_OPTION_NON_VOLATILE, KEY_ALL_ACCESS | view,
                        nullptr, key.put(), nullptr) != ERROR_SUCCESS) {
        key.release();  // nothing was opened
    }
    return key;
}

BOOL IsRegKeyExist(HKEY root, const wchar_t* subkey, REGSAM view) {
    if (root == nullptr || subkey == nullptr) {
        return FALSE;
    }
    return OpenKey(root, subkey, KEY_QUERY_VALUE | view) ? TRUE : FALSE;
}

DWORD GetRegValueType(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM view) {
    DWORD type = 0;
    return QueryValueInfo(root, subkey, name, view, &type, nullptr) ? type : 0;
}

LONG GetRegValueSize(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM view) {
    DWORD size = 0;
    if (!QueryValueInfo(root, subkey, name, view, nullptr, &size) || size > 0x7FFFFFFF) {
        return -1;
    }
    return static_cast<LONG>(size);
}

BOOL GetRegDWORD(HKEY root, const wchar_t* subkey, const wchar_t* name, DWORD* out, REGSAM view) {
    if (root == nullptr || subkey == nullptr || name == nullptr || out == nullptr) {
        return FALSE;
    }
    UniqueHKey key = OpenKey(RedirectedRoot(root), subkey, KEY_READ | view);
    DWORD type = 0;
    DWORD value = 0;
    DWORD size = sizeof(value);
    if (!key ||
        RegQueryValueExW(key.get(), name, nullptr, &type, reinterpret_cast<BYTE*>(&value), &size) !=
            ERROR_SUCCESS ||
        type != REG_DWORD || size != sizeof(value)) {
        return FALSE;
    }
    *out = value;
    return TRUE;
}

BOOL GetRegString(HKEY root, const wchar_t* subkey, const wchar_t* name, wchar_t* buffer,
                  DWORD sizeChars, REGSAM view) {
    if (buffer == nullptr || sizeChars == 0) {
        return FALSE;
    }
    ZeroMemory(buffer, sizeChars * sizeof(wchar_t));
    if (root == nullptr || subkey == nullptr || name == nullptr) {
        return FALSE;
    }
    UniqueHKey key = OpenKey(RedirectedRoot(root), subkey, KEY_READ | view);
    DWORD type = 0;
    DWORD size = sizeChars * sizeof(wchar_t);
    if (!key ||
        RegQueryValueExW(key.get(), name, nullptr, &type, reinterpret_cast<BYTE*>(buffer), &size) !=
            ERROR_SUCCESS ||
        type != REG_SZ || !TerminateText(buffer, sizeChars, size)) {
        ZeroMemory(buffer, sizeChars * sizeof(wchar_t));
        return FALSE;
    }
    return TRUE;
}

BOOL GetRegString(HKEY root, const wchar_t* subkey, const wchar_t* name, CStringEx& out,
                  REGSAM view) {
    out.Empty();
    LONG size = GetRegValueSize(root, subkey, name, view);
    if (size < 0) {
        return FALSE;
    }
    // Room for the value and a terminator; at least two characters so the
    // buffer is always allocated.
    int chars = static_cast<int>(size / sizeof(wchar_t)) + 2;
    wchar_t* buffer = out.GetBuffer(chars);
    if (buffer == nullptr) {
        return FALSE;
    }
    BOOL ok = GetRegString(root, subkey, name, buffer, static_cast<DWORD>(chars) + 1, view);
    out.ReleaseBuffer(-1);
    if (!ok) {
        out.Empty();
    }
    return ok;
}

BOOL SetRegString(HKEY root, const wchar_t* subkey, const wchar_t* name, const wchar_t* text,
                  REGSAM view, DWORD type) {
    if (root == nullptr || subkey == nullptr || name == nullptr || text == nullptr) {
        return FALSE;
    }
    UniqueHKey key = OpenForWrite(RedirectedRoot(root), subkey, view);
    DWORD bytes = static_cast<DWORD>((lstrlenW(text) + 1) * sizeof(wchar_t));
    return key && RegSetValueExW(key.get(), name, 0, type, reinterpret_cast<const BYTE*>(text),
                                 bytes) == ERROR_SUCCESS;
}

BOOL SetRegDWORD(HKEY root, const wchar_t* subkey, const wchar_t* name, DWORD value, REGSAM view) {
    if (root == nullptr || subkey == nullptr || name == nullptr) {
        return FALSE;
    }
    UniqueHKey key = OpenForWrite(RedirectedRoot(root), subkey, view);
    return key &&
           RegSetValueExW(key.get(), name, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value),
                          sizeof(value)) == ERROR_SUCCESS;
}

BOOL DeleteRegValue(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM view) {
    if (root == nullptr || subkey == nullptr || name == nullptr) {
        return FALSE;
    }
    UniqueHKey key = OpenKey(root, subkey, kReadWrite | view);
    return key && RegDeleteValueW(key.get(), name) == ERROR_SUCCESS;
}

BOOL EnumRegValueNames(HKEY root, const wchar_t* subkey, std::vector<CStringEx>& names,
                       REGSAM view) {
    if (root == nullptr || subkey == nullptr) {
        return FALSE;
    }
    UniqueHKey key = OpenKey(root, subkey, KEY_READ | view);
    if (!key) {
        return FALSE;
    }
    DWORD count = 0;
    if (RegQueryInfoKeyW(key.get(), nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, &count,
                         nullptr, nullptr, nullptr, nullptr) != ERROR_SUCCESS) {
        return FALSE;
    }
    // Value names may be far longer than key names; one that does not fit
    // the buffer is left out and the result says the list is incomplete.
    const DWORD kNameChars = 2048;
    std::vector<wchar_t> name(kNameChars);
    BOOL complete = TRUE;
    for (DWORD i = 0; i < count; ++i) {
        DWORD size = kNameChars;
        LONG step =
            RegEnumValueW(key.get(), i, name.data(), &size, nullptr, nullptr, nullptr, nullptr);
        if (step == ERROR_NO_MORE_ITEMS) {
            break;  // values removed meanwhile: the list ends early
        }
        if (step == ERROR_SUCCESS) {
            names.emplace_back(name.data());
        } else {
            complete = FALSE;
        }
    }
    return complete;
}
