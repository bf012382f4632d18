// Whole-entry editing of the search path text.
#include <gtest/gtest.h>

#include <string>

#include "cleanup/path_entries.h"
#include "tests/support/file_util.h"

namespace {

struct EntryCase {
    const wchar_t* list;
    const wchar_t* folder;
    bool listed;
    const wchar_t* removed;  // the list without the folder's entries
    int removedCount;
};

TEST(PathEntries, RemovesWholeEntriesAndKeepsTheRestAsWritten) {
    const EntryCase cases[] = {
        {L"C:\\A;C:\\Suite\\qmtools;C:\\B", L"C:\\Suite\\qmtools\\", true, L"C:\\A;C:\\B", 1},
        {L"C:\\Suite\\qmtools;C:\\B", L"C:\\Suite\\qmtools", true, L"C:\\B", 1},
        {L"C:\\A;C:\\Suite\\qmtools;", L"C:\\Suite\\qmtools", true, L"C:\\A", 1},
        {L"C:\\Suite\\qmtools", L"C:\\Suite\\qmtools", true, L"", 1},
        // Longer entries that merely contain the folder's text are other folders
        // (text replacement would leave "C:\A2;C:\B" for the first).
        {L"C:\\A;C:\\Suite\\qm2;C:\\B", L"C:\\Suite\\qm", false, L"C:\\A;C:\\Suite\\qm2;C:\\B", 0},
        {L"D:\\x\\C:\\Suite\\qm;C:\\Suite\\qm.old", L"C:\\Suite\\qm", false,
         L"D:\\x\\C:\\Suite\\qm;C:\\Suite\\qm.old", 0},
        // Case and trailing backslashes do not matter.
        {L"C:\\A;c:\\SUITE\\qm\\\\;C:\\B;C:\\Suite\\qm", L"C:\\Suite\\qm", true, L"C:\\A;C:\\B", 2},
        {L"C:\\Suite\\qm", L"c:\\SUITE\\qm\\", true, L"", 1},
        {L"%SystemRoot%\\system32; C:\\Spaced ;;%ProgramFiles%\\Tool\\;C:\\Suite\\qm",
         L"C:\\Suite\\qm", true, L"%SystemRoot%\\system32; C:\\Spaced ;;%ProgramFiles%\\Tool\\", 1},
        // An empty folder names no entry, empty ones included.
        {L"C:\\A;;C:\\B", L"", false, L"C:\\A;;C:\\B", 0},
        {L"C:\\A;\\;C:\\B", L"\\", false, L"C:\\A;\\;C:\\B", 0},
    };
    for (const EntryCase& c : cases) {
        SCOPED_TRACE(Narrow(c.list) + " - " + Narrow(c.folder));
        EXPECT_EQ(c.listed, PathListHasEntry(c.list, c.folder));
        int count = -1;
        EXPECT_EQ(std::wstring(c.removed), RemovePathEntries(c.list, c.folder, &count).c_str());
        EXPECT_EQ(c.removedCount, count);
    }
}

TEST(PathEntries, AppendsTheFolderWithoutItsTrailingBackslash) {
    const wchar_t* const cases[][3] = {
        {L"C:\\Windows\\system32;C:\\Windows", L"C:\\Suite\\qmtools\\",
         L"C:\\Windows\\system32;C:\\Windows;C:\\Suite\\qmtools"},
        {L"C:\\A;;", L"C:\\Suite", L"C:\\A;C:\\Suite"},
        {L"", L"C:\\Suite", L"C:\\Suite"},
        {L"C:\\A;C:\\Suite\\qm2", L"C:\\Suite\\qm", L"C:\\A;C:\\Suite\\qm2;C:\\Suite\\qm"},
        {L"%SystemRoot%\\system32;%windir%", L"C:\\Suite\\qm",
         L"%SystemRoot%\\system32;%windir%;C:\\Suite\\qm"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(std::wstring(c[2]), AppendPathEntry(c[0], c[1]).c_str()) << Narrow(c[0]);
    }
}

TEST(PathEntries, HandlesALongPath) {
    std::wstring list;
    for (int i = 0; i < 1500; ++i) {
        list += L"C:\\Tools\\entry" + std::to_wstring(i) + L";";
    }
    const std::wstring before = list.substr(0, list.size() - 1);
    list += L"C:\\Suite\\qm";
    EXPECT_TRUE(PathListHasEntry(list.c_str(), L"C:\\Suite\\qm"));
    EXPECT_EQ(before, RemovePathEntries(list.c_str(), L"C:\\Suite\\qm").c_str());
}

}  // namespace
