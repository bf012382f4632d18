// CMSDom: the one way this program reads and edits XML as a tree, over the
// MSXML 3.0 DOM. It keeps no state: every operation takes the document, node
// or node list it works on as an IUnknown, text as BSTRs, and answers with a
// fixed code. Failures are described on the debugger output, never thrown.
//
// Out-arguments receive an IUnknown reference the caller owns (pass a
// ComPtr<IUnknown>'s ReleaseAndGetAddressOf()); arguments are never released.
// A null BSTR counts as empty text.
//
//   ComPtr<IUnknown> doc, node;
//   CMSDom::CreateFromString(xml.get(), doc.ReleaseAndGetAddressOf());
//   CMSDom::SelectSingleChild(doc.Get(), path.get(), node.ReleaseAndGetAddressOf());
#pragma once

#include <windows.h>
#include <oleauto.h>

#include "base/string_ex.h"

class CMSDom {
public:
    // Documents: create, load, save, serialise.

    // A new DOMDocument 3.0. E_INVALIDARG for a null ppDoc, E_FAIL when the
    // object cannot be created.
    static HRESULT MSDomCreate(IUnknown** ppDoc);
    // Loads the file (or URL) synchronously, with the document's other
    // settings as they are. VARIANT_TRUE when the parser accepted it.
    static VARIANT_BOOL LoadXmlFile(IUnknown* pDoc, BSTR bstrPath);
    // Loads XML from bytes already read and checked by the caller (the array
    // of VT_UI1 stays the caller's), without validation or external
    // resolution: for files that someone else may write.
    static VARIANT_BOOL LoadXmlBytes(IUnknown* pDoc, SAFEARRAY* psaBytes);
    // Parses text without validation or external resolution, keeping white
    // space.
    static VARIANT_BOOL LoadFromString(IUnknown* pDoc, BSTR bstrXml);
    // MSDomCreate, then LoadFromString. On a failure after creation the new
    // document stays in *ppDoc for the caller to release.
    static HRESULT CreateFromString(BSTR bstrXml, IUnknown** ppDoc);
    // Writes the document as UTF-8 (declaring it so) to a path or file URL.
    // The file is replaced in one step: it holds either its old or its new
    // content.
    static HRESULT SaveToFile(IUnknown* pDoc, BSTR bstrPath);
    // The serialised text of a node or document, owned by the caller.
    static HRESULT GetXML(IUnknown* pNode, BSTR* pXml);

    // Finding nodes (plain element paths in the document's default selection
    // language).

    static HRESULT GetRootNode(IUnknown* pDoc, IUnknown** ppRoot);
    // E_FAIL, *ppFound untouched, when nothing is selected.
    static HRESULT SelectSingleChild(IUnknown* pNode, BSTR bstrPath, IUnknown** ppFound);
    // An empty list is a success.
    static HRESULT GetNodeList(IUnknown* pNode, BSTR bstrPath, IUnknown** ppList);
    // The list's length, or -1.
    static int GetNodeListCount(IUnknown* pList);
    static HRESULT GetNodeFromList(IUnknown* pList, int nIndex, IUnknown** ppNode);
    // The first top-level comment of pNode's document whose text, trimmed of
    // surrounding white space, equals bstrText (case-sensitive). pNode is a
    // node inside the document, not the document itself.
    static HRESULT GetCommentsNode(IUnknown* pNode, BSTR bstrText, IUnknown** ppComment);

    // Reading values.

    // The concatenated text of the node and its descendants; strValue is
    // emptied when nothing could be read.
    static HRESULT GetNodeValue(IUnknown* pNode, CStringEx& strValue);
    // The text of the first node bstrPath selects; strValue is emptied when
    // nothing was found.
    static HRESULT GetChildNodeValue(IUnknown* pNode, BSTR bstrPath, CStringEx& strValue);
    // An element's attribute; E_FAIL and strValue untouched when it is absent.
    static HRESULT GetNodeAttribute(IUnknown* pNode, BSTR bstrName, CStringEx& strValue);

    // Changing the tree.

    // Appends a new element as pParent's last child; ppNew may be null. A null
    // name creates nothing and still answers S_OK.
    static HRESULT CreateNode(IUnknown* pParent, BSTR bstrName, IUnknown** ppNew = nullptr);
    // As above, then gives the element the text; answers the creation's code.
    static HRESULT CreateNode(IUnknown* pParent, BSTR bstrName, BSTR bstrText,
                              IUnknown** ppNew = nullptr);
    // As above with the number as decimal text; answers the value step's code
    // when an element was appended.
    static HRESULT CreateNode(IUnknown* pParent, BSTR bstrName, int nNumber,
                              IUnknown** ppNew = nullptr);
    // Replaces the node's content by the text.
    static HRESULT SetNodeValue(IUnknown* pNode, BSTR bstrText);
    static HRESULT SetNodeValue(IUnknown* pNode, int nNumber);
    static HRESULT AppendChildNode(IUnknown* pParent, IUnknown* pChild);
    // A deep copy, not inserted anywhere.
    static HRESULT CloneNode(IUnknown* pSrc, IUnknown** ppClone);
    static HRESULT RemoveSingleNode(IUnknown* pNode);
};
