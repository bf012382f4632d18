#include "base/untrusted_xml_load.h"

#include <msxml2.h>

#include "base/com_owners.h"
#include "base/ms_dom.h"

namespace {

// A declaration the byte check could not see (an encoding that spells it
// otherwise) still shows in the parsed document. A document that cannot be
// asked counts as having one.
bool HasDocumentType(IUnknown* pDoc) {
    ComPtr<IXMLDOMDocument> doc;
    ComPtr<IXMLDOMDocumentType> doctype;
    return FAILED(pDoc->QueryInterface(IID_IXMLDOMDocument,
                                       reinterpret_cast<void**>(doc.GetAddressOf()))) ||
           !doc || FAILED(doc->get_doctype(doctype.GetAddressOf())) || doctype;
}

}  // namespace

UntrustedXmlRead LoadUntrustedXmlFile(IUnknown* pDoc, const wchar_t* path) {
    if (pDoc == nullptr || path == nullptr) {
        return UntrustedXmlRead::kUnreadable;
    }
    UniqueSafeArray bytes;
    UntrustedXmlRead read = ReadUntrustedXml(path, bytes.put());
    if (read != UntrustedXmlRead::kOk) {
        return read;
    }
    if (CMSDom::LoadXmlBytes(pDoc, bytes.get()) != VARIANT_TRUE) {
        return UntrustedXmlRead::kNotWellFormed;
    }
    return HasDocumentType(pDoc) ? UntrustedXmlRead::kHasDoctype : UntrustedXmlRead::kOk;
}
