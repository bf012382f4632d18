// Path helpers: the slash rules of CStringEx::PathAppend, module-relative
// paths and RemoveFileSpec, with the two messages they send to the debugger
// output on invalid input.
#include <gtest/gtest.h>

#include <windows.h>

#include <string>
#include <utility>

#include "base/path_api.h"
#include "base/string_ex.h"
#include "tests/unit/debug_output_capture.h"

TEST(PathAppend, JoinsWithExactlyOneBackslash) {
    const std::wstring longName(5000, L'n');  // no 260-character limit
    const struct {
        const wchar_t* path;
        const wchar_t* file;
        std::wstring joined;
    } cases[] = {
        {L"C:\\a\\", L"\\b.txt", L"C:\\a\\b.txt"},
        {L"C:\\a\\\\\\", L"\\\\b.txt", L"C:\\a\\b.txt"},
        // Slashes are removed first, then backslashes, each kind once.
        {L"C:\\a/", L"/\\b", L"C:\\a\\b"},
        {L"C:\\a", L"\\/b", L"C:\\a\\/b"},
        {L"C:\\a\\/", L"b", L"C:\\a\\b"},
        {L"C:\\a/\\", L"b", L"C:\\a/\\b"},
        {L"C:\\a", L"b/", L"C:\\a\\b/"},  // the file's end is kept
        {L"", L"b.txt", L"\\b.txt"},
        {L"C:\\a", L"", L"C:\\a\\"},
        {L"C:\\a", longName.c_str(), L"C:\\a\\" + longName},
    };
    for (const auto& c : cases) {
        CStringEx path(c.path);
        CStringEx::PathAppend(path, c.file);
        EXPECT_EQ(c.joined, path.c_str()) << c.path;
    }
}

TEST(PathApi, InvalidInputLeavesTheOutputAndTellsTheDebugger) {
    DebugOutputCapture capture;
    CStringEx path(L"C:\\a\\");
    CStringEx::PathAppend(path, nullptr);
    EXPECT_STREQ(L"C:\\a\\", path.c_str());
    CPathApi::GetResFilePath(nullptr, nullptr, path);
    EXPECT_STREQ(L"C:\\a\\", path.c_str());
    ASSERT_EQ(2u, capture.lines().size());
    EXPECT_EQ(L"CStringEx::PathAppend: lpszFile == NULL\n", capture.lines()[0]);
    EXPECT_EQ(L"\nCPathApi::GetResFilePath: Invalid Input!\n", capture.lines()[1]);
}

TEST(GetResFilePath, JoinsTheModuleFolderWithTheFileName) {
    // A null module is the program itself.
    for (HMODULE module : {HMODULE{}, GetModuleHandleW(L"kernel32.dll")}) {
        wchar_t file[MAX_PATH] = {};
        ASSERT_NE(0u, GetModuleFileNameW(module, file, MAX_PATH));
        CStringEx out(L"previous");
        CPathApi::GetResFilePath(module, L"sub\\x.txt", out);
        EXPECT_EQ(std::wstring(file, wcsrchr(file, L'\\')) + L"\\sub\\x.txt", out.c_str());
        // A path beyond MAX_PATH gives no truncated result.
        CPathApi::GetResFilePath(module, std::wstring(300, L'n').c_str(), out);
        EXPECT_TRUE(out.IsEmpty());
    }
}

TEST(RemoveFileSpec, RemovesTheLastElementInPlace) {
    for (const auto& [path, parent] :
         {std::pair{L"C:\\a\\b.txt", L"C:\\a"}, {L"C:\\a", L"C:\\"}, {L"b.txt", L""}, {L"", L""}}) {
        CStringEx s(path);
        CPathApi::RemoveFileSpec(s);
        EXPECT_STREQ(parent, s.c_str()) << path;
        EXPECT_NE(nullptr, s.GetBuffer(8)) << path;  // not left locked
    }
    // A string locked by its caller is left alone.
    CStringEx locked(L"C:\\a\\b.txt");
    ASSERT_NE(nullptr, locked.GetBuffer(-1));
    CPathApi::RemoveFileSpec(locked);
    EXPECT_STREQ(L"C:\\a\\b.txt", locked.c_str());
}
