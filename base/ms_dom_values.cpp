// CMSDom: reading a node's text and an element's attributes.
#include "base/ms_dom.h"

#include "base/ms_dom_support.h"

using ms_dom::Message;
using ms_dom::Query;

namespace {

// The node's text, or E_FAIL with value emptied.
HRESULT ReadText(IXMLDOMNode* node, CStringEx& value) {
    UniqueBstr text;
    if (node->get_text(text.put()) != S_OK) {
        value.Empty();
        return E_FAIL;
    }
    value = text.get();
    return S_OK;
}

}  // namespace

HRESULT CMSDom::GetNodeValue(IUnknown* pNode, CStringEx& strValue) {
    if (pNode == nullptr) {
        Message(L"CMSDom::GetNodeValue: Invalid Argument\n");
        return E_POINTER;
    }
    ComPtr<IXMLDOMNode> node = Query<IXMLDOMNode>(pNode, IID_IXMLDOMNode);
    if (!node) {
        strValue.Empty();
        return E_POINTER;
    }
    return ReadText(node.Get(), strValue);
}

HRESULT CMSDom::GetChildNodeValue(IUnknown* pNode, BSTR bstrPath, CStringEx& strValue) {
    ComPtr<IXMLDOMNode> node = Query<IXMLDOMNode>(pNode, IID_IXMLDOMNode);
    ComPtr<IXMLDOMNode> found;
    // S_FALSE with no node: nothing selected.
    if (!node || node->selectSingleNode(bstrPath, found.GetAddressOf()) != S_OK || !found) {
        strValue.Empty();
        return E_FAIL;
    }
    return ReadText(found.Get(), strValue);
}

HRESULT CMSDom::GetNodeAttribute(IUnknown* pNode, BSTR bstrName, CStringEx& strValue) {
    if (bstrName == nullptr) {
        return E_FAIL;
    }
    ComPtr<IXMLDOMElement> element = Query<IXMLDOMElement>(pNode, IID_IXMLDOMElement);
    if (!element) {
        return E_FAIL;
    }
    // S_FALSE with a null variant: no such attribute.
    UniqueVariant value;
    if (element->getAttribute(bstrName, value.get()) != S_OK ||
        FAILED(::VariantChangeType(value.get(), value.get(), 0, VT_BSTR))) {
        return E_FAIL;
    }
    strValue = V_BSTR(value.get());
    return S_OK;
}
