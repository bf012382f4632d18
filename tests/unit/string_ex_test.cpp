// CStringEx: the results every caller relies on for empty, negative, out of
// range and null input, the in-place edits and their sizing, formatting,
// string-table loading, and the narrow copies handed to MAPI.
#include <gtest/gtest.h>

#include <windows.h>

#include <malloc.h>

#include <string>

#include "base/ansi_text.h"
#include "base/string_ex.h"
#include "tests/unit/string_table.h"

namespace {

std::wstring Text(const CStringEx& s) {
    return s.c_str();
}

// An empty CStringEx normally holds no buffer at all; GetBuffer of an empty
// string without enlargement answers null exactly then.
bool HasNoBuffer(CStringEx& s) {
    wchar_t* buffer = s.GetBuffer(0);
    if (buffer != nullptr) {
        s.ReleaseBuffer(-1);
        return false;
    }
    return true;
}

std::wstring Repeat(const std::wstring& piece, int times) {
    std::wstring text;
    for (int i = 0; i < times; ++i) {
        text += piece;
    }
    return text;
}

}  // namespace

// ---- construction, assignment, appending ----

TEST(StringExConstruction, DefaultAndNullStringsAreEmptyWithoutBuffer) {
    CStringEx byDefault;
    CStringEx fromNull(static_cast<const wchar_t*>(nullptr));
    CStringEx fromEmpty(L"");
    CStringEx fromNullWithLength(nullptr, 5);
    CStringEx zeroLength(L"abc", 0);
    CStringEx negativeLength(L"abc", -1);
    for (CStringEx* s :
         {&byDefault, &fromNull, &fromEmpty, &fromNullWithLength, &zeroLength, &negativeLength}) {
        EXPECT_EQ(0, s->GetLength());
        EXPECT_TRUE(s->IsEmpty());
        EXPECT_STREQ(L"", s->c_str());
        EXPECT_TRUE(HasNoBuffer(*s));
    }
    EXPECT_EQ(L"abc", Text(CStringEx(L"abcdef", 3)));
}

TEST(StringExConstruction, CopiesAreDeep) {
    CStringEx original(L"path");
    CStringEx copy(original);
    CStringEx assigned;
    assigned = original;
    copy += L"\\x";
    assigned.MakeUpper();
    EXPECT_EQ(L"path", Text(original));
    EXPECT_EQ(L"path\\x", Text(copy));
    EXPECT_EQ(L"PATH", Text(assigned));
    EXPECT_NE(original.c_str(), copy.c_str());

    CStringEx moved(std::move(copy));
    EXPECT_EQ(L"path\\x", Text(moved));
    copy = L"reused";  // a moved-from string stays usable
    EXPECT_EQ(L"reused", Text(copy));
}

TEST(StringExConstruction, AssigningAStringItsOwnTextIsSafe) {
    CStringEx s(L"abcdef");
    s = s;
    EXPECT_EQ(L"abcdef", Text(s));
    s = s.c_str() + 2;  // a pointer into the buffer that is replaced
    EXPECT_EQ(L"cdef", Text(s));
    s += s;
    EXPECT_EQ(L"cdefcdef", Text(s));
    s += s.c_str() + 6;
    EXPECT_EQ(L"cdefcdefef", Text(s));
    EXPECT_EQ(20, s.Insert(1, s.c_str()));
    EXPECT_EQ(L"ccdefcdefefdefcdefef", Text(s));
    CStringEx r(L"xax");
    EXPECT_EQ(1, r.Replace(L"a", r.c_str()));
    EXPECT_EQ(L"xxaxx", Text(r));
}

TEST(StringExConstruction, AssigningNullEmptiesTheString) {
    CStringEx s(L"text");
    s = static_cast<const wchar_t*>(nullptr);
    EXPECT_EQ(0, s.GetLength());
    EXPECT_TRUE(HasNoBuffer(s));
}

TEST(StringExConstruction, AppendingFollowsTheEmptyRules) {
    CStringEx both;
    both += L"";
    both += static_cast<const wchar_t*>(nullptr);
    both += CStringEx();
    both += L'\0';
    EXPECT_TRUE(HasNoBuffer(both));  // both empty: stays empty

    CStringEx fromEmpty;
    fromEmpty += CStringEx(L"arg");
    EXPECT_EQ(L"arg", Text(fromEmpty));

    CStringEx s(L"a");
    s += L'b';
    s += L"cd";
    s += CStringEx(L"e");
    s += L'\0';  // no terminator inside the text
    s += static_cast<const wchar_t*>(nullptr);
    EXPECT_EQ(L"abcde", Text(s));
    EXPECT_EQ(5, s.GetLength());
}

// ---- access ----

TEST(StringExAccess, EmptyStringGivesZeroMinusOneAndEmptyResults) {
    CStringEx s;
    EXPECT_EQ(0, s.GetLength());
    EXPECT_EQ(L'\0', s.GetAt(0));
    EXPECT_EQ(-1, s.Find(L'a'));
    EXPECT_EQ(-1, s.Find(L"a"));
    EXPECT_EQ(-1, s.Find(L""));
    EXPECT_EQ(-1, s.ReverseFind(L'a'));
    EXPECT_EQ(-1, s.ReverseFind(L"a"));
    EXPECT_EQ(-1, s.ReverseFind(L""));
    EXPECT_TRUE(s.Mid(0).IsEmpty());
    EXPECT_TRUE(s.Mid(0, 5).IsEmpty());
    EXPECT_TRUE(s.Left(3).IsEmpty());
    EXPECT_TRUE(s.Right(3).IsEmpty());
    EXPECT_EQ(0, s.Delete(0, 1));

    const wchar_t* buffer = s.GetConstBuffer();
    ASSERT_NE(nullptr, buffer);
    EXPECT_EQ(L'\0', buffer[0]);
    EXPECT_FALSE(HasNoBuffer(s));  // GetConstBuffer allocated an empty text
    EXPECT_EQ(0, s.GetLength());
    EXPECT_TRUE(s.IsEmpty());
}

TEST(StringExAccess, GetAtAnswersZeroOutsideTheText) {
    CStringEx s(L"abc");
    EXPECT_EQ(L'a', s.GetAt(0));
    EXPECT_EQ(L'c', s.GetAt(2));
    EXPECT_EQ(L'\0', s.GetAt(3));
    EXPECT_EQ(L'\0', s.GetAt(-1));
    EXPECT_EQ(L'\0', s.GetAt(0x7FFFFFFF));
    EXPECT_EQ(L'\0', s.GetAt(-0x7FFFFFFF - 1));
}

TEST(StringExAccess, GetBufferLocksUntilReleased) {
    CStringEx s(L"abc");
    wchar_t* buffer = s.GetBuffer(-1);
    ASSERT_NE(nullptr, buffer);
    EXPECT_STREQ(L"abc", buffer);
    EXPECT_EQ(nullptr, s.GetBuffer(-1));  // locked
    EXPECT_EQ(nullptr, s.GetBuffer(100));
    EXPECT_EQ(L"abc", Text(s));  // the refused enlargement changed nothing
    s.ReleaseBuffer(-1);
    EXPECT_NE(nullptr, s.GetBuffer(-1));
    s.ReleaseBuffer(-1);

    // ReleaseBuffer toggles the flag: a second release locks again.
    s.ReleaseBuffer(-1);
    EXPECT_EQ(nullptr, s.GetBuffer(-1));
    s.ReleaseBuffer(-1);
    EXPECT_NE(nullptr, s.GetBuffer(-1));
    s.ReleaseBuffer(-1);

    // Empty clears the flag.
    ASSERT_NE(nullptr, s.GetBuffer(-1));
    s.Empty();
    wchar_t* fresh = s.GetBuffer(4);
    ASSERT_NE(nullptr, fresh);
    s.ReleaseBuffer(-1);
}

TEST(StringExAccess, GetBufferEnlargesWithZerosAndKeepsTheText) {
    CStringEx s(L"abc");
    wchar_t* buffer = s.GetBuffer(10);
    ASSERT_NE(nullptr, buffer);
    ASSERT_GE(_msize(buffer), 11 * sizeof(wchar_t));
    EXPECT_STREQ(L"abc", buffer);
    for (int i = 3; i <= 10; ++i) {
        EXPECT_EQ(L'\0', buffer[i]) << i;
    }
    wcscpy(buffer, L"0123456789");  // ten characters and the terminator fit
    s.ReleaseBuffer(-1);
    EXPECT_EQ(L"0123456789", Text(s));
    EXPECT_EQ(10, s.GetLength());

    // The text is whatever stands before the first zero.
    buffer = s.GetBuffer(-1);
    ASSERT_NE(nullptr, buffer);
    buffer[4] = L'\0';
    s.ReleaseBuffer(-1);
    EXPECT_EQ(L"0123", Text(s));
}

TEST(StringExAccess, GetBufferOfOneMoreThanTheLengthHasRoomForTheTerminator) {
    CStringEx s(L"abc");
    wchar_t* buffer = s.GetBuffer(4);
    ASSERT_NE(nullptr, buffer);
    // The text's buffers come from the C runtime heap, which knows their size.
    ASSERT_GE(_msize(buffer), 5 * sizeof(wchar_t));
    wcscpy(buffer, L"wxyz");  // four characters asked for, plus the terminator
    s.ReleaseBuffer(-1);
    EXPECT_EQ(L"wxyz", Text(s));
}

TEST(StringExAccess, GetBufferOfAnEmptyStringNeedsAnEnlargement) {
    for (int minLength : {-1, 0, 1}) {
        CStringEx s;
        EXPECT_EQ(nullptr, s.GetBuffer(minLength)) << minLength;
        EXPECT_NE(nullptr, s.GetBuffer(2)) << minLength;  // the refusal did not lock
        s.ReleaseBuffer(-1);
    }
    CStringEx s;
    wchar_t* buffer = s.GetBuffer(2);
    ASSERT_NE(nullptr, buffer);
    EXPECT_EQ(L'\0', buffer[0]);
    buffer[0] = L'x';
    buffer[1] = L'y';
    s.ReleaseBuffer(-1);
    EXPECT_EQ(L"xy", Text(s));
}

// ---- comparison ----

TEST(StringExCompare, EmptyAndNullFollowTheirOwnRules) {
    CStringEx empty;
    EXPECT_EQ(0, empty.Compare(nullptr));
    EXPECT_EQ(0, empty.Compare(L""));
    EXPECT_EQ(-1, empty.Compare(L"a"));
    CStringEx text(L"a");
    EXPECT_EQ(1, text.Compare(nullptr));
    EXPECT_GT(text.Compare(L""), 0);
    // An allocated empty text counts as empty too.
    CStringEx allocated;
    allocated.GetConstBuffer();
    EXPECT_EQ(0, allocated.Compare(nullptr));
    EXPECT_EQ(-1, allocated.Compare(L"x"));

    EXPECT_EQ(0, empty.CompareNoCase(nullptr));
    EXPECT_EQ(0, empty.CompareNoCase(L""));
    EXPECT_EQ(-1, empty.CompareNoCase(L"A"));
    EXPECT_EQ(1, text.CompareNoCase(nullptr));
}

TEST(StringExCompare, CompareIsOrdinal) {
    EXPECT_EQ(0, CStringEx(L"abc").Compare(L"abc"));
    EXPECT_LT(CStringEx(L"abc").Compare(L"abd"), 0);
    EXPECT_GT(CStringEx(L"abd").Compare(L"abc"), 0);
    EXPECT_LT(CStringEx(L"ab").Compare(L"abc"), 0);
    EXPECT_GT(CStringEx(L"a").Compare(L"B"), 0);  // code units, not letters
    EXPECT_GT(CStringEx(L"\x00E9").Compare(L"z"), 0);
    EXPECT_LT(CStringEx(L"\xD83D\xDE00").Compare(L"\xFF01"), 0);  // UTF-16 units
    EXPECT_TRUE(CStringEx(L"x") == L"x");
    EXPECT_TRUE(CStringEx(L"x") != L"X");
}

TEST(StringExCompare, CompareNoCaseFoldsOnlyAsciiLettersToLowerCase) {
    EXPECT_EQ(0, CStringEx(L"Program FILES").CompareNoCase(L"program files"));
    EXPECT_EQ(0, CStringEx(L"AZ").CompareNoCase(L"az"));
    // Folding is to lower case: '_' (0x5F) sorts before 'a' but after 'A'.
    EXPECT_LT(CStringEx(L"_").CompareNoCase(L"A"), 0);
    EXPECT_GT(CStringEx(L"a").CompareNoCase(L"_"), 0);
    // Letters beyond ASCII do not fold.
    EXPECT_NE(0, CStringEx(L"\x00C9").CompareNoCase(L"\x00E9"));
    EXPECT_NE(0, CStringEx(L"\x0416").CompareNoCase(L"\x0436"));
    EXPECT_LT(CStringEx(L"abc").CompareNoCase(L"ABD"), 0);
    EXPECT_LT(CStringEx(L"AB").CompareNoCase(L"abc"), 0);
}

// ---- search ----

TEST(StringExSearch, FindHonoursTheStartIndex) {
    CStringEx s(L"a.b.c");
    EXPECT_EQ(1, s.Find(L'.'));
    EXPECT_EQ(1, s.Find(L'.', 1));
    EXPECT_EQ(3, s.Find(L'.', 2));
    EXPECT_EQ(1, s.Find(L'.', -5));  // negative counts as 0
    EXPECT_EQ(-1, s.Find(L'.', 4));
    EXPECT_EQ(-1, s.Find(L'.', 5));  // start not less than the length
    EXPECT_EQ(-1, s.Find(L'.', 100));
    EXPECT_EQ(-1, s.Find(L'x'));

    EXPECT_EQ(2, s.Find(L"b.c"));
    EXPECT_EQ(3, s.Find(L".c", 2));
    EXPECT_EQ(-1, s.Find(L".b", 2));
    EXPECT_EQ(0, s.Find(L"a.", -1));
    EXPECT_EQ(-1, s.Find(L"c", 5));
    EXPECT_EQ(-1, s.Find(L"a.b.c.", 0));
    EXPECT_EQ(-1, s.Find(static_cast<const wchar_t*>(nullptr)));
}

TEST(StringExSearch, ReverseFindGivesTheLastPosition) {
    CStringEx s(L"C:\\a\\b.txt");
    EXPECT_EQ(4, s.ReverseFind(L'\\'));
    EXPECT_EQ(-1, s.ReverseFind(L'/'));
    EXPECT_EQ(4, s.ReverseFind(L"\\"));
    EXPECT_EQ(6, s.ReverseFind(L".txt"));
    EXPECT_EQ(0, s.ReverseFind(L"C:\\a\\b.txt"));
    EXPECT_EQ(-1, s.ReverseFind(L"C:\\a\\b.txt2"));  // longer than the string
    EXPECT_EQ(-1, s.ReverseFind(static_cast<const wchar_t*>(nullptr)));
    EXPECT_EQ(10, s.ReverseFind(L""));  // an empty text stands at the end
    EXPECT_EQ(2, CStringEx(L"aaaa").ReverseFind(L"aa"));
    EXPECT_EQ(-1, CStringEx(L"abc").ReverseFind(L"x"));
}

// ---- extraction ----

TEST(StringExExtract, MidClampsStartAndCount) {
    CStringEx s(L"abc");
    EXPECT_EQ(L"bc", Text(s.Mid(1, -1)));
    EXPECT_EQ(L"bc", Text(s.Mid(1)));
    EXPECT_EQ(L"b", Text(s.Mid(1, 1)));
    EXPECT_EQ(L"", Text(s.Mid(1, 0)));
    EXPECT_EQ(L"bc", Text(s.Mid(1, 100)));
    EXPECT_EQ(L"bc", Text(s.Mid(1, 0x7FFFFFFF)));
    EXPECT_EQ(L"ab", Text(s.Mid(-3, 2)));
    EXPECT_EQ(L"", Text(s.Mid(3, 2)));
    EXPECT_EQ(L"", Text(s.Mid(5, 2)));
    EXPECT_EQ(L"abc", Text(s));  // unchanged
}

TEST(StringExExtract, LeftAndRight) {
    CStringEx s(L"abc");
    EXPECT_EQ(L"ab", Text(s.Left(2)));
    EXPECT_EQ(L"", Text(s.Left(0)));
    EXPECT_EQ(L"abc", Text(s.Left(10)));
    EXPECT_EQ(L"abc", Text(s.Left(-1)));  // a negative count takes everything

    // Right gives the last `count` characters.
    EXPECT_EQ(L"c", Text(s.Right(1)));
    EXPECT_EQ(L"bc", Text(s.Right(2)));
    EXPECT_EQ(L"abc", Text(s.Right(3)));
    EXPECT_EQ(L"abc", Text(s.Right(10)));
    EXPECT_EQ(L"", Text(s.Right(0)));
    EXPECT_EQ(L"", Text(s.Right(-1)));
    EXPECT_EQ(L"txt", Text(CStringEx(L"C:\\a\\b.txt").Right(3)));
}

// ---- editing ----

TEST(StringExEdit, InsertClampsTheIndex) {
    CStringEx s(L"ac");
    EXPECT_EQ(3, s.Insert(1, L"b"));
    EXPECT_EQ(L"abc", Text(s));
    EXPECT_EQ(4, s.Insert(-5, L"<"));
    EXPECT_EQ(L"<abc", Text(s));
    EXPECT_EQ(5, s.Insert(100, L">"));
    EXPECT_EQ(L"<abc>", Text(s));
    EXPECT_EQ(5, s.Insert(2, nullptr));
    EXPECT_EQ(5, s.Insert(2, L""));
    EXPECT_EQ(L"<abc>", Text(s));

    CStringEx empty;
    EXPECT_EQ(0, empty.Insert(3, nullptr));
    EXPECT_EQ(2, empty.Insert(3, L"xy"));
    EXPECT_EQ(L"xy", Text(empty));
}

TEST(StringExEdit, DeleteCutsOrRemoves) {
    CStringEx s(L"abcdef");
    EXPECT_EQ(1, s.Delete(1, 100));
    EXPECT_EQ(L"a", Text(s));

    s = L"abcdef";
    EXPECT_EQ(6, s.Delete(-1, 2));
    EXPECT_EQ(L"abcdef", Text(s));
    EXPECT_EQ(6, s.Delete(7, 1));  // beyond the length
    EXPECT_EQ(6, s.Delete(6, 1));  // at the end: nothing to remove
    EXPECT_EQ(L"abcdef", Text(s));
    EXPECT_EQ(4, s.Delete(1, 2));
    EXPECT_EQ(L"adef", Text(s));
    EXPECT_EQ(3, s.Delete(3, 1));  // index + count exactly at the end
    EXPECT_EQ(L"ade", Text(s));
    EXPECT_EQ(3, s.Delete(0, 0));
    EXPECT_EQ(0, s.Delete(0, 0x7FFFFFFF));
    EXPECT_EQ(0, s.GetLength());

    CStringEx empty;
    EXPECT_EQ(0, empty.Delete(0, 1));
}

TEST(StringExEdit, ReplaceDoesNothingInTheDocumentedCases) {
    CStringEx s(L"ab-ab");
    EXPECT_EQ(0, s.Replace(L"ab", L"ab"));
    EXPECT_EQ(0, s.Replace(nullptr, L"x"));
    EXPECT_EQ(0, s.Replace(L"ab", nullptr));
    EXPECT_EQ(0, s.Replace(L"", L"x"));
    EXPECT_EQ(0, s.Replace(L"zz", L"x"));
    EXPECT_EQ(L"ab-ab", Text(s));
    CStringEx empty;
    EXPECT_EQ(0, empty.Replace(L"a", L"b"));
    EXPECT_EQ(0, empty.Replace(L'a', L"b"));
    EXPECT_TRUE(HasNoBuffer(empty));
    EXPECT_EQ(0, s.Replace(L'\0', L"x"));
}

TEST(StringExEdit, ReplaceShorterLongerAndEmpty) {
    CStringEx banana(L"banana");
    EXPECT_EQ(3, banana.Replace(L"a", L""));
    EXPECT_EQ(L"bnn", Text(banana));

    CStringEx amps(L"a&b&");
    EXPECT_EQ(2, amps.Replace(L"&", L"&amp;"));
    EXPECT_EQ(L"a&amp;b&amp;", Text(amps));  // inserted text is not scanned again

    CStringEx shorter(L"one&amp;two&amp;&amp;");
    EXPECT_EQ(3, shorter.Replace(L"&amp;", L"&"));
    EXPECT_EQ(L"one&two&&", Text(shorter));

    CStringEx grow(L"aaa");
    EXPECT_EQ(3, grow.Replace(L"a", L"aa"));
    EXPECT_EQ(L"aaaaaa", Text(grow));

    CStringEx overlapping(L"aaaaa");
    EXPECT_EQ(2, overlapping.Replace(L"aa", L"b"));  // left to right, no overlap
    EXPECT_EQ(L"bba", Text(overlapping));

    CStringEx whole(L"xyz");
    EXPECT_EQ(1, whole.Replace(L"xyz", L""));
    EXPECT_EQ(0, whole.GetLength());

    CStringEx chars(L"a/b/c");
    EXPECT_EQ(2, chars.Replace(L'/', L"\\\\"));
    EXPECT_EQ(L"a\\\\b\\\\c", Text(chars));
}

TEST(StringExEdit, ReplaceSizesItsResultForManyOccurrences) {
    // Every character replaced by a much longer text, then back.
    std::wstring many = Repeat(L"&", 20000);
    CStringEx s(many.c_str());
    EXPECT_EQ(20000, s.Replace(L"&", L"&amp;"));
    EXPECT_EQ(100000, s.GetLength());
    EXPECT_EQ(Repeat(L"&amp;", 20000), Text(s));
    EXPECT_EQ(20000, s.Replace(L"&amp;", L"&"));
    EXPECT_EQ(many, Text(s));

    // Occurrences separated by text, replaced by one slightly longer.
    std::wstring mixed = Repeat(L"ab<cd", 5000) + L"tail";
    CStringEx m(mixed.c_str());
    EXPECT_EQ(5000, m.Replace(L"<", L"&lt;"));
    EXPECT_EQ(Repeat(L"ab&lt;cd", 5000) + L"tail", Text(m));
    EXPECT_EQ(5000, m.Replace(L"ab&lt;cd", L"."));
    EXPECT_EQ(Repeat(L".", 5000) + L"tail", Text(m));
}

TEST(StringExEdit, TrimByCharacterAndByText) {
    CStringEx s(L"//a/b//");
    s.TrimLeft(L'/');
    EXPECT_EQ(L"a/b//", Text(s));
    s.TrimRight(L'/');
    EXPECT_EQ(L"a/b", Text(s));

    CStringEx t(L"ababXab");
    t.TrimLeft(L"ab");
    EXPECT_EQ(L"Xab", Text(t));
    t.TrimRight(L"ab");
    EXPECT_EQ(L"X", Text(t));

    CStringEx partial(L"abaXba");
    partial.TrimLeft(L"ab");  // only whole copies
    partial.TrimRight(L"ab");
    EXPECT_EQ(L"aXba", Text(partial));
    partial.TrimLeft(static_cast<const wchar_t*>(nullptr));
    partial.TrimLeft(L"");
    partial.TrimRight(static_cast<const wchar_t*>(nullptr));
    partial.TrimRight(L"");
    EXPECT_EQ(L"aXba", Text(partial));

    CStringEx all(L"xxxx");
    all.TrimLeft(L'x');
    EXPECT_EQ(0, all.GetLength());
    all = L"xyxy";
    all.TrimRight(L"xy");
    EXPECT_TRUE(all.IsEmpty());

    CStringEx empty;
    empty.TrimLeft(L'a');
    empty.TrimRight(L'a');
    empty.TrimLeft(L"a");
    empty.TrimRight(L"a");
    empty.TrimLeft();
    empty.TrimRight();
    EXPECT_TRUE(HasNoBuffer(empty));
}

TEST(StringExEdit, TrimWithoutArgumentUsesTwoDifferentWhiteSpaceSets) {
    CStringEx left(L" \t\r\n \t x ");
    left.TrimLeft();
    EXPECT_EQ(L"x ", Text(left));

    // The left trim knows space, CR, LF and tab only; the right trim asks iswspace.
    CStringEx verticalTab(L"\vx\v");
    verticalTab.TrimLeft();
    verticalTab.TrimRight();
    EXPECT_EQ(L"\vx", Text(verticalTab));
    CStringEx formFeed(L"\fx \f\r\n\t ");
    formFeed.TrimLeft();
    formFeed.TrimRight();
    EXPECT_EQ(L"\fx", Text(formFeed));
    CStringEx blanks(L" \t ");
    blanks.TrimRight();
    EXPECT_EQ(0, blanks.GetLength());
}

TEST(StringExEdit, MakeUpper) {
    CStringEx s(L"c:\\program files\\x.dll");
    s.MakeUpper();
    EXPECT_EQ(L"C:\\PROGRAM FILES\\X.DLL", Text(s));
    CStringEx empty;
    empty.MakeUpper();
    EXPECT_TRUE(HasNoBuffer(empty));
}

// ---- formatting ----

TEST(StringExFormat, WideNarrowAndNumbers) {
    CStringEx s(L"previous text");
    s.Format(L"%s|%S|%d|%x|%u|%ld|%c|%%|%5d|%-3s|", L"wide", "narrow", -42, 255u, 4000000000u,
             123456L, L'z', 7, L"a");
    EXPECT_EQ(L"wide|narrow|-42|ff|4000000000|123456|z|%|    7|a  |", Text(s));
    s.Format(L"%s", L"");
    EXPECT_EQ(0, s.GetLength());
    s.Format(L"no conversions");
    EXPECT_EQ(L"no conversions", Text(s));
    s.Format(L"%.3s%08.3f", L"abcdef", 3.14159);
    EXPECT_EQ(L"abc0003.142", Text(s));
}

TEST(StringExFormat, LongOutputIsNotCut) {
    std::wstring wide = Repeat(L"w", 70000);
    std::string narrow(50000, 'n');
    CStringEx s;
    s.Format(L"[%s][%S][%d]", wide.c_str(), narrow.c_str(), 9);
    EXPECT_EQ(L"[" + wide + L"][" + std::wstring(50000, L'n') + L"][9]", Text(s));

    s.Format(L"%20000d|", 5);
    ASSERT_EQ(20001, s.GetLength());
    EXPECT_EQ(L'5', s.GetAt(19999));
    EXPECT_EQ(L' ', s.GetAt(0));

    s.Format(L"%s%s%s%s", wide.c_str(), wide.c_str(), wide.c_str(), wide.c_str());
    EXPECT_EQ(280000, s.GetLength());
}

// ---- string table ----

TEST(StringExLoadString, ReadsEntriesOfEveryBlockPosition) {
    HMODULE self = GetModuleHandleW(nullptr);
    CStringEx s;
    EXPECT_TRUE(s.LoadString(self, IDS_TEST_ZERO));
    EXPECT_EQ(L"zero", Text(s));
    EXPECT_TRUE(s.LoadString(self, IDS_TEST_FIFTEEN));
    EXPECT_EQ(L"fifteen, the last of the first block", Text(s));
    EXPECT_TRUE(s.LoadString(self, IDS_TEST_SIXTEEN));
    EXPECT_EQ(L"sixteen", Text(s));
    EXPECT_TRUE(s.LoadString(self, IDS_TEST_FORTY_FIVE));
    EXPECT_EQ(L"forty-five", Text(s));
    EXPECT_TRUE(s.LoadString(self, IDS_TEST_NON_ASCII));
    EXPECT_EQ(L"caf\x00e9 \xd83d\xde00", Text(s));
    EXPECT_TRUE(s.LoadString(self, IDS_TEST_LONG));
    EXPECT_EQ(Repeat(L"0123456789", 40), Text(s));
}

TEST(StringExLoadString, MissingOrEmptyEntriesGiveFalseAndAnEmptyString) {
    HMODULE self = GetModuleHandleW(nullptr);
    for (UINT id : {IDS_TEST_EMPTY, IDS_TEST_UNSET_FIRST_BLOCK, IDS_TEST_UNSET_SECOND_BLOCK,
                    IDS_TEST_IN_MISSING_BLOCK}) {
        CStringEx s(L"previous");
        EXPECT_FALSE(s.LoadString(self, id)) << id;
        EXPECT_EQ(0, s.GetLength()) << id;
    }
}

TEST(StringExLoadString, IdsBeyondSixteenBitsDoNotWrapToOtherEntries) {
    // Block numbers are 16-bit: id 0x100000 would land in block 1 again and
    // read the text of id 0.
    HMODULE self = GetModuleHandleW(nullptr);
    CStringEx s(L"previous");
    EXPECT_FALSE(s.LoadString(self, 0x100000 + IDS_TEST_ZERO));
    EXPECT_TRUE(s.IsEmpty());
    EXPECT_FALSE(s.LoadString(self, 0xFFFFFFFFu));
    EXPECT_TRUE(s.IsEmpty());
}

// ---- narrow copies ----

TEST(AnsiCopyToList, CopiesAndOwnsEachNarrowString) {
    AnsiStringList list;
    EXPECT_EQ(nullptr, AnsiCopyToList(nullptr, list));
    EXPECT_EQ(0u, list.size());

    char* subject = AnsiCopyToList(L"Trace files", list);
    ASSERT_NE(nullptr, subject);
    EXPECT_STREQ("Trace files", subject);
    EXPECT_EQ(1u, list.size());

    char* empty = AnsiCopyToList(L"", list);
    ASSERT_NE(nullptr, empty);
    EXPECT_STREQ("", empty);
    EXPECT_EQ(2u, list.size());

    std::wstring longText = Repeat(L"path\\", 2000);
    char* body = AnsiCopyToList(longText.c_str(), list);
    ASSERT_NE(nullptr, body);
    EXPECT_EQ(std::string(body), std::string(longText.begin(), longText.end()));
    EXPECT_EQ(3u, list.size());
    EXPECT_STREQ("Trace files", subject);  // earlier entries stay valid
}

TEST(AnsiCopyToList, ConvertsToTheSystemCodePage) {
    if (GetACP() != 1252) {
        GTEST_SKIP() << "system code page " << GetACP();
    }
    AnsiStringList list;
    char* text = AnsiCopyToList(L"caf\x00e9 \x20ac", list);
    ASSERT_NE(nullptr, text);
    EXPECT_STREQ("caf\xe9 \x80", text);
    // Characters outside the code page become the system default character.
    char* other = AnsiCopyToList(L"\x0416", list);
    ASSERT_NE(nullptr, other);
    EXPECT_STREQ("?", other);
}
