// COIXML: the text-search rules that build the element tree (they are part of
// the command-line format), escaping, CDATA removal, number reading,
// serialisation, and hostile input of command-line length.
#include <gtest/gtest.h>

#include <string>

#include "base/oixml.h"
#include "base/string_ex.h"

namespace {

std::wstring Text(const CStringEx& s) {
    return s.c_str();
}

std::wstring Xml(COIXML& node) {
    CStringEx out;
    node.GetXML(out);
    return Text(out);
}

std::wstring Name(const COIXML& node) {
    CStringEx out;
    node.GetName(out);
    return Text(out);
}

// The child's value as read by GetChildValue, or "<missing>".
std::wstring Value(const COIXML& node, const wchar_t* name) {
    CStringEx out;
    if (node.GetChildValue(name, out) != 0) {
        return L"<missing>";
    }
    return Text(out);
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

// Levels below `node` when always following the first child.
int ChainDepth(const COIXML& node) {
    int depth = 0;
    for (const COIXML* at = &node; at->GetChildCount() > 0; at = at->GetChild(0)) {
        ++depth;
    }
    return depth;
}

const COIXML* Deepest(const COIXML& node) {
    const COIXML* at = &node;
    while (at->GetChildCount() > 0) {
        at = at->GetChild(0);
    }
    return at;
}

const COIXML* ParentOfDeepest(const COIXML& node) {
    const COIXML* parent = &node;
    while (parent->GetChildCount() > 0 && parent->GetChild(0)->GetChildCount() > 0) {
        parent = parent->GetChild(0);
    }
    return parent;
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

}  // namespace

// ---- building the tree ----

TEST(OIXmlParse, LeafElement) {
    COIXML root;
    root.SetXML(L"<a>x</a>");
    EXPECT_EQ(L"a", Name(root));
    EXPECT_EQ(0, root.GetChildCount());
    EXPECT_EQ(L"<a>x</a>", Xml(root));
}

TEST(OIXmlParse, TextAroundTheRootIsIgnored) {
    COIXML root;
    root.SetXML(L"<?xml version=\"1.0\"?><!-- sent by the add-in --><r><a>1</a></r>\r\ntrailing");
    EXPECT_EQ(L"r", Name(root));
    EXPECT_EQ(L"<r><a>1</a></r>", Xml(root));
}

TEST(OIXmlParse, TheLastClosingTagNamesTheRoot) {
    // A closing tag in the trailing text wins, and its opening tag is missing.
    COIXML root;
    root.SetXML(L"<r>x</r> trailing </y>");
    EXPECT_EQ(L"y", Name(root));
    EXPECT_EQ(L"<y></y>", Xml(root));

    // The name runs from "</" to the next '>', blanks included.
    COIXML spaced;
    spaced.SetXML(L"<r><a b>1</a b></r>");
    EXPECT_EQ(L"a b", ChildNames(spaced));
    EXPECT_EQ(L"1", Value(spaced, L"a b"));
}

TEST(OIXmlParse, LeafValuesLoseBlanksThenGreaterThanSignsThenBlanks) {
    COIXML root;
    root.SetXML(
        L"<r><a>  x  </a><b> >> y </b><c>\t z \r\n</c><d>w\t </d><e> p > q </e><f>>></f></r>");
    EXPECT_EQ(L"a,b,c,d,e,f", ChildNames(root));
    EXPECT_EQ(L"x", Value(root, L"a"));
    EXPECT_EQ(L"y", Value(root, L"b"));
    EXPECT_EQ(L"\t z \r\n", Value(root, L"c"));  // tabs and line breaks stay
    EXPECT_EQ(L"w\t", Value(root, L"d"));
    EXPECT_EQ(L"p > q", Value(root, L"e"));
    EXPECT_EQ(L"", Value(root, L"f"));

    COIXML leaf;
    leaf.SetXML(L"<a> > x > </a>");
    EXPECT_EQ(L"<a>x ></a>", Xml(leaf));
}

TEST(OIXmlParse, ChildrenStandInDocumentOrder) {
    COIXML root;
    const wchar_t* text = L"<CmdLine><A>1</A><B><C>2</C><D>3</D></B><E>4</E></CmdLine>";
    root.SetXML(text);
    EXPECT_EQ(L"CmdLine", Name(root));
    EXPECT_EQ(L"A,B,E", ChildNames(root));
    EXPECT_EQ(L"C,D", ChildNames(*root.GetChild(1)));
    EXPECT_EQ(L"1", Value(root, L"A"));
    EXPECT_EQ(L"4", Value(root, L"E"));
    EXPECT_EQ(L"3", Value(*root.GetChild(1), L"D"));
    EXPECT_EQ(text, Xml(root));
}

TEST(OIXmlParse, BlanksBetweenChildrenAreDroppedLineBreaksAndTabsStay) {
    COIXML spaces;
    spaces.SetXML(L"<r> <a>1</a> <b>2</b> </r>");
    EXPECT_EQ(L"<r><a>1</a><b>2</b></r>", Xml(spaces));

    // The parent's own text is written before its first child.
    COIXML lines;
    lines.SetXML(L"<r>\r\n\t<a>1</a>\r\n\t<b>2</b>\r\n</r>");
    EXPECT_EQ(L"a,b", ChildNames(lines));
    EXPECT_EQ(L"<r>\r\n\t\r\n\t\r\n<a>1</a><b>2</b></r>", Xml(lines));
}

TEST(OIXmlParse, TextBetweenChildrenBecomesTheParentsValue) {
    COIXML root;
    root.SetXML(L"<r>pre<a>1</a>mid<b>2</b>post</r>");
    EXPECT_EQ(L"a,b", ChildNames(root));
    EXPECT_EQ(L"<r>premidpost<a>1</a><b>2</b></r>", Xml(root));

    COIXML outer;
    outer.SetXML(L"<o><r>pre<a>1</a>post</r></o>");
    EXPECT_EQ(L"prepost", Value(outer, L"r"));
}

TEST(OIXmlParse, AnOpeningTagWithAttributesIsNotRecognised) {
    // The child fails, and with it the reading of the children before it.
    COIXML last;
    last.SetXML(L"<r><a>1</a><b x=\"1\">2</b></r>");
    EXPECT_EQ(0, last.GetChildCount());
    EXPECT_EQ(L"<missing>", Value(last, L"a"));
    EXPECT_EQ(L"<r><a>1</a><b x=\"1\">2</b></r>", Xml(last));  // kept as the root's text

    // Children after it in the document are read first and stay.
    COIXML first;
    first.SetXML(L"<r><b x=\"1\">2</b><a>1</a></r>");
    EXPECT_EQ(L"a", ChildNames(first));
    EXPECT_EQ(L"<r><b x=\"1\">2</b><a>1</a></r>", Xml(first));

    COIXML root;
    root.SetXML(L"<r id=\"7\"><a>1</a></r>");
    EXPECT_EQ(L"r", Name(root));
    EXPECT_EQ(0, root.GetChildCount());
    EXPECT_EQ(L"<r></r>", Xml(root));

    COIXML blank;
    blank.SetXML(L"<r ><a>1</a></r>");
    EXPECT_EQ(0, blank.GetChildCount());
}

TEST(OIXmlParse, NestedElementsOfOneNameArePairedByPosition) {
    COIXML plain;
    plain.SetXML(L"<a><a>x</a></a>");
    EXPECT_EQ(L"a", ChildNames(plain));
    EXPECT_EQ(L"x", Value(plain, L"a"));
    EXPECT_EQ(L"<a><a>x</a></a>", Xml(plain));

    // The last opening tag goes with the last closing tag: the outer element's
    // text around its namesake child is not its own.
    COIXML texts;
    texts.SetXML(L"<a>1<a>2</a>3</a>");
    EXPECT_EQ(L"<a><a>2</a></a>", Xml(texts));

    // Inside a parent, the outer opening tag is left over in the parent's text.
    COIXML parent;
    parent.SetXML(L"<r><a><a>x</a></a></r>");
    EXPECT_EQ(L"a", ChildNames(parent));
    EXPECT_EQ(L"", Value(parent, L"a"));
    EXPECT_EQ(L"x", Value(*parent.GetChild(0), L"a"));
    EXPECT_EQ(L"<r><a><a><a>x</a></a></r>", Xml(parent));
}

TEST(OIXmlParse, SetXmlOfTooShortTextOnlyRemovesTheChildren) {
    for (const wchar_t* shortText : {L"", L"<", L"x"}) {
        COIXML node;
        node.SetName(L"n");
        node.SetValue(L"v");
        node.AddChild(L"c", L"1", true);
        node.SetXML(shortText);
        EXPECT_EQ(L"n", Name(node));
        EXPECT_EQ(0, node.GetChildCount());
        EXPECT_EQ(L"<n>v</n>", Xml(node));
    }
}

TEST(OIXmlParse, SetXmlOfNullEmptiesTheElement) {
    COIXML node;
    node.SetXML(L"<n><c>1</c>v</n>");
    node.SetXML(nullptr);
    EXPECT_EQ(L"", Name(node));
    EXPECT_EQ(0, node.GetChildCount());
    EXPECT_EQ(L"<></>", Xml(node));
}

TEST(OIXmlParse, MalformedTextKeepsWhatTheParseReached) {
    COIXML node;
    node.SetName(L"old");
    node.SetValue(L"v");
    node.SetXML(L"no closing tag");  // nothing read
    EXPECT_EQ(L"<old>v</old>", Xml(node));
    node.SetXML(L"<a>y</a");  // a closing tag without '>'
    EXPECT_EQ(L"<old>v</old>", Xml(node));
    node.SetXML(L"<a x='1'>y</a>");  // the name is read, the value is not
    EXPECT_EQ(L"a", Name(node));
    EXPECT_EQ(L"<a>v</a>", Xml(node));

    node.SetXML(L"<b><c>2</c></b>");  // the same object parses again
    EXPECT_EQ(L"<b><c>2</c></b>", Xml(node));
}

// ---- reading children ----

TEST(OIXmlChildValue, FirstDirectChildWithTheExactName) {
    COIXML root;
    root.SetXML(L"<r><a>1</a><A>2</A><a>3</a><x><b>4</b></x></r>");
    EXPECT_EQ(L"1", Value(root, L"a"));
    EXPECT_EQ(L"2", Value(root, L"A"));
    EXPECT_EQ(L"<missing>", Value(root, L"b"));  // only direct children
    EXPECT_EQ(L"<missing>", Value(root, L"r"));
    EXPECT_EQ(L"<missing>", Value(root, L""));

    CStringEx out(L"untouched");
    EXPECT_EQ(1, root.GetChildValue(L"nope", out));
    EXPECT_EQ(1, root.GetChildValue(static_cast<const wchar_t*>(nullptr), out));
    EXPECT_EQ(L"untouched", Text(out));
    EXPECT_EQ(0, root.GetChildValue(L"a", out));
    EXPECT_EQ(L"1", Text(out));
}

TEST(OIXmlChildValue, NumbersAreReadWithWtoi) {
    COIXML root;
    root.SetXML(
        L"<r><n>12abc</n><neg>-5</neg><plus>+7</plus><tab>\t42</tab><text>abc</text>"
        L"<empty></empty><blank>   </blank><cdata><![CDATA[15]]></cdata>"
        L"<nocdata><![CDATA[]]></nocdata><hex>0x10</hex></r>");
    struct Case {
        const wchar_t* name;
        int result;
        int value;
    };
    const Case cases[] = {
        {L"n", 0, 12},       {L"neg", 0, -5},   {L"plus", 0, 7},     {L"tab", 0, 42},
        {L"text", 0, 0},     {L"empty", 3, 99}, {L"blank", 3, 99},   {L"cdata", 0, 15},
        {L"nocdata", 3, 99}, {L"hex", 0, 0},    {L"missing", 1, 99},
    };
    for (const Case& c : cases) {
        int value = 99;
        EXPECT_EQ(c.result, root.GetChildValue(c.name, value)) << c.name;
        EXPECT_EQ(c.value, value) << c.name;
    }

    unsigned long flags = 5;
    root.SetXML(L"<r><u>-1</u><e></e></r>");
    EXPECT_EQ(0, root.GetChildValue(L"u", flags));
    EXPECT_EQ(0xFFFFFFFFul, flags);
    flags = 5;
    EXPECT_EQ(3, root.GetChildValue(L"e", flags));
    EXPECT_EQ(1, root.GetChildValue(L"x", flags));
    EXPECT_EQ(5ul, flags);
}

// ---- escaping ----

TEST(OIXmlEscaping, SetValueEscapesAmpersandFirst) {
    COIXML node;
    node.SetName(L"n");
    node.SetValue(L"a&b<c>\"d'e");
    EXPECT_EQ(L"<n>a&amp;b&lt;c&gt;&quot;d&apos;e</n>", Xml(node));
    node.SetValue(L"&lt;");
    EXPECT_EQ(L"<n>&amp;lt;</n>", Xml(node));
    node.SetValue(L"<");
    EXPECT_EQ(L"<n>&lt;</n>", Xml(node));  // the entity is not escaped again
    node.SetValue(nullptr);
    EXPECT_EQ(L"<n></n>", Xml(node));

    EXPECT_EQ(L"&amp;amp;&quot;&quot;", Text(OIXmlEscape(L"&amp;\"\"")));
    EXPECT_EQ(L"", Text(OIXmlEscape(nullptr)));
}

TEST(OIXmlEscaping, ReadingUnescapesAmpersandLast) {
    COIXML root;
    root.SetXML(
        L"<r><a>&amp;lt;</a><b>&amp;amp;</b><c>&lt;&gt;&quot;&apos;&amp;</c>"
        L"<d>&#60;&nbsp;&AMP;&lt</d><e>&amp;quot;</e></r>");
    EXPECT_EQ(L"&lt;", Value(root, L"a"));  // the entity's text, not the character
    EXPECT_EQ(L"&amp;", Value(root, L"b"));
    EXPECT_EQ(L"<>\"'&", Value(root, L"c"));
    EXPECT_EQ(L"&#60;&nbsp;&AMP;&lt", Value(root, L"d"));  // nothing else is known
    EXPECT_EQ(L"&quot;", Value(root, L"e"));

    EXPECT_EQ(L"&lt;", Text(OIXmlUnescape(L"&amp;lt;")));
    EXPECT_EQ(L"", Text(OIXmlUnescape(nullptr)));
}

TEST(OIXmlEscaping, WhatIsSetIsReadBack) {
    const wchar_t* texts[] = {
        L"a&b",
        L"<",
        L"\"quoted\"",
        L"it's",
        L"&amp;lt; <tag attr=\"v\"> it's & done",
        L"&&&&",
        L"caf\x00e9 \xd83d\xde00 \xd800",
    };
    for (const wchar_t* text : texts) {
        COIXML root;
        root.SetName(L"r");
        root.AddChild(L"v", text, true);
        EXPECT_EQ(text, Value(root, L"v"));
        // ... also after a trip through the serialised form.
        COIXML again;
        again.SetXML(CStringEx(Xml(root).c_str()).c_str());
        EXPECT_EQ(text, Value(again, L"v"));
    }
}

// ---- CDATA ----

TEST(OIXmlCData, TheWrapperIsRemovedFromReadValues) {
    COIXML root;
    root.SetXML(
        L"<r><a><![CDATA[a<b & c]]></a><b>\r\n\t<![CDATA[ x ]]>\r\n</b>"
        L"<c>&lt;![CDATA[y]]&gt;</c><d><![CDATA[<![CDATA[z]]>]]></d><e><![CDATA[open</e></r>");
    EXPECT_EQ(L"a<b & c", Value(root, L"a"));
    EXPECT_EQ(L" x ", Value(root, L"b"));  // blanks inside the section stay
    EXPECT_EQ(L"y", Value(root, L"c"));    // unescaped first, then unwrapped
    EXPECT_EQ(L"z", Value(root, L"d"));
    EXPECT_EQ(L"<![CDATA[open", Value(root, L"e"));  // no end marker
}

TEST(OIXmlCData, MarkersMustStandInTheFirstAndLastThirtyCharacters) {
    const std::wstring section = L"<![CDATA[x]]>";
    struct Case {
        std::wstring value;
        std::wstring expected;
    };
    const Case cases[] = {
        {Repeat(L"\t", 21) + section, L"x"},  // the marker ends at the 30th character
        {Repeat(L"\t", 22) + section, Repeat(L"\t", 22) + section},
        {section + Repeat(L"\t", 27), L"x"},  // "]]>" starts 30 from the end
        {section + Repeat(L"\t", 28), section + Repeat(L"\t", 28)},
        {L"ab" + section, L"ab<![CDATA[x"},  // text before the marker stays
        {L"<![CDATA[" + Repeat(L"v", 30000) + L"]]>", Repeat(L"v", 30000)},
    };
    for (const Case& c : cases) {
        CStringEx value(c.value.c_str());
        OIXmlStripCData(value);
        EXPECT_EQ(c.expected, Text(value)) << c.value.size();

        COIXML root;
        root.SetXML((L"<r><v>" + c.value + L"</v></r>").c_str());
        EXPECT_EQ(c.expected, Value(root, L"v")) << c.value.size();
    }
}

// ---- serialisation ----

TEST(OIXmlBuild, GetXmlRebuildsThroughTheChildren) {
    COIXML root;
    root.SetName(L"Feedback");
    EXPECT_NE(nullptr, root.AddChild(L"Result", L"1", false));
    EXPECT_NE(nullptr, root.AddChild(L"Text", L"a<b", true));
    COIXML* info = root.AddChild(L"Info", nullptr, false);
    ASSERT_NE(nullptr, info);
    info->AddChild(L"Inner", L"x", false);  // no rebuild asked: GetXML does it
    info->AddChild(L"Empty", L"", false);
    EXPECT_EQ(
        L"<Feedback><Result>1</Result><Text>a&lt;b</Text>"
        L"<Info><Inner>x</Inner><Empty></Empty></Info></Feedback>",
        Xml(root));

    root.SetValue(L"v");  // the own value stands before the children
    root.SetName(L"F");
    EXPECT_EQ(
        L"<F>v<Result>1</Result><Text>a&lt;b</Text><Info><Inner>x</Inner><Empty></Empty></Info></"
        L"F>",
        Xml(root));

    COIXML empty;
    EXPECT_EQ(L"<></>", Xml(empty));
}

TEST(OIXmlBuild, ManyChildrenKeepTheirOrder) {
    COIXML root;
    root.SetName(L"r");
    std::wstring expected = L"<r>";
    for (int i = 0; i < 1000; ++i) {
        std::wstring name = L"c" + std::to_wstring(i);
        root.AddChild(name.c_str(), std::to_wstring(i).c_str(), false);
        expected += L"<" + name + L">" + std::to_wstring(i) + L"</" + name + L">";
    }
    expected += L"</r>";
    EXPECT_EQ(1000, root.GetChildCount());
    EXPECT_EQ(expected, Xml(root));

    COIXML parsed;
    parsed.SetXML(expected.c_str());
    EXPECT_EQ(1000, parsed.GetChildCount());
    EXPECT_EQ(L"999", Value(parsed, L"c999"));
    EXPECT_EQ(expected, Xml(parsed));
}

// ---- hostile and large input ----

TEST(OIXmlRobustness, TextOfTheLongestCommandLine) {
    std::wstring value = Repeat(L"v", 32767 - 14);
    std::wstring text = L"<r><v>" + value + L"</v></r>";
    ASSERT_EQ(32767u, text.size());
    COIXML root;
    root.SetXML(text.c_str());
    EXPECT_EQ(value, Value(root, L"v"));
    EXPECT_EQ(text, Xml(root));
}

TEST(OIXmlRobustness, NestingUpToTheLimitIsRead) {
    // The root and 256 levels below it.
    COIXML root;
    std::wstring text = DistinctNesting(0, 256, L"x");
    root.SetXML(text.c_str());
    EXPECT_EQ(256, ChainDepth(root));
    EXPECT_EQ(L"d256", Name(*Deepest(root)));
    EXPECT_EQ(L"x", Value(*ParentOfDeepest(root), L"d256"));
    EXPECT_EQ(text, Xml(root));
}

TEST(OIXmlRobustness, DeeperNestingIsKeptAsTextAtTheLimit) {
    COIXML root;
    std::wstring text = DistinctNesting(0, 5000, L"x");
    root.SetXML(text.c_str());
    EXPECT_EQ(256, ChainDepth(root));
    EXPECT_EQ(L"d256", Name(*Deepest(root)));
    EXPECT_EQ(DistinctNesting(257, 5000, L"x"), Value(*ParentOfDeepest(root), L"d256"));
    EXPECT_EQ(text, Xml(root));  // nothing is lost
}

TEST(OIXmlRobustness, DeepNestingOfOneName) {
    COIXML root;
    root.SetXML((Repeat(L"<a>", 5000) + L"x" + Repeat(L"</a>", 5000)).c_str());
    EXPECT_EQ(L"a", Name(root));
    EXPECT_EQ(256, ChainDepth(root));
}

TEST(OIXmlRobustness, UnbalancedTags) {
    COIXML opening;
    opening.SetXML((Repeat(L"<a>", 5000) + L"</a>").c_str());
    EXPECT_EQ(L"<a></a>", Xml(opening));

    COIXML closing;
    closing.SetXML(Repeat(L"</a>", 5000).c_str());
    EXPECT_EQ(L"a", Name(closing));
    EXPECT_EQ(0, closing.GetChildCount());

    COIXML unclosed;
    unclosed.SetXML(Repeat(L"<a>", 5000).c_str());
    EXPECT_EQ(L"", Name(unclosed));

    COIXML mixed;
    mixed.SetXML((L"<r>" + Repeat(L"<a><b></a>", 2000) + L"</r>").c_str());
    EXPECT_EQ(L"r", Name(mixed));
    EXPECT_EQ(2000, mixed.GetChildCount());
    EXPECT_EQ(L"<b>", Value(mixed, L"a"));
}

TEST(OIXmlRobustness, StrayAngleBrackets) {
    COIXML root;
    root.SetXML(L"<r><a>1<</a>></r>");
    EXPECT_EQ(L"a", ChildNames(root));
    EXPECT_EQ(L"1<", Value(root, L"a"));
    EXPECT_EQ(L"<r><a>1<</a></r>", Xml(root));

    COIXML tail;
    tail.SetXML(L"<r><a>x > y < z</a></r><");
    EXPECT_EQ(L"x > y < z", Value(tail, L"a"));
}

TEST(OIXmlRobustness, TextsMadeOfOneRepeatedPiece) {
    for (const wchar_t* piece : {L"</", L">", L"<", L"</>", L"<></>", L"<a>", L"/>"}) {
        size_t pieceLength = wcslen(piece);
        std::wstring text = Repeat(piece, static_cast<int>(32767 / pieceLength));
        COIXML root;
        root.SetXML(text.c_str());
        EXPECT_EQ(L"", Name(root)) << piece;
        EXPECT_EQ(0, root.GetChildCount()) << piece;
        EXPECT_EQ(L"<></>", Xml(root)) << piece;
    }
}

TEST(OIXmlRobustness, NonAsciiNamesAndValues) {
    COIXML root;
    root.SetXML(
        L"<r><\x540d\x524d>\x5024 \xd83d\xde00</\x540d\x524d>"
        L"<e\xd83d\xde00>\xdbff\xdfff</e\xd83d\xde00><u>\xd800x\xdc00</u></r>");
    EXPECT_EQ(L"\x540d\x524d,e\xd83d\xde00,u", ChildNames(root));
    EXPECT_EQ(L"\x5024 \xd83d\xde00", Value(root, L"\x540d\x524d"));
    EXPECT_EQ(L"\xdbff\xdfff", Value(root, L"e\xd83d\xde00"));
    EXPECT_EQ(L"\xd800x\xdc00", Value(root, L"u"));  // lone surrogates pass unchanged
}
