// CStringEx as the program uses it: searching from either end, trims by
// character, by text and by blank, the replacement that never rescans, and
// the buffer a caller writes into.
#include <gtest/gtest.h>

#include <malloc.h>

#include <string>

#include "base/string_ex.h"

namespace {

// One operation on a string `s` holding `before`: its result and the text
// left in `s`. The operation's source text names the row in failures.
struct Row {
    const wchar_t* before;
    const char* operation;
    int (*run)(CStringEx& s);
    int result;
    const wchar_t* after;
};
#define ROW(before, operation, result, after)                                                 \
    Row {                                                                                     \
        before, #operation, [](CStringEx& s) { return static_cast<int>(operation); }, result, \
            after                                                                             \
    }

TEST(StringEx, OperationsAtTheirBoundaries) {
    const Row rows[] = {
        ROW(L"a\\b\\c", s.ReverseFind(L'\\'), 3, L"a\\b\\c"),
        ROW(L"a\\b\\c", s.ReverseFind(L"a\\b\\c\\"), -1, L"a\\b\\c"),
        ROW(L"aaaa", s.ReverseFind(L"aa"), 2, L"aaaa"),
        ROW(nullptr, s.Find(L"a") + s.ReverseFind(L""), -2, L""),
        ROW(L"abc", (s = s.Left(-1), 0), 0, L"abc"),
        ROW(L"a", s.Compare(nullptr), 1, L"a"),
        ROW(L"a", s.Compare(L"B") > 0, 1, L"a"),                      // code units, not letters
        ROW(L"a&b&", s.Replace(L"&", L"&amp;"), 2, L"a&amp;b&amp;"),  // not scanned again
        ROW(L"aaaaa", s.Replace(L"aa", L"b"), 2, L"bba"),             // left to right
        ROW(L"ab-ab", s.Replace(L"", L"x") + s.Replace(L"zz", L"x"), 0, L"ab-ab"),
        ROW(L"\"C:\\x\"\"", (s.TrimLeft(L'"'), s.TrimRight(L'"'), 0), 0, L"C:\\x"),
        ROW(L"ababXab", (s.TrimLeft(L"ab"), s.TrimRight(L"ab"), 0), 0, L"X"),
        ROW(L"abaXba", (s.TrimLeft(L"ab"), s.TrimRight(L"ab"), 0), 0, L"aXba"),
        // The left trim knows space, CR, LF and tab only; the right trim asks iswspace.
        ROW(L"\v \t\r\nx\v", (s.TrimLeft(), s.TrimRight(), 0), 0, L"\v \t\r\nx"),
        ROW(L" \t\r\nx \f\r\n\t ", (s.TrimLeft(), s.TrimRight(), 0), 0, L"x"),
    };
    for (const Row& row : rows) {
        CStringEx s(row.before);
        EXPECT_EQ(row.result, row.run(s)) << row.operation;
        EXPECT_STREQ(row.after, s.c_str()) << row.operation;
    }
}

TEST(StringEx, BufferHoldsWhatTheCallerAskedFor) {
    for (int minLength : {-1, 3, 10}) {
        CStringEx s(L"abc");
        wchar_t* buffer = s.GetBuffer(minLength);
        ASSERT_NE(nullptr, buffer);
        const size_t chars = minLength < 4 ? 4 : minLength + 1;  // with the terminator
        ASSERT_GE(_msize(buffer), chars * sizeof(wchar_t));
        std::wstring full(chars - 1, L'w');
        wcscpy(buffer, full.c_str());
        s.ReleaseBuffer(-1);
        EXPECT_EQ(full, s.c_str());
    }
}

}  // namespace
