#include "actions/page_island.h"

#include "base/com_owners.h"

namespace {

// HTML and BODY elements nested deeper than this are not searched: a hostile
// page could otherwise exhaust the stack, one browser call after another.
const int kMaxIslandDepth = 64;

// The object a browser call gave as IDispatch, as the interface T (null when
// the call failed or the object has no such interface).
template <typename T>
ComPtr<T> ObjectAs(HRESULT hr, const ComPtr<IDispatch>& object) {
    ComPtr<T> result;
    if (SUCCEEDED(hr) && object) {
        object.As(&result);
    }
    return result;
}

CStringEx TagName(IHTMLElement* element) {
    UniqueBstr tag;
    if (FAILED(element->get_tagName(tag.put())) || tag.get() == nullptr) {
        return CStringEx();
    }
    return CStringEx(tag.get());
}

bool SearchElement(IHTMLElement* element, const CStringEx& tag, CStringEx& island, int depth);

bool SearchChildren(IHTMLElement* element, CStringEx& island, int depth) {
    if (depth >= kMaxIslandDepth) {
        return false;
    }
    ComPtr<IDispatch> childrenObject;
    HRESULT hr = element->get_children(childrenObject.GetAddressOf());
    ComPtr<IHTMLElementCollection> children = ObjectAs<IHTMLElementCollection>(hr, childrenObject);
    if (!children) {
        return false;
    }
    long count = 0;
    if (FAILED(children->get_length(&count))) {
        return false;
    }
    for (long i = count - 1; i >= 0; --i) {
        VARIANT index;
        VariantInit(&index);
        index.vt = VT_I4;
        index.lVal = i;
        ComPtr<IDispatch> childObject;
        hr = children->item(index, index, childObject.GetAddressOf());
        ComPtr<IHTMLElement> child = ObjectAs<IHTMLElement>(hr, childObject);
        if (!child) {
            continue;
        }
        CStringEx childTag = TagName(child.Get());
        if (childTag.IsEmpty() || childTag.CompareNoCase(L"FORM") == 0) {
            continue;
        }
        if (SearchElement(child.Get(), childTag, island, depth + 1)) {
            return true;
        }
    }
    return false;
}

bool SearchElement(IHTMLElement* element, const CStringEx& tag, CStringEx& island, int depth) {
    if (tag.CompareNoCase(L"xml") == 0) {
        UniqueBstr inner;
        element->get_innerHTML(inner.put());
        island = inner.get() != nullptr ? CStringEx(inner.get()) : CStringEx();
        return true;
    }
    if (tag.CompareNoCase(L"Body") == 0 || tag.CompareNoCase(L"HTML") == 0) {
        return SearchChildren(element, island, depth);
    }
    return false;
}

}  // namespace

bool FindXmlIsland(IHTMLElement* element, CStringEx& island) {
    if (element == nullptr) {
        return false;
    }
    CStringEx tag = TagName(element);
    if (tag.IsEmpty()) {
        return false;
    }
    return SearchElement(element, tag, island, 0);
}

bool ReadPageIsland(IWebBrowserApp* browser, bool busyMeansNotReady, CStringEx& island) {
    if (browser == nullptr) {
        return false;
    }
    if (busyMeansNotReady) {
        VARIANT_BOOL busy = VARIANT_FALSE;
        if (SUCCEEDED(browser->get_Busy(&busy)) && busy != VARIANT_FALSE) {
            return false;
        }
    }
    ComPtr<IDispatch> documentObject;
    HRESULT hr = browser->get_Document(documentObject.GetAddressOf());
    ComPtr<IHTMLDocument3> document = ObjectAs<IHTMLDocument3>(hr, documentObject);
    if (!document) {
        return false;
    }
    ComPtr<IHTMLElement> root;
    if (FAILED(document->get_documentElement(root.GetAddressOf())) || !root) {
        return false;
    }
    return FindXmlIsland(root.Get(), island);
}
