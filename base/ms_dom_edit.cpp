// CMSDom: adding, valuing, copying and removing nodes.
#include "base/ms_dom.h"

#include <cwchar>

#include "base/ms_dom_support.h"

using ms_dom::Message;
using ms_dom::Query;

namespace {

// The decimal text of number as a BSTR.
UniqueBstr NumberText(int number) {
    wchar_t text[16] = {};
    swprintf(text, sizeof(text) / sizeof(text[0]), L"%d", number);
    return UniqueBstr(::SysAllocString(text));
}

}  // namespace

HRESULT CMSDom::CreateNode(IUnknown* pParent, BSTR bstrName, IUnknown** ppNew) {
    if (bstrName != nullptr && bstrName[0] == L'\0') {
        Message(L"CMSDom::CreateNode: Invalid argument\n");
        return E_INVALIDARG;
    }
    ComPtr<IXMLDOMNode> parent;
    ComPtr<IXMLDOMDocument> doc;
    HRESULT hr =
        ms_dom::NodeInDocument(pParent, L"CMSDom::CreateNode: Failed to get IXMLDOMNodePtr\n",
                               L"CMSDom::CreateNode: Failed to get ownerDocument\n", &parent, &doc);
    if (FAILED(hr)) {
        return hr;
    }
    // An element that cannot be made (no name) is not an error: nothing is added.
    ComPtr<IXMLDOMElement> element;
    if (doc->createElement(bstrName, element.GetAddressOf()) != S_OK || !element) {
        return S_OK;
    }
    ComPtr<IXMLDOMNode> appended;
    if (!ms_dom::AcceptsChild(parent.Get(), element.Get()) ||
        parent->appendChild(element.Get(), appended.GetAddressOf()) != S_OK || !appended) {
        return E_FAIL;  // a parent that takes no elements (text, comment)
    }
    if (ppNew != nullptr) {
        return ms_dom::HandOut(appended.Get(), ppNew);
    }
    return S_OK;
}

HRESULT CMSDom::CreateNode(IUnknown* pParent, BSTR bstrName, BSTR bstrText, IUnknown** ppNew) {
    ComPtr<IUnknown> element;
    HRESULT hr = CreateNode(pParent, bstrName, element.GetAddressOf());
    if (element) {
        SetNodeValue(element.Get(), bstrText);
        if (ppNew != nullptr) {
            *ppNew = element.Detach();
        }
    }
    return hr;
}

HRESULT CMSDom::CreateNode(IUnknown* pParent, BSTR bstrName, int nNumber, IUnknown** ppNew) {
    ComPtr<IUnknown> element;
    HRESULT hr = CreateNode(pParent, bstrName, element.GetAddressOf());
    if (element) {
        hr = SetNodeValue(element.Get(), nNumber);
        if (ppNew != nullptr) {
            *ppNew = element.Detach();
        }
    }
    return hr;
}

HRESULT CMSDom::SetNodeValue(IUnknown* pNode, BSTR bstrText) {
    ComPtr<IXMLDOMNode> node = Query<IXMLDOMNode>(pNode, IID_IXMLDOMNode);
    if (!node) {
        Message(L"CMSDom::SetNodeValue: Failed to get IXMLDOMNodePtr\n");
        return E_FAIL;
    }
    if (node->put_text(bstrText) != S_OK) {
        Message(L"CMSDom::SetNodeValueInternal: put_text FAILED!\n");
        return E_FAIL;
    }
    return S_OK;
}

HRESULT CMSDom::SetNodeValue(IUnknown* pNode, int nNumber) {
    UniqueBstr text = NumberText(nNumber);
    return SetNodeValue(pNode, text.get());
}

HRESULT CMSDom::AppendChildNode(IUnknown* pParent, IUnknown* pChild) {
    if (pParent == nullptr || pChild == nullptr) {
        Message(L"CMSDom::AppendChildNode: Input para is NULL!\n");
        return E_INVALIDARG;
    }
    ComPtr<IXMLDOMNode> parent = Query<IXMLDOMNode>(pParent, IID_IXMLDOMNode);
    ComPtr<IXMLDOMNode> child = Query<IXMLDOMNode>(pChild, IID_IXMLDOMNode);
    ComPtr<IXMLDOMNode> appended;
    if (!parent || !child || !ms_dom::AcceptsChild(parent.Get(), child.Get()) ||
        parent->appendChild(child.Get(), appended.GetAddressOf()) != S_OK || !appended) {
        Message(L"CMSDom::AppendChildNode: appendChild failed!\n");
        return E_FAIL;
    }
    return S_OK;
}

HRESULT CMSDom::CloneNode(IUnknown* pSrc, IUnknown** ppClone) {
    if (pSrc == nullptr || ppClone == nullptr) {
        Message(L"CMSDom::CloneNode: input para is NULL!\n");
        return E_POINTER;
    }
    ComPtr<IXMLDOMNode> source = Query<IXMLDOMNode>(pSrc, IID_IXMLDOMNode);
    if (!source) {
        Message(L"CMSDom::CloneNode: can not get Src IXMLDOMNode!\n");
        return E_POINTER;
    }
    ComPtr<IXMLDOMNode> clone;
    if (source->cloneNode(VARIANT_TRUE, clone.GetAddressOf()) != S_OK || !clone) {
        return E_FAIL;
    }
    return ms_dom::HandOut(clone.Get(), ppClone);
}

HRESULT CMSDom::RemoveSingleNode(IUnknown* pNode) {
    if (pNode == nullptr) {
        Message(L"CMSDom::RemoveSingleNode: Invalid Argument\n");
        return E_INVALIDARG;
    }
    ComPtr<IXMLDOMNode> node = Query<IXMLDOMNode>(pNode, IID_IXMLDOMNode);
    if (!node) {
        Message(L"CMSDom::RemoveSingleNode: Failed to get IXMLDOMNodePtr\n");
        return E_FAIL;
    }
    ComPtr<IXMLDOMNode> parent;
    if (node->get_parentNode(parent.GetAddressOf()) != S_OK || !parent) {
        Message(L"CMSDom::RemoveSingleNode: Failed to get parent IXMLDOMNodePtr\n");
        return E_FAIL;
    }
    ComPtr<IXMLDOMNode> removed;
    if (parent->removeChild(node.Get(), removed.GetAddressOf()) != S_OK || !removed) {
        Message(L"CMSDom::RemoveSingleNode: Failed to remove child node\n");
        return E_FAIL;
    }
    return S_OK;
}
