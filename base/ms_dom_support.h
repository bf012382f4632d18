// What the CMSDom operations share: their debugger-output messages, the
// interface queries that stand for "is this a document / node / list", and
// handing a result out as the caller's own IUnknown reference.
#pragma once

#include <windows.h>
#include <msxml2.h>

#include "base/com_owners.h"

namespace ms_dom {

// One line of the wrapper's own diagnostics.
inline void Message(const wchar_t* text) {
    ::OutputDebugStringW(text);
}

// A null BSTR and an empty one are both empty.
inline bool IsEmptyText(BSTR text) {
    return text == nullptr || text[0] == L'\0';
}

// The interface iid of object, or null (also for a null object).
template <typename T>
ComPtr<T> Query(IUnknown* object, REFIID iid) {
    ComPtr<T> result;
    if (object != nullptr &&
        FAILED(object->QueryInterface(iid, reinterpret_cast<void**>(result.GetAddressOf())))) {
        result.Reset();
    }
    return result;
}

// Stores object's IUnknown in *out for the caller; *out is untouched on failure.
HRESULT HandOut(IUnknown* object, IUnknown** out);

// The node object stands for and the document it belongs to (a document
// itself belongs to none, whatever the DOM answers). E_POINTER after the
// matching message when either is missing.
HRESULT NodeInDocument(IUnknown* object, const wchar_t* notNodeMessage,
                       const wchar_t* noOwnerMessage, ComPtr<IXMLDOMNode>* node,
                       ComPtr<IXMLDOMDocument>* doc);

// Whether parent may take child as its last child. Some DOM implementations
// accept children of a comment or a second root element and leave a tree
// that breaks later; the platform's own DOM refuses them.
bool AcceptsChild(IXMLDOMNode* parent, IXMLDOMNode* child);

// A string VARIANT holding a copy of text; VT_EMPTY when out of memory.
void SetStringVariant(UniqueVariant& variant, const wchar_t* text);

}  // namespace ms_dom
