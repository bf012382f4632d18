// A status file that a configured "file" URL names: made to exist, and given
// the suite's state.
#include <array>
#include <string>

#include "base/ms_dom.h"
#include "base/trace.h"
#include "base/untrusted_xml_load.h"
#include "presence/custom_status.h"
#include "presence/status_paths.h"

namespace {

const wchar_t kMirovanFolder[] = L"Mirovan";
const wchar_t kSuiteFolder[] = L"Quillmark Tools";

// The comments earlier releases wrote at the top of a status file. This
// suite's earlier releases wrote none.
const std::array<const wchar_t*, 0> kLegacyComments = {};

bool IsFileUrl(const wchar_t* url) {
    return wcsncmp(url, L"file", 4) == 0;
}

// The path without its last element ("C:\a\b" gives "C:\a").
CStringEx FolderOf(const CStringEx& path) {
    int slash = path.ReverseFind(L'\\');
    return slash > 0 ? path.Left(slash) : CStringEx();
}

// Creates folder when it is missing and its last element is name.
void CreateNamedFolder(const CStringEx& folder, const wchar_t* name) {
    CStringEx last = folder.Mid(folder.ReverseFind(L'\\') + 1);
    TraceLevel1(TraceNamed("strFolderName", last));
    if (folder.IsEmpty() || GetFileAttributesW(folder.c_str()) != INVALID_FILE_ATTRIBUTES ||
        last.Compare(name) != 0) {
        return;
    }
    TraceLevel1(TraceValue("CreateDirectory"));
    if (!CreateDirectoryW(folder.c_str(), nullptr)) {
        CStringEx failure;
        failure.Format(L"CreateDirectory failed ! LastError=%d", static_cast<int>(GetLastError()));
        TraceLevel1(TraceValue(failure));
    }
}

HRESULT SaveDocument(IUnknown* pDom, const wchar_t* path) {
    UniqueBstr target(SysAllocString(path));
    return target ? CMSDom::SaveToFile(pDom, target.get()) : E_OUTOFMEMORY;
}

}  // namespace

void CMOCCustomStatusInstall::ValidateCustomStatusFile(const wchar_t* lpszUrl) {
    CAutoFunTrace trace("CMOCCustomStatusInstall::ValidateCustomStatusFile");
    if (lpszUrl == nullptr) {
        TraceLevel8(
            TraceValue("CMOCCustomStatusInstall::ValidateCustomStatusFile: input para is NULL!"));
        return;
    }
    CStringEx path;
    if (!IsFileUrl(lpszUrl) || !StatusFilePathFromUrl(lpszUrl, path) ||
        GetFileAttributesW(path.c_str()) != INVALID_FILE_ATTRIBUTES ||
        !IsStatusPathSafe(path.c_str())) {
        return;
    }
    CStringEx suiteFolder = FolderOf(path);
    CreateNamedFolder(FolderOf(suiteFolder), kMirovanFolder);
    CreateNamedFolder(suiteFolder, kSuiteFolder);
    CopyStatusTemplate(path.c_str());
}

int CMOCCustomStatusInstall::UpdateStatusFileForInstall(const wchar_t* lpszUrl) {
    CAutoFunTrace trace("CMOCCustomStatusInstall::UpdateStatusFileForInstall");
    if (lpszUrl == nullptr) {
        TraceLevel4(TraceValue("CMOCCustomStatusInstall::UpdateStatusFile: input para is NULL!"));
        return 0;
    }
    if (!IsFileUrl(lpszUrl)) {
        TraceLevel8(
            TraceValue("CMOCCustomStatusInstall::UpdateStatusFileForInstall: regkey "
                       "CustomStateURL is not include file, it can not be written!"));
        return 0;
    }
    CStringEx path;
    if (!StatusFilePathFromUrl(lpszUrl, path)) {
        TraceLevel4(TraceValue("CMOCCustomStatusInstall::UpdateStatusFileForInstall: the URL names "
                               "no full path\n"),
                    TraceNamed("lpszUrl", lpszUrl));
        return 0;
    }
    ComPtr<IUnknown> doc;
    if (!IsStatusPathSafe(path.c_str()) || FAILED(CMSDom::MSDomCreate(doc.GetAddressOf()))) {
        return 0;
    }
    UntrustedXmlRead read = LoadUntrustedXmlFile(doc.Get(), path.c_str());
    if (read != UntrustedXmlRead::kOk) {
        TraceLevel4(
            TraceValue(std::string("CMOCCustomStatusInstall::UpdateStatusFileForInstall: ") +
                       DescribeUntrustedXmlRead(read)),
            TraceNamed("lpszFilePath", path));
        return 0;
    }
    RemoveMrvOldCommNode(doc.Get(), path.c_str());
    if (GetMirovanStatusNode(doc.Get())) {
        return 0;  // the suite's state is there already
    }
    return InsertMirovanStatus(doc.Get()) && SUCCEEDED(SaveDocument(doc.Get(), path.c_str())) ? 1
                                                                                              : 0;
}

void CMOCCustomStatusInstall::RemoveMrvOldCommNode(IUnknown* pDom, const wchar_t* lpszPath) {
    CAutoFunTrace trace("CMOCCustomStatusInstall::RemoveMrvOldCommNode");
    if (pDom == nullptr) {
        TraceLevel4(TraceValue(
            "CMOCCustomStatusInstall::RemoveMrvOldCommNode: input pDom is NULL, RETURN NULL!"));
        return;
    }
    ComPtr<IUnknown> root;
    if (FAILED(CMSDom::GetRootNode(pDom, root.GetAddressOf()))) {
        return;
    }
    bool removed = false;
    for (const wchar_t* text : kLegacyComments) {
        UniqueBstr comment(SysAllocString(text));
        ComPtr<IUnknown> node;
        if (SUCCEEDED(CMSDom::GetCommentsNode(root.Get(), comment.get(), node.GetAddressOf())) &&
            SUCCEEDED(CMSDom::RemoveSingleNode(node.Get()))) {
            removed = true;
        }
    }
    if (removed && lpszPath != nullptr && lpszPath[0] != L'\0') {
        SaveDocument(pDom, lpszPath);
    }
}
