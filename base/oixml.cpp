#include "base/oixml.h"

#include <cwchar>
#include <new>

namespace {

// Elements nested deeper than this are treated as malformed: the recursive
// parse would otherwise exhaust the stack on a hostile command line.
const int kMaxParseDepth = 256;
const int kCDataWindow = 30;

// Index of the last "</" that lies wholly inside text[0, end), or -1.
int LastClosingTag(const wchar_t* text, int end) {
    for (int i = end - 2; i >= 0; --i) {
        if (text[i] == L'<' && text[i + 1] == L'/') {
            return i;
        }
    }
    return -1;
}

// Index of the first "</" that begins in text[start, end) and lies wholly
// inside text[0, length), or -1.
int FirstClosingTag(const wchar_t* text, int length, int start, int end) {
    if (end > length - 1) {
        end = length - 1;
    }
    for (int i = start < 0 ? 0 : start; i < end; ++i) {
        if (text[i] == L'<' && text[i + 1] == L'/') {
            return i;
        }
    }
    return -1;
}

// Index of the first ch in text[start, end), or -1.
int FirstChar(const wchar_t* text, int start, int end, wchar_t ch) {
    for (int i = start; i < end; ++i) {
        if (text[i] == ch) {
            return i;
        }
    }
    return -1;
}

// Index of the last opening tag "<" name ">" that lies wholly inside
// text[0, end), or -1.
int LastOpeningTag(const wchar_t* text, int end, const wchar_t* name, int nameLength) {
    for (int i = end - (nameLength + 2); i >= 0; --i) {
        if (text[i] == L'<' && text[i + nameLength + 1] == L'>' &&
            wmemcmp(text + i + 1, name, nameLength) == 0) {
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

// Concatenation of texts in one allocation.
CStringEx Concatenate(const wchar_t* const* parts, const int* lengths, int count) {
    long long total = 0;
    for (int i = 0; i < count; ++i) {
        total += lengths[i];
    }
    CStringEx joined;
    if (total == 0 || total > 0x7FFFFFFE) {
        return joined;
    }
    // GetBuffer of an empty string with room for total characters gives a
    // zeroed buffer of total + 1.
    wchar_t* out = joined.GetBuffer(total < 2 ? 2 : static_cast<int>(total));
    if (out == nullptr) {
        return joined;
    }
    for (int i = 0; i < count; ++i) {
        wmemcpy(out, parts[i], lengths[i]);
        out += lengths[i];
    }
    joined.ReleaseBuffer(-1);
    return joined;
}

// "<" name ">" value children "</" name ">"
CStringEx ElementXml(const CStringEx& name, const CStringEx& value, const CStringEx& children) {
    const wchar_t* parts[] = {L"<",  name.c_str(), L">", value.c_str(), children.c_str(),
                              L"</", name.c_str(), L">"};
    int nameLength = name.GetLength();
    const int lengths[] = {1, nameLength, 1, value.GetLength(), children.GetLength(),
                           2, nameLength, 1};
    return Concatenate(parts, lengths, 8);
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

// The text a parse works on: the characters [0, length) of a buffer that is
// shortened in place as elements are cut out of it. An element's children
// work on the prefix before its closing tag, in the same buffer.
struct COIXML::ParseText {
    wchar_t* data;
    int length;
    // The lowest index any cut has changed, so a parent knows whether the
    // closing tag it found before is still where it was.
    int lowestCut;
    // No "</" begins at this index or later: what follows a cut is the
    // remainder behind the last "</", so the next search for the last "</"
    // need not read it again.
    int closeSearchEnd;

    // Cuts out [from, to), the element just read; text[to, length) is its
    // remainder.
    void Cut(int from, int to) {
        wmemmove(data + from, data + to, static_cast<size_t>(length - to));
        length -= to - from;
        if (from < lowestCut) {
            lowestCut = from;
        }
        closeSearchEnd = from + 1;
    }
};

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
    // The parse cuts the elements it reads out of a working copy, in place.
    CStringEx working(text);
    int length = working.GetLength();
    wchar_t* data = working.GetBuffer(-1);
    if (data == nullptr) {
        return;  // empty: nothing to read
    }
    ParseText parseText{data, length, length, length};
    ParseNode(parseText, 0);
    working.ReleaseBuffer(-1);
}

CStringEx COIXML::JoinChildXml() const {
    if (m_childCount == 0) {
        return CStringEx();
    }
    const wchar_t** parts = new (std::nothrow) const wchar_t*[m_childCount];
    int* lengths = new (std::nothrow) int[m_childCount];
    CStringEx joined;
    if (parts != nullptr && lengths != nullptr) {
        for (int i = 0; i < m_childCount; ++i) {
            parts[i] = m_children[i]->m_xml.c_str();
            lengths[i] = m_children[i]->m_xml.GetLength();
        }
        joined = Concatenate(parts, lengths, m_childCount);
    }
    delete[] parts;
    delete[] lengths;
    return joined;
}

void COIXML::Rebuild() {
    for (int i = 0; i < m_childCount; ++i) {
        m_children[i]->Rebuild();
    }
    m_xml = ElementXml(m_name, m_value, JoinChildXml());
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

// The serialised form is not formatted here: GetXML rebuilds it from name,
// value and children, and formatting it on every level would copy the whole
// subtree once per level of nesting.
int COIXML::ParseNode(ParseText& text, int depth) {
    if (text.length < 2) {
        return -2;
    }
    if (depth > kMaxParseDepth) {
        return -1;
    }
    wchar_t* data = text.data;
    int length = text.length;

    // The last closing tag ends this element; its name runs to the next '>'.
    int closeAt = LastClosingTag(data, text.closeSearchEnd < length ? text.closeSearchEnd : length);
    if (closeAt < 0) {
        return -1;
    }
    int nameStart = closeAt + 2;
    int nameEnd = FirstChar(data, nameStart, length, L'>');
    if (nameEnd < 0) {
        return -1;
    }
    int nameLength = nameEnd - nameStart;
    m_name = CStringEx(data + nameStart, nameLength);
    int remainderStart = nameEnd + 1;

    int openAt = LastOpeningTag(data, closeAt, data + nameStart, nameLength);
    if (openAt < 0) {
        return -1;
    }
    int contentStart = openAt + nameLength + 2;
    bool hasChildren = FirstClosingTag(data, length, contentStart, closeAt) >= 0;

    if (!hasChildren) {
        m_value = CStringEx(data + contentStart, closeAt - contentStart);
        TrimElementValue(m_value);
        text.Cut(openAt, remainderStart);
        return 0;
    }

    // Children are cut out of head (the text before the closing tag) from
    // last to first. The remainder after the closing tag stays untouched
    // meanwhile, since the children change only head.
    ParseText head{data, closeAt, closeAt, closeAt};
    int firstClose = FirstClosingTag(data, head.length, openAt, head.length);
    while (firstClose >= 0) {
        COIXML* child = new (std::nothrow) COIXML();
        if (child == nullptr) {
            break;
        }
        int lowestBefore = head.lowestCut;
        head.lowestCut = head.length;
        int result = child->ParseNode(head, depth + 1);
        int lowestCut = head.lowestCut;
        head.lowestCut = lowestCut < lowestBefore ? lowestCut : lowestBefore;
        if (result < 0 || !AppendChild(child)) {
            delete child;
            break;
        }
        // A cut wholly behind the first "</" leaves it in place.
        if (lowestCut < firstClose + 2 || firstClose + 2 > head.length) {
            firstClose = FirstClosingTag(data, head.length, openAt, head.length);
        }
    }
    for (int i = 0, j = m_childCount - 1; i < j; ++i, --j) {
        COIXML* swap = m_children[i];
        m_children[i] = m_children[j];
        m_children[j] = swap;
    }

    m_value = contentStart < head.length
                  ? CStringEx(data + contentStart, head.length - contentStart)
                  : CStringEx();
    TrimElementValue(m_value);

    // The text becomes head up to the opening tag, then the remainder.
    int keep = openAt < head.length ? openAt : head.length;
    if (head.lowestCut < text.lowestCut) {
        text.lowestCut = head.lowestCut;
    }
    text.Cut(keep, remainderStart);
    return 1;
}
