// The shortcut keywords end to end, the shortcuts read back through the shell
// link object: where addshortcuts puts them and what they point at, how
// updateshortcuts renames an older release's shortcuts and which job follows,
// and what delshortcuts and delunuseddata remove and leave.
#include <windows.h>
#include <objbase.h>
#include <shlobj.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "cleanup/shell_link.h"
#include "tests/e2e/suite_install.h"
#include "tests/support/host_link.h"
#include "tests/support/machine_fixture.h"

namespace {

using namespace suite_install;
using Names = std::vector<std::wstring>;

const REGSAM k64 = KEY_WOW64_64KEY;
const wchar_t kProductCode[] = L"{6F1B2C3D-4E5F-4A6B-8C7D-9E0F1A2B3C4D}";
const wchar_t kDefaultFolder[] = L"Mirovan Meetings";
const wchar_t kSuiteFolder[] = L"Mirovan Meeting Center";  // string 3145
const wchar_t kOneClickLink[] = L"Mirovan Meetings.lnk";
const wchar_t kSettingsLink[] = L"Quillmark Tools Settings.lnk";
const wchar_t kUninstallLink[] = L"Uninstall Quillmark Tools.lnk";
const wchar_t kMsiexec[] = L"C:\\windows\\syswow64\\msiexec.exe";
const wchar_t kNotepad[] = L"C:\\windows\\notepad.exe";

std::wstring ShellFolder(int csidl) {
    wchar_t path[MAX_PATH] = {};
    SHGetFolderPathW(nullptr, csidl, nullptr, SHGFP_TYPE_DEFAULT, path);
    return path;
}

struct ExpectedLink {
    const wchar_t* name;
    std::wstring target;
    std::wstring arguments;
    std::wstring iconPath;
    int iconIndex;
};

class ShortcutsTest : public MachineTest {
protected:
    ShortcutsTest() : m_root(Program().folder()) {
        CoInitialize(nullptr);
        InstallSuite(m_root, kProductCode);
    }
    ~ShortcutsTest() override {
        for (const std::wstring& programs : m_programs) {
            for (const wchar_t* folder : {kDefaultFolder, kSuiteFolder, L"Other Vendor"}) {
                RemoveTree(JoinPath(programs, folder));
            }
        }
        for (const std::wstring& desktop : {m_userDesktop, m_commonDesktop}) {
            for (const std::wstring& name : ListDir(desktop)) {
                RemoveTree(JoinPath(desktop, name));
            }
        }
        RemoveProducts();
        CoUninitialize();
    }
    void SetUp() override {
        // The prefix's own desktop folder, never the host's home behind a link.
        ASSERT_EQ(0u, GetFileAttributesW(m_userDesktop.c_str()) & FILE_ATTRIBUTE_REPARSE_POINT);
    }

    std::wstring InRoot(const wchar_t* name) const { return JoinPath(m_root, name); }

    std::vector<ExpectedLink> SuiteLinks() const {
        std::wstring oneClick = InRoot(L"qmoneclk.exe");
        return {
            {kOneClickLink, oneClick, L"", oneClick, 0},
            {kSettingsLink, InRoot(L"qminst.exe"), L"/OpenSetting=1", InRoot(L"qmRes.dll"), 3},
            {L"Quillmark Tools Help.lnk", InRoot(L"qminst.exe"), L"/help for quillmark tools",
             InRoot(L"qmRes.dll"), 2},
            {kUninstallLink, kMsiexec, std::wstring(L"/x ") + kProductCode, L"", 0},
        };
    }

    void ExpectLink(const std::wstring& folder, const ExpectedLink& expected) {
        std::wstring path = JoinPath(folder, expected.name);
        SCOPED_TRACE(Narrow(path));
        LinkFields link;
        ASSERT_HRESULT_SUCCEEDED(ReadLink(nullptr, path.c_str(), link));
        EXPECT_STRCASEEQ(Narrow(expected.target).c_str(), Narrow(link.target.c_str()).c_str());
        EXPECT_STREQ(expected.arguments.c_str(), link.arguments.c_str());
        EXPECT_STRCASEEQ(Narrow(m_root).c_str(), Narrow(link.workingDir.c_str()).c_str());
        // Wine reports a shortcut without an icon as having its target's.
        const std::wstring& icon = expected.iconPath.empty() ? expected.target : expected.iconPath;
        EXPECT_STRCASEEQ(Narrow(icon).c_str(), Narrow(link.iconPath.c_str()).c_str());
        EXPECT_EQ(expected.iconIndex, link.iconIndex);
    }

    void ExpectSuiteFolder(const std::wstring& folder) {
        Names names;
        for (const ExpectedLink& link : SuiteLinks()) {
            names.push_back(link.name);
            ExpectLink(folder, link);
        }
        std::sort(names.begin(), names.end());
        EXPECT_EQ(names, ListDir(folder));
    }

    void Plant(const std::wstring& folder, const wchar_t* name, const std::wstring& target,
               const wchar_t* arguments = nullptr, const wchar_t* icon = nullptr, int index = 0) {
        MakeDirs(folder);
        ASSERT_HRESULT_SUCCEEDED(CreateLink(nullptr, folder.c_str(), target.c_str(),
                                            JoinPath(folder, name).c_str(), arguments, icon, index,
                                            m_root.c_str()));
    }

    RunResult RunKeyword(const wchar_t* keyword) {
        RunResult run = Program().Run(std::wstring(L"-") + keyword);
        EXPECT_FALSE(run.crashed || run.timedOut) << Narrow(keyword);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }

    std::wstring m_root;
    const std::wstring m_programs[2] = {ShellFolder(CSIDL_PROGRAMS),
                                        ShellFolder(CSIDL_COMMON_PROGRAMS)};
    const std::wstring m_userDesktop = ShellFolder(CSIDL_DESKTOP);
    const std::wstring m_commonDesktop = ShellFolder(CSIDL_COMMON_DESKTOPDIRECTORY);
};

// The Start-menu folder, by how the companion application is registered.
struct FolderCase {
    int code;  // its upgrade code, -1 for none
    REGSAM view;
    const wchar_t* displayName;  // null: a number instead of a name
    const wchar_t* appName;      // the suite's "AppName", or null
    const wchar_t* expectedFolder;
};

const FolderCase kFolderCases[] = {
    {-1, 0, nullptr, nullptr, kDefaultFolder},    // none
    {0, k64, L"Mirovan", nullptr, kSuiteFolder},  // the first code, 64-bit view
    {0, 0, L"Mirovan", nullptr, kDefaultFolder},  // the first code is not looked up in 32 bits
    {3, 0, L"Mirovan", nullptr, kSuiteFolder},    // the last code, 32-bit view
    {-1, 0, nullptr, L"Mirovan", kSuiteFolder},   // "AppName" only
    {1, k64, nullptr, nullptr, kDefaultFolder},   // a "DisplayName" that is no text
};

class AddShortcutsTest : public ShortcutsTest, public ::testing::WithParamInterface<FolderCase> {};

TEST_P(AddShortcutsTest, CreatesTheSuiteShortcutsInTheCompanionsFolder) {
    const FolderCase& c = GetParam();
    if (c.code >= 0) {
        RegisterProduct(c.code, c.view, c.view);
        if (c.displayName != nullptr) {
            RegPutString(HKEY_LOCAL_MACHINE, kUninstallEntry, L"DisplayName", c.displayName,
                         c.view);
        } else {
            RegPutDword(HKEY_LOCAL_MACHINE, kUninstallEntry, L"DisplayName", 1, c.view);
        }
    }
    if (c.appName != nullptr) {
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\Uninstall", L"AppName", c.appName);
    }
    RunResult run = RunKeyword(L"addshortcuts");
    EXPECT_TRUE(run.HasTrace(" qmmirovanoni.exe: Call addshortcutslinks.\n,\n"));
    const wchar_t* other = c.expectedFolder == kSuiteFolder ? kDefaultFolder : kSuiteFolder;
    for (const std::wstring& programs : m_programs) {
        ExpectSuiteFolder(JoinPath(programs, c.expectedFolder));
        EXPECT_FALSE(DirExists(JoinPath(programs, other)));
    }
    // The one-click shortcut on the common desktop, and so not on the user's.
    EXPECT_EQ(Names{kOneClickLink}, ListDir(m_commonDesktop));
    ExpectLink(m_commonDesktop, SuiteLinks()[0]);
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

INSTANTIATE_TEST_SUITE_P(Folders, AddShortcutsTest, ::testing::ValuesIn(kFolderCases));

// Texts that cannot name a file (missing, or 260 characters long) and a
// product code that is no text: what cannot be named is left out, and
// nothing lands in the program folders themselves.
struct BrokenCase {
    bool companion;  // the folder is then named by the missing string 3145
    bool productCodeIsText;
    Names inDefaultFolder;
};

const BrokenCase kBrokenCases[] = {
    {false, true, {kUninstallLink}},
    {true, true, {}},
    {false, false, {}},
};

class BrokenInputTest : public ShortcutsTest, public ::testing::WithParamInterface<BrokenCase> {};

TEST_P(BrokenInputTest, CreatesOnlyWhatItCanName) {
    const BrokenCase& c = GetParam();
    UseTexts(m_root, c.productCodeIsText ? L"badtexts\\" : L"");
    if (c.companion) {
        RegisterProduct(0, k64, k64);
        RegPutString(HKEY_LOCAL_MACHINE, kUninstallEntry, L"DisplayName", L"Mirovan", k64);
    }
    if (!c.productCodeIsText) {
        RegPutDword(HKEY_LOCAL_MACHINE, kSuiteKey, L"ProductCode", 1);
    }
    const Names before[] = {ListDir(m_programs[0]), ListDir(m_programs[1])};
    RunKeyword(L"addshortcuts");
    for (int i = 0; i < 2; ++i) {
        EXPECT_EQ(c.inDefaultFolder, ListDir(JoinPath(m_programs[i], kDefaultFolder)));
        Names after = ListDir(m_programs[i]);
        after.erase(std::remove(after.begin(), after.end(), kDefaultFolder), after.end());
        EXPECT_EQ(before[i], after);
    }
    EXPECT_TRUE(ListDir(m_commonDesktop).empty());
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

INSTANTIATE_TEST_SUITE_P(Inputs, BrokenInputTest, ::testing::ValuesIn(kBrokenCases));

TEST_F(ShortcutsTest, UpdateRenamesAnOlderReleasesShortcutsAndMovesThemToTheSuiteFolder) {
    // An older release's shortcuts, under old names and with old icons, in
    // the folder named after the companion's product (there is no companion).
    const wchar_t* oldIcon = L"C:\\old\\icons.dll";
    const ExpectedLink help = {L"Guide.lnk", InRoot(L"qminst.exe"), L"/help for quillmark tools",
                               oldIcon, 7};
    for (const std::wstring& programs : m_programs) {
        std::wstring folder = JoinPath(programs, kDefaultFolder);
        Plant(folder, L"Join.lnk", InRoot(L"qmoneclk.exe"), nullptr, oldIcon, 5);
        Plant(folder, L"Options.lnk", InRoot(L"qminst.exe"), L"/OpenSetting=1", oldIcon, 6);
        Plant(folder, help.name, help.target, help.arguments.c_str(), oldIcon, 7);
    }
    Plant(m_commonDesktop, L"Join.lnk", InRoot(L"qmoneclk.exe"), nullptr, oldIcon, 5);

    RunResult run = RunKeyword(L"updateshortcuts");
    EXPECT_TRUE(run.HasTrace(" qmmirovanoni.exe: Call udpateshortlinks.\n,\n"));
    for (const std::wstring& programs : m_programs) {
        std::wstring oldFolder = JoinPath(programs, kDefaultFolder);
        std::wstring newFolder = JoinPath(programs, kSuiteFolder);
        EXPECT_FALSE(DirExists(oldFolder));
        EXPECT_EQ((Names{L"Guide.lnk", kOneClickLink, kSettingsLink}), ListDir(newFolder));
        ExpectLink(newFolder, SuiteLinks()[0]);
        ExpectLink(newFolder, SuiteLinks()[1]);
        ExpectLink(newFolder, help);
        EXPECT_TRUE(run.HasTrace("MoveLinkTargetIcon lpszLinkSrcDir=" + Narrow(oldFolder) +
                                 ",lpszLinkDesDir=" + Narrow(newFolder) + ",lpszIconName=,\n"));
    }
    EXPECT_EQ(Names{kOneClickLink}, ListDir(m_commonDesktop));
    ExpectLink(m_commonDesktop, SuiteLinks()[0]);
    // A desktop shortcut was renamed: the shortcuts are moved, not added.
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

// The job after the renames: shortcuts are added only when both desktops
// hold shortcuts and none was renamed (parameter: the user's desktop holds
// one); else they are moved.
class UpdateFollowUpTest : public ShortcutsTest, public ::testing::WithParamInterface<bool> {};

TEST_P(UpdateFollowUpTest, AddsShortcutsOnlyWhenNoDesktopShortcutWasRenamed) {
    Plant(m_commonDesktop, kOneClickLink, InRoot(L"qmoneclk.exe"));
    if (GetParam()) {
        Plant(m_userDesktop, L"Notepad.lnk", kNotepad);
    }
    RunKeyword(L"updateshortcuts");
    for (const std::wstring& programs : m_programs) {
        EXPECT_EQ(GetParam(), DirExists(JoinPath(programs, kDefaultFolder)));
    }
    EXPECT_EQ(Names{kOneClickLink}, ListDir(m_commonDesktop));
}

INSTANTIATE_TEST_SUITE_P(Desktops, UpdateFollowUpTest, ::testing::Bool());

// The suite's shortcuts go (the uninstall shortcut whatever its arguments,
// the one-click shortcut on the desktops), nothing else: not a qminst.exe
// shortcut with other arguments, another program's shortcut, files that are
// no shortcuts or whose targets are missing or too long, nor a shortcut in
// another vendor's folder. A folder left empty goes.
class RemoveShortcutsTest : public ShortcutsTest,
                            public ::testing::WithParamInterface<const wchar_t*> {};

TEST_P(RemoveShortcutsTest, RemovesOnlyTheSuitesShortcuts) {
    RunKeyword(L"addshortcuts");
    std::wstring folder = JoinPath(m_programs[0], kDefaultFolder);
    Plant(folder, L"Repair.lnk", kMsiexec, L"/fa {00000000-0000-0000-0000-000000000000}");
    Plant(folder, L"Log.lnk", InRoot(L"qminst.exe"), L"/log");
    Plant(folder, L"Notepad.lnk", kNotepad);
    Plant(folder, L"Gone.lnk", InRoot(L"gone.exe"));
    Plant(folder, L"Long.lnk", m_root + L"\\" + std::wstring(280, L'x') + L".exe");
    ASSERT_TRUE(WriteFileBytes(JoinPath(folder, L"Broken.lnk"), "not a shortcut"));
    std::wstring otherVendor = JoinPath(m_programs[0], L"Other Vendor");
    Plant(otherVendor, kOneClickLink, InRoot(L"qmoneclk.exe"));
    Plant(m_commonDesktop, L"Notepad.lnk", kNotepad);
    // Written in short form, as Windows reads every shortcut's target.
    wchar_t shortTarget[MAX_PATH] = {};
    ASSERT_NE(0u, GetShortPathNameW(InRoot(L"qmoneclk.exe").c_str(), shortTarget, MAX_PATH));
    ASSERT_NE(InRoot(L"qmoneclk.exe"), shortTarget);
    Plant(m_userDesktop, L"Join.lnk", shortTarget, L"/now");

    RunKeyword(GetParam());
    EXPECT_EQ((Names{L"Broken.lnk", L"Gone.lnk", L"Log.lnk", L"Long.lnk", L"Notepad.lnk"}),
              ListDir(folder));
    EXPECT_FALSE(DirExists(JoinPath(m_programs[1], kDefaultFolder)));
    EXPECT_EQ(Names{kOneClickLink}, ListDir(otherVendor));
    EXPECT_EQ(Names{L"Notepad.lnk"}, ListDir(m_commonDesktop));
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

INSTANTIATE_TEST_SUITE_P(Keywords, RemoveShortcutsTest,
                         ::testing::Values(L"delshortcuts", L"delunuseddata"));

// A suite folder that the user replaced by a link: no shortcut is written
// through it, and none it leads to is renamed or deleted.
TEST_F(ShortcutsTest, NoShortcutWorkGoesThroughAPlantedLink) {
    std::wstring elsewhere = m_scratch.Sub(L"elsewhere", true);
    Plant(elsewhere, L"Join.lnk", InRoot(L"qmoneclk.exe"));
    HostLink planted(JoinPath(m_programs[0], kDefaultFolder), elsewhere);
    ASSERT_TRUE(planted.ok());
    for (const wchar_t* keyword : {L"addshortcuts", L"updateshortcuts", L"delshortcuts"}) {
        RunResult run = RunKeyword(keyword);
        EXPECT_TRUE(run.HasTraceContaining("refused to go through a reparse point"));
        EXPECT_EQ(Names{L"Join.lnk"}, ListDir(elsewhere)) << Narrow(keyword);
    }
}

}  // namespace
