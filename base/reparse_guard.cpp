#include "base/reparse_guard.h"

#include <windows.h>

#include <string>

#include "base/trace.h"

namespace {

bool IsSeparator(wchar_t ch) {
    return ch == L'\\' || ch == L'/';
}

void LogRefusal(const char* reason, const char* name, const std::wstring& where) {
    TraceLevel4(TraceValue(reason), TraceNamed(name, where.c_str()));
}

}  // namespace

bool IsFreeOfReparsePoints(const wchar_t* trustedRoot, const wchar_t* path) {
    if (trustedRoot == nullptr || path == nullptr || trustedRoot[0] == L'\0') {
        return false;
    }
    const std::wstring target(path);
    size_t rootChars = wcslen(trustedRoot);
    while (rootChars > 0 && IsSeparator(trustedRoot[rootChars - 1])) {
        --rootChars;
    }
    if (rootChars == 0 || target.size() < rootChars ||
        CompareStringOrdinal(target.c_str(), static_cast<int>(rootChars), trustedRoot,
                             static_cast<int>(rootChars), TRUE) != CSTR_EQUAL ||
        (target.size() > rootChars && !IsSeparator(target[rootChars]))) {
        LogRefusal("IsFreeOfReparsePoints: the path is not inside its folder", "lpszFilePath",
                   target);
        return false;
    }
    size_t at = rootChars;
    while (at < target.size()) {
        while (at < target.size() && IsSeparator(target[at])) {
            ++at;
        }
        size_t end = at;
        while (end < target.size() && !IsSeparator(target[end])) {
            ++end;
        }
        if (end == at) {
            break;  // trailing separators
        }
        const std::wstring name = target.substr(at, end - at);
        // The prefix without a trailing separator: asked with one, Wine
        // reports a linked folder as a plain folder.
        const std::wstring component = target.substr(0, end);
        if (name == L"." || name == L"..") {
            LogRefusal("IsFreeOfReparsePoints: the path steps out of its folder", "lpszFilePath",
                       target);
            return false;
        }
        DWORD attributes = GetFileAttributesW(component.c_str());
        if (attributes == INVALID_FILE_ATTRIBUTES) {
            return true;  // nothing there yet, nor below it
        }
        if (attributes & FILE_ATTRIBUTE_REPARSE_POINT) {
            LogRefusal("IsFreeOfReparsePoints: refused to go through a reparse point",
                       "lpszReparsePoint", component);
            return false;
        }
        at = end;
    }
    return true;
}
