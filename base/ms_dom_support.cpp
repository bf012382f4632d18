#include "base/ms_dom_support.h"

namespace ms_dom {

HRESULT HandOut(IUnknown* object, IUnknown** out) {
    IUnknown* unknown = nullptr;
    HRESULT hr = object->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(&unknown));
    if (FAILED(hr) || unknown == nullptr) {
        return FAILED(hr) ? hr : E_NOINTERFACE;
    }
    *out = unknown;
    return S_OK;
}

HRESULT NodeInDocument(IUnknown* object, const wchar_t* notNodeMessage,
                       const wchar_t* noOwnerMessage, ComPtr<IXMLDOMNode>* node,
                       ComPtr<IXMLDOMDocument>* doc) {
    *node = Query<IXMLDOMNode>(object, IID_IXMLDOMNode);
    if (!*node) {
        Message(notNodeMessage);
        return E_POINTER;
    }
    DOMNodeType type = NODE_INVALID;
    if ((*node)->get_nodeType(&type) != S_OK || type == NODE_DOCUMENT ||
        (*node)->get_ownerDocument(doc->ReleaseAndGetAddressOf()) != S_OK || !*doc) {
        Message(noOwnerMessage);
        return E_POINTER;
    }
    return S_OK;
}

bool AcceptsChild(IXMLDOMNode* parent, IXMLDOMNode* child) {
    DOMNodeType parentType = NODE_INVALID;
    DOMNodeType childType = NODE_INVALID;
    if (parent->get_nodeType(&parentType) != S_OK || child->get_nodeType(&childType) != S_OK) {
        return false;
    }
    switch (childType) {
        case NODE_ELEMENT:
        case NODE_TEXT:
        case NODE_CDATA_SECTION:
        case NODE_ENTITY_REFERENCE:
        case NODE_PROCESSING_INSTRUCTION:
        case NODE_COMMENT:
        case NODE_DOCUMENT_FRAGMENT:
            break;
        default:
            return false;  // documents, attributes, declarations
    }
    if (parentType == NODE_ELEMENT || parentType == NODE_DOCUMENT_FRAGMENT) {
        return true;
    }
    if (parentType != NODE_DOCUMENT) {
        return false;
    }
    if (childType == NODE_PROCESSING_INSTRUCTION || childType == NODE_COMMENT) {
        return true;
    }
    // A document holds one element and no text.
    ComPtr<IXMLDOMDocument> doc = Query<IXMLDOMDocument>(parent, IID_IXMLDOMDocument);
    ComPtr<IXMLDOMElement> root;
    return childType == NODE_ELEMENT && doc &&
           doc->get_documentElement(root.GetAddressOf()) == S_FALSE && !root;
}

void SetStringVariant(UniqueVariant& variant, const wchar_t* text) {
    ::VariantClear(variant.get());
    BSTR copy = ::SysAllocString(text);
    if (copy != nullptr) {
        V_VT(variant.get()) = VT_BSTR;
        V_BSTR(variant.get()) = copy;
    }
}

}  // namespace ms_dom
