// Whole-entry editing of the search path text.
#include <gtest/gtest.h>

#include "cleanup/path_entries.h"
#include "tests/support/file_util.h"

namespace {

TEST(PathEntries, RemovesWholeEntriesAndKeepsTheRestAsWritten) {
    const struct {
        const wchar_t* list;
        const wchar_t* folder;
        const wchar_t* removed;  // the list without the folder's entries
        int count;
    } cases[] = {
        {L"C:\\A;C:\\Suite\\qm;C:\\B", L"C:\\Suite\\qm\\", L"C:\\A;C:\\B", 1},
        {L"C:\\Suite\\qm;C:\\B", L"C:\\Suite\\qm", L"C:\\B", 1},
        {L"C:\\A;C:\\Suite\\qm;", L"C:\\Suite\\qm", L"C:\\A", 1},
        {L"C:\\Suite\\qm", L"C:\\Suite\\qm", L"", 1},
        // Entries that merely contain the folder's text are other folders.
        {L"C:\\A;C:\\Suite\\qm2;C:\\B", L"C:\\Suite\\qm", L"C:\\A;C:\\Suite\\qm2;C:\\B", 0},
        {L"D:\\x\\C:\\Suite\\qm;C:\\Suite\\qm.old", L"C:\\Suite\\qm",
         L"D:\\x\\C:\\Suite\\qm;C:\\Suite\\qm.old", 0},
        // Letter case and trailing backslashes do not matter.
        {L"C:\\A;c:\\SUITE\\qm\\\\;C:\\B;C:\\Suite\\qm", L"C:\\Suite\\qm", L"C:\\A;C:\\B", 2},
        {L"%SystemRoot%\\system32; C:\\Spaced ;;%ProgramFiles%\\T\\;C:\\Suite\\qm",
         L"C:\\Suite\\qm", L"%SystemRoot%\\system32; C:\\Spaced ;;%ProgramFiles%\\T\\", 1},
        // An empty folder names no entry, empty ones included.
        {L"C:\\A;;C:\\B", L"", L"C:\\A;;C:\\B", 0},
        {L"C:\\A;\\;C:\\B", L"\\", L"C:\\A;\\;C:\\B", 0},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(Narrow(c.list) + " - " + Narrow(c.folder));
        EXPECT_EQ(c.count > 0, PathListHasEntry(c.list, c.folder));
        int count = -1;
        EXPECT_EQ(std::wstring(c.removed), RemovePathEntries(c.list, c.folder, &count).c_str());
        EXPECT_EQ(c.count, count);
    }
}

TEST(PathEntries, AppendsTheFolderWithoutItsTrailingBackslash) {
    const wchar_t* const cases[][3] = {
        {L"C:\\W\\system32;C:\\W", L"C:\\Suite\\qm\\", L"C:\\W\\system32;C:\\W;C:\\Suite\\qm"},
        {L"C:\\A;;", L"C:\\Suite", L"C:\\A;C:\\Suite"},
        {L"", L"C:\\Suite", L"C:\\Suite"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(std::wstring(c[2]), AppendPathEntry(c[0], c[1]).c_str()) << Narrow(c[0]);
    }
}

}  // namespace
