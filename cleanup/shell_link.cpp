#include "cleanup/shell_link.h"

#include <shlguid.h>

namespace {

// Arguments may be longer than a path.
const int kArgumentChars = 1024;
// Room to see that a target does not fit a path.
const int kTargetChars = 2 * MAX_PATH;

bool IsGiven(const wchar_t* text) {
    return text != nullptr && text[0] != L'\0';
}

}  // namespace

ShellLinkFile::ShellLinkFile() {
    if (FAILED(CoCreateInstance(CLSID_ShellLink, nullptr, CLSCTX_INPROC_SERVER,
                                IID_PPV_ARGS(m_link.GetAddressOf())))) {
        m_link.Reset();
    }
}

HRESULT ShellLinkFile::Load(HWND owner, const wchar_t* linkPath) {
    ComPtr<IPersistFile> file;
    if (!Created() || linkPath == nullptr || FAILED(m_link.As(&file))) {
        return E_FAIL;
    }
    HRESULT hr = file->Load(linkPath, STGM_READ);
    if (FAILED(hr)) {
        return hr;
    }
    m_link->Resolve(owner, SLR_NO_UI | SLR_ANY_MATCH);
    return S_OK;
}

HRESULT ShellLinkFile::Read(LinkFields& out) const {
    if (!Created()) {
        return E_FAIL;
    }
    wchar_t target[kTargetChars] = {};
    if (FAILED(m_link->GetPath(target, kTargetChars, nullptr, SLGP_SHORTPATH)) ||
        wcsnlen(target, kTargetChars) >= MAX_PATH) {
        return E_FAIL;
    }
    wchar_t workingDir[MAX_PATH] = {};
    wchar_t arguments[kArgumentChars] = {};
    wchar_t iconPath[MAX_PATH] = {};
    int iconIndex = 0;
    m_link->GetWorkingDirectory(workingDir, MAX_PATH);
    m_link->GetArguments(arguments, kArgumentChars);
    m_link->GetIconLocation(iconPath, MAX_PATH, &iconIndex);
    out.target = target;
    out.workingDir = workingDir;
    out.arguments = arguments;
    out.iconPath = iconPath;
    out.iconIndex = iconIndex;
    return S_OK;
}

HRESULT ShellLinkFile::Save(const wchar_t* linkPath) {
    ComPtr<IPersistFile> file;
    if (!Created() || FAILED(m_link.As(&file))) {
        return E_FAIL;
    }
    return file->Save(linkPath, TRUE);
}

HRESULT CreateLink(HWND /*owner*/, const wchar_t* folder, const wchar_t* target,
                   const wchar_t* linkPath, const wchar_t* arguments, const wchar_t* iconPath,
                   int iconIndex, const wchar_t* workingDir) {
    if (!IsGiven(folder) || !IsGiven(target) || !IsGiven(linkPath) || !IsGiven(workingDir)) {
        return E_FAIL;
    }
    ShellLinkFile link;
    if (!link.Created()) {
        return E_FAIL;
    }
    link.Link()->SetPath(target);
    if (IsGiven(iconPath)) {
        link.Link()->SetIconLocation(iconPath, iconIndex);
    }
    link.Link()->SetWorkingDirectory(workingDir);
    if (IsGiven(arguments)) {
        link.Link()->SetArguments(arguments);
    }
    return link.Save(linkPath);
}

HRESULT ReadLink(HWND owner, const wchar_t* linkPath, LinkFields& out) {
    ShellLinkFile link;
    HRESULT hr = link.Load(owner, linkPath);
    return FAILED(hr) ? hr : link.Read(out);
}
