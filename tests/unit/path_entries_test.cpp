// Whole-entry editing of the search path text.
#include <gtest/gtest.h>

#include <string>

#include "cleanup/path_entries.h"

namespace {

std::wstring Added(const wchar_t* list, const wchar_t* folder) {
    return AppendPathEntry(list, folder).c_str();
}

std::wstring Removed(const wchar_t* list, const wchar_t* folder, int* count = nullptr) {
    return RemovePathEntries(list, folder, count).c_str();
}

TEST(PathEntries, AppendsTheFolderWithoutItsTrailingBackslash) {
    EXPECT_EQ(L"C:\\Windows\\system32;C:\\Windows;C:\\Suite\\qmtools",
              Added(L"C:\\Windows\\system32;C:\\Windows", L"C:\\Suite\\qmtools\\"));
    EXPECT_EQ(L"C:\\A;C:\\Suite", Added(L"C:\\A;;", L"C:\\Suite"));
    EXPECT_EQ(L"C:\\Suite", Added(L"", L"C:\\Suite"));
}

TEST(PathEntries, RemovesTheFolderBetweenOthers) {
    int count = 0;
    EXPECT_EQ(L"C:\\A;C:\\B",
              Removed(L"C:\\A;C:\\Suite\\qmtools;C:\\B", L"C:\\Suite\\qmtools\\", &count));
    EXPECT_EQ(1, count);
    EXPECT_EQ(L"C:\\B", Removed(L"C:\\Suite\\qmtools;C:\\B", L"C:\\Suite\\qmtools"));
    EXPECT_EQ(L"C:\\A", Removed(L"C:\\A;C:\\Suite\\qmtools;", L"C:\\Suite\\qmtools"));
}

TEST(PathEntries, AnEntryThatOnlyContainsTheFolderIsAnotherFolder) {
    // Text replacement would leave "C:\A2;C:\B" here.
    EXPECT_EQ(L"C:\\A;C:\\Suite\\qm2;C:\\B",
              Removed(L"C:\\A;C:\\Suite\\qm2;C:\\B", L"C:\\Suite\\qm"));
    EXPECT_EQ(L"D:\\x\\C:\\Suite\\qm;C:\\Suite\\qm.old",
              Removed(L"D:\\x\\C:\\Suite\\qm;C:\\Suite\\qm.old", L"C:\\Suite\\qm"));
    EXPECT_FALSE(PathListHasEntry(L"C:\\A;C:\\Suite\\qm2;C:\\B", L"C:\\Suite\\qm"));
    EXPECT_EQ(L"C:\\A;C:\\Suite\\qm2;C:\\Suite\\qm",
              Added(L"C:\\A;C:\\Suite\\qm2", L"C:\\Suite\\qm"));
}

TEST(PathEntries, MatchesWithoutRegardToCaseOrTrailingBackslashes) {
    EXPECT_TRUE(PathListHasEntry(L"C:\\A;c:\\suite\\QM\\\\;C:\\B", L"C:\\Suite\\qm"));
    EXPECT_TRUE(PathListHasEntry(L"C:\\Suite\\qm", L"c:\\SUITE\\qm\\"));
    int count = 0;
    EXPECT_EQ(L"C:\\A;C:\\B",
              Removed(L"C:\\A;c:\\SUITE\\qm\\;C:\\B;C:\\Suite\\qm", L"C:\\Suite\\qm", &count));
    EXPECT_EQ(2, count);
}

TEST(PathEntries, KeepsEveryOtherEntryAsWritten) {
    const wchar_t* list =
        L"%SystemRoot%\\system32; C:\\Spaced ;;%ProgramFiles%\\Tool\\;C:\\Suite\\qm";
    EXPECT_EQ(L"%SystemRoot%\\system32; C:\\Spaced ;;%ProgramFiles%\\Tool\\",
              Removed(list, L"C:\\Suite\\qm"));
    EXPECT_EQ(L"%SystemRoot%\\system32;%windir%;C:\\Suite\\qm",
              Added(L"%SystemRoot%\\system32;%windir%", L"C:\\Suite\\qm"));
}

TEST(PathEntries, TheOnlyEntryIsRemovedToo) {
    int count = 0;
    EXPECT_EQ(L"", Removed(L"C:\\Suite\\qmtools", L"C:\\Suite\\qmtools", &count));
    EXPECT_EQ(1, count);
}

TEST(PathEntries, NothingMatchesAnEmptyFolder) {
    EXPECT_FALSE(PathListHasEntry(L"C:\\A;;C:\\B", L""));
    EXPECT_FALSE(PathListHasEntry(L"C:\\A;\\;C:\\B", L"\\"));
    EXPECT_EQ(L"C:\\A;;C:\\B", Removed(L"C:\\A;;C:\\B", L"\\"));
}

TEST(PathEntries, HandlesALongPath) {
    std::wstring list;
    for (int i = 0; i < 1500; ++i) {
        list += L"C:\\Tools\\entry" + std::to_wstring(i) + L";";
    }
    list += L"C:\\Suite\\qm";
    EXPECT_TRUE(PathListHasEntry(list.c_str(), L"C:\\Suite\\qm"));
    std::wstring expected = list.substr(0, list.size() - wcslen(L";C:\\Suite\\qm"));
    EXPECT_EQ(expected, Removed(list.c_str(), L"C:\\Suite\\qm"));
}

}  // namespace
