// CMSDom: selecting nodes, node lists and top-level comments.
#include "base/ms_dom.h"

#include <cwchar>

#include "base/ms_dom_support.h"

using ms_dom::IsEmptyText;
using ms_dom::Message;
using ms_dom::Query;

namespace {

// The comment's text without the white space around it equals text.
bool CommentTextEquals(IXMLDOMNode* comment, BSTR text) {
    UniqueBstr raw;
    if (comment->get_text(raw.put()) != S_OK) {
        return false;
    }
    CStringEx trimmed(raw.get());
    trimmed.TrimLeft();
    trimmed.TrimRight();
    return wcscmp(trimmed.c_str(), text != nullptr ? text : L"") == 0;
}

}  // namespace

HRESULT CMSDom::SelectSingleChild(IUnknown* pNode, BSTR bstrPath, IUnknown** ppFound) {
    if (pNode == nullptr || IsEmptyText(bstrPath) || ppFound == nullptr) {
        Message(L"CMSDom::SelectSingleChild: Invalid Argument\n");
        return E_INVALIDARG;
    }
    ComPtr<IXMLDOMNode> node = Query<IXMLDOMNode>(pNode, IID_IXMLDOMNode);
    if (!node) {
        Message(L"CMSDom::SelectSingleChild: Failed to get IXMLDOMNodePtr\n");
        return E_FAIL;
    }
    // S_FALSE with no node: nothing selected.
    ComPtr<IXMLDOMNode> found;
    if (node->selectSingleNode(bstrPath, found.GetAddressOf()) != S_OK || !found) {
        return E_FAIL;
    }
    HRESULT hr = ms_dom::HandOut(found.Get(), ppFound);
    if (FAILED(hr)) {
        Message(L"CMSDom::SelectSingleChild: Failed to QueryInterface of IUnknown\n");
    }
    return hr;
}

HRESULT CMSDom::GetNodeList(IUnknown* pNode, BSTR bstrPath, IUnknown** ppList) {
    if (pNode == nullptr || IsEmptyText(bstrPath) || ppList == nullptr) {
        Message(L"CMSDom::GetNodeList: Invalid argument\n");
        return E_INVALIDARG;
    }
    ComPtr<IXMLDOMNode> node = Query<IXMLDOMNode>(pNode, IID_IXMLDOMNode);
    if (!node) {
        Message(L"CMSDom::GetNodeList: can not get IXMLDOMNodePtr\n");
        return E_FAIL;
    }
    ComPtr<IXMLDOMNodeList> list;
    if (node->selectNodes(bstrPath, list.GetAddressOf()) != S_OK || !list) {
        return E_FAIL;
    }
    HRESULT hr = ms_dom::HandOut(list.Get(), ppList);
    if (FAILED(hr)) {
        Message(L"CMSDom::GetNodeList: Failed to QueryInterface of IUnknown\n");
    }
    return hr;
}

int CMSDom::GetNodeListCount(IUnknown* pList) {
    if (pList == nullptr) {
        Message(L"CMSDom::GetNodeListCount: input para is NULL!\n");
        return -1;
    }
    ComPtr<IXMLDOMNodeList> list = Query<IXMLDOMNodeList>(pList, IID_IXMLDOMNodeList);
    if (!list) {
        Message(L"CMSDom::GetNodeListCount: NodeList pointer is NULL!\n");
        return -1;
    }
    long length = 0;
    if (list->get_length(&length) != S_OK) {
        return -1;
    }
    return static_cast<int>(length);
}

HRESULT CMSDom::GetNodeFromList(IUnknown* pList, int nIndex, IUnknown** ppNode) {
    if (pList == nullptr || nIndex < 0 || ppNode == nullptr) {
        Message(L"CMSDom::GetNodeFromList: Invalid argument\n");
        return E_INVALIDARG;
    }
    ComPtr<IXMLDOMNodeList> list = Query<IXMLDOMNodeList>(pList, IID_IXMLDOMNodeList);
    if (!list) {
        Message(L"CMSDom::GetNodeFromList: Can not get IXMLDOMNodeListPtr\n");
        return E_FAIL;
    }
    long length = 0;
    if (list->get_length(&length) == S_OK && nIndex >= length) {
        Message(L"CMSDom::GetNodeFromList: Node Index overflow\n");
        return E_FAIL;
    }
    ComPtr<IXMLDOMNode> item;
    if (list->get_item(nIndex, item.GetAddressOf()) != S_OK || !item) {
        Message(L"CMSDom::GetNodeFromList: Failed to get node from list\n");
        return E_FAIL;
    }
    HRESULT hr = ms_dom::HandOut(item.Get(), ppNode);
    if (FAILED(hr)) {
        Message(L"CMSDom::GetNodeFromList: Failed to QueryInterface of IUnknown\n");
    }
    return hr;
}

HRESULT CMSDom::GetCommentsNode(IUnknown* pNode, BSTR bstrText, IUnknown** ppComment) {
    if (ppComment == nullptr) {
        Message(L"CMSDom::GetCommentsNode: output ppINode is NULL!\n");
        return E_POINTER;
    }
    ComPtr<IXMLDOMNode> node;
    ComPtr<IXMLDOMDocument> doc;
    HRESULT hr = ms_dom::NodeInDocument(
        pNode, L"CMSDom::GetCommentsNode: Failed to get IXMLDOMNodePtr\n",
        L"CMSDom::GetCommentsNode: Failed to get ownerDocument\n", &node, &doc);
    if (FAILED(hr)) {
        return hr;
    }
    ComPtr<IXMLDOMNodeList> children;
    if (doc->get_childNodes(children.GetAddressOf()) != S_OK || !children) {
        return E_FAIL;
    }
    long count = 0;
    if (children->get_length(&count) != S_OK) {
        return E_FAIL;
    }
    for (long i = 0; i < count; ++i) {
        ComPtr<IXMLDOMNode> child;
        DOMNodeType type = NODE_INVALID;
        if (children->get_item(i, child.GetAddressOf()) != S_OK || !child ||
            child->get_nodeType(&type) != S_OK || type != NODE_COMMENT ||
            !CommentTextEquals(child.Get(), bstrText)) {
            continue;
        }
        if (FAILED(ms_dom::HandOut(child.Get(), ppComment))) {
            Message(L"CMSDom::GetCommentsNode: QueryInterface IID_IUnknown failed!\n");
            return E_FAIL;
        }
        return S_OK;
    }
    return E_FAIL;
}
