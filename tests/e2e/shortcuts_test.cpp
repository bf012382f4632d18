// The shortcut keywords end to end, each shortcut read back through the shell
// link object: where addshortcuts puts them and what they point at, how
// updateshortcuts renames an older release's shortcuts and which job follows,
// and what delshortcuts (and delunuseddata) removes and leaves. Only the
// scratch prefix's own folders are used: its desktop is a real folder there.
#include <windows.h>
#include <objbase.h>
#include <shlobj.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include "cleanup/shell_link.h"
#include "tests/e2e/suite_install.h"
#include "tests/support/host_link.h"
#include "tests/support/machine_fixture.h"

namespace {

using namespace suite_install;

const REGSAM k64 = KEY_WOW64_64KEY;
const wchar_t kProductCode[] = L"{6F1B2C3D-4E5F-4A6B-8C7D-9E0F1A2B3C4D}";
const wchar_t kDefaultFolder[] = L"Mirovan Meetings";
const wchar_t kSuiteFolder[] = L"Mirovan Meeting Center";  // string 3145
const wchar_t kCompanionName[] = L"Mirovan Meeting Center";
const wchar_t kOneClickLink[] = L"Mirovan Meetings.lnk";
const wchar_t kSettingsLink[] = L"Quillmark Tools Settings.lnk";
const wchar_t kHelpLink[] = L"Quillmark Tools Help.lnk";
const wchar_t kUninstallLink[] = L"Uninstall Quillmark Tools.lnk";
const wchar_t kMsiexec[] = L"C:\\windows\\syswow64\\msiexec.exe";
const wchar_t kNotepad[] = L"C:\\windows\\notepad.exe";

std::wstring ShellFolder(int csidl) {
    wchar_t path[MAX_PATH] = {};
    SHGetFolderPathW(nullptr, csidl, nullptr, SHGFP_TYPE_DEFAULT, path);
    return path;
}

std::wstring Upper(std::wstring text) {
    CharUpperW(&text[0]);
    return text;
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
    ShortcutsTest()
        : m_root(Program().folder()),
          m_userPrograms(ShellFolder(CSIDL_PROGRAMS)),
          m_commonPrograms(ShellFolder(CSIDL_COMMON_PROGRAMS)),
          m_userDesktop(ShellFolder(CSIDL_DESKTOP)),
          m_commonDesktop(ShellFolder(CSIDL_COMMON_DESKTOPDIRECTORY)) {
        CoInitialize(nullptr);
        InstallSuite(m_root, kProductCode);
    }

    ~ShortcutsTest() override {
        for (const std::wstring& programs : {m_userPrograms, m_commonPrograms}) {
            for (const wchar_t* folder : {kDefaultFolder, kSuiteFolder, L"Other Vendor"}) {
                RemoveTree(JoinPath(programs, folder));
            }
            for (const std::wstring& name : ListDir(programs)) {
                if (name.size() > 4 && Upper(name.substr(name.size() - 4)) == L".LNK") {
                    RemoveTree(JoinPath(programs, name));
                }
            }
        }
        for (const std::wstring& desktop : {m_userDesktop, m_commonDesktop}) {
            for (const std::wstring& name : ListDir(desktop)) {
                RemoveTree(JoinPath(desktop, name));
            }
        }
        CoUninitialize();
    }

    void SetUp() override {
        // Never the host's home folder behind a linked desktop.
        ASSERT_EQ(0u, GetFileAttributesW(m_userDesktop.c_str()) & FILE_ATTRIBUTE_REPARSE_POINT);
    }

    std::wstring InRoot(const wchar_t* name) const { return JoinPath(m_root, name); }

    std::vector<ExpectedLink> SuiteLinks() const {
        return {
            {kOneClickLink, InRoot(L"qmoneclk.exe"), L"", InRoot(L"qmoneclk.exe"), 0},
            {kSettingsLink, InRoot(L"qminst.exe"), L"/OpenSetting=1", InRoot(L"qmRes.dll"), 3},
            {kHelpLink, InRoot(L"qminst.exe"), L"/help for quillmark tools", InRoot(L"qmRes.dll"),
             2},
            {kUninstallLink, kMsiexec, std::wstring(L"/x ") + kProductCode, L"", 0},
        };
    }

    void ExpectLink(const std::wstring& folder, const ExpectedLink& expected) {
        std::wstring path = JoinPath(folder, expected.name);
        SCOPED_TRACE(Narrow(path));
        LinkFields link;
        ASSERT_HRESULT_SUCCEEDED(ReadLink(nullptr, path.c_str(), link));
        EXPECT_EQ(Upper(expected.target), Upper(link.target.c_str()));
        EXPECT_EQ(expected.arguments, link.arguments.c_str());
        EXPECT_EQ(Upper(m_root), Upper(link.workingDir.c_str()));
        // Wine reports a shortcut without an icon as having its target's.
        std::wstring icon = expected.iconPath.empty() ? expected.target : expected.iconPath;
        EXPECT_EQ(Upper(icon), Upper(link.iconPath.c_str()));
        EXPECT_EQ(expected.iconIndex, link.iconIndex);
    }

    void ExpectSuiteFolder(const std::wstring& folder) {
        std::vector<std::wstring> names;
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
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }

    std::wstring m_root;
    std::wstring m_userPrograms;
    std::wstring m_commonPrograms;
    std::wstring m_userDesktop;
    std::wstring m_commonDesktop;
};

// Where addshortcuts puts the Start-menu shortcuts, by what names the
// companion application.
struct FolderCase {
    const char* name;
    int code;  // the companion's upgrade code, -1 for none
    REGSAM view;
    const wchar_t* appName;  // "AppName", or null
    bool displayNameIsText;
    const wchar_t* expectedFolder;
};

const FolderCase kFolderCases[] = {
    {"no companion, no AppName", -1, 0, nullptr, true, kDefaultFolder},
    {"first upgrade code, 64-bit view", 0, k64, nullptr, true, kSuiteFolder},
    {"first upgrade code is not looked up in the 32-bit view", 0, 0, nullptr, true, kDefaultFolder},
    {"last upgrade code, 32-bit view", 3, 0, nullptr, true, kSuiteFolder},
    {"AppName only", -1, 0, L"Mirovan", true, kSuiteFolder},
    {"DisplayName not a string", 1, k64, nullptr, false, kDefaultFolder},
};

class AddShortcutsTest : public ShortcutsTest, public ::testing::WithParamInterface<FolderCase> {};

TEST_P(AddShortcutsTest, CreatesTheSuiteShortcutsInTheCompanionsFolder) {
    const FolderCase& c = GetParam();
    SCOPED_TRACE(c.name);
    std::unique_ptr<InstalledProduct> companion;
    if (c.code >= 0) {
        companion = std::make_unique<InstalledProduct>(c.code, c.view, c.view);
        if (c.displayNameIsText) {
            RegPutString(HKEY_LOCAL_MACHINE, kUninstallEntry, L"DisplayName", kCompanionName,
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
    const wchar_t* otherFolder = c.expectedFolder == kSuiteFolder ? kDefaultFolder : kSuiteFolder;
    for (const std::wstring& programs : {m_userPrograms, m_commonPrograms}) {
        ExpectSuiteFolder(JoinPath(programs, c.expectedFolder));
        EXPECT_FALSE(DirExists(JoinPath(programs, otherFolder)));
    }
    // The one-click shortcut on the common desktop, and so not on the user's.
    EXPECT_EQ(std::vector<std::wstring>{kOneClickLink}, ListDir(m_commonDesktop));
    ExpectLink(m_commonDesktop, SuiteLinks()[0]);
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

INSTANTIATE_TEST_SUITE_P(Folders, AddShortcutsTest, ::testing::ValuesIn(kFolderCases),
                         [](const ::testing::TestParamInfo<FolderCase>& info) {
                             return "Case" + std::to_string(info.index);
                         });

// Texts that cannot name a file and a product code that is not a string:
// whatever cannot be named is left out, and nothing lands in the program
// folders themselves.
struct BrokenCase {
    const char* name;
    bool companion;  // the folder name then comes from the missing string 3145
    bool productCodeIsText;
    std::vector<std::wstring> expectedInDefaultFolder;
};

const BrokenCase kBrokenCases[] = {
    {"texts missing or 260 characters long", false, true, {kUninstallLink}},
    {"folder name missing", true, true, {}},
    {"product code not a string", false, false, {}},
};

class BrokenInputTest : public ShortcutsTest, public ::testing::WithParamInterface<BrokenCase> {};

TEST_P(BrokenInputTest, CreatesOnlyWhatItCanName) {
    const BrokenCase& c = GetParam();
    SCOPED_TRACE(c.name);
    UseTexts(m_root, L"badtexts\\");
    std::unique_ptr<InstalledProduct> companion;
    if (c.companion) {
        companion = std::make_unique<InstalledProduct>(0, k64, k64);
        RegPutString(HKEY_LOCAL_MACHINE, kUninstallEntry, L"DisplayName", kCompanionName, k64);
    }
    if (!c.productCodeIsText) {
        UseTexts(m_root);
        RegPutDword(HKEY_LOCAL_MACHINE, kSuiteKey, L"ProductCode", 1);
    }
    std::vector<std::wstring> userProgramsBefore = ListDir(m_userPrograms);
    std::vector<std::wstring> commonProgramsBefore = ListDir(m_commonPrograms);
    RunKeyword(L"addshortcuts");
    for (const std::wstring& programs : {m_userPrograms, m_commonPrograms}) {
        std::wstring folder = JoinPath(programs, kDefaultFolder);
        EXPECT_EQ(c.expectedInDefaultFolder, ListDir(folder));
        EXPECT_FALSE(DirExists(JoinPath(programs, kSuiteFolder)));
    }
    if (c.expectedInDefaultFolder.empty()) {
        EXPECT_EQ(userProgramsBefore, ListDir(m_userPrograms));
        EXPECT_EQ(commonProgramsBefore, ListDir(m_commonPrograms));
    } else {
        ExpectLink(JoinPath(m_userPrograms, kDefaultFolder), SuiteLinks()[3]);
    }
    EXPECT_TRUE(ListDir(m_commonDesktop).empty());
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

INSTANTIATE_TEST_SUITE_P(Inputs, BrokenInputTest, ::testing::ValuesIn(kBrokenCases),
                         [](const ::testing::TestParamInfo<BrokenCase>& info) {
                             return "Case" + std::to_string(info.index);
                         });

TEST_F(ShortcutsTest, UpdateRenamesAnOlderReleasesShortcutsAndMovesThemToTheSuiteFolder) {
    // An older release's shortcuts, under old names and with old icons, in
    // the folder named after the companion's product (there is no companion).
    const wchar_t* oldIcon = L"C:\\old\\icons.dll";
    for (const std::wstring& programs : {m_userPrograms, m_commonPrograms}) {
        std::wstring folder = JoinPath(programs, kDefaultFolder);
        Plant(folder, L"Join.lnk", InRoot(L"qmoneclk.exe"), nullptr, oldIcon, 5);
        Plant(folder, L"Options.lnk", InRoot(L"qminst.exe"), L"/OpenSetting=1", oldIcon, 6);
        Plant(folder, L"Guide.lnk", InRoot(L"qminst.exe"), L"/help for quillmark tools", oldIcon,
              7);
    }
    Plant(m_commonDesktop, L"Join.lnk", InRoot(L"qmoneclk.exe"), nullptr, oldIcon, 5);

    RunResult run = RunKeyword(L"updateshortcuts");
    EXPECT_TRUE(run.HasTrace(" qmmirovanoni.exe: Call udpateshortlinks.\n,\n"));
    std::vector<ExpectedLink> current = SuiteLinks();
    for (const std::wstring& programs : {m_userPrograms, m_commonPrograms}) {
        std::wstring oldFolder = JoinPath(programs, kDefaultFolder);
        std::wstring newFolder = JoinPath(programs, kSuiteFolder);
        EXPECT_FALSE(DirExists(oldFolder));
        std::vector<std::wstring> expected = {L"Guide.lnk", kOneClickLink, kSettingsLink};
        EXPECT_EQ(expected, ListDir(newFolder));
        ExpectLink(newFolder, current[0]);
        ExpectLink(newFolder, current[1]);
        ExpectLink(newFolder,
                   {L"Guide.lnk", InRoot(L"qminst.exe"), L"/help for quillmark tools", oldIcon, 7});
        EXPECT_TRUE(run.HasTrace("MoveLinkTargetIcon lpszLinkSrcDir=" + Narrow(oldFolder) +
                                 ",lpszLinkDesDir=" + Narrow(newFolder) + ",lpszIconName=,\n"));
    }
    EXPECT_EQ(std::vector<std::wstring>{kOneClickLink}, ListDir(m_commonDesktop));
    ExpectLink(m_commonDesktop, current[0]);
    // A desktop shortcut was renamed: the shortcuts are moved, not added.
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

// Which job follows the renames: shortcuts are added again only when both
// desktops hold shortcuts and none had to be renamed.
struct FollowUpCase {
    const char* name;
    bool userDesktopHoldsAShortcut;
    bool addShortcutsRuns;
};

const FollowUpCase kFollowUpCases[] = {
    {"both desktops hold shortcuts, none renamed", true, true},
    {"the user's desktop holds none", false, false},
};

class UpdateFollowUpTest : public ShortcutsTest,
                           public ::testing::WithParamInterface<FollowUpCase> {};

TEST_P(UpdateFollowUpTest, AddsShortcutsOnlyWhenNoDesktopShortcutWasRenamed) {
    const FollowUpCase& c = GetParam();
    SCOPED_TRACE(c.name);
    Plant(m_commonDesktop, kOneClickLink, InRoot(L"qmoneclk.exe"));
    if (c.userDesktopHoldsAShortcut) {
        Plant(m_userDesktop, L"Notepad.lnk", kNotepad);
    }
    RunKeyword(L"updateshortcuts");
    for (const std::wstring& programs : {m_userPrograms, m_commonPrograms}) {
        EXPECT_EQ(c.addShortcutsRuns, DirExists(JoinPath(programs, kDefaultFolder)));
    }
    EXPECT_EQ(std::vector<std::wstring>{kOneClickLink}, ListDir(m_commonDesktop));
}

INSTANTIATE_TEST_SUITE_P(Desktops, UpdateFollowUpTest, ::testing::ValuesIn(kFollowUpCases),
                         [](const ::testing::TestParamInfo<FollowUpCase>& info) {
                             return "Case" + std::to_string(info.index);
                         });

// delshortcuts and delunuseddata remove the suite's shortcuts (the uninstall
// shortcut whatever its arguments) and nothing else: not a qminst.exe
// shortcut with other arguments, another program's shortcut, files that are
// no shortcuts or whose targets are missing or too long, nor a shortcut in
// another vendor's folder. A folder left empty goes.
class RemoveShortcutsTest : public ShortcutsTest,
                            public ::testing::WithParamInterface<const wchar_t*> {};

TEST_P(RemoveShortcutsTest, RemovesOnlyTheSuitesShortcuts) {
    RunKeyword(L"addshortcuts");
    std::wstring userFolder = JoinPath(m_userPrograms, kDefaultFolder);
    ASSERT_TRUE(DirExists(userFolder));
    Plant(userFolder, L"Repair.lnk", kMsiexec, L"/fa {00000000-0000-0000-0000-000000000000}");
    Plant(userFolder, L"Log.lnk", InRoot(L"qminst.exe"), L"/log");
    Plant(userFolder, L"Notepad.lnk", kNotepad);
    Plant(userFolder, L"Gone.lnk", InRoot(L"gone.exe"));
    Plant(userFolder, L"Long.lnk", m_root + L"\\" + std::wstring(280, L'x') + L".exe");
    ASSERT_TRUE(WriteFileBytes(JoinPath(userFolder, L"Broken.lnk"), "not a shortcut"));
    std::wstring otherVendor = JoinPath(m_userPrograms, L"Other Vendor");
    Plant(otherVendor, kOneClickLink, InRoot(L"qmoneclk.exe"));
    Plant(m_commonDesktop, L"Notepad.lnk", kNotepad);
    // Written in short form, as Windows reads every shortcut's target.
    wchar_t shortTarget[MAX_PATH] = {};
    ASSERT_NE(0u, GetShortPathNameW(InRoot(L"qmoneclk.exe").c_str(), shortTarget, MAX_PATH));
    ASSERT_NE(InRoot(L"qmoneclk.exe"), shortTarget);
    Plant(m_userDesktop, L"Join.lnk", shortTarget, L"/now");

    RunKeyword(GetParam());
    std::vector<std::wstring> kept = {L"Broken.lnk", L"Gone.lnk", L"Log.lnk", L"Long.lnk",
                                      L"Notepad.lnk"};
    EXPECT_EQ(kept, ListDir(userFolder));
    EXPECT_FALSE(DirExists(JoinPath(m_commonPrograms, kDefaultFolder)));
    EXPECT_EQ(std::vector<std::wstring>{kOneClickLink}, ListDir(otherVendor));
    EXPECT_EQ(std::vector<std::wstring>{L"Notepad.lnk"}, ListDir(m_commonDesktop));
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

INSTANTIATE_TEST_SUITE_P(Keywords, RemoveShortcutsTest,
                         ::testing::Values(L"delshortcuts", L"delunuseddata"));

// A Start-menu folder of the suite that is a link planted by the user: no
// shortcut is written through it, and none it leads to is deleted.
TEST_F(ShortcutsTest, NoShortcutWorkGoesThroughAPlantedLink) {
    std::wstring elsewhere = m_scratch.Sub(L"elsewhere", true);
    Plant(elsewhere, L"Join.lnk", InRoot(L"qmoneclk.exe"));
    HostLink planted(JoinPath(m_userPrograms, kDefaultFolder), elsewhere);
    ASSERT_TRUE(planted.ok());
    for (const wchar_t* keyword : {L"addshortcuts", L"updateshortcuts", L"delshortcuts"}) {
        RunResult run = RunKeyword(keyword);
        EXPECT_TRUE(run.HasTraceContaining("refused to go through a reparse point"))
            << Narrow(keyword);
        EXPECT_EQ(std::vector<std::wstring>{L"Join.lnk"}, ListDir(elsewhere)) << Narrow(keyword);
    }
}

}  // namespace
