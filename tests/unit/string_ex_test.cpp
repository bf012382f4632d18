// CStringEx: the results every caller relies on for empty, negative, out of
// range and null input, the in-place edits and their sizing, formatting,
// string-table loading, and the narrow copies handed to MAPI.
#include <gtest/gtest.h>

#include <windows.h>

#include <malloc.h>

#include <iterator>
#include <string>
#include <utility>

#include "base/ansi_text.h"
#include "base/string_ex.h"
#include "tests/unit/string_table.h"

namespace {

std::wstring Repeat(const std::wstring& piece, int times) {
    std::wstring text;
    for (int i = 0; i < times; ++i) {
        text += piece;
    }
    return text;
}

// One operation on a string `s` holding `before`: its result and the text
// left in `s`. The operation's source text names the row in failures.
struct Row {
    const wchar_t* before;
    const char* operation;
    int (*run)(CStringEx& s);
    int result;
    const wchar_t* after;
};
// clang-format off
#define ROW(before, operation, result, after) \
    Row{before, #operation, [](CStringEx& s) { return static_cast<int>(operation); }, result, after}
// clang-format on

void CheckRows(const Row* rows, size_t count) {
    for (size_t i = 0; i < count; ++i) {
        const Row& row = rows[i];
        SCOPED_TRACE(row.operation);
        CStringEx s(row.before);
        EXPECT_EQ(row.result, row.run(s));
        EXPECT_STREQ(row.after, s.c_str());
    }
}

const int kMaxInt = 0x7FFFFFFF;

}  // namespace

TEST(StringExRules, AccessCompareSearchAndExtraction) {
    const Row rows[] = {
        ROW(nullptr, s.GetLength(), 0, L""),
        ROW(nullptr, s.GetAt(0), 0, L""),
        ROW(nullptr, s.GetConstBuffer() != nullptr && *s.GetConstBuffer() == L'\0', 1, L""),
        // An empty string gives a buffer only when enlarged; a refusal does not lock.
        ROW(nullptr, s.GetBuffer(-1) || s.GetBuffer(0) || s.GetBuffer(1) || !s.GetBuffer(2), 0,
            L""),
        ROW(L"abc", s.GetAt(3), 0, L"abc"),
        ROW(L"abc", s.GetAt(-1), 0, L"abc"),
        // Compare: exact results where either side is empty or null.
        ROW(nullptr, s.Compare(nullptr), 0, L""),
        ROW(nullptr, s.Compare(L""), 0, L""),
        ROW(nullptr, s.Compare(L"a"), -1, L""),
        ROW(nullptr, (s.GetConstBuffer(), s.Compare(L"x")), -1, L""),
        ROW(L"a", s.Compare(nullptr), 1, L"a"),
        ROW(nullptr, s.CompareNoCase(L"A"), -1, L""),
        ROW(L"a", s.CompareNoCase(nullptr), 1, L"a"),
        ROW(L"a", s.Compare(L"B") > 0, 1, L"a"),  // code units, not letters
        ROW(L"\xD83D\xDE00", s.Compare(L"\xFF01") < 0, 1, L"\xD83D\xDE00"),
        ROW(L"Program FILES", s.CompareNoCase(L"program files"), 0, L"Program FILES"),
        ROW(L"_", s.CompareNoCase(L"A") < 0, 1, L"_"),                  // folds to lower case
        ROW(L"\x00C9", s.CompareNoCase(L"\x00E9") != 0, 1, L"\x00C9"),  // ASCII letters only
        // Find and ReverseFind.
        ROW(nullptr, s.Find(L'a'), -1, L""),
        ROW(nullptr, s.ReverseFind(L""), -1, L""),
        ROW(L"a.b.c", s.Find(L'.', 2), 3, L"a.b.c"),
        ROW(L"a.b.c", s.Find(L'.', -5), 1, L"a.b.c"),
        ROW(L"a.b.c", s.Find(L'.', 5), -1, L"a.b.c"),
        ROW(L"a.b.c", s.Find(L".c", 2), 3, L"a.b.c"),
        ROW(L"a.b.c", s.Find(static_cast<const wchar_t*>(nullptr)), -1, L"a.b.c"),
        ROW(L"a\\b\\c", s.ReverseFind(L'\\'), 3, L"a\\b\\c"),
        ROW(L"a\\b\\c", s.ReverseFind(L"a\\b\\c\\"), -1, L"a\\b\\c"),
        ROW(L"a\\b\\c", s.ReverseFind(static_cast<const wchar_t*>(nullptr)), -1, L"a\\b\\c"),
        ROW(L"a\\b\\c", s.ReverseFind(L""), 5, L"a\\b\\c"),
        ROW(L"aaaa", s.ReverseFind(L"aa"), 2, L"aaaa"),
        // Extraction: each row keeps the extracted text in `s`.
        ROW(nullptr, (s = s.Mid(0, 5), 0), 0, L""),
        ROW(L"abc", (s = s.Mid(1, -1), 0), 0, L"bc"),
        ROW(L"abc", (s = s.Mid(5, 2), 0), 0, L""),
        ROW(L"abc", (s = s.Mid(-3, 2), 0), 0, L"ab"),
        ROW(L"abc", (s = s.Mid(1, kMaxInt), 0), 0, L"bc"),
        ROW(L"abc", (s = s.Left(-1), 0), 0, L"abc"),
        ROW(L"abc", (s = s.Left(0), 0), 0, L""),
        // Right gives the last `count` characters.
        ROW(L"abc", (s = s.Right(10), 0), 0, L"abc"),
        ROW(L"abc", (s = s.Right(2), 0), 0, L"bc"),
        ROW(L"abc", (s = s.Right(-1), 0), 0, L""),
    };
    CheckRows(rows, std::size(rows));
}

TEST(StringExRules, ConstructionAndEditing) {
    const Row rows[] = {
        ROW(L"", (s = CStringEx(L"abcdef", 3), 0), 0, L"abc"),
        ROW(L"path", (CStringEx(s).MakeUpper(), 0), 0, L"path"),  // copies are deep
        ROW(L"text", (s = static_cast<const wchar_t*>(nullptr), s.GetBuffer(0) == nullptr), 1, L""),
        // Appending empties to an empty string leaves it without a buffer.
        ROW(nullptr,
            (s += L"", s += nullptr, s += CStringEx(), s += L'\0', s.GetBuffer(0) == nullptr), 1,
            L""),
        ROW(nullptr, (s += CStringEx(L"arg"), 0), 0, L"arg"),
        ROW(L"a", (s += L'b', s += L"cd", s += L'\0', s += nullptr, s.GetLength()), 4, L"abcd"),
        // The string's own text, or a pointer into it, as the argument.
        ROW(L"abcdef", (s = s.c_str() + 2, 0), 0, L"cdef"),
        ROW(L"cdef", (s += s, s += s.c_str() + 6, 0), 0, L"cdefcdefef"),
        ROW(L"abc", s.Insert(1, s.c_str()), 6, L"aabcbc"),
        ROW(L"xax", s.Replace(L"a", s.c_str()), 1, L"xxaxx"),
        ROW(L"ac", s.Insert(1, L"b"), 3, L"abc"),
        ROW(L"abc", s.Insert(-5, L"<"), 4, L"<abc"),
        ROW(L"abc", s.Insert(100, L">"), 4, L"abc>"),
        ROW(L"abc", s.Insert(2, nullptr), 3, L"abc"),
        ROW(nullptr, s.Insert(3, nullptr), 0, L""),
        ROW(nullptr, s.Insert(3, L"xy"), 2, L"xy"),
        ROW(nullptr, s.Delete(0, 1), 0, L""),
        ROW(L"abcdef", s.Delete(1, 100), 1, L"a"),
        ROW(L"abcdef", s.Delete(-1, 2), 6, L"abcdef"),
        ROW(L"abcdef", s.Delete(7, 1), 6, L"abcdef"),
        ROW(L"abcdef", s.Delete(1, 2), 4, L"adef"),
        ROW(L"abcdef", s.Delete(0, kMaxInt), 0, L""),
        // Replace: nothing done, then the replacing cases.
        ROW(L"ab-ab", s.Replace(L"ab", L"ab"), 0, L"ab-ab"),
        ROW(L"ab-ab", s.Replace(nullptr, L"x"), 0, L"ab-ab"),
        ROW(L"ab-ab", s.Replace(L"ab", nullptr), 0, L"ab-ab"),
        ROW(L"ab-ab", s.Replace(L"", L"x"), 0, L"ab-ab"),
        ROW(L"ab-ab", s.Replace(L"zz", L"x"), 0, L"ab-ab"),
        ROW(L"ab-ab", s.Replace(L'\0', L"x"), 0, L"ab-ab"),
        ROW(nullptr, s.Replace(L"a", L"b") + s.Replace(L'a', L"b"), 0, L""),
        ROW(L"banana", s.Replace(L"a", L""), 3, L"bnn"),
        ROW(L"a&b&", s.Replace(L"&", L"&amp;"), 2, L"a&amp;b&amp;"),  // not scanned again
        ROW(L"aaaaa", s.Replace(L"aa", L"b"), 2, L"bba"),             // left to right, no overlap
        ROW(L"a/b/c", s.Replace(L'/', L"\\\\"), 2, L"a\\\\b\\\\c"),
        // Trims: by character, by whole copies of a text, and by white space.
        ROW(L"//a/b//", (s.TrimLeft(L'/'), s.TrimRight(L'/'), 0), 0, L"a/b"),
        ROW(L"xxxx", (s.TrimLeft(L'x'), s.GetLength()), 0, L""),
        ROW(L"ababXab", (s.TrimLeft(L"ab"), s.TrimRight(L"ab"), 0), 0, L"X"),
        ROW(L"abaXba", (s.TrimLeft(L"ab"), s.TrimRight(L"ab"), 0), 0, L"aXba"),
        ROW(L"ab", (s.TrimLeft(nullptr), s.TrimLeft(L""), s.TrimRight(nullptr), 0), 0, L"ab"),
        ROW(L" \t\r\n \t x ", (s.TrimLeft(), 0), 0, L"x "),
        // The left trim knows space, CR, LF and tab only; the right trim asks iswspace.
        ROW(L"\vx\v", (s.TrimLeft(), s.TrimRight(), 0), 0, L"\vx"),
        ROW(L"\fx \f\r\n\t ", (s.TrimLeft(), s.TrimRight(), 0), 0, L"\fx"),
        ROW(L"c:\\program files\\x.dll", (s.MakeUpper(), 0), 0, L"C:\\PROGRAM FILES\\X.DLL"),
        ROW(nullptr, (s.TrimLeft(), s.TrimRight(L'a'), s.MakeUpper(), s.GetBuffer(0) == nullptr), 1,
            L""),
    };
    CheckRows(rows, std::size(rows));
}

TEST(StringExRules, ReplaceSizesItsResultForManyOccurrences) {
    std::wstring many(20000, L'&');
    CStringEx s(many.c_str());
    EXPECT_EQ(20000, s.Replace(L"&", L"&amp;"));
    EXPECT_EQ(Repeat(L"&amp;", 20000), s.c_str());
    EXPECT_EQ(20000, s.Replace(L"&amp;", L"&"));
    EXPECT_EQ(many, s.c_str());
}

TEST(StringExBuffer, LockedUntilReleasedAndEnlargedWithATerminator) {
    CStringEx s(L"abc");
    ASSERT_NE(nullptr, s.GetBuffer(-1));
    EXPECT_EQ(nullptr, s.GetBuffer(-1));
    EXPECT_EQ(nullptr, s.GetBuffer(100));
    EXPECT_STREQ(L"abc", s.c_str());  // the refused enlargement changed nothing
    s.ReleaseBuffer(-1);
    wchar_t* buffer = s.GetBuffer(-1);
    ASSERT_NE(nullptr, buffer);
    buffer[2] = L'\0';  // the text is whatever stands before the first zero
    s.ReleaseBuffer(-1);
    EXPECT_STREQ(L"ab", s.c_str());
    s.GetBuffer(-1);
    s.Empty();  // clears the lock
    EXPECT_NE(nullptr, s.GetBuffer(4));

    // 4 is the string's length + 1: the caller may write four characters.
    for (int minLength : {4, 10}) {
        SCOPED_TRACE(minLength);
        CStringEx s(L"abc");
        wchar_t* buffer = s.GetBuffer(minLength);
        ASSERT_NE(nullptr, buffer);
        // The text's buffers come from the C runtime heap, which knows their size.
        ASSERT_GE(_msize(buffer), (minLength + 1) * sizeof(wchar_t));
        EXPECT_EQ(std::wstring(L"abc") + std::wstring(minLength - 2, L'\0'),
                  std::wstring(buffer, minLength + 1));
        std::wstring full(minLength, L'w');
        wcscpy(buffer, full.c_str());
        s.ReleaseBuffer(-1);
        EXPECT_EQ(full, s.c_str());
    }
}

TEST(StringExFormat, WideNarrowNumbersAndLongOutput) {
    CStringEx s(L"previous text");
    s.Format(L"%s|%S|%d|%x|%u|%c|%%|%5d|%-3s|%.3s%08.3f", L"wide", "narrow", -42, 255u, 4000000000u,
             L'z', 7, L"a", L"abcdef", 3.14159);
    EXPECT_STREQ(L"wide|narrow|-42|ff|4000000000|z|%|    7|a  |abc0003.142", s.c_str());
    s.Format(L"%s", L"");
    EXPECT_EQ(0, s.GetLength());

    std::wstring wide(70000, L'w');
    std::string narrow(50000, 'n');
    s.Format(L"[%s][%S][%d]", wide.c_str(), narrow.c_str(), 9);
    EXPECT_EQ(L"[" + wide + L"][" + std::wstring(50000, L'n') + L"][9]", s.c_str());
    s.Format(L"%20000d|", 5);
    EXPECT_EQ(std::wstring(19999, L' ') + L"5|", s.c_str());
}

TEST(StringExLoadString, FindsEachEntryOfEachBlock) {
    // An empty text means LoadString answers false.
    const std::pair<UINT, std::wstring> cases[] = {
        {IDS_TEST_ZERO, L"zero"},
        {IDS_TEST_FIFTEEN, L"fifteen, the last of the first block"},
        {IDS_TEST_SIXTEEN, L"sixteen"},
        {IDS_TEST_FORTY_FIVE, L"forty-five"},
        {IDS_TEST_NON_ASCII, L"caf\x00e9 \xd83d\xde00"},
        {IDS_TEST_LONG, Repeat(L"0123456789", 40)},
        {IDS_TEST_EMPTY, L""},
        {IDS_TEST_UNSET_FIRST_BLOCK, L""},
        {IDS_TEST_IN_MISSING_BLOCK, L""},
        // Block numbers are 16-bit: these must not wrap around to id 0's text.
        {0x100000 + IDS_TEST_ZERO, L""},
        {0xFFFFFFFFu, L""},
    };
    for (const auto& [id, text] : cases) {
        SCOPED_TRACE(id);
        CStringEx s(L"previous");
        EXPECT_EQ(!text.empty(), s.LoadString(GetModuleHandleW(nullptr), id));
        EXPECT_EQ(text, s.c_str());
    }
}

TEST(AnsiCopyToList, CopiesAndOwnsEachNarrowString) {
    AnsiStringList list;
    EXPECT_EQ(nullptr, AnsiCopyToList(nullptr, list));
    EXPECT_EQ(0u, list.size());
    char* subject = AnsiCopyToList(L"Trace files", list);
    EXPECT_STREQ("", AnsiCopyToList(L"", list));
    std::wstring longText = Repeat(L"path\\", 2000);
    EXPECT_STREQ(std::string(longText.begin(), longText.end()).c_str(),
                 AnsiCopyToList(longText.c_str(), list));
    EXPECT_EQ(3u, list.size());
    EXPECT_STREQ("Trace files", subject);  // earlier entries stay valid

    if (GetACP() == 1252) {
        // The system code page; characters outside it become its default character.
        EXPECT_STREQ("caf\xe9 \x80", AnsiCopyToList(L"caf\x00e9 \x20ac", list));
        EXPECT_STREQ("?", AnsiCopyToList(L"\x0416", list));
    }
}
