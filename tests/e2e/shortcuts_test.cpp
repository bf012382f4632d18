// The suite's shortcuts and the UI language the program starts in, end to
// end. The shortcuts are read back through the shell link object.
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
// The uninstall entry of the product RegisterProduct files (packed there).
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

void RegisterProduct(int code, REGSAM upgradeView, REGSAM entryView) {
    RegPutString(HKEY_LOCAL_MACHINE, UpgradeKey(code), L"39A1EB3B91C93B54EAD80FE3C665084C", L"",
                 upgradeView);
    RegMakeKey(HKEY_LOCAL_MACHINE, kUninstallEntry, entryView);
}

// "name: target arguments | working folder | icon,index", in lower case.
std::wstring Describe(std::wstring name, const std::wstring& target, const wchar_t* arguments,
                      const std::wstring& folder, const std::wstring& icon, int index) {
    std::wstring text = name + L": " + target + L" " + arguments + L" | " + folder + L" | " + icon +
                        L"," + std::to_wstring(index);
    CharLowerW(&text[0]);
    return text;
}

enum ShellFolder { kPrograms, kCommonPrograms, kDesktop, kCommonDesktop };

// The suite in the program's folder; what a test adds to the shell's folders goes after it.
class SuiteTest : public MachineTest {
protected:
    SuiteTest() {
        CoInitialize(nullptr);
        const int csidls[] = {CSIDL_PROGRAMS, CSIDL_COMMON_PROGRAMS, CSIDL_DESKTOP,
                              CSIDL_COMMON_DESKTOPDIRECTORY};
        for (int i = 0; i < 4; ++i) {
            wchar_t path[MAX_PATH] = {};
            SHGetFolderPathW(nullptr, csidls[i], nullptr, SHGFP_TYPE_DEFAULT, path);
            m_shell[i] = path;
            m_before[i] = ListDir(path);
        }
        for (const wchar_t* file :
             {L"qmoneclk.exe", L"qminst.exe", L"qmRes.dll", L"qmOI3Res.dll"}) {
            CopyFileW(FakePath(file).c_str(), InRoot(file).c_str(), FALSE);
        }
        RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", m_root);
        RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"ProductCode", kProductCode);
    }
    ~SuiteTest() override {
        for (int i = 0; i < 4; ++i) {
            for (const std::wstring& name : Added(i)) {
                RemoveTree(JoinPath(m_shell[i], name));
            }
        }
        for (REGSAM view : {REGSAM(0), k64}) {
            for (int code = 0; code < 4; ++code) {
                RegRemoveTree(HKEY_LOCAL_MACHINE, UpgradeKey(code), view);
            }
            RegRemoveTree(HKEY_LOCAL_MACHINE, kUninstallEntry, view);
        }
        CoUninitialize();
    }
    std::wstring InRoot(const wchar_t* name) const { return JoinPath(m_root, name); }
    std::wstring In(int shell, const wchar_t* name) const { return JoinPath(m_shell[shell], name); }
    // What shell folder i holds that it did not hold before the test.
    Names Added(int i) const {
        Names added;
        for (const std::wstring& name : ListDir(m_shell[i])) {
            if (std::find(m_before[i].begin(), m_before[i].end(), name) == m_before[i].end()) {
                added.push_back(name);
            }
        }
        return added;
    }
    // The shortcuts added to shell folder i, or all in its subfolder, described.
    Names Shortcuts(int i, const wchar_t* subfolder = nullptr) const {
        const std::wstring folder = subfolder ? In(i, subfolder) : m_shell[i];
        Names described;
        for (const std::wstring& name : subfolder ? ListDir(folder) : Added(i)) {
            LinkFields link;
            EXPECT_HRESULT_SUCCEEDED(ReadLink(nullptr, JoinPath(folder, name).c_str(), link));
            described.push_back(Describe(name, link.target.c_str(), link.arguments.c_str(),
                                         link.workingDir.c_str(), link.iconPath.c_str(),
                                         link.iconIndex));
        }
        return described;
    }
    // The suite's shortcuts (Wine gives one without an icon its target's).
    Names SuiteLinks() const {
        const std::wstring oneClick = InRoot(L"qmoneclk.exe");
        const std::wstring setup = InRoot(L"qminst.exe");
        const std::wstring icons = InRoot(L"qmRes.dll");
        return {
            Describe(kOneClickLink, oneClick, L"", m_root, oneClick, 0),
            Describe(L"Quillmark Tools Help.lnk", setup, L"/help for quillmark tools", m_root,
                     icons, 2),
            Describe(L"Quillmark Tools Settings.lnk", setup, L"/OpenSetting=1", m_root, icons, 3),
            Describe(L"Uninstall Quillmark Tools.lnk", kMsiexec,
                     (std::wstring(L"/x ") + kProductCode).c_str(), m_root, kMsiexec, 0),
        };
    }
    void Plant(const std::wstring& folder, const wchar_t* name, const std::wstring& target,
               const wchar_t* arguments = nullptr, const wchar_t* icon = nullptr, int index = 0) {
        MakeDirs(folder);
        ASSERT_HRESULT_SUCCEEDED(CreateLink(nullptr, folder.c_str(), target.c_str(),
                                            JoinPath(folder, name).c_str(), arguments, icon, index,
                                            m_root.c_str()));
    }
    const std::wstring m_root = Program().folder();
    std::wstring m_shell[4];
    Names m_before[4];
};

// The Start-menu folder by how the companion is registered, or with bad texts.
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
    {3, 0, nullptr, false, kSuiteFolder},
    {-1, 0, L"Mirovan", false, kSuiteFolder},
    {-1, 0, nullptr, true, kDefaultFolder},
    {0, k64, nullptr, true, nullptr},  // string 3145 missing
};

class AddShortcutsTest : public SuiteTest, public ::testing::WithParamInterface<AddCase> {};

TEST_P(AddShortcutsTest, CreatesTheSuiteShortcutsInTheCompanionsFolder) {
    const AddCase& c = GetParam();
    for (const wchar_t* library : {L"qmRes.dll", L"qmOI3Res.dll"}) {
        const std::wstring release = c.badTexts ? L"badtexts\\" : L"";
        CopyFileW(FakePath((release + library).c_str()).c_str(), InRoot(library).c_str(), FALSE);
    }
    if (c.code >= 0) {
        RegisterProduct(c.code, c.view, c.view);
        RegPutString(HKEY_LOCAL_MACHINE, kUninstallEntry, L"DisplayName", L"Mirovan", c.view);
    }
    if (c.appName != nullptr) {
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\Uninstall", L"AppName", c.appName);
    }
    Program().Run(L"-addshortcuts");
    const Names links = SuiteLinks();
    for (int programs : {kPrograms, kCommonPrograms}) {
        EXPECT_EQ(c.folder ? Names{c.folder} : Names{}, Added(programs));
        if (c.folder != nullptr) {
            EXPECT_EQ(c.badTexts ? Names{links[3]} : links, Shortcuts(programs, c.folder));
        }
    }
    // The one-click shortcut on the common desktop, and so not on the user's.
    EXPECT_EQ(c.badTexts ? Names{} : Names{links[0]}, Shortcuts(kCommonDesktop));
    EXPECT_EQ(Names{}, Added(kDesktop));
}

INSTANTIATE_TEST_SUITE_P(Folders, AddShortcutsTest, ::testing::ValuesIn(kAddCases));

TEST_F(SuiteTest, UpdateRenamesAnOlderReleasesShortcutsAndMovesThemToTheSuiteFolder) {
    // An older release's shortcuts, old names and icons, in the default folder.
    const wchar_t* oldIcon = L"C:\\old\\icons.dll";
    for (int programs : {kPrograms, kCommonPrograms}) {
        const std::wstring folder = In(programs, kDefaultFolder);
        Plant(folder, L"Join.lnk", InRoot(L"qmoneclk.exe"), nullptr, oldIcon, 5);
        Plant(folder, L"Options.lnk", InRoot(L"qminst.exe"), L"/OpenSetting=1", oldIcon, 6);
        Plant(folder, L"Guide.lnk", InRoot(L"qminst.exe"), L"/help", oldIcon, 7);
    }
    Plant(m_shell[kCommonDesktop], L"Join.lnk", InRoot(L"qmoneclk.exe"), nullptr, oldIcon, 5);
    Program().Run(L"-updateshortcuts");
    const Names links = SuiteLinks();
    const std::wstring guide =
        Describe(L"Guide.lnk", InRoot(L"qminst.exe"), L"/help", m_root, oldIcon, 7);
    for (int programs : {kPrograms, kCommonPrograms}) {
        EXPECT_EQ(Names{kSuiteFolder}, Added(programs));
        EXPECT_EQ((Names{guide, links[0], links[2]}), Shortcuts(programs, kSuiteFolder));
    }
    // A desktop shortcut was renamed: the shortcuts are moved, not added.
    EXPECT_EQ(Names{links[0]}, Shortcuts(kCommonDesktop));
    EXPECT_EQ(Names{}, Added(kDesktop));
}

// With both desktops holding shortcuts and none renamed, shortcuts are added.
TEST_F(SuiteTest, UpdateAddsShortcutsWhenNoDesktopShortcutWasRenamed) {
    Plant(m_shell[kCommonDesktop], kOneClickLink, InRoot(L"qmoneclk.exe"));
    Plant(m_shell[kDesktop], L"Notepad.lnk", kNotepad);
    Program().Run(L"-updateshortcuts");
    EXPECT_EQ(SuiteLinks(), Shortcuts(kCommonPrograms, kDefaultFolder));
}

// The suite's shortcuts go (uninstall whatever its arguments), nothing else.
class RemoveShortcutsTest : public SuiteTest,
                            public ::testing::WithParamInterface<const wchar_t*> {};

TEST_P(RemoveShortcutsTest, RemovesOnlyTheSuitesShortcuts) {
    Program().Run(L"-addshortcuts");
    const std::wstring folder = In(kPrograms, kDefaultFolder);
    Plant(folder, L"Repair.lnk", kMsiexec, L"/fa {00000000-0000-0000-0000-000000000000}");
    Plant(folder, L"Log.lnk", InRoot(L"qminst.exe"), L"/log");
    Plant(folder, L"Notepad.lnk", kNotepad);
    Plant(folder, L"Gone.lnk", InRoot(L"gone.exe"));
    Plant(folder, L"Long.lnk", m_root + L"\\" + std::wstring(280, L'x') + L".exe");
    ASSERT_TRUE(WriteFileBytes(JoinPath(folder, L"Broken.lnk"), "not a shortcut"));
    Plant(In(kPrograms, L"Other Vendor"), kOneClickLink, InRoot(L"qmoneclk.exe"));
    Plant(m_shell[kDesktop], L"Join.lnk", InRoot(L"qmoneclk.exe"), L"/now");
    Program().Run(GetParam());
    EXPECT_EQ((Names{L"Broken.lnk", L"Gone.lnk", L"Log.lnk", L"Long.lnk", L"Notepad.lnk"}),
              ListDir(folder));
    EXPECT_EQ((Names{kDefaultFolder, L"Other Vendor"}), Added(kPrograms));
    EXPECT_EQ(Names{}, Added(kCommonPrograms));
    EXPECT_EQ(Names{}, Added(kCommonDesktop));
    EXPECT_EQ(Names{}, Added(kDesktop));
}

INSTANTIATE_TEST_SUITE_P(Keywords, RemoveShortcutsTest,
                         ::testing::Values(L"-delshortcuts", L"-delunuseddata"));

// The LANGID handed to SetThreadUILanguage (Wine's changes nothing visible).
struct LanguageCase {
    const wchar_t* userCode;     // HKCU "QMUILanguage", or null
    const wchar_t* machineCode;  // HKLM (32-bit view) "QMUILanguage", or null
    std::optional<DWORD> productLanguage;
    int expected;
};

const LanguageCase kLanguageCases[] = {
    {L" jp ", nullptr, std::nullopt, 1041},  // trimmed, any case
    {L"XX", L"JP", std::nullopt, 1033},      // unknown: the machine's is not read
    {nullptr, L"XX", 1041, 1041},            // unknown: the product's language
    {nullptr, nullptr, 4105, 1033},          // "EN"
    {nullptr, nullptr, 2058, 3082},          // "SP"
    {nullptr, nullptr, std::nullopt, 1033},  // no suite at all
};

class UILanguageTest : public SuiteTest, public ::testing::WithParamInterface<LanguageCase> {};

TEST_P(UILanguageTest, ProgramStartsInTheChosenLanguage) {
    const LanguageCase& c = GetParam();
    RegRemoveTree(HKEY_LOCAL_MACHINE, kSuiteKey);
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
    EXPECT_TRUE(run.HasDebugOutput("qmMrvONI.exe: _tWinMain: SetThreadUILanguage " +
                                   std::to_string(c.expected) + "\n"));
}

INSTANTIATE_TEST_SUITE_P(Cases, UILanguageTest, ::testing::ValuesIn(kLanguageCases));

}  // namespace
