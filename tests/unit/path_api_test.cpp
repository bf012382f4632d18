// Path helpers: the slash rules of CStringEx::PathAppend, module-relative
// paths and RemoveFileSpec, with the two messages they send to the debugger
// output on invalid input.
#include <gtest/gtest.h>

#include <windows.h>

#include <string>

#include "base/path_api.h"
#include "base/string_ex.h"
#include "tests/unit/debug_output_capture.h"

namespace {

std::wstring Text(const CStringEx& s) {
    return s.c_str();
}

std::wstring Appended(const wchar_t* path, const wchar_t* file) {
    CStringEx joined(path);
    CStringEx::PathAppend(joined, file);
    return Text(joined);
}

std::wstring ModuleFolder(HMODULE module) {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(module, path, MAX_PATH);
    std::wstring folder = path;
    return folder.substr(0, folder.rfind(L'\\'));
}

std::wstring RemovedFileSpec(const wchar_t* path) {
    CStringEx s(path);
    CPathApi::RemoveFileSpec(s);
    return Text(s);
}

}  // namespace

TEST(PathAppend, JoinsWithExactlyOneBackslash) {
    EXPECT_EQ(L"C:\\a\\b.txt", Appended(L"C:\\a\\", L"\\b.txt"));
    EXPECT_EQ(L"C:\\a\\b.txt", Appended(L"C:\\a", L"b.txt"));
    EXPECT_EQ(L"C:\\a\\b.txt", Appended(L"C:\\a\\\\\\", L"\\\\b.txt"));
    EXPECT_EQ(L"C:\\a\\b\\c", Appended(L"C:\\a", L"b\\c"));
    EXPECT_EQ(L"C:\\a\\b", Appended(L"C:\\a//", L"//b"));
}

TEST(PathAppend, RemovesSlashesFirstThenBackslashesEachKindOnce) {
    EXPECT_EQ(L"C:\\a\\b", Appended(L"C:\\a/", L"/\\b"));
    EXPECT_EQ(L"C:\\a\\/b", Appended(L"C:\\a", L"\\/b"));
    // At the end of the path: slashes first, then backslashes.
    EXPECT_EQ(L"C:\\a\\b", Appended(L"C:\\a\\/", L"b"));
    EXPECT_EQ(L"C:\\a/\\b", Appended(L"C:\\a/\\", L"b"));
    EXPECT_EQ(L"C:\\a\\b/", Appended(L"C:\\a", L"b/"));  // the file's end is kept
}

TEST(PathAppend, EmptyPathAndEmptyFile) {
    EXPECT_EQ(L"\\b.txt", Appended(L"", L"b.txt"));
    EXPECT_EQ(L"\\b.txt", Appended(nullptr, L"\\b.txt"));
    EXPECT_EQ(L"C:\\a\\", Appended(L"C:\\a", L""));
    EXPECT_EQ(L"C:\\a\\", Appended(L"C:\\a\\", L"/\\"));
    EXPECT_EQ(L"\\", Appended(L"/", L"\\"));
}

TEST(PathAppend, NullFileLeavesThePathAndTellsTheDebugger) {
    DebugOutputCapture capture;
    CStringEx path(L"C:\\a\\");
    CStringEx::PathAppend(path, nullptr);
    EXPECT_EQ(L"C:\\a\\", Text(path));
    ASSERT_EQ(1u, capture.lines().size());
    EXPECT_EQ(L"CStringEx::PathAppend: lpszFile == NULL\n", capture.lines()[0]);
}

TEST(PathAppend, HandlesNonAsciiAndLongNames) {
    EXPECT_EQ(L"C:\\\x00c4rger\\\xd83d\xde00.txt",
              Appended(L"C:\\\x00c4rger", L"\xd83d\xde00.txt"));
    std::wstring longName(5000, L'n');
    EXPECT_EQ(L"C:\\a\\" + longName, Appended(L"C:\\a", longName.c_str()));  // no 260 limit
}

TEST(GetResFilePath, JoinsTheModuleFolderWithTheFileName) {
    CStringEx out(L"previous");
    CPathApi::GetResFilePath(nullptr, L"qmRes.dll", out);
    EXPECT_EQ(ModuleFolder(nullptr) + L"\\qmRes.dll", Text(out));

    HMODULE kernel32 = GetModuleHandleW(L"kernel32.dll");
    ASSERT_NE(nullptr, kernel32);
    CPathApi::GetResFilePath(kernel32, L"sub\\x.txt", out);
    EXPECT_EQ(ModuleFolder(kernel32) + L"\\sub\\x.txt", Text(out));
}

TEST(GetResFilePath, NullFileNameLeavesTheOutputAndTellsTheDebugger) {
    DebugOutputCapture capture;
    CStringEx out(L"unchanged");
    CPathApi::GetResFilePath(nullptr, nullptr, out);
    EXPECT_EQ(L"unchanged", Text(out));
    ASSERT_EQ(1u, capture.lines().size());
    EXPECT_EQ(L"\nCPathApi::GetResFilePath: Invalid Input!\n", capture.lines()[0]);
}

TEST(GetResFilePath, APathBeyondMaxPathGivesNoTruncatedResult) {
    std::wstring longName(300, L'n');
    CStringEx out(L"previous");
    CPathApi::GetResFilePath(nullptr, longName.c_str(), out);
    EXPECT_TRUE(out.IsEmpty());
}

TEST(RemoveFileSpec, RemovesTheLastElementInPlace) {
    EXPECT_EQ(L"C:\\a", RemovedFileSpec(L"C:\\a\\b.txt"));
    EXPECT_EQ(L"C:\\", RemovedFileSpec(L"C:\\a"));
    EXPECT_EQ(L"C:\\", RemovedFileSpec(L"C:\\"));
    EXPECT_EQ(L"", RemovedFileSpec(L"b.txt"));
    EXPECT_EQ(L"\\\\server\\share", RemovedFileSpec(L"\\\\server\\share\\x.txt"));
}

TEST(RemoveFileSpec, EmptyStaysEmptyAndTheStringIsNotLeftLocked) {
    CStringEx empty;
    CPathApi::RemoveFileSpec(empty);
    EXPECT_TRUE(empty.IsEmpty());

    CStringEx s(L"C:\\a\\b.txt");
    CPathApi::RemoveFileSpec(s);
    wchar_t* buffer = s.GetBuffer(-1);
    EXPECT_NE(nullptr, buffer);  // released again
    s.ReleaseBuffer(-1);
    CPathApi::RemoveFileSpec(s);
    EXPECT_EQ(L"C:\\", Text(s));

    // A string locked by its caller is left alone.
    CStringEx locked(L"C:\\a\\b.txt");
    ASSERT_NE(nullptr, locked.GetBuffer(-1));
    CPathApi::RemoveFileSpec(locked);
    EXPECT_EQ(L"C:\\a\\b.txt", Text(locked));
    locked.ReleaseBuffer(-1);
}
