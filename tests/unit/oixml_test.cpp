// COIXML as the Action command line is parsed with it: the text-search rules
// that build the element tree, child values as text and numbers, the CDATA
// window and the nesting limit.
#include <gtest/gtest.h>

#include <string>

#include "base/oixml.h"
#include "base/string_ex.h"

namespace {

// The child's value as read by GetChildValue, or "<missing>".
std::wstring Value(const COIXML& node, const wchar_t* name) {
    CStringEx out;
    return node.GetChildValue(name, out) == 0 ? out.c_str() : L"<missing>";
}

// "name(child(...),child)" of the whole tree.
std::wstring Tree(const COIXML& node) {
    CStringEx name;
    node.GetName(name);
    std::wstring text = name.c_str();
    for (int i = 0; i < node.GetChildCount(); ++i) {
        text += (i ? L"," : L"(") + Tree(*node.GetChild(i));
    }
    return node.GetChildCount() > 0 ? text + L")" : text;
}

std::wstring Repeat(const std::wstring& piece, int times) {
    std::wstring text;
    while (times-- > 0) {
        text += piece;
    }
    return text;
}

TEST(OIXmlParse, BuildsTheTreeByTextSearch) {
    const struct {
        std::wstring text;
        std::wstring tree;
    } cases[] = {
        // Text around the root is ignored; the last "</" names the root.
        {L"<?xml version=\"1.0\"?><r><a>1</a></r>\r\ntrailing", L"r(a)"},
        {L"<r>x</r> trailing </y>", L"y"},
        {L"<R><A>1</A><B><C>2</C><D>3</D></B><E>4</E></R>", L"R(A,B(C,D),E)"},
        // A child with an attribute ends the reading of the children before it.
        {L"<r><a>1</a><b x=\"1\">2</b></r>", L"r"},
        {L"<r><b x=\"1\">2</b><a>1</a></r>", L"r(a)"},
        {L"<r id=\"7\"><a>1</a></r>", L"r"},  // nor the children of a root with one
        // Same-name elements pair the last opening tag with the last closing tag.
        {L"<a>1<a>2</a>3</a>", L"a(a)"},
        // Stray angle brackets, truncation and unbalanced tags.
        {L"<r><a>x > y < z</a></r><", L"r(a)"},
        {L"<a>y</a", L"n"},
        {L"<r>" + Repeat(L"<a><b></a>", 3) + L"</r>", L"r(a,a,a)"},
    };
    for (const auto& c : cases) {
        COIXML root;  // what a parse replaces or keeps
        root.SetName(L"n");
        root.SetXML(c.text.c_str());
        EXPECT_EQ(c.tree, Tree(root)) << c.text.substr(0, 80);
    }
}

TEST(OIXmlChildValue, FirstDirectChildWithTheExactNameAsTextOrNumber) {
    COIXML root;
    root.SetXML(
        L"<r><a>1</a><A>2</A><a>3</a><x><b>4</b></x><d> >> w\t </d><u>&amp;lt;&lt;&amp;</u>"
        L"<c><![CDATA[ <b> ]]></c><n>12abc</n><neg>-5</neg><text>abc</text><empty></empty>"
        L"<blank>   </blank><cdata><![CDATA[15]]></cdata></r>");
    EXPECT_EQ(L"1", Value(root, L"a"));
    EXPECT_EQ(L"2", Value(root, L"A"));
    EXPECT_EQ(L"<missing>", Value(root, L"b"));  // only direct children
    EXPECT_EQ(L"w\t", Value(root, L"d"));        // blanks, then '>', then blanks go
    EXPECT_EQ(L"&lt;<&", Value(root, L"u"));     // "&amp;" is unescaped last
    EXPECT_EQ(L" <b> ", Value(root, L"c"));
    const struct {
        const wchar_t* name;
        int result;
        int value;
    } numbers[] = {{L"n", 0, 12},     {L"neg", 0, -5},   {L"text", 0, 0},    {L"empty", 3, 99},
                   {L"blank", 3, 99}, {L"cdata", 0, 15}, {L"missing", 1, 99}};
    for (const auto& c : numbers) {
        int value = 99;
        EXPECT_EQ(c.result, root.GetChildValue(c.name, value)) << c.name;
        EXPECT_EQ(c.value, value) << c.name;
    }
}

TEST(OIXmlCData, TheWrapperGoesWhenItsMarkersStandInTheThirtyCharacterWindows) {
    const std::wstring section = L"<![CDATA[x]]>";
    const struct {
        std::wstring value;
        std::wstring expected;
    } cases[] = {
        {L"&lt;![CDATA[y]]&gt;", L"y"},             // unescaped first, then unwrapped
        {L"ab" + section, L"ab<![CDATA[x"},         // text before the marker stays
        {std::wstring(21, L'\t') + section, L"x"},  // the marker ends at the 30th character
        {std::wstring(22, L'\t') + section, std::wstring(22, L'\t') + section},
        {section + std::wstring(27, L'\t'), L"x"},  // "]]>" starts 30 from the end
        {section + std::wstring(28, L'\t'), section + std::wstring(28, L'\t')},
    };
    for (const auto& c : cases) {
        COIXML root;
        root.SetXML((L"<r><v>" + c.value + L"</v></r>").c_str());
        EXPECT_EQ(c.expected, Value(root, L"v")) << c.value.size();
    }
}

TEST(OIXmlParse, NestingEndsAt256LevelsBelowTheRoot) {
    COIXML root;
    root.SetXML((Repeat(L"<a>", 5000) + L"x" + Repeat(L"</a>", 5000)).c_str());
    EXPECT_EQ(Repeat(L"a(", 256) + L"a" + Repeat(L")", 256), Tree(root));
}

}  // namespace
