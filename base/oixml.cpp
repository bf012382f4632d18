#include "base/oixml.h"

#include <cwchar>
#include <new>

namespace {

// Elements nested deeper than this are treated as malformed: the recursive
// parse would otherwise exhaust the stack on a hostile command line.
const int kMaxParseDepth = 256;
const int kCDataWindow = 30;

// Index of the last occurrence of sub that lies wholly inside text[0, end), or -1.
int LastIndexBefore(const wchar_t* text, int end, const wchar_t* sub, int subLength) {
    for (int i = end - subLength; i >= 0; --i) {
        if (wmemcmp(text + i, sub, subLength) == 0) {
            return i;
        }
    }
    return -1;
}

// Index of the first occurrence of sub at or after start that begins before end, or -1.
int FirstIndexFrom(const wchar_t* text, int length, int start, int end, const wchar_t* sub,
                   int subLength) {
    if (start < 0) {
        start = 0;
    }
    for (int i = start; i < end && i + subLength <= length; ++i) {
        if (wmemcmp(text + i, sub, subLength) == 0) {
            return i;
        }
    }
    return -1;
}

// Leading blanks, then leading '>', then leading blanks again; trailing
// blanks. Tabs and line breaks are kept.
void TrimElementValue(CStringEx& value) {
    value.TrimLeft(L' ');
    value.TrimLeft(L'>');
    value.TrimLeft(L' ');
    value.TrimRight(L' ');
}

CStringEx ElementXml(const CStringEx& name, const CStringEx& value, const CStringEx& children) {
    CStringEx xml(L"<");
    xml += name;
    xml += L'>';
    xml += value;
    xml += children;
    xml += L"</";
    xml += name;
    xml += L'>';
    return xml;
}

}  // namespace

CStringEx OIXmlEscape(const wchar_t* text) {
    CStringEx escaped(text);
    escaped.Replace(L"&", L"&amp;");
    escaped.Replace(L"<", L"&lt;");
    escaped.Replace(L">", L"&gt;");
    escaped.Replace(L"\"", L"&quot;");
    escaped.Replace(L"'", L"&apos;");
    return escaped;
}

CStringEx OIXmlUnescape(const wchar_t* text) {
    CStringEx plain(text);
    plain.Replace(L"&lt;", L"<");
    plain.Replace(L"&gt;", L">");
    plain.Replace(L"&quot;", L"\"");
    plain.Replace(L"&apos;", L"'");
    plain.Replace(L"&amp;", L"&");
    return plain;
}

void OIXmlStripCData(CStringEx& value) {
    int length = value.GetLength();
    int openAt = value.Find(L"<![CDATA[");
    int closeAt = value.ReverseFind(L"]]>");
    bool opensEarly = openAt >= 0 && openAt + 9 <= kCDataWindow;
    bool closesLate = closeAt >= 0 && closeAt >= length - kCDataWindow;
    if (!opensEarly || !closesLate) {
        return;
    }
    value.TrimLeft();
    value.TrimLeft(L"<![CDATA[");
    value.TrimRight();
    value.TrimRight(L"]]>");
}

COIXML::COIXML() = default;

COIXML::~COIXML() {
    DeleteChildren();
}

void COIXML::DeleteChildren() {
    for (int i = 0; i < m_childCount; ++i) {
        delete m_children[i];
    }
    delete[] m_children;
    m_children = nullptr;
    m_childCount = 0;
    m_childCapacity = 0;
}

bool COIXML::AppendChild(COIXML* child) {
    if (m_childCount == m_childCapacity) {
        int capacity = m_childCapacity == 0 ? 1 : m_childCapacity * 2;
        COIXML** larger = new (std::nothrow) COIXML*[capacity];
        if (larger == nullptr) {
            return false;
        }
        for (int i = 0; i < m_childCount; ++i) {
            larger[i] = m_children[i];
        }
        delete[] m_children;
        m_children = larger;
        m_childCapacity = capacity;
    }
    m_children[m_childCount++] = child;
    return true;
}

const COIXML* COIXML::GetChild(int index) const {
    return (index >= 0 && index < m_childCount) ? m_children[index] : nullptr;
}

const COIXML* COIXML::FindChild(const wchar_t* name) const {
    if (name == nullptr) {
        return nullptr;
    }
    for (int i = 0; i < m_childCount; ++i) {
        if (m_children[i]->m_name.Compare(name) == 0) {
            return m_children[i];
        }
    }
    return nullptr;
}

void COIXML::SetXML(const wchar_t* text) {
    DeleteChildren();
    if (text == nullptr) {
        m_name.Empty();
        m_value.Empty();
        m_xml.Empty();
        return;
    }
    CStringEx working(text);
    ParseNode(working, 0);
}

void COIXML::Rebuild() {
    CStringEx children;
    for (int i = 0; i < m_childCount; ++i) {
        m_children[i]->Rebuild();
        children += m_children[i]->m_xml;
    }
    m_xml = ElementXml(m_name, m_value, children);
}

void COIXML::GetXML(CStringEx& out) {
    Rebuild();
    out = m_xml;
}

void COIXML::GetName(CStringEx& out) const {
    out = m_name;
}

bool COIXML::SetName(const wchar_t* name) {
    m_name = name;
    Rebuild();
    return true;
}

bool COIXML::SetValue(const wchar_t* value) {
    m_value = OIXmlEscape(value);
    Rebuild();
    return true;
}

COIXML* COIXML::AddChild(const wchar_t* name, const wchar_t* value, bool rebuild) {
    COIXML* child = new (std::nothrow) COIXML();
    if (child == nullptr) {
        return nullptr;
    }
    child->SetName(name);
    child->SetValue(value);
    if (!AppendChild(child)) {
        delete child;
        return nullptr;
    }
    if (rebuild) {
        Rebuild();
    }
    return child;
}

int COIXML::GetChildValue(const wchar_t* name, CStringEx& out) const {
    const COIXML* child = FindChild(name);
    if (child == nullptr) {
        return 1;
    }
    out = OIXmlUnescape(child->m_value.c_str());
    OIXmlStripCData(out);
    return 0;
}

int COIXML::GetChildValue(const wchar_t* name, int& out) const {
    CStringEx text;
    int result = GetChildValue(name, text);
    if (result != 0) {
        return result;
    }
    if (text.IsEmpty()) {
        return 3;
    }
    out = _wtoi(text.c_str());
    return 0;
}

int COIXML::GetChildValue(const wchar_t* name, unsigned long& out) const {
    int number = 0;
    int result = GetChildValue(name, number);
    if (result == 0) {
        out = static_cast<unsigned long>(number);
    }
    return result;
}

int COIXML::ParseNode(CStringEx& text, int depth) {
    if (text.GetLength() < 2) {
        return -2;
    }
    if (depth > kMaxParseDepth) {
        return -1;
    }
    const wchar_t* buffer = text.c_str();
    int length = text.GetLength();

    // The last closing tag ends this element; its name runs to the next '>'.
    int closeAt = LastIndexBefore(buffer, length, L"</", 2);
    if (closeAt < 0) {
        return -1;
    }
    int nameStart = closeAt + 2;
    int nameEnd = FirstIndexFrom(buffer, length, nameStart, length, L">", 1);
    if (nameEnd < 0) {
        return -1;
    }
    m_name = CStringEx(buffer + nameStart, nameEnd - nameStart);
    int remainderStart = nameEnd + 1;

    CStringEx openTag(L"<");
    openTag += m_name;
    openTag += L'>';
    int openTagLength = openTag.GetLength();
    int openAt = LastIndexBefore(buffer, closeAt, openTag.c_str(), openTagLength);
    if (openAt < 0) {
        return -1;
    }
    int contentStart = openAt + openTagLength;
    bool hasChildren = FirstIndexFrom(buffer, length, contentStart, closeAt, L"</", 2) >= 0;

    if (!hasChildren) {
        m_value = CStringEx(buffer + contentStart, closeAt - contentStart);
        TrimElementValue(m_value);
        text.Delete(openAt, remainderStart - openAt);
        m_xml = ElementXml(m_name, m_value, CStringEx());
        return 0;
    }

    // Children are cut out of head from last to first.
    CStringEx head(buffer, closeAt);
    CStringEx remainder(buffer + remainderStart, length - remainderStart);
    for (;;) {
        if (FirstIndexFrom(head.c_str(), head.GetLength(), openAt, head.GetLength(), L"</", 2) <
            0) {
            break;
        }
        COIXML* child = new (std::nothrow) COIXML();
        if (child == nullptr) {
            break;
        }
        if (child->ParseNode(head, depth + 1) < 0 || !AppendChild(child)) {
            delete child;
            break;
        }
    }
    for (int i = 0, j = m_childCount - 1; i < j; ++i, --j) {
        COIXML* swap = m_children[i];
        m_children[i] = m_children[j];
        m_children[j] = swap;
    }

    m_value = head.Mid(contentStart);
    TrimElementValue(m_value);
    CStringEx children;
    for (int i = 0; i < m_childCount; ++i) {
        children += m_children[i]->m_xml;
    }
    m_xml = ElementXml(m_name, m_value, children);
    CStringEx rest = head.Left(openAt);
    rest += remainder;
    text = rest;
    return 1;
}
