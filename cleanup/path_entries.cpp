#include "cleanup/path_entries.h"

#include <windows.h>

#include <string>

namespace {

const wchar_t kSeparator = L';';

// Length of text[0, length) once trailing backslashes are dropped.
size_t LengthWithoutTrailingBackslashes(const wchar_t* text, size_t length) {
    while (length > 0 && text[length - 1] == L'\\') {
        --length;
    }
    return length;
}

// Does the entry text[0, length) name the folder (already trimmed)?
bool EntryNamesFolder(const wchar_t* entry, size_t length, const std::wstring& folder) {
    length = LengthWithoutTrailingBackslashes(entry, length);
    if (length != folder.size() || length == 0) {
        return false;
    }
    // File-system names compare ordinally without regard to case.
    return CompareStringOrdinal(entry, static_cast<int>(length), folder.c_str(),
                                static_cast<int>(length), TRUE) == CSTR_EQUAL;
}

std::wstring Trimmed(const wchar_t* folder) {
    if (folder == nullptr) {
        return std::wstring();
    }
    std::wstring text(folder);
    text.resize(LengthWithoutTrailingBackslashes(text.c_str(), text.size()));
    return text;
}

// Calls visit(start, length) for each entry of list[0, length).
template <typename Visit>
void ForEachEntry(const wchar_t* list, size_t length, Visit visit) {
    size_t start = 0;
    for (;;) {
        size_t end = start;
        while (end < length && list[end] != kSeparator) {
            ++end;
        }
        visit(start, end - start);
        if (end >= length) {
            return;
        }
        start = end + 1;
    }
}

size_t LengthWithoutTrailingSeparators(const wchar_t* text, size_t length) {
    while (length > 0 && text[length - 1] == kSeparator) {
        --length;
    }
    return length;
}

}  // namespace

CStringEx TrimTrailingBackslashes(const wchar_t* folder) {
    std::wstring text = Trimmed(folder);
    return CStringEx(text.c_str(), static_cast<int>(text.size()));
}

bool PathListHasEntry(const wchar_t* pathList, const wchar_t* folder) {
    std::wstring wanted = Trimmed(folder);
    if (pathList == nullptr || wanted.empty()) {
        return false;
    }
    bool found = false;
    ForEachEntry(pathList, wcslen(pathList), [&](size_t start, size_t length) {
        found = found || EntryNamesFolder(pathList + start, length, wanted);
    });
    return found;
}

CStringEx AppendPathEntry(const wchar_t* pathList, const wchar_t* folder) {
    std::wstring result;
    if (pathList != nullptr) {
        result.assign(pathList, LengthWithoutTrailingSeparators(pathList, wcslen(pathList)));
    }
    if (!result.empty()) {
        result += kSeparator;
    }
    result += Trimmed(folder);
    return CStringEx(result.c_str(), static_cast<int>(result.size()));
}

CStringEx RemovePathEntries(const wchar_t* pathList, const wchar_t* folder, int* removedCount) {
    if (removedCount != nullptr) {
        *removedCount = 0;
    }
    if (pathList == nullptr) {
        return CStringEx();
    }
    std::wstring wanted = Trimmed(folder);
    size_t length = LengthWithoutTrailingSeparators(pathList, wcslen(pathList));
    std::wstring result;
    result.reserve(length);
    bool first = true;
    ForEachEntry(pathList, length, [&](size_t start, size_t entryLength) {
        if (EntryNamesFolder(pathList + start, entryLength, wanted)) {
            if (removedCount != nullptr) {
                ++*removedCount;
            }
            return;
        }
        if (!first) {
            result += kSeparator;
        }
        result.append(pathList + start, entryLength);
        first = false;
    });
    size_t lead = result.find_first_not_of(kSeparator);
    result.erase(0, lead == std::wstring::npos ? result.size() : lead);
    return CStringEx(result.c_str(), static_cast<int>(result.size()));
}
