#include "base/registry_no_links.h"

#include <wchar.h>

#include <string>
#include <vector>

#include "base/proc_address.h"
#include "base/win_handles.h"

namespace {

const REGSAM kDeleteAccess = KEY_READ | KEY_WRITE | DELETE;
const DWORD kKeyNameChars = 256;  // registry key names hold at most 255
const int kKeyNameInformation = 3;

bool IsLink(HKEY key) {
    DWORD type = REG_NONE;
    return RegQueryValueExW(key, L"SymbolicLinkValue", nullptr, &type, nullptr, nullptr) ==
               ERROR_SUCCESS &&
           type == REG_LINK;
}

// Opens name below parent as the key itself: a link is opened, not followed.
bool OpenOwnKey(HKEY parent, const wchar_t* name, REGSAM access, UniqueHKey& out) {
    if (RegOpenKeyExW(parent, name, REG_OPTION_OPEN_LINK, access, out.put()) != ERROR_SUCCESS) {
        out.release();  // nothing was opened
        return false;
    }
    return true;
}

// The key's full name in the registry ("\REGISTRY\USER\..."): the target's
// when it was reached through a link. Empty when it cannot be read.
std::wstring FullName(HKEY key) {
    using NtQueryKeyFn = LONG(NTAPI*)(HANDLE, int, void*, ULONG, ULONG*);
    static const auto queryKey =
        GetProcAs<NtQueryKeyFn>(GetModuleHandleW(L"ntdll.dll"), "NtQueryKey");
    std::vector<BYTE> info(sizeof(ULONG) + 2048 * sizeof(wchar_t));
    ULONG length = 0;
    if (queryKey == nullptr || queryKey(key, kKeyNameInformation, info.data(),
                                        static_cast<ULONG>(info.size()), &length) != 0) {
        return std::wstring();
    }
    const ULONG bytes = *reinterpret_cast<const ULONG*>(info.data());
    return std::wstring(reinterpret_cast<const wchar_t*>(info.data() + sizeof(ULONG)),
                        bytes / sizeof(wchar_t));
}

// Opens root\path (the last component as itself, with access) and checks
// that it lies where its path says: below the first component, which is no
// link, and reached through no link on the way.
bool OpenPathInHive(HKEY root, const wchar_t* path, REGSAM access, UniqueHKey& out) {
    if (root == nullptr || path == nullptr) {
        return false;
    }
    // The path's components, one backslash between them.
    std::vector<std::wstring> parts;
    for (const wchar_t* p = path; *p != L'\0';) {
        size_t length = wcscspn(p, L"\\");
        if (length > 0) {
            parts.emplace_back(p, length);
        }
        p += length + (p[length] != L'\0' ? 1 : 0);
    }
    if (parts.empty()) {
        return false;  // never the root itself
    }
    if (parts.size() == 1) {
        return OpenOwnKey(root, parts[0].c_str(), access, out);
    }
    UniqueHKey top;
    if (!OpenOwnKey(root, parts[0].c_str(), KEY_QUERY_VALUE, top) || IsLink(top.get())) {
        return false;
    }
    std::wstring rest;
    for (size_t i = 1; i < parts.size(); ++i) {
        rest += (i > 1 ? L"\\" : L"") + parts[i];
    }
    const std::wstring expected = FullName(top.get()) + L"\\" + rest;
    if (!OpenOwnKey(top.get(), rest.c_str(), access, out)) {
        return false;
    }
    const std::wstring reached = FullName(out.get());
    if (reached.empty() ||
        CompareStringOrdinal(reached.c_str(), static_cast<int>(reached.size()), expected.c_str(),
                             static_cast<int>(expected.size()), TRUE) != CSTR_EQUAL) {
        out.reset();
        return false;
    }
    return true;
}

// Removes the open key after its subkeys. Each is opened as itself, so a link
// shows no subkeys of its own and goes as a link.
bool DeleteOpenKey(HKEY key) {
    using NtDeleteKeyFn = LONG(NTAPI*)(HANDLE);
    static const auto ntDeleteKey =
        GetProcAs<NtDeleteKeyFn>(GetModuleHandleW(L"ntdll.dll"), "NtDeleteKey");
    if (ntDeleteKey == nullptr) {
        return false;
    }
    std::vector<wchar_t> name(kKeyNameChars);
    for (;;) {
        DWORD size = kKeyNameChars;
        if (RegEnumKeyExW(key, 0, name.data(), &size, nullptr, nullptr, nullptr, nullptr) !=
            ERROR_SUCCESS) {
            break;
        }
        UniqueHKey child;
        if (!OpenOwnKey(key, name.data(), kDeleteAccess, child) || !DeleteOpenKey(child.get())) {
            return false;
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
