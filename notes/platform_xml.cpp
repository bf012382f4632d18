#include "notes/platform_xml.h"

#include <msxml2.h>

#include "base/com_owners.h"
#include "base/staged_file.h"
#include "base/trace.h"
#include "base/untrusted_xml_bytes.h"

namespace {

// Relative to the site element.
const wchar_t kFeatureXPath[] = L"feature[@id=\"com.mrv.realtime.meeting.feature\"]";
const wchar_t kFeatureElement[] = L"feature";

struct FeatureAttribute {
    const wchar_t* name;
    const wchar_t* value;
};
// In this order: Eclipse readers and people compare the text.
const FeatureAttribute kFeatureAttributes[] = {
    {L"id", L"com.mrv.realtime.meeting.feature"},
    {L"url", L"features/com.mrv.realtime.meeting.feature_1.0.1/"},
    {L"version", L"1.0.1"},
};

// Deeper nesting than any configuration file has; a guard where the parser
// honours it.
const LONG kMaxElementDepth = 256;

UniqueBstr MakeBstr(const wchar_t* text) {
    return UniqueBstr(SysAllocString(text));
}

void SetStringVariant(UniqueVariant& variant, const wchar_t* text) {
    VariantClear(variant.get());
    V_VT(variant.get()) = VT_BSTR;
    V_BSTR(variant.get()) = SysAllocString(text);
}

void LogLoadRefusal(UntrustedXmlRead reason) {
    TraceLevel4(TraceValue(std::string("PlatformXml: ") + DescribeUntrustedXmlRead(reason)));
}

// One platform.xml opened at its site element.
class CPlatformXml {
public:
    PlatformXmlStatus Open(const wchar_t* path, const SiteXPaths& sites) {
        if (FAILED(CoCreateInstance(CLSID_DOMDocument30, nullptr, CLSCTX_ALL, IID_IXMLDOMDocument,
                                    reinterpret_cast<void**>(m_doc.ReleaseAndGetAddressOf()))) ||
            !m_doc) {
            return PlatformXmlStatus::kCannotCreate;
        }
        if (!Load(path)) {
            return PlatformXmlStatus::kLoadFailed;
        }
        for (const wchar_t* xpath : sites) {
            if (xpath != nullptr && SelectSingle(m_doc.Get(), xpath, &m_site)) {
                return PlatformXmlStatus::kOk;
            }
        }
        return PlatformXmlStatus::kNoSite;
    }

    bool FindFeature(ComPtr<IXMLDOMNode>* feature) {
        return SelectSingle(m_site.Get(), kFeatureXPath, feature);
    }

    // Appends <feature id url version/> as the site's last child.
    bool AddFeature() {
        ComPtr<IXMLDOMElement> element;
        UniqueBstr name = MakeBstr(kFeatureElement);
        if (m_doc->createElement(name.get(), element.ReleaseAndGetAddressOf()) != S_OK ||
            !element) {
            return false;
        }
        ComPtr<IXMLDOMNamedNodeMap> attributes;
        if (element->get_attributes(attributes.ReleaseAndGetAddressOf()) != S_OK || !attributes) {
            return false;
        }
        for (const FeatureAttribute& item : kFeatureAttributes) {
            ComPtr<IXMLDOMAttribute> attribute;
            UniqueBstr attributeName = MakeBstr(item.name);
            if (m_doc->createAttribute(attributeName.get(), attribute.ReleaseAndGetAddressOf()) !=
                    S_OK ||
                !attribute) {
                return false;
            }
            UniqueVariant value;
            SetStringVariant(value, item.value);
            ComPtr<IXMLDOMNode> added;
            if (FAILED(attribute->put_nodeValue(*value.get())) ||
                FAILED(attributes->setNamedItem(attribute.Get(), added.ReleaseAndGetAddressOf()))) {
                return false;
            }
        }
        ComPtr<IXMLDOMNode> appended;
        return m_site->appendChild(element.Get(), appended.ReleaseAndGetAddressOf()) == S_OK;
    }

    bool RemoveFeature(const ComPtr<IXMLDOMNode>& feature) {
        ComPtr<IXMLDOMNode> removed;
        return m_site->removeChild(feature.Get(), removed.ReleaseAndGetAddressOf()) == S_OK;
    }

    // The document goes to a staging file beside path, which then replaces
    // path in one step: a save that fails part-way leaves path as it was.
    bool Save(const wchar_t* path) {
        StagedFile staged(path);
        if (!staged.Begin()) {
            return false;
        }
        UniqueVariant destination;
        SetStringVariant(destination, staged.Path());
        return m_doc->save(*destination.get()) == S_OK && staged.Commit();
    }

private:
    // S_FALSE with a null node means "nothing selected".
    static bool SelectSingle(IXMLDOMNode* from, const wchar_t* xpath, ComPtr<IXMLDOMNode>* out) {
        UniqueBstr query = MakeBstr(xpath);
        return from->selectSingleNode(query.get(), out->ReleaseAndGetAddressOf()) == S_OK && *out;
    }

    static void SetProperty(IXMLDOMDocument2* doc, const wchar_t* name, VARIANT value) {
        UniqueBstr property = MakeBstr(name);
        // Best effort: a parser that does not know a property keeps its default.
        doc->setProperty(property.get(), value);
    }

    // No validation, no external resolution, no DTD; the bytes parsed are the
    // bytes that passed the checks.
    bool Load(const wchar_t* path) {
        m_doc->put_async(VARIANT_FALSE);
        m_doc->put_validateOnParse(VARIANT_FALSE);
        m_doc->put_resolveExternals(VARIANT_FALSE);
        ComPtr<IXMLDOMDocument2> doc2;
        if (SUCCEEDED(m_doc->QueryInterface(
                IID_IXMLDOMDocument2, reinterpret_cast<void**>(doc2.ReleaseAndGetAddressOf()))) &&
            doc2) {
            UniqueVariant language;
            SetStringVariant(language, L"XPath");
            SetProperty(doc2.Get(), L"SelectionLanguage", *language.get());
            VARIANT prohibit;
            VariantInit(&prohibit);
            V_VT(&prohibit) = VT_BOOL;
            V_BOOL(&prohibit) = VARIANT_TRUE;
            SetProperty(doc2.Get(), L"ProhibitDTD", prohibit);
            VARIANT depth;
            VariantInit(&depth);
            V_VT(&depth) = VT_I4;
            V_I4(&depth) = kMaxElementDepth;
            SetProperty(doc2.Get(), L"MaxElementDepth", depth);
        }

        UniqueVariant source;
        SAFEARRAY* bytes = nullptr;
        UntrustedXmlRead read = ReadUntrustedXml(path, &bytes);
        if (read != UntrustedXmlRead::kOk) {
            LogLoadRefusal(read);
            return false;
        }
        V_VT(source.get()) = VT_ARRAY | VT_UI1;
        V_ARRAY(source.get()) = bytes;  // the variant owns the array now

        VARIANT_BOOL loaded = VARIANT_FALSE;
        if (m_doc->load(*source.get(), &loaded) != S_OK || loaded != VARIANT_TRUE) {
            return false;
        }
        // A declaration the byte check could not see still ends here.
        ComPtr<IXMLDOMDocumentType> doctype;
        if (m_doc->get_doctype(doctype.ReleaseAndGetAddressOf()) == S_OK && doctype) {
            LogLoadRefusal(UntrustedXmlRead::kHasDoctype);
            return false;
        }
        return true;
    }

    ComPtr<IXMLDOMDocument> m_doc;
    ComPtr<IXMLDOMNode> m_site;
};

}  // namespace

PlatformXmlEdit EditPlatformXml(const wchar_t* path, const SiteXPaths& sites, bool enable,
                                SaveGate gate) {
    PlatformXmlEdit result;
    CPlatformXml xml;
    result.status = xml.Open(path, sites);
    if (result.status != PlatformXmlStatus::kOk) {
        return result;
    }
    ComPtr<IXMLDOMNode> feature;
    bool listed = xml.FindFeature(&feature);
    if (enable && !listed) {
        if (!xml.AddFeature()) {
            result.status = PlatformXmlStatus::kEditFailed;
            return result;
        }
        result.changed = true;
    } else if (!enable && listed) {
        if (!xml.RemoveFeature(feature)) {
            result.status = PlatformXmlStatus::kEditFailed;
            return result;
        }
        result.changed = true;
    }
    if (!result.changed) {
        return result;  // the file already says what was asked
    }
    if (gate != nullptr && !gate(path)) {
        return result;  // not writable: left as it is, silently
    }
    result.saved = xml.Save(path);
    if (!result.saved) {
        result.status = PlatformXmlStatus::kSaveFailed;
    }
    return result;
}

PlatformXmlStatus TestPlatformXml(const wchar_t* path, const SiteXPaths& sites, bool* listed) {
    if (listed != nullptr) {
        *listed = false;
    }
    CPlatformXml xml;
    PlatformXmlStatus status = xml.Open(path, sites);
    if (status == PlatformXmlStatus::kOk && listed != nullptr) {
        ComPtr<IXMLDOMNode> feature;
        *listed = xml.FindFeature(&feature);
    }
    return status;
}
