#include "base/registry_no_links.h"

#include <wchar.h>

#include <string>
#include <vector>

#include "base/proc_address.h"
#include "base/win_handles.h"

namespace {

const REGSAM kDeleteAccess = KEY_READ | KEY_WRITE | DELETE;
const DWORD kKeyNameChars = 256;  // registry key names hold at most 255

bool IsLink(HKEY key) {
    DWORD type = REG_NONE;
    return RegQueryValueExW(key, L"SymbolicLinkValue", nullptr, &type, nullptr, nullptr) ==
               ERROR_SUCCESS &&
           type == REG_LINK;
}

// Opens name below parent as the key itself, a link included.
bool OpenOwnKey(HKEY parent, const wchar_t* name, REGSAM access, UniqueHKey& out) {
    if (RegOpenKeyExW(parent, name, REG_OPTION_OPEN_LINK, access, out.put()) != ERROR_SUCCESS) {
        out.release();  // nothing was opened
        return false;
    }
    return true;
}

// Walks path one component at a time; true with the last component open
// (with access) when none before it is a link.
bool OpenPathInHive(HKEY root, const wchar_t* path, REGSAM access, UniqueHKey& out) {
    if (root == nullptr || path == nullptr) {
        return false;
    }
    UniqueHKey current;
    HKEY parent = root;
    const wchar_t* start = path;
    for (;;) {
        while (*start == L'\\') {
            ++start;
        }
        const wchar_t* end = start;
        while (*end != L'\0' && *end != L'\\') {
            ++end;
        }
        if (end == start) {
            return false;  // no component at all: never the root itself
        }
        std::wstring name(start, end);
        bool last = *end == L'\0' || end[wcsspn(end, L"\\")] == L'\0';
        UniqueHKey next;
        if (!OpenOwnKey(parent, name.c_str(), last ? access : KEY_READ, next)) {
            return false;
        }
        if (last) {
            out = std::move(next);
            return true;
        }
        if (IsLink(next.get())) {
            return false;
        }
        current = std::move(next);
        parent = current.get();
        start = end;
    }
}

// Removes the open key: a link as itself, any other key after its subkeys.
bool DeleteOpenKey(HKEY key) {
    using NtDeleteKeyFn = LONG(NTAPI*)(HANDLE);
    static const auto ntDeleteKey =
        GetProcAs<NtDeleteKeyFn>(GetModuleHandleW(L"ntdll.dll"), "NtDeleteKey");
    if (ntDeleteKey == nullptr) {
        return false;
    }
    if (!IsLink(key)) {
        std::vector<wchar_t> name(kKeyNameChars);
        for (;;) {
            DWORD size = kKeyNameChars;
            if (RegEnumKeyExW(key, 0, name.data(), &size, nullptr, nullptr, nullptr, nullptr) !=
                ERROR_SUCCESS) {
                break;
            }
            UniqueHKey child;
            if (!OpenOwnKey(key, name.data(), kDeleteAccess, child) ||
                !DeleteOpenKey(child.get())) {
                return false;
            }
        }
    }
    return ntDeleteKey(key) == 0;
}

}  // namespace

BOOL DeleteKeyTreeNoLinks(HKEY root, const wchar_t* path) {
    UniqueHKey key;
    return OpenPathInHive(root, path, kDeleteAccess, key) && DeleteOpenKey(key.get()) ? TRUE
                                                                                      : FALSE;
}

BOOL DeleteValueNoLinks(HKEY root, const wchar_t* path, const wchar_t* name) {
    UniqueHKey key;
    if (name == nullptr || !OpenPathInHive(root, path, KEY_READ | KEY_WRITE, key) ||
        IsLink(key.get())) {
        return FALSE;
    }
    return RegDeleteValueW(key.get(), name) == ERROR_SUCCESS ? TRUE : FALSE;
}
