// CMSDom: creating and loading documents, their text and their root.
#include "base/ms_dom.h"

#include "base/ms_dom_support.h"

using ms_dom::IsEmptyText;
using ms_dom::Message;
using ms_dom::Query;

namespace {

// A load or parse that the parser refused answers S_FALSE and VARIANT_FALSE;
// an error code means the call itself broke.
VARIANT_BOOL LoadResult(HRESULT hr, VARIANT_BOOL loaded, const wchar_t* brokeMessage) {
    if (FAILED(hr)) {
        Message(brokeMessage);
        return VARIANT_FALSE;
    }
    return hr == S_OK && loaded == VARIANT_TRUE ? VARIANT_TRUE : VARIANT_FALSE;
}

}  // namespace

HRESULT CMSDom::MSDomCreate(IUnknown** ppDoc) {
    if (ppDoc == nullptr) {
        Message(L"CMSDom::MSDomCreate: Invalid argument\n");
        return E_INVALIDARG;
    }
    ComPtr<IUnknown> doc;
    if (FAILED(::CoCreateInstance(CLSID_DOMDocument30, nullptr, CLSCTX_ALL, IID_IUnknown,
                                  reinterpret_cast<void**>(doc.GetAddressOf()))) ||
        !doc || FAILED(::OleRun(doc.Get()))) {
        Message(L"CMSDom::MSDomCreate:Failed to create dom object\n");
        return E_FAIL;
    }
    *ppDoc = doc.Detach();
    return S_OK;
}

VARIANT_BOOL CMSDom::LoadXmlFile(IUnknown* pDoc, BSTR bstrPath) {
    if (pDoc == nullptr || IsEmptyText(bstrPath)) {
        Message(L"CMSDom::LoadXmlFile: Invalid argument\n");
        return VARIANT_FALSE;
    }
    ComPtr<IXMLDOMDocument> doc = Query<IXMLDOMDocument>(pDoc, IID_IXMLDOMDocument);
    if (!doc) {
        Message(L"CMSDom::LoadXmlFile: Failed to get IXMLDOMDocumentPtr\n");
        return VARIANT_FALSE;
    }
    // A document loading in the background would be read half-parsed.
    doc->put_async(VARIANT_FALSE);
    UniqueVariant source;
    ms_dom::SetStringVariant(source, bstrPath);
    VARIANT_BOOL loaded = VARIANT_FALSE;
    HRESULT hr = doc->load(*source.get(), &loaded);
    return LoadResult(hr, loaded, L"Exception !CMSDom::LoadXmlFile: COIXML SaveToDOM FAILED !\n");
}

VARIANT_BOOL CMSDom::LoadXmlBytes(IUnknown* pDoc, SAFEARRAY* psaBytes) {
    if (pDoc == nullptr || psaBytes == nullptr) {
        Message(L"CMSDom::LoadXmlBytes: Invalid argument\n");
        return VARIANT_FALSE;
    }
    ComPtr<IXMLDOMDocument> doc = Query<IXMLDOMDocument>(pDoc, IID_IXMLDOMDocument);
    if (!doc) {
        Message(L"CMSDom::LoadXmlBytes: Failed to get IXMLDOMDocumentPtr\n");
        return VARIANT_FALSE;
    }
    doc->put_async(VARIANT_FALSE);
    doc->put_validateOnParse(VARIANT_FALSE);
    doc->put_resolveExternals(VARIANT_FALSE);
    // Borrowed: the variant is not cleared, the caller keeps the array.
    VARIANT source;
    ::VariantInit(&source);
    V_VT(&source) = VT_ARRAY | VT_UI1;
    V_ARRAY(&source) = psaBytes;
    VARIANT_BOOL loaded = VARIANT_FALSE;
    HRESULT hr = doc->load(source, &loaded);
    return LoadResult(hr, loaded, L"CMSDom::LoadXmlBytes: load FAILED!\n");
}

VARIANT_BOOL CMSDom::LoadFromString(IUnknown* pDoc, BSTR bstrXml) {
    if (pDoc == nullptr || IsEmptyText(bstrXml)) {
        Message(L"CMSDom::LoadFromString:Invalid argument\n");
        return VARIANT_FALSE;
    }
    ComPtr<IXMLDOMDocument> doc = Query<IXMLDOMDocument>(pDoc, IID_IXMLDOMDocument);
    if (!doc) {
        Message(L"CMSDom::LoadFromString:Failed to get IXMLDOMDocumentPtr\n");
        return VARIANT_FALSE;
    }
    doc->put_validateOnParse(VARIANT_FALSE);
    doc->put_resolveExternals(VARIANT_FALSE);
    doc->put_preserveWhiteSpace(VARIANT_TRUE);
    VARIANT_BOOL loaded = VARIANT_FALSE;
    HRESULT hr = doc->loadXML(bstrXml, &loaded);
    return LoadResult(hr, loaded, L"Exception CMSDom::LoadFromString: COIXML SaveToDOM FAILED!\n");
}

HRESULT CMSDom::CreateFromString(BSTR bstrXml, IUnknown** ppDoc) {
    HRESULT hr = MSDomCreate(ppDoc);
    if (FAILED(hr)) {
        return hr;
    }
    if (IsEmptyText(bstrXml)) {
        return E_FAIL;
    }
    return LoadFromString(*ppDoc, bstrXml) == VARIANT_TRUE ? S_OK : E_FAIL;
}

HRESULT CMSDom::GetXML(IUnknown* pNode, BSTR* pXml) {
    if (pNode == nullptr || pXml == nullptr) {
        Message(L"CMSDom::GetXML: Invalid Argument\n");
        return E_INVALIDARG;
    }
    ComPtr<IXMLDOMNode> node = Query<IXMLDOMNode>(pNode, IID_IXMLDOMNode);
    if (!node) {
        Message(L"CMSDom::GetXML: Failed to get IXMLDOMDocumentPtr\n");
        return E_FAIL;
    }
    UniqueBstr xml;
    if (node->get_xml(xml.put()) != S_OK) {
        Message(L"CMSDom::GetXML: Failed to get_xml\n ");
        return E_FAIL;
    }
    *pXml = xml.release();
    return S_OK;
}

HRESULT CMSDom::GetRootNode(IUnknown* pDoc, IUnknown** ppRoot) {
    ComPtr<IXMLDOMDocument> doc = Query<IXMLDOMDocument>(pDoc, IID_IXMLDOMDocument);
    if (!doc) {
        Message(L"CMSDom::GetRootNode: can not get IXMLDOMDocument!\n");
        return E_FAIL;
    }
    if (ppRoot == nullptr) {
        return E_POINTER;
    }
    ComPtr<IXMLDOMElement> root;
    if (doc->get_documentElement(root.GetAddressOf()) != S_OK || !root) {
        return E_FAIL;
    }
    return ms_dom::HandOut(root.Get(), ppRoot);
}
