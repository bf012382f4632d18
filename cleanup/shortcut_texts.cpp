#include "cleanup/shortcut_texts.h"

#include <wchar.h>

SuiteTextLibrary::SuiteTextLibrary(const CStringEx& root, const wchar_t* fileName) {
    CStringEx path(root);
    CStringEx::PathAppend(path, fileName);
    m_module.reset(LoadLibraryW(path.c_str()));
}

CStringEx SuiteTextLibrary::Text(UINT id) const {
    CStringEx text;
    if (!m_module || !text.LoadString(m_module.get(), id) || text.GetLength() >= MAX_PATH) {
        text.Empty();
    }
    return text;
}

bool IsPlainName(const CStringEx& name) {
    return !name.IsEmpty() && name != L"." && name != L".." &&
           wcspbrk(name.c_str(), L"\\/:*?\"<>|") == nullptr;
}

bool LinkPathIn(const CStringEx& folder, const CStringEx& name, CStringEx& linkPath) {
    if (folder.IsEmpty() || !IsPlainName(name)) {
        return false;
    }
    linkPath = folder;
    CStringEx::PathAppend(linkPath, name.c_str());
    linkPath += L".lnk";
    return linkPath.GetLength() < MAX_PATH;
}
