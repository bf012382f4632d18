#include "base/registry_delete.h"

#include <shlwapi.h>

#include <string>
#include <vector>

#include "base/object_security.h"
#include "base/proc_address.h"
#include "base/registry_no_links.h"
#include "base/string_ex.h"
#include "base/trace.h"
#include "base/win_handles.h"

namespace {

const REGSAM kReadWrite = KEY_READ | KEY_WRITE;  // 0x2001F
const DWORD kEnumNameChars = 2048;
const DWORD kTreeNameChars = 256;
const DWORD kTreeBudgetMs = 20000;

DWORD SystemTicks() {
    return GetTickCount();
}
RegistryTickSource g_tickSource = SystemTicks;

// A child that vanished while we worked on it is as good as deleted.
bool IsGone(LONG error) {
    return error == ERROR_FILE_NOT_FOUND || error == ERROR_KEY_DELETED;
}

bool IsEmpty(const wchar_t* text) {
    return text == nullptr || text[0] == L'\0';
}

// The final deletion stays in the view the key was opened in; a plain
// RegDeleteKeyW would remove the same name in the 32-bit view instead.
LONG DeleteKeyInView(HKEY root, const wchar_t* subkey, REGSAM view) {
    if (view == 0) {
        return RegDeleteKeyW(root, subkey);
    }
    using RegDeleteKeyExWFn = LONG(WINAPI*)(HKEY, LPCWSTR, REGSAM, DWORD);
    auto deleteKeyEx =
        GetProcAs<RegDeleteKeyExWFn>(GetModuleHandleW(L"advapi32.dll"), "RegDeleteKeyExW");
    if (deleteKeyEx == nullptr) {
        return ERROR_CALL_NOT_IMPLEMENTED;
    }
    return deleteKeyEx(root, subkey, view, 0);
}

LONG DeleteChildTree(HKEY parent, const wchar_t* name);

// Deletes every subkey of key, always asking for index 0. Stops at the first
// child that cannot be deleted. Name buffers live on the heap so a deep tree
// cannot exhaust the stack.
LONG DeleteSubkeys(HKEY key) {
    std::vector<wchar_t> name(kEnumNameChars);
    std::wstring lastGone;
    for (;;) {
        DWORD size = kEnumNameChars;
        if (RegEnumKeyExW(key, 0, name.data(), &size, nullptr, nullptr, nullptr, nullptr) !=
            ERROR_SUCCESS) {
            return ERROR_SUCCESS;  // nothing more; the key's own deletion tells the rest
        }
        LONG result = DeleteChildTree(key, name.data());
        if (result == ERROR_SUCCESS) {
            lastGone.clear();
            continue;
        }
        // A child reported gone but listed again cannot be reached by name
        // (for example an embedded null): stop instead of spinning.
        if (IsGone(result) && lastGone != name.data()) {
            lastGone = name.data();
            continue;
        }
        return result;
    }
}

// Children are opened relative to their parent and inherit its view.
LONG DeleteChildTree(HKEY parent, const wchar_t* name) {
    UniqueHKey child;
    LONG result = RegOpenKeyExW(parent, name, 0, kReadWrite, child.put());
    if (result != ERROR_SUCCESS) {
        child.release();  // nothing was opened
        return result;
    }
    result = DeleteSubkeys(child.get());
    child.reset();
    if (result != ERROR_SUCCESS) {
        return result;
    }
    return RegDeleteKeyW(parent, name);
}

// keep >= 0: this key stays and its children are pruned with keep - 1;
// keep < 0: this key goes with everything below it.
LONG PruneTree(HKEY root, const wchar_t* subkey, int keep) {
    UniqueHKey key;
    LONG result = RegOpenKeyW(root, subkey, key.put());
    if (result != ERROR_SUCCESS) {
        key.release();  // nothing was opened
        return result;
    }
    const DWORD start = g_tickSource();
    wchar_t name[kTreeNameChars];
    std::wstring lastGone;
    DWORD index = 0;
    for (;;) {
        if (g_tickSource() - start > kTreeBudgetMs) {
            break;
        }
        DWORD size = kTreeNameChars;
        LONG step =
            RegEnumKeyExW(key.get(), index, name, &size, nullptr, nullptr, nullptr, nullptr);
        if (step == ERROR_MORE_DATA) {
            ++index;  // a name longer than the buffer: that child stays
            continue;
        }
        if (step != ERROR_SUCCESS) {
            break;
        }
        LONG child = PruneTree(key.get(), name, keep >= 0 ? keep - 1 : -1);
        if (child == ERROR_SUCCESS) {
            lastGone.clear();
            continue;  // the next child now has this index
        }
        if (IsGone(child) && lastGone != name) {
            lastGone = name;
            continue;
        }
        ++index;  // the child stayed
    }
    key.reset();
    if (keep >= 0) {
        return -1;
    }
    return RegDeleteKeyW(root, subkey);
}

}  // namespace

void SetRegistryDeleteTickSource(RegistryTickSource source) {
    g_tickSource = source != nullptr ? source : SystemTicks;
}

BOOL CRegistry::RecurDeleteKey(HKEY root, const wchar_t* subkey, REGSAM view) {
    // An empty subkey would name root itself: never delete a whole root.
    if (root == nullptr || IsEmpty(subkey)) {
        return FALSE;
    }
    UniqueHKey key;
    if (RegOpenKeyExW(root, subkey, 0, kReadWrite | view, key.put()) != ERROR_SUCCESS) {
        key.release();  // nothing was opened
        return FALSE;
    }
    LONG result = DeleteSubkeys(key.get());
    key.reset();
    if (result != ERROR_SUCCESS) {
        return FALSE;
    }
    result = DeleteKeyInView(root, subkey, view);
    return result == ERROR_SUCCESS || IsGone(result) ? TRUE : FALSE;
}

BOOL RecursDeleteRegisterKey(HKEY root, const wchar_t* parent, const wchar_t* child) {
    // An empty child would make SHDeleteKeyW remove the parent itself.
    if (parent == nullptr || IsEmpty(child)) {
        TraceLevel1(TraceValue("RecursDeleteRegisterKey: input para is NULL!\n"));
        return FALSE;
    }
    if (root == nullptr) {
        return FALSE;
    }
    UniqueHKey key;
    if (RegOpenKeyExW(root, parent, 0, kReadWrite, key.put()) != ERROR_SUCCESS) {
        key.release();  // nothing was opened
        return FALSE;
    }
    return SHDeleteKeyW(key.get(), child) == ERROR_SUCCESS ? TRUE : FALSE;
}

LONG DeleteRegKeyTree(HKEY root, const wchar_t* subkey, int depth) {
    if (root == nullptr || IsEmpty(subkey) || depth < 0) {
        return ERROR_INVALID_PARAMETER;
    }
    return PruneTree(root, subkey, depth > 0 ? depth : -1);
}

BOOL RemoveRegKey(const wchar_t* userKeyName, const wchar_t* subkey) {
    // Both names are required: an empty one would widen the deletion to a
    // whole hive (or to all of HKEY_USERS).
    if (IsEmpty(userKeyName) || IsEmpty(subkey)) {
        return FALSE;
    }
    CStringEx path;
    path.Format(L"%s\\%s", userKeyName, subkey);
    CObjectSecurity security(HKEY_USERS, path.c_str());
    if (!security.CanDelete()) {
        CStringEx line;
        line.Format(L"RemoveRegKey failed!subkey %s, DeleteAllow %d", subkey,
                    static_cast<int>(security.GetLastError()));
        OutputDebugStringW(line.c_str());
        return FALSE;
    }
    // The user owns that hive: a link planted in it must not lead the deletion
    // out of it.
    if (!DeleteKeyTreeNoLinks(HKEY_USERS, path.c_str())) {
        OutputDebugStringW(L"CRegistry::RecurDeleteKey RegDeleteKey Failed!");
        return FALSE;
    }
    return TRUE;
}

BOOL RemoveRegValue(const wchar_t* userKeyName, const wchar_t* subkey, const wchar_t* valueName) {
    if (IsEmpty(userKeyName) || IsEmpty(subkey) || valueName == nullptr) {
        return FALSE;
    }
    CStringEx path;
    path.Format(L"%s\\%s", userKeyName, subkey);
    CObjectSecurity security(HKEY_USERS, path.c_str());
    if (!security.CanWrite()) {
        CStringEx line;
        line.Format(L"RemoveRegValue failed!subkey %s, DeleteAllow %d", subkey,
                    static_cast<int>(security.GetLastError()));
        OutputDebugStringW(line.c_str());
        return FALSE;
    }
    if (!DeleteValueNoLinks(HKEY_USERS, path.c_str(), valueName)) {
        OutputDebugStringW(L"RemoveRegValue::DeleteValue Failed!");
        return FALSE;
    }
    return TRUE;
}
