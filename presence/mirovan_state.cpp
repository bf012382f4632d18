// The suite's own custom state: finding it in a status document, and adding
// the template's copy of it.
#include <string>

#include "base/ms_dom.h"
#include "base/trace.h"
#include "base/untrusted_xml_load.h"
#include "notes/plugin_paths.h"
#include "presence/custom_status.h"
#include "presence/status_paths.h"

namespace {

const wchar_t kStateElement[] = L"customState";
const wchar_t kActivityElement[] = L"activity";
const wchar_t kStateId[] = L"19780803";
const wchar_t kActivityLcid[] = L"1033";
const wchar_t kActivityText[] = L"In a Mirovan meeting";

bool HasAttribute(IUnknown* element, const wchar_t* name, const wchar_t* value) {
    UniqueBstr attribute(SysAllocString(name));
    CStringEx text;
    return SUCCEEDED(CMSDom::GetNodeAttribute(element, attribute.get(), text)) && text == value;
}

bool IsSuiteActivity(IUnknown* activity) {
    CStringEx text;
    return HasAttribute(activity, L"LCID", kActivityLcid) &&
           SUCCEEDED(CMSDom::GetNodeValue(activity, text)) && text == kActivityText;
}

// Calls visit on each child element of node named name, in document order,
// until it returns true; true when one did.
template <typename Visit>
bool AnyChild(IUnknown* node, const wchar_t* name, Visit visit) {
    UniqueBstr path(SysAllocString(name));
    ComPtr<IUnknown> list;
    if (FAILED(CMSDom::GetNodeList(node, path.get(), list.GetAddressOf()))) {
        return false;
    }
    const int count = CMSDom::GetNodeListCount(list.Get());
    for (int i = 0; i < count; ++i) {
        ComPtr<IUnknown> child;
        if (SUCCEEDED(CMSDom::GetNodeFromList(list.Get(), i, child.GetAddressOf())) &&
            visit(child.Get())) {
            return true;
        }
    }
    return false;
}

}  // namespace

ComPtr<IUnknown> CMOCCustomStatusInstall::GetMirovanStatusNode(IUnknown* pDom) {
    CAutoFunTrace trace("CMOCCustomStatusInstall::GetMirovanStatusNode");
    ComPtr<IUnknown> found;
    if (pDom == nullptr) {
        TraceLevel4(TraceValue(
            "CMOCCustomStatusInstall::GetMirovanStatusNode: input pDom is NULL, RETURN NULL!"));
        return found;
    }
    ComPtr<IUnknown> root;
    if (FAILED(CMSDom::GetRootNode(pDom, root.GetAddressOf()))) {
        return found;
    }
    // Every state with the suite's ID is looked at, not only the first: a
    // file whose first such state has other wording got the suite's own
    // appended after it, and must not get another copy on every run.
    AnyChild(root.Get(), kStateElement, [&found](IUnknown* state) {
        if (!HasAttribute(state, L"ID", kStateId) ||
            !AnyChild(state, kActivityElement, IsSuiteActivity)) {
            return false;
        }
        found = state;
        return true;
    });
    return found;
}

int CMOCCustomStatusInstall::InsertMirovanStatus(IUnknown* pDom) {
    CAutoFunTrace trace("CMOCCustomStatusInstall::InsertMirovanStatus");
    if (pDom == nullptr) {
        TraceLevel4(
            TraceValue("CMOCCustomStatusInstall::InsertMirovanStatus: input para is NULL!"));
        return 0;
    }
    ComPtr<IUnknown> templateDoc;
    if (FAILED(CMSDom::MSDomCreate(templateDoc.GetAddressOf()))) {
        TraceLevel8(TraceValue(
            "CMOCCustomStatusInstall::InsertMirovanStatus: CMSDom::MSDomCreate FAILED!"));
        return 0;
    }
    CStringEx templatePath;
    if (!GetStatusTemplatePath(templatePath) || !IsRegularFile(templatePath.c_str())) {
        TraceLevel4(
            TraceValue("CMOCCustomStatusInstall::InsertMirovanStatus: Can not found "
                       "MirovanStatus.xml in Application Data!"));
        return 0;
    }
    // The install folder of a per-user installation is the user's.
    UntrustedXmlRead read = LoadUntrustedXmlFile(templateDoc.Get(), templatePath.c_str());
    if (read != UntrustedXmlRead::kOk) {
        TraceLevel4(TraceValue(std::string("CMOCCustomStatusInstall::InsertMirovanStatus: ") +
                               DescribeUntrustedXmlRead(read)),
                    TraceNamed("lpszFilePath", templatePath));
        return 0;
    }
    // Only the suite's own state: any other would be appended again on every
    // run, since the file would still lack the suite's.
    ComPtr<IUnknown> state = GetMirovanStatusNode(templateDoc.Get());
    ComPtr<IUnknown> copy;
    ComPtr<IUnknown> root;
    return state && SUCCEEDED(CMSDom::CloneNode(state.Get(), copy.GetAddressOf())) &&
                   SUCCEEDED(CMSDom::GetRootNode(pDom, root.GetAddressOf())) &&
                   SUCCEEDED(CMSDom::AppendChildNode(root.Get(), copy.Get()))
               ? 1
               : 0;
}
