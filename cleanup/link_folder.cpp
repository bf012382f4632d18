#include "cleanup/link_folder.h"

#include <shellapi.h>

#include <vector>

#include "base/trace.h"
#include "base/win_handles.h"
#include "cleanup/shell_link.h"

namespace {

// No confirmation, silent, no error box, no undo.
const FILEOP_FLAGS kDeleteFlags = 0x714;
// A new name on a collision; silent and without an error box as well, since
// nobody may be there to close one (the program has no window and often runs
// under an installer as the system account).
const FILEOP_FLAGS kRenameFlags = 0x108 | FOF_SILENT | FOF_NOERRORUI;

bool IsGiven(const wchar_t* text) {
    return text != nullptr && text[0] != L'\0';
}

// The short form of a path, or the path itself when the system has none
// (a missing file).
CStringEx ShortForm(const wchar_t* path) {
    wchar_t shortPath[MAX_PATH] = {};
    DWORD length = GetShortPathNameW(path, shortPath, MAX_PATH);
    if (length == 0 || length >= MAX_PATH) {
        return CStringEx(path);
    }
    return CStringEx(shortPath);
}

// A rule with its target already in short form.
struct Matcher {
    Matcher(const wchar_t* target, const wchar_t* arguments)
        : shortTarget(ShortForm(target)), arguments(arguments) {}

    bool Matches(const LinkFields& link) const {
        return !link.target.IsEmpty() &&
               ShortForm(link.target.c_str()).CompareNoCase(shortTarget.c_str()) == 0 &&
               (arguments == nullptr || link.arguments.CompareNoCase(arguments) == 0);
    }

    CStringEx shortTarget;
    const wchar_t* arguments;
};

bool EndsWithLinkExtension(const wchar_t* name) {
    size_t length = wcslen(name);
    return length >= 4 && lstrcmpiW(name + length - 4, L".lnk") == 0;
}

// The shortcut files of a folder. entries counts everything "*.lnk" finds
// (folders too); a name whose short form alone ends in ".lnk" is no shortcut.
struct FolderLinks {
    int entries = 0;
    std::vector<CStringEx> files;
};

FolderLinks ListLinks(const wchar_t* folder) {
    FolderLinks found;
    CStringEx pattern(folder);
    CStringEx::PathAppend(pattern, L"*.lnk");
    WIN32_FIND_DATAW entry;
    UniqueFindHandle find(FindFirstFileW(pattern.c_str(), &entry));
    if (!find) {
        return found;
    }
    do {
        ++found.entries;
        if ((entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) == 0 &&
            EndsWithLinkExtension(entry.cFileName)) {
            CStringEx path(folder);
            CStringEx::PathAppend(path, entry.cFileName);
            if (path.GetLength() < MAX_PATH) {
                found.files.push_back(path);
            }
        }
    } while (FindNextFileW(find.get(), &entry));
    return found;
}

bool MatchesAny(const LinkFields& link, const std::vector<Matcher>& matchers) {
    for (const Matcher& matcher : matchers) {
        if (matcher.Matches(link)) {
            return true;
        }
    }
    return false;
}

// One path for SHFileOperationW: the list ends with a second terminator.
std::vector<wchar_t> PathList(const CStringEx& path) {
    std::vector<wchar_t> list(path.c_str(), path.c_str() + path.GetLength());
    list.push_back(L'\0');
    list.push_back(L'\0');
    return list;
}

bool ShellFileOperation(HWND owner, UINT operation, const CStringEx& from, const CStringEx* to,
                        FILEOP_FLAGS flags) {
    std::vector<wchar_t> fromList = PathList(from);
    std::vector<wchar_t> toList = to != nullptr ? PathList(*to) : std::vector<wchar_t>();
    SHFILEOPSTRUCTW operationInfo = {};
    operationInfo.hwnd = owner;
    operationInfo.wFunc = operation;
    operationInfo.pFrom = fromList.data();
    operationInfo.pTo = to != nullptr ? toList.data() : nullptr;
    operationInfo.fFlags = flags;
    return SHFileOperationW(&operationInfo) == 0 && !operationInfo.fAnyOperationsAborted;
}

}  // namespace

int DeleteLinksByTarget(HWND owner, const wchar_t* folder, const wchar_t* target,
                        const wchar_t* arguments) {
    LinkRule rule = {target, arguments};
    return DeleteLinksByTargets(owner, folder, &rule, 1);
}

int DeleteLinksByTargets(HWND owner, const wchar_t* folder, const LinkRule* rules, size_t count) {
    if (!IsGiven(folder) || rules == nullptr) {
        return E_FAIL;
    }
    std::vector<Matcher> matchers;
    for (size_t i = 0; i < count; ++i) {
        if (IsGiven(rules[i].target)) {
            matchers.emplace_back(rules[i].target, rules[i].arguments);
        }
    }
    FolderLinks links = ListLinks(folder);
    if (links.entries == 0) {
        return E_FAIL;
    }
    int deleted = 0;
    for (const CStringEx& path : links.files) {
        LinkFields link;
        if (SUCCEEDED(ReadLink(owner, path.c_str(), link)) && MatchesAny(link, matchers) &&
            ShellFileOperation(owner, FO_DELETE, path, nullptr, kDeleteFlags)) {
            deleted = 1;
        }
    }
    return deleted;
}

int UpdateLinkIcon(HWND owner, const wchar_t* folder, const wchar_t* target,
                   const wchar_t* arguments, const wchar_t* iconPath, int iconIndex) {
    if (!IsGiven(folder) || !IsGiven(target)) {
        return E_FAIL;
    }
    FolderLinks links = ListLinks(folder);
    if (links.entries == 0) {
        return E_FAIL;
    }
    const Matcher matcher(target, arguments);
    int saved = 0;
    for (const CStringEx& path : links.files) {
        ShellLinkFile link;
        LinkFields fields;
        if (FAILED(link.Load(owner, path.c_str())) || FAILED(link.Read(fields)) ||
            !matcher.Matches(fields)) {
            continue;
        }
        link.Link()->SetIconLocation(iconPath != nullptr ? iconPath : L"", iconIndex);
        if (SUCCEEDED(link.Save(path.c_str()))) {
            saved = 1;
        }
    }
    return saved;
}

int UpdateLinkName(HWND owner, const wchar_t* folder, const wchar_t* target,
                   const wchar_t* arguments, const wchar_t* newLinkPath) {
    TraceLevel2Named("UpdateLinkName", TraceNamed("lpszLinkDir", folder),
                     TraceNamed("lpszLinkTarget", target), TraceNamed("lpszLinkArgs", arguments),
                     TraceNamed("lpszNewLinkName", newLinkPath));
    if (!IsGiven(folder) || !IsGiven(target)) {
        return E_FAIL;
    }
    FolderLinks links = ListLinks(folder);
    if (links.entries == 0) {
        return E_FAIL;
    }
    if (!IsGiven(newLinkPath)) {
        return 0;
    }
    const Matcher matcher(target, arguments);
    const CStringEx newPath(newLinkPath);
    int renamed = 0;
    for (const CStringEx& path : links.files) {
        LinkFields link;
        if (path.CompareNoCase(newLinkPath) != 0 &&
            SUCCEEDED(ReadLink(owner, path.c_str(), link)) && matcher.Matches(link) &&
            ShellFileOperation(owner, FO_RENAME, path, &newPath, kRenameFlags)) {
            renamed = 1;
        }
    }
    return renamed;
}

void MoveLinkTargetIcon(HWND /*owner*/, const wchar_t* srcDir, const wchar_t* dstDir,
                        const wchar_t* linkName) {
    TraceLevel2Named("MoveLinkTargetIcon", TraceNamed("lpszLinkSrcDir", srcDir),
                     TraceNamed("lpszLinkDesDir", dstDir), TraceNamed("lpszIconName", linkName));
    if (!IsGiven(srcDir) || !IsGiven(dstDir)) {
        return;
    }
    if (IsFolderEmpty(dstDir)) {
        CreateDirectoryW(dstDir, nullptr);
    }
    CStringEx onlyName;
    if (linkName != nullptr) {
        onlyName = linkName;
        onlyName += L".lnk";
    }
    for (const CStringEx& source : ListLinks(srcDir).files) {
        const wchar_t* fileName = source.c_str() + source.ReverseFind(L'\\') + 1;
        if (linkName != nullptr && onlyName.CompareNoCase(fileName) != 0) {
            continue;
        }
        CStringEx destination(dstDir);
        CStringEx::PathAppend(destination, fileName);
        if (destination.GetLength() < MAX_PATH &&
            CopyFileW(source.c_str(), destination.c_str(), FALSE)) {
            DeleteFileW(source.c_str());
        }
    }
    if (linkName == nullptr && IsFolderEmpty(srcDir)) {
        RemoveDirectoryW(srcDir);
    }
}

int IsFolderEmpty(const wchar_t* path) {
    if (path == nullptr) {
        return 1;
    }
    CStringEx pattern(path);
    CStringEx::PathAppend(pattern, L"*");
    WIN32_FIND_DATAW entry;
    UniqueFindHandle find(FindFirstFileW(pattern.c_str(), &entry));
    if (!find) {
        return 1;
    }
    do {
        if (wcscmp(entry.cFileName, L".") != 0 && wcscmp(entry.cFileName, L"..") != 0) {
            return 0;
        }
    } while (FindNextFileW(find.get(), &entry));
    return 1;
}
