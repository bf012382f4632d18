// Moving shortcuts between folders, and the system profile folder a 32-bit
// process running as the system account reaches on 64-bit Windows (both
// reached by updateshortcuts only in that setting, which Wine cannot give).
#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "cleanup/link_folder.h"
#include "cleanup/shortcut_places.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"

namespace {

using Names = std::vector<std::wstring>;

struct MoveCase {
    const char* name;
    Names source;
    const wchar_t* linkName;
    Names moved;
    Names left;
    bool sourceStays;
};

const MoveCase kMoveCases[] = {
    {"all shortcuts, the emptied folder goes",
     {L"A.lnk", L"B.lnk"},
     nullptr,
     {L"A.lnk", L"B.lnk"},
     {},
     false},
    {"only the named one, any case",
     {L"A.lnk", L"B.lnk", L"c.txt"},
     L"a",
     {L"A.lnk"},
     {L"B.lnk", L"c.txt"},
     true},
    {"a named move never removes its folder (a desktop)", {L"A.lnk"}, L"A", {L"A.lnk"}, {}, true},
};

class MoveLinkTargetIconTest : public ::testing::TestWithParam<MoveCase> {};

TEST_P(MoveLinkTargetIconTest, MovesTheChosenShortcuts) {
    const MoveCase& c = GetParam();
    SCOPED_TRACE(c.name);
    ScratchDir scratch;
    std::wstring source = scratch.Sub(L"source", true);
    std::wstring destination = scratch.Sub(L"destination");
    for (const std::wstring& name : c.source) {
        ASSERT_TRUE(WriteFileBytes(JoinPath(source, name), Narrow(name)));
    }
    MoveLinkTargetIcon(nullptr, source.c_str(), destination.c_str(), c.linkName);
    EXPECT_EQ(c.moved, ListDir(destination));
    for (const std::wstring& name : c.moved) {
        EXPECT_EQ(Narrow(name), ReadFileBytes(JoinPath(destination, name)));
    }
    EXPECT_EQ(c.sourceStays, DirExists(source));
    EXPECT_EQ(c.left, ListDir(source));
}

INSTANTIATE_TEST_SUITE_P(Cases, MoveLinkTargetIconTest, ::testing::ValuesIn(kMoveCases));

TEST(Wow64ProfileFolderTest, TakesThePathFromConfigOnIntoTheWow64Folder) {
    CStringEx folder;
    EXPECT_TRUE(Wow64ProfileFolder(L"C:\\Windows\\SysWOW64",
                                   L"C:\\Windows\\system32\\config\\systemprofile\\Desktop",
                                   folder));
    EXPECT_STREQ(L"C:\\Windows\\SysWOW64\\config\\systemprofile\\Desktop", folder.c_str());
    // An ordinary user's own folder.
    EXPECT_FALSE(Wow64ProfileFolder(L"C:\\Windows\\SysWOW64", L"C:\\Users\\ann\\Desktop", folder));
}

}  // namespace
