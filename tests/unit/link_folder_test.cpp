// Moving shortcuts to the common folders, and the system profile folder a
// 32-bit process running as the system account reaches on 64-bit Windows:
// updateshortcuts does both only in that setting, which Wine cannot give.
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

// A named move (a desktop's one shortcut) takes only that one, in any case,
// and never removes its folder, emptied or not.
TEST(MoveLinkTargetIconTest, NamedMoveTakesOnlyThatShortcutAndKeepsTheFolder) {
    for (const Names& others : {Names{L"B.lnk", L"c.txt"}, Names{}}) {
        ScratchDir scratch;
        const std::wstring source = scratch.Sub(L"source", true);
        const std::wstring destination = scratch.Sub(L"destination");
        for (const std::wstring& name : others) {
            WriteFileBytes(JoinPath(source, name), "other");
        }
        WriteFileBytes(JoinPath(source, L"A.lnk"), "moved");
        MoveLinkTargetIcon(nullptr, source.c_str(), destination.c_str(), L"a");
        EXPECT_EQ(Names{L"A.lnk"}, ListDir(destination));
        EXPECT_EQ("moved", ReadFileBytes(JoinPath(destination, L"A.lnk")));
        EXPECT_TRUE(DirExists(source));
        EXPECT_EQ(others, ListDir(source));
    }
}

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
