// CMSDom::SaveToFile: the XML declaration made to say UTF-8, then one staged
// write of the file.
#include "base/ms_dom.h"

#include <shlwapi.h>

#include <cwchar>
#include <string>

#include "base/ms_dom_support.h"
#include "base/staged_file.h"

using ms_dom::IsEmptyText;
using ms_dom::Message;

namespace {

const wchar_t kDeclarationTarget[] = L"xml";
const wchar_t kDeclarationData[] = L"version = \"1.0\" encoding=\"UTF-8\"";

UniqueBstr MakeBstr(const wchar_t* text) {
    return UniqueBstr(::SysAllocString(text));
}

// The standalone pseudo-attribute of a declaration's data, or empty.
std::wstring StandaloneOf(const wchar_t* data) {
    const wchar_t* at = wcsstr(data, L"standalone");
    if (at == nullptr) {
        return std::wstring();
    }
    at += wcslen(L"standalone");
    at += wcsspn(at, L" \t\r\n");
    if (*at != L'=') {
        return std::wstring();
    }
    ++at;
    at += wcsspn(at, L" \t\r\n");
    const wchar_t quote = *at;
    if (quote != L'"' && quote != L'\'') {
        return std::wstring();
    }
    const wchar_t* end = wcschr(at + 1, quote);
    return end != nullptr ? std::wstring(at + 1, end) : std::wstring();
}

// Replaces an xml declaration by one that says UTF-8, keeping its
// standalone. (Not through the declaration's attribute map: not every DOM
// lets that be written.)
bool DeclareUtf8(IXMLDOMDocument* doc, IXMLDOMNode* declaration) {
    UniqueVariant data;
    if (declaration->get_nodeValue(data.get()) != S_OK || V_VT(data.get()) != VT_BSTR) {
        return false;
    }
    std::wstring text = L"version=\"1.0\" encoding=\"UTF-8\"";
    std::wstring standalone = StandaloneOf(V_BSTR(data.get()) ? V_BSTR(data.get()) : L"");
    if (standalone == L"yes" || standalone == L"no") {
        text += L" standalone=\"" + standalone + L"\"";
    }
    UniqueBstr target = MakeBstr(kDeclarationTarget);
    UniqueBstr newData = MakeBstr(text.c_str());
    ComPtr<IXMLDOMProcessingInstruction> replacement;
    ComPtr<IXMLDOMNode> replaced;
    return doc->createProcessingInstruction(target.get(), newData.get(),
                                            replacement.GetAddressOf()) == S_OK &&
           replacement &&
           doc->replaceChild(replacement.Get(), declaration, replaced.GetAddressOf()) == S_OK;
}

// A declaration saying UTF-8 in front of everything. Only a document with a
// root element gets a new one; it goes before the first child, since a
// declaration after a leading comment would make the file unreadable.
bool InsertDeclaration(IXMLDOMDocument* doc, IXMLDOMNode* firstChild) {
    ComPtr<IXMLDOMElement> root;
    if (doc->get_documentElement(root.GetAddressOf()) != S_OK || !root) {
        return true;
    }
    UniqueBstr target = MakeBstr(kDeclarationTarget);
    UniqueBstr data = MakeBstr(kDeclarationData);
    ComPtr<IXMLDOMProcessingInstruction> declaration;
    if (doc->createProcessingInstruction(target.get(), data.get(), declaration.GetAddressOf()) !=
            S_OK ||
        !declaration) {
        return false;
    }
    VARIANT before;
    ::VariantInit(&before);
    V_VT(&before) = VT_UNKNOWN;
    V_UNKNOWN(&before) = firstChild;  // borrowed, not cleared
    ComPtr<IXMLDOMNode> inserted;
    return doc->insertBefore(declaration.Get(), before, inserted.GetAddressOf()) == S_OK;
}

bool NormaliseDeclaration(IXMLDOMDocument* doc) {
    ComPtr<IXMLDOMNode> first;
    if (doc->get_firstChild(first.GetAddressOf()) != S_OK || !first) {
        return true;  // an empty document is saved as it is
    }
    DOMNodeType type = NODE_INVALID;
    UniqueBstr name;
    if (first->get_nodeType(&type) == S_OK && type == NODE_PROCESSING_INSTRUCTION &&
        first->get_nodeName(name.put()) == S_OK && name &&
        _wcsicmp(name.get(), kDeclarationTarget) == 0) {
        return DeclareUtf8(doc, first.Get());
    }
    return InsertDeclaration(doc, first.Get());
}

// A file URL names a local path; anything else is taken as a path.
bool LocalPath(const wchar_t* path, std::wstring* local) {
    if (_wcsnicmp(path, L"file:", 5) != 0) {
        *local = path;
        return true;
    }
    wchar_t buffer[MAX_PATH * 2] = {};
    DWORD size = sizeof(buffer) / sizeof(buffer[0]);
    if (FAILED(::PathCreateFromUrlW(path, buffer, &size, 0))) {
        return false;
    }
    *local = buffer;
    return true;
}

bool SaveStaged(IXMLDOMDocument* doc, const wchar_t* path) {
    std::wstring local;
    if (!LocalPath(path, &local)) {
        return false;
    }
    StagedFile staged(local.c_str());
    if (!staged.Begin()) {
        return false;
    }
    UniqueVariant destination;
    ms_dom::SetStringVariant(destination, staged.Path());
    return V_VT(destination.get()) == VT_BSTR && doc->save(*destination.get()) == S_OK &&
           staged.Commit();
}

}  // namespace

HRESULT CMSDom::SaveToFile(IUnknown* pDoc, BSTR bstrPath) {
    if (pDoc == nullptr || IsEmptyText(bstrPath)) {
        Message(L"CMSDom::SaveToFile : Invalid Argument\n");
        return E_INVALIDARG;
    }
    ComPtr<IXMLDOMDocument> doc = ms_dom::Query<IXMLDOMDocument>(pDoc, IID_IXMLDOMDocument);
    if (!doc) {
        Message(L"CMSDom::SaveToFile : Failed to get IXMLDOMDocumentPtr\n");
        return E_POINTER;
    }
    if (!NormaliseDeclaration(doc.Get()) || !SaveStaged(doc.Get(), bstrPath)) {
        Message(L"CMSDom::SaveToFile: Failed to save to file\n");
        return E_FAIL;
    }
    return S_OK;
}
