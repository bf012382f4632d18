// The suite's shortcuts and the UI language the program starts in, end to
// end. The shortcuts are read back through the shell link object: where
// addshortcuts puts them and what they point at, how updateshortcuts renames
// an older release's shortcuts and which job follows, and what delshortcuts
// and delunuseddata remove and leave.
#include <windows.h>
#include <objbase.h>
#include <shlobj.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <optional>
#include <string>
#include <vector>

#include "cleanup/shell_link.h"
#include "tests/support/file_util.h"
#include "tests/support/host_link.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace {

using Names = std::vector<std::wstring>;

const REGSAM k64 = KEY_WOW64_64KEY;
const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kProductCode[] = L"{6F1B2C3D-4E5F-4A6B-8C7D-9E0F1A2B3C4D}";
const wchar_t kDefaultFolder[] = L"Mirovan Meetings";
const wchar_t kSuiteFolder[] = L"Mirovan Meeting Center";  // string 3145
const wchar_t kOneClickLink[] = L"Mirovan Meetings.lnk";
const wchar_t kMsiexec[] = L"C:\\windows\\syswow64\\msiexec.exe";
const wchar_t kNotepad[] = L"C:\\windows\\notepad.exe";
// The companion's or the suite's uninstall entry: its code {B3BE1A93-...}
// is the packed name under an upgrade code in RegisterProduct.
const std::wstring kUninstallEntry =
    L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\"
    L"{B3BE1A93-9C19-45B3-AE8D-F03E6C5680C4}";

std::wstring UpgradeKey(int code) {
    const wchar_t* const codes[] = {
        L"D246995CF3A71534DA5CB21A176B54E1", L"1A705790D0FBFFE4DBC7B0F099009CD9",
        L"01B86E973310E6B41B32D3838B0D7F54", L"B65785237423439438E10A099BA54F48"};
    return std::wstring(
               L"Software\\Microsoft\\Windows\\CurrentVersion\\Installer\\UpgradeCodes\\") +
           codes[code];
}

// The product under one of the suite's four upgrade codes (in upgradeView),
// with its uninstall entry (in entryView).
void RegisterProduct(int code, REGSAM upgradeView, REGSAM entryView) {
    RegPutString(HKEY_LOCAL_MACHINE, UpgradeKey(code), L"39A1EB3B91C93B54EAD80FE3C665084C", L"",
                 upgradeView);
    RegMakeKey(HKEY_LOCAL_MACHINE, kUninstallEntry, entryView);
}

void RemoveProducts() {
    for (REGSAM view : {REGSAM(0), k64}) {
        for (int code = 0; code < 4; ++code) {
            RegRemoveTree(HKEY_LOCAL_MACHINE, UpgradeKey(code), view);
        }
        RegRemoveTree(HKEY_LOCAL_MACHINE, kUninstallEntry, view);
    }
}

std::wstring ShellFolder(int csidl) {
    wchar_t path[MAX_PATH] = {};
    SHGetFolderPathW(nullptr, csidl, nullptr, SHGFP_TYPE_DEFAULT, path);
    return path;
}

// A shortcut as "name: target arguments | working folder | icon,index", in
// lower case (the shell hands paths back in any case).
std::wstring Describe(std::wstring name, const wchar_t* target, const wchar_t* arguments,
                      const wchar_t* folder, const wchar_t* icon, int index) {
    std::wstring text = name + L": " + target + L" " + arguments + L" | " + folder + L" | " + icon +
                        L"," + std::to_wstring(index);
    CharLowerW(&text[0]);
    return text;
}

// The shortcuts of folder, described.
Names Shortcuts(const std::wstring& folder) {
    Names shortcuts;
    for (const std::wstring& name : ListDir(folder)) {
        LinkFields link;
        EXPECT_HRESULT_SUCCEEDED(ReadLink(nullptr, JoinPath(folder, name).c_str(), link))
            << Narrow(name);
        shortcuts.push_back(Describe(name, link.target.c_str(), link.arguments.c_str(),
                                     link.workingDir.c_str(), link.iconPath.c_str(),
                                     link.iconIndex));
    }
    return shortcuts;
}

// The suite installed in the program's folder; the shell's folders emptied after.
class ShortcutsTest : public MachineTest {
protected:
    ShortcutsTest() : m_root(Program().folder()) { CoInitialize(nullptr); }
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
        Install(L"");
        // The prefix's own desktop folder, never the host's home behind a link.
        ASSERT_EQ(0u, GetFileAttributesW(m_userDesktop.c_str()) & FILE_ATTRIBUTE_REPARSE_POINT);
    }

    std::wstring InRoot(const wchar_t* name) const { return JoinPath(m_root, name); }

    // The suite's root folder: the programs the shortcuts point at and the
    // resource libraries of a stand-in release ("" or "badtexts\\").
    void Install(const std::wstring& texts) {
        for (const wchar_t* program : {L"qmoneclk.exe", L"qminst.exe"}) {
            CopyFileW(FakePath(program).c_str(), InRoot(program).c_str(), FALSE);
        }
        for (const wchar_t* library : {L"qmRes.dll", L"qmOI3Res.dll"}) {
            CopyFileW(FakePath((texts + library).c_str()).c_str(), InRoot(library).c_str(), FALSE);
        }
        RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", m_root);
        RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"ProductCode", kProductCode);
    }

    std::wstring Link(const wchar_t* name, const wchar_t* target, const wchar_t* arguments,
                      const wchar_t* icon, int index) const {
        return Describe(name, InRoot(target).c_str(), arguments, m_root.c_str(),
                        InRoot(icon).c_str(), index);
    }
    // The one-click, help, settings and uninstall shortcuts. Wine reports a
    // shortcut without an icon as having its target's.
    Names SuiteLinks() const {
        return {
            Link(kOneClickLink, L"qmoneclk.exe", L"", L"qmoneclk.exe", 0),
            Link(L"Quillmark Tools Help.lnk", L"qminst.exe", L"/help for quillmark tools",
                 L"qmRes.dll", 2),
            Link(L"Quillmark Tools Settings.lnk", L"qminst.exe", L"/OpenSetting=1", L"qmRes.dll",
                 3),
            Describe(L"Uninstall Quillmark Tools.lnk", kMsiexec,
                     (std::wstring(L"/x ") + kProductCode).c_str(), m_root.c_str(), kMsiexec, 0),
        };
    }

    void Plant(const std::wstring& folder, const wchar_t* name, const std::wstring& target,
               const wchar_t* arguments = nullptr, const wchar_t* icon = nullptr, int index = 0) {
        MakeDirs(folder);
        ASSERT_HRESULT_SUCCEEDED(CreateLink(nullptr, folder.c_str(), target.c_str(),
                                            JoinPath(folder, name).c_str(), arguments, icon, index,
                                            m_root.c_str()));
    }

    void RunKeyword(const wchar_t* keyword) {
        RunResult run = Program().Run(std::wstring(L"-") + keyword);
        EXPECT_FALSE(run.crashed || run.timedOut) << Narrow(keyword);
        EXPECT_EQ(0, run.exitCode);
    }

    std::wstring m_root;
    const std::wstring m_programs[2] = {ShellFolder(CSIDL_PROGRAMS),
                                        ShellFolder(CSIDL_COMMON_PROGRAMS)};
    const std::wstring m_userDesktop = ShellFolder(CSIDL_DESKTOP);
    const std::wstring m_commonDesktop = ShellFolder(CSIDL_COMMON_DESKTOPDIRECTORY);
};

// The Start-menu folder by how the companion application is registered, and
// what lands in it when the texts are missing or 260 characters long.
struct AddCase {
    int code;  // the companion's upgrade code (its "DisplayName" set), -1 for none
    REGSAM view;
    const wchar_t* appName;  // the suite's "AppName", or null
    bool badTexts;           // then only the uninstall shortcut has a usable name
    const wchar_t* folder;   // null: none made
};

const AddCase kAddCases[] = {
    {-1, 0, nullptr, false, kDefaultFolder},
    {0, k64, nullptr, false, kSuiteFolder},
    {0, 0, nullptr, false, kDefaultFolder},  // the first code is not looked up in 32 bits
    {3, 0, nullptr, false, kSuiteFolder},
    {-1, 0, L"Mirovan", false, kSuiteFolder},
    {-1, 0, nullptr, true, kDefaultFolder},
    {0, k64, nullptr, true, nullptr},  // string 3145 missing
};

class AddShortcutsTest : public ShortcutsTest, public ::testing::WithParamInterface<AddCase> {};

TEST_P(AddShortcutsTest, CreatesTheSuiteShortcutsInTheCompanionsFolder) {
    const AddCase& c = GetParam();
    if (c.badTexts) {
        Install(L"badtexts\\");
    }
    if (c.code >= 0) {
        RegisterProduct(c.code, c.view, c.view);
        RegPutString(HKEY_LOCAL_MACHINE, kUninstallEntry, L"DisplayName", L"Mirovan", c.view);
    }
    if (c.appName != nullptr) {
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\Uninstall", L"AppName", c.appName);
    }
    const Names before[] = {ListDir(m_programs[0]), ListDir(m_programs[1])};
    RunKeyword(L"addshortcuts");
    const Names links = SuiteLinks();
    for (int i = 0; i < 2; ++i) {
        Names after = ListDir(m_programs[i]);
        if (c.folder != nullptr) {
            EXPECT_EQ(c.badTexts ? Names{links[3]} : links,
                      Shortcuts(JoinPath(m_programs[i], c.folder)));
            after.erase(std::remove(after.begin(), after.end(), c.folder), after.end());
        }
        EXPECT_EQ(before[i], after);
    }
    // The one-click shortcut on the common desktop, and so not on the user's.
    EXPECT_EQ(c.badTexts ? Names{} : Names{links[0]}, Shortcuts(m_commonDesktop));
    EXPECT_TRUE(ListDir(m_userDesktop).empty());
}

INSTANTIATE_TEST_SUITE_P(Folders, AddShortcutsTest, ::testing::ValuesIn(kAddCases));

TEST_F(ShortcutsTest, UpdateRenamesAnOlderReleasesShortcutsAndMovesThemToTheSuiteFolder) {
    // An older release's shortcuts, under old names and with old icons, in
    // the folder named after the companion's product (there is no companion).
    const wchar_t* oldIcon = L"C:\\old\\icons.dll";
    for (const std::wstring& programs : m_programs) {
        std::wstring folder = JoinPath(programs, kDefaultFolder);
        Plant(folder, L"Join.lnk", InRoot(L"qmoneclk.exe"), nullptr, oldIcon, 5);
        Plant(folder, L"Options.lnk", InRoot(L"qminst.exe"), L"/OpenSetting=1", oldIcon, 6);
        Plant(folder, L"Guide.lnk", InRoot(L"qminst.exe"), L"/help for quillmark tools", oldIcon,
              7);
    }
    Plant(m_commonDesktop, L"Join.lnk", InRoot(L"qmoneclk.exe"), nullptr, oldIcon, 5);

    RunKeyword(L"updateshortcuts");
    const Names links = SuiteLinks();
    const std::wstring guide = Describe(L"Guide.lnk", InRoot(L"qminst.exe").c_str(),
                                        L"/help for quillmark tools", m_root.c_str(), oldIcon, 7);
    for (const std::wstring& programs : m_programs) {
        EXPECT_FALSE(DirExists(JoinPath(programs, kDefaultFolder)));
        EXPECT_EQ((Names{guide, links[0], links[2]}), Shortcuts(JoinPath(programs, kSuiteFolder)));
    }
    // A desktop shortcut was renamed: the shortcuts are moved, not added.
    EXPECT_EQ(Names{links[0]}, Shortcuts(m_commonDesktop));
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
    Plant(m_userDesktop, L"Join.lnk", InRoot(L"qmoneclk.exe"), L"/now");

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
        RunKeyword(keyword);
        EXPECT_EQ(Names{L"Join.lnk"}, ListDir(elsewhere)) << Narrow(keyword);
    }
}

// The UI language, seen as the LANGID the program hands to
// SetThreadUILanguage (reported to the debugger output: Wine's
// SetThreadUILanguage changes nothing a test could observe). The user's code
// is taken as it is, the machine's only when known, else the installed
// product's language; both directions of the language table as tabled.
struct LanguageCase {
    const wchar_t* userCode;     // HKCU "QMUILanguage", or null
    const wchar_t* machineCode;  // HKLM (32-bit view) "QMUILanguage", or null
    std::optional<DWORD> productLanguage;
    int expected;
};

const LanguageCase kLanguageCases[] = {
    {L" jp ", nullptr, std::nullopt, 1041},  // trimmed, any case
    {L"XX", L"JP", std::nullopt, 1033},      // unknown: the machine's is not read
    {nullptr, L" de ", std::nullopt, 1031},
    {nullptr, L"XX", 1041, 1041},  // unknown: the product's language
    {nullptr, nullptr, 4105, 1033},
    {nullptr, nullptr, 2058, 3082},  // SP
    {nullptr, nullptr, 1034, 2058},  // ES
    {nullptr, nullptr, 1234, 1033},
    {nullptr, nullptr, std::nullopt, 1033},  // no suite at all
};

class UILanguageTest : public MachineTest, public ::testing::WithParamInterface<LanguageCase> {
protected:
    ~UILanguageTest() override { RemoveProducts(); }
};

TEST_P(UILanguageTest, ProgramStartsInTheChosenLanguage) {
    const LanguageCase& c = GetParam();
    if (c.userCode != nullptr) {
        RegPutString(HKEY_CURRENT_USER, kSuiteKey, L"QMUILanguage", c.userCode);
    }
    if (c.machineCode != nullptr) {
        RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"QMUILanguage", c.machineCode);
    }
    // Filed under a later upgrade code: the earlier ones are tried first.
    if (c.productLanguage) {
        RegisterProduct(2, k64, 0);
        RegPutDword(HKEY_LOCAL_MACHINE, kUninstallEntry, L"Language", *c.productLanguage);
    }
    RunResult run = Program().Run(L"-x");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasDebugOutput("qmMrvONI.exe: _tWinMain: SetThreadUILanguage " +
                                   std::to_string(c.expected) + "\n"));
}

INSTANTIATE_TEST_SUITE_P(Cases, UILanguageTest, ::testing::ValuesIn(kLanguageCases));

}  // namespace
