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

// A rule; the short form of its target is looked up when first needed.
class Matcher {
public:
    Matcher(const wchar_t* target, const wchar_t* arguments)
        : m_target(target), m_arguments(arguments) {}

    // The link's target as it reads equals the rule's target.
    bool MatchesAsWritten(const LinkFields& link) const {
        return MatchesArguments(link) && link.target.CompareNoCase(m_target.c_str()) == 0;
    }
    // The link's target in short form equals the rule's in short form.
    bool MatchesInShortForm(const LinkFields& link, const CStringEx& linkShortTarget) {
        if (!m_shortTargetKnown) {
            m_shortTarget = ShortForm(m_target.c_str());
            m_shortTargetKnown = true;
        }
        return MatchesArguments(link) && linkShortTarget.CompareNoCase(m_shortTarget.c_str()) == 0;
    }

private:
    bool MatchesArguments(const LinkFields& link) const {
        return m_arguments == nullptr || link.arguments.CompareNoCase(m_arguments) == 0;
    }

    CStringEx m_target;
    const wchar_t* m_arguments;
    CStringEx m_shortTarget;
    bool m_shortTargetKnown = false;
};

// Whether the link matches any of the rules. Short forms, which cost file
// system look-ups, are compared only when no rule matches the target as it
// reads.
bool MatchesAny(const LinkFields& link, std::vector<Matcher>& matchers) {
    if (link.target.IsEmpty()) {
        return false;
    }
    for (const Matcher& matcher : matchers) {
        if (matcher.MatchesAsWritten(link)) {
            return true;
        }
    }
    const CStringEx linkShortTarget = ShortForm(link.target.c_str());
    for (Matcher& matcher : matchers) {
        if (matcher.MatchesInShortForm(link, linkShortTarget)) {
            return true;
        }
    }
    return false;
}

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
    std::vector<Matcher> matchers = {Matcher(target, arguments)};
    int saved = 0;
    for (const CStringEx& path : links.files) {
        ShellLinkFile link;
        LinkFields fields;
        if (FAILED(link.Load(owner, path.c_str())) || FAILED(link.Read(fields)) ||
            !MatchesAny(fields, matchers)) {
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
    std::vector<Matcher> matchers = {Matcher(target, arguments)};
    const CStringEx newPath(newLinkPath);
    int renamed = 0;
    for (const CStringEx& path : links.files) {
        LinkFields link;
        if (path.CompareNoCase(newLinkPath) != 0 &&
            SUCCEEDED(ReadLink(owner, path.c_str(), link)) && MatchesAny(link, matchers) &&
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
