// COIXML: a light, string-based XML element tree (no attributes, namespaces
// or DOM). It parses the Action command line and builds the small XML texts
// the program sends. Parsing is plain text search on each element's own tags;
// the rules are part of the format the command-line producers rely on.
#pragma once

#include "base/string_ex.h"

class COIXML {
public:
    COIXML();
    virtual ~COIXML();
    COIXML(const COIXML&) = delete;
    COIXML& operator=(const COIXML&) = delete;

    // Deletes all children; a null text also empties name, value and xml,
    // otherwise parses text into this element.
    void SetXML(const wchar_t* text);
    // The element serialised, rebuilt through its children.
    void GetXML(CStringEx& out);
    void GetName(CStringEx& out) const;
    bool SetName(const wchar_t* name);
    // Stores value escaped (null counts as empty).
    bool SetValue(const wchar_t* value);
    // Appends a child (owned by this element); null when out of memory.
    COIXML* AddChild(const wchar_t* name, const wchar_t* value, bool rebuild);

    // First direct child named exactly `name`: 0 found (out = its value,
    // unescaped, CDATA wrapper removed), 1 no such child (out untouched).
    int GetChildValue(const wchar_t* name, CStringEx& out) const;
    // As above, the value read with _wtoi; 3 when the value is empty (out
    // untouched).
    int GetChildValue(const wchar_t* name, int& out) const;
    int GetChildValue(const wchar_t* name, unsigned long& out) const;

    int GetChildCount() const { return m_childCount; }
    const COIXML* GetChild(int index) const;

private:
    struct ParseText;

    // Reads the last element of `text` into this element and cuts it out of
    // `text`: -2 too short, -1 malformed, 0 leaf, 1 element with children.
    int ParseNode(ParseText& text, int depth);
    // The serialised children, concatenated in one allocation.
    CStringEx JoinChildXml() const;
    void Rebuild();
    void DeleteChildren();
    bool AppendChild(COIXML* child);
    const COIXML* FindChild(const wchar_t* name) const;

    CStringEx m_xml;    // the serialised element as of the last Rebuild
    CStringEx m_value;  // escaped, as it stands in XML
    CStringEx m_name;
    COIXML** m_children = nullptr;
    int m_childCount = 0;
    int m_childCapacity = 0;
};

// XML escaping of the five predefined entities, "&" first.
CStringEx OIXmlEscape(const wchar_t* text);
// The reverse, "&amp;" last; no other entity is recognised.
CStringEx OIXmlUnescape(const wchar_t* text);
// Removes a CDATA wrapper when "<![CDATA[" stands in the first 30 and "]]>"
// in the last 30 characters.
void OIXmlStripCData(CStringEx& value);
