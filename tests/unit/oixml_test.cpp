// COIXML: the text-search rules that build the element tree (they are part of
// the command-line format), escaping, CDATA removal, number reading,
// serialisation, and hostile input of command-line length.
#include <gtest/gtest.h>

#include <string>

#include "base/oixml.h"
#include "base/string_ex.h"

namespace {

std::wstring Xml(COIXML& node) {
    CStringEx out;
    node.GetXML(out);
    return out.c_str();
}

std::wstring Name(const COIXML& node) {
    CStringEx out;
    node.GetName(out);
    return out.c_str();
}

// The child's value as read by GetChildValue, or "<missing>".
std::wstring Value(const COIXML& node, const wchar_t* name) {
    CStringEx out;
    return node.GetChildValue(name, out) == 0 ? out.c_str() : L"<missing>";
}

std::wstring ChildNames(const COIXML& node) {
    std::wstring names;
    for (int i = 0; i < node.GetChildCount(); ++i) {
        names += (i ? L"," : L"") + Name(*node.GetChild(i));
    }
    return names;
}

std::wstring Repeat(const std::wstring& piece, int times) {
    std::wstring text;
    for (int i = 0; i < times; ++i) {
        text += piece;
    }
    return text;
}

// "<d{first}>...<d{last}>inner</d{last}>...</d{first}>"
std::wstring DistinctNesting(int first, int last, const std::wstring& inner) {
    std::wstring open;
    std::wstring close;
    for (int i = first; i <= last; ++i) {
        open += L"<d" + std::to_wstring(i) + L">";
        close.insert(0, L"</d" + std::to_wstring(i) + L">");
    }
    return open + inner + close;
}

// Levels below `node`, following first children.
int Depth(const COIXML& node) {
    return node.GetChildCount() == 0 ? 0 : 1 + Depth(*node.GetChild(0));
}

}  // namespace

TEST(OIXmlParse, BuildsTheTreeByTextSearch) {
    const std::wstring longValue(32767 - 14, L'v');  // the longest command line
    const struct {
        std::wstring text;
        const wchar_t* name;
        std::wstring children;
        std::wstring xml;  // empty: the text itself
    } cases[] = {
        // Text around the root is ignored; the last "</" names the root.
        {L"<?xml version=\"1.0\"?><!-- c --><r><a>1</a></r>\r\ntrailing", L"r", L"a",
         L"<r><a>1</a></r>"},
        {L"<r>x</r> trailing </y>", L"y", L"", L"<y>v</y>"},
        {L"<r><a b>1</a b></r>", L"r", L"a b", L""},
        // A leaf loses blanks, then '>' characters, then blanks.
        {L"<a> > x > </a>", L"a", L"", L"<a>x ></a>"},
        {L"<CmdLine><A>1</A><B><C>2</C><D>3</D></B><E>4</E></CmdLine>", L"CmdLine", L"A,B,E", L""},
        // The text between and after children is the parent's value, written before
        // them; blanks are dropped, line breaks and tabs stay.
        {L"<r> <a>1</a> <b>2</b> </r>", L"r", L"a,b", L"<r><a>1</a><b>2</b></r>"},
        {L"<r>\r\n\t<a>1</a>\r\n\t<b>2</b>\r\n</r>", L"r", L"a,b",
         L"<r>\r\n\t\r\n\t\r\n<a>1</a><b>2</b></r>"},
        {L"<r>pre<a>1</a>mid<b>2</b>post</r>", L"r", L"a,b", L"<r>premidpost<a>1</a><b>2</b></r>"},
        // A child with an attribute fails and ends the reading of the children
        // before it, which stay in the parent's text; a root with one is not read.
        {L"<r><a>1</a><b x=\"1\">2</b></r>", L"r", L"", L""},
        {L"<r><b x=\"1\">2</b><a>1</a></r>", L"r", L"a", L""},
        {L"<r id=\"7\"><a>1</a></r>", L"r", L"", L"<r>v</r>"},
        // Same-name elements pair the last opening tag with the last closing tag.
        {L"<a><a>x</a></a>", L"a", L"a", L""},
        {L"<a>1<a>2</a>3</a>", L"a", L"a", L"<a><a>2</a></a>"},
        {L"<r><a><a>x</a></a></r>", L"r", L"a", L"<r><a><a><a>x</a></a></r>"},
        // Stray angle brackets.
        {L"<r><a>1<</a>></r>", L"r", L"a", L"<r><a>1<</a></r>"},
        {L"<r><a>x > y < z</a></r><", L"r", L"a", L"<r><a>x > y < z</a></r>"},
        // Too short or malformed: the parse keeps what it reached.
        {L"", L"n", L"", L"<n>v</n>"},
        {L"x", L"n", L"", L"<n>v</n>"},
        {L"no closing tag", L"n", L"", L"<n>v</n>"},
        {L"<a>y</a", L"n", L"", L"<n>v</n>"},
        {L"<a x='1'>y</a>", L"a", L"", L"<a>v</a>"},
        // Long texts and unbalanced tags.
        {L"<r><v>" + longValue + L"</v></r>", L"r", L"v", L""},
        {Repeat(L"<a>", 5000) + L"</a>", L"a", L"", L"<a></a>"},
        {Repeat(L"</a>", 5000), L"a", L"", L"<a>v</a>"},
        {L"<r>" + Repeat(L"<a><b></a>", 2000) + L"</r>", L"r", Repeat(L"a,", 1999) + L"a", L""},
        // Surrogate pairs and lone surrogates pass unchanged.
        {L"<r><\x540d>\x5024 \xd83d\xde00</\x540d><e\xd83d\xde00>\xdbff\xdfff</e\xd83d\xde00>"
         L"<u>\xd800x\xdc00</u></r>",
         L"r", L"\x540d,e\xd83d\xde00,u", L""},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text.substr(0, 80));
        COIXML root;  // what a parse replaces or keeps
        root.SetName(L"n");
        root.SetValue(L"v");
        root.AddChild(L"c", L"1", true);
        root.SetXML(c.text.c_str());
        EXPECT_EQ(c.name, Name(root));
        EXPECT_EQ(c.children, ChildNames(root));
        EXPECT_EQ(c.xml.empty() ? c.text : c.xml, Xml(root));
    }
}

TEST(OIXmlChildValue, FirstDirectChildWithTheExactNameAsTextOrNumber) {
    COIXML root;
    root.SetXML(
        L"<r><a>1</a><A>2</A><a>3</a><x><b>4</b></x><c>\t z \r\n</c><d> >> w\t </d><e> p > q </e>"
        L"<n>12abc</n><neg>-5</neg><plus>+7</plus>"
        L"<tab>\t42</tab><text>abc</text><empty></empty><blank>   </blank>"
        L"<cdata><![CDATA[15]]></cdata><nocdata><![CDATA[]]></nocdata><hex>0x10</hex></r>");
    EXPECT_EQ(L"1", Value(root, L"a"));
    EXPECT_EQ(L"2", Value(root, L"A"));
    EXPECT_EQ(L"<missing>", Value(root, L"b"));  // only direct children
    EXPECT_EQ(L"<missing>", Value(root, L"r"));
    // A leaf's value keeps tabs and line breaks at its ends.
    EXPECT_EQ(L"\t z \r\n", Value(root, L"c"));
    EXPECT_EQ(L"w\t", Value(root, L"d"));
    EXPECT_EQ(L"p > q", Value(root, L"e"));
    CStringEx out(L"untouched");
    EXPECT_EQ(1, root.GetChildValue(L"nope", out));
    EXPECT_EQ(1, root.GetChildValue(static_cast<const wchar_t*>(nullptr), out));
    EXPECT_STREQ(L"untouched", out.c_str());

    const struct {
        const wchar_t* name;
        int result;
        int value;
    } cases[] = {
        {L"n", 0, 12},       {L"neg", 0, -5},   {L"plus", 0, 7},     {L"tab", 0, 42},
        {L"text", 0, 0},     {L"empty", 3, 99}, {L"blank", 3, 99},   {L"cdata", 0, 15},
        {L"nocdata", 3, 99}, {L"hex", 0, 0},    {L"missing", 1, 99},
    };
    for (const auto& c : cases) {
        int value = 99;
        EXPECT_EQ(c.result, root.GetChildValue(c.name, value)) << c.name;
        EXPECT_EQ(c.value, value) << c.name;
    }
    unsigned long flags = 5;
    EXPECT_EQ(3, root.GetChildValue(L"empty", flags));
    EXPECT_EQ(0, root.GetChildValue(L"neg", flags));
    EXPECT_EQ(0xFFFFFFFBul, flags);
}

TEST(OIXmlEscaping, AmpersandIsEscapedFirstAndUnescapedLast) {
    COIXML node;
    node.SetName(L"n");
    node.SetValue(L"a&b<c>\"d'e");
    EXPECT_EQ(L"<n>a&amp;b&lt;c&gt;&quot;d&apos;e</n>", Xml(node));
    node.SetValue(L"&lt;");
    EXPECT_EQ(L"<n>&amp;lt;</n>", Xml(node));
    node.SetValue(nullptr);
    EXPECT_EQ(L"<n></n>", Xml(node));

    COIXML root;
    root.SetXML(
        L"<r><a>&amp;lt;</a><b>&amp;amp;</b><c>&lt;&gt;&quot;&apos;&amp;</c>"
        L"<d>&#60;&nbsp;&AMP;&lt</d></r>");
    EXPECT_EQ(L"&lt;", Value(root, L"a"));  // the entity's text, not the character
    EXPECT_EQ(L"&amp;", Value(root, L"b"));
    EXPECT_EQ(L"<>\"'&", Value(root, L"c"));
    EXPECT_EQ(L"&#60;&nbsp;&AMP;&lt", Value(root, L"d"));  // nothing else is known

    // What is set is read back, also after a trip through the serialised form.
    for (const wchar_t* text : {L"a&b", L"&amp;lt; <tag attr=\"v\"> it's & done", L"&&&&"}) {
        COIXML built;
        built.SetName(L"r");
        built.AddChild(L"v", text, true);
        EXPECT_EQ(text, Value(built, L"v"));
        COIXML again;
        again.SetXML(Xml(built).c_str());
        EXPECT_EQ(text, Value(again, L"v"));
    }
}

TEST(OIXmlCData, TheWrapperIsRemovedWhenItsMarkersStandInTheThirtyCharacterWindows) {
    const std::wstring section = L"<![CDATA[x]]>";
    const struct {
        std::wstring value;
        std::wstring expected;
    } cases[] = {
        {L"<![CDATA[a<b & c]]>", L"a<b & c"},
        {L"\r\n\t<![CDATA[ x ]]>\r\n", L" x "},  // blanks inside the section stay
        {L"&lt;![CDATA[y]]&gt;", L"y"},          // unescaped first, then unwrapped
        {L"<![CDATA[<![CDATA[z]]>]]>", L"z"},
        {L"<![CDATA[open", L"<![CDATA[open"},
        {L"ab" + section, L"ab<![CDATA[x"},         // text before the marker stays
        {std::wstring(21, L'\t') + section, L"x"},  // the marker ends at the 30th character
        {std::wstring(22, L'\t') + section, std::wstring(22, L'\t') + section},
        {section + std::wstring(27, L'\t'), L"x"},  // "]]>" starts 30 from the end
        {section + std::wstring(28, L'\t'), section + std::wstring(28, L'\t')},
        {L"<![CDATA[" + std::wstring(30000, L'v') + L"]]>", std::wstring(30000, L'v')},
    };
    for (const auto& c : cases) {
        COIXML root;
        root.SetXML((L"<r><v>" + c.value + L"</v></r>").c_str());
        EXPECT_EQ(c.expected, Value(root, L"v")) << c.value.size();
    }
}

TEST(OIXmlBuild, GetXmlRebuildsThroughTheChildrenUntilANullTextEmptiesAll) {
    COIXML root;
    root.SetName(L"Feedback");
    EXPECT_NE(nullptr, root.AddChild(L"Text", L"a<b", true));
    COIXML* info = root.AddChild(L"Info", nullptr, false);
    ASSERT_NE(nullptr, info);
    info->AddChild(L"Inner", L"x", false);  // no rebuild asked: GetXML does it
    info->AddChild(L"Empty", L"", false);
    root.SetValue(L"v");  // the own value stands before the children
    EXPECT_EQ(
        L"<Feedback>v<Text>a&lt;b</Text><Info><Inner>x</Inner><Empty></Empty></Info></Feedback>",
        Xml(root));

    root.SetXML(nullptr);  // empties the element
    EXPECT_EQ(0, root.GetChildCount());
    EXPECT_EQ(L"<></>", Xml(root));
}

TEST(OIXmlRobustness, NestingBeyond256LevelsIsKeptAsTextAtTheLimit) {
    // The root and up to 256 levels below it are elements.
    for (int last : {256, 5000}) {
        std::wstring text = DistinctNesting(0, last, L"x");
        COIXML root;
        root.SetXML(text.c_str());
        EXPECT_EQ(256, Depth(root)) << last;
        const COIXML* parent = &root;
        while (Depth(*parent) > 1) {
            parent = parent->GetChild(0);
        }
        EXPECT_EQ(L"d256", ChildNames(*parent));
        EXPECT_EQ(last == 256 ? L"x" : DistinctNesting(257, last, L"x"), Value(*parent, L"d256"));
        EXPECT_EQ(text, Xml(root));  // nothing is lost
    }
    COIXML same;
    same.SetXML((Repeat(L"<a>", 5000) + L"x" + Repeat(L"</a>", 5000)).c_str());
    EXPECT_EQ(256, Depth(same));
}

TEST(OIXmlRobustness, TextsOfOneRepeatedPieceGiveNoElement) {
    for (const wchar_t* piece : {L"</", L">", L"<", L"</>", L"<></>", L"<a>", L"/>"}) {
        COIXML root;
        root.SetXML(Repeat(piece, static_cast<int>(32767 / wcslen(piece))).c_str());
        EXPECT_EQ(0, root.GetChildCount()) << piece;
        EXPECT_EQ(L"<></>", Xml(root)) << piece;
    }
}
