#include "notes/plugin_paths.h"

#include <wchar.h>

namespace {

bool IsSeparator(wchar_t ch) {
    return ch == L'\\' || ch == L'/';
}

// True when relative has a component that is exactly "..".
bool HasParentStep(const wchar_t* relative) {
    const wchar_t* component = relative;
    for (const wchar_t* p = relative;; ++p) {
        if (*p == L'\0' || IsSeparator(*p)) {
            if (p - component == 2 && component[0] == L'.' && component[1] == L'.') {
                return true;
            }
            if (*p == L'\0') {
                return false;
            }
            component = p + 1;
        }
    }
}

}  // namespace

bool JoinFilePath(const wchar_t* folder, const wchar_t* relative, wchar_t (&out)[MAX_PATH]) {
    out[0] = L'\0';
    if (folder == nullptr || relative == nullptr || folder[0] == L'\0' || relative[0] == L'\0' ||
        IsSeparator(relative[0]) || wcschr(relative, L':') != nullptr || HasParentStep(relative)) {
        return false;
    }
    size_t folderChars = wcsnlen(folder, MAX_PATH);
    size_t relativeChars = wcsnlen(relative, MAX_PATH);
    bool needsSeparator = !IsSeparator(folder[folderChars - 1]);
    size_t total = folderChars + (needsSeparator ? 1 : 0) + relativeChars;
    if (total >= MAX_PATH) {
        return false;
    }
    wmemcpy(out, folder, folderChars);
    size_t at = folderChars;
    if (needsSeparator) {
        out[at++] = L'\\';
    }
    wmemcpy(out + at, relative, relativeChars);
    out[total] = L'\0';
    return true;
}

bool IsFullFolderPath(const wchar_t* folder) {
    if (folder == nullptr || folder[0] == L'\0') {
        return false;
    }
    bool driveRooted =
        ((folder[0] >= L'A' && folder[0] <= L'Z') || (folder[0] >= L'a' && folder[0] <= L'z')) &&
        folder[1] == L':' && IsSeparator(folder[2]);
    bool unc = IsSeparator(folder[0]) && IsSeparator(folder[1]) && folder[2] != L'\0';
    return driveRooted || unc;
}

bool IsUsableFolder(const wchar_t* folder) {
    if (folder == nullptr || wcsnlen(folder, MAX_PATH) >= MAX_PATH || !IsFullFolderPath(folder)) {
        return false;
    }
    DWORD attributes = GetFileAttributesW(folder);
    return attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_DIRECTORY) != 0;
}

bool IsRegularFile(const wchar_t* path) {
    if (path == nullptr || path[0] == L'\0') {
        return false;
    }
    DWORD attributes = GetFileAttributesW(path);
    return attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_DIRECTORY) == 0;
}
