// What older releases left: Windows Installer registrations, the old Outlook
// integration's files, update leftovers, a retired class and 64-bit add-ins.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/test_paths.h"

namespace {

const HKEY kUser = HKEY_CURRENT_USER;
const HKEY kMachine = HKEY_LOCAL_MACHINE;
const std::wstring kNotesCode = L"UpgradeCodes\\39A1EB3B91C93B54EAD80FE3C665084C";
const std::wstring kOutlookCode = L"UpgradeCodes\\E4698B57199D4B241AF129150B2CCAE2";
const std::wstring kCopies = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Installer\\";
const std::wstring kUninstall = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\";
// Packed and braced product codes, the first two listed under the code.
const std::wstring kProducts[][2] = {
    {L"39A1EB3B91C93B54EAD80FE3C665084C", L"{B3BE1A93-9C19-45B3-AE8D-F03E6C5680C4}"},
    {L"E4698B57199D4B241AF129150B2CCAE2", L"{75B8964E-D991-42B4-A11F-9251B0C2AC2E}"},
    {L"AAAAAAAABBBBCCCCDDDDEEEEEEEEEEEE", L"{AAAAAAAA-BBBB-CCCC-DDDD-EEEEEEEEEEEE}"}};
const std::wstring kOldServer = L"CLSID\\{061E7FF2-9750-46FB-AFD6-245CE0AB8549}";
const std::wstring kToolbarClass = L"{90E2BA2E-DD1B-4cde-9134-7A8B86D33CA7}";
const std::wstring kToolbar = L"SOFTWARE\\Microsoft\\Internet Explorer\\Toolbar";
const std::wstring kToolbarKey = L"SOFTWARE\\Classes\\CLSID\\" + kToolbarClass;

std::wstring Installer(HKEY root) {
    return root == kUser ? L"SOFTWARE\\Microsoft\\Installer\\" : L"SOFTWARE\\Classes\\Installer\\";
}

// A product's "Products" (part 0) or "Features" (1) key, or its uninstall entry (2).
std::wstring Entry(HKEY root, int product, int part) {
    const wchar_t* lists[] = {L"Products\\", L"Features\\"};
    return part < 2 ? Installer(root) + lists[part] + kProducts[product][0]
                    : kUninstall + kProducts[product][1];
}

class LegacyRemovalTest : public MachineTest {
protected:
    LegacyRemovalTest() {
        RegPutString(kMachine, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", m_suite);
    }
    ~LegacyRemovalTest() override {
        for (HKEY root : {kUser, kMachine}) {
            for (int entry = 0; entry < 9; ++entry) {
                RegRemoveTree(root, Entry(root, entry / 3, entry % 3));
            }
            for (const std::wstring& code : {kNotesCode, kOutlookCode}) {
                RegRemoveTree(root, Installer(root) + code);
                RegRemoveTree(kMachine, kCopies + code);
            }
        }
        RegRemoveTree(HKEY_CLASSES_ROOT, kOldServer);
        RegRemoveTree(kMachine, kToolbarKey);
        RegRemoveValue(kMachine, kToolbar, kToolbarClass.c_str());
        RegRemoveValue(kMachine, kToolbar, L"QMTest-Neighbour");
    }
    static void Register(HKEY root, const std::wstring& code, int products) {
        for (int product = 0; product < products; ++product) {
            for (int part = 0; part < 3; ++part) {
                RegPutString(root, Entry(root, product, part) + L"\\Sub", L"v", L"x");
            }
            if (product < 2) {
                RegPutString(root, Installer(root) + code, kProducts[product][0].c_str(), L"");
            }
        }
    }
    static int EntriesLeft(HKEY root, int product) {
        return RegHasKey(root, Entry(root, product, 0)) + RegHasKey(root, Entry(root, product, 1)) +
               RegHasKey(root, Entry(root, product, 2));
    }
    const std::wstring m_suite = m_scratch.Sub(L"suite", true);
};

TEST_F(LegacyRemovalTest, ListedProductsGoThenTheUpgradeCode) {
    for (HKEY root : {kUser, kMachine}) {
        Register(root, kNotesCode, 3);
    }
    RegMakeKey(kMachine, kCopies + kNotesCode + L"\\Sub");
    Program().Run(L"-uninstalloldni");
    for (HKEY root : {kUser, kMachine}) {
        SCOPED_TRACE(root == kUser ? "user" : "machine");
        EXPECT_EQ(0, EntriesLeft(root, 0) + EntriesLeft(root, 1));
        EXPECT_EQ(3, EntriesLeft(root, 2));
        EXPECT_FALSE(RegHasKey(root, Installer(root) + kNotesCode));
    }
    EXPECT_FALSE(RegHasKey(kMachine, kCopies + kNotesCode));
}

// Without the user's registration the machine's goes all the same; the
// files at restart, with the folder above when named 327 (empty row: no class).
TEST_F(LegacyRemovalTest, OldOutlookIntegrationGoes) {
    RegMakeKey(kUser, Installer(kUser) + L"Products");
    for (const std::wstring row : {L"Mirovan\\327\\OI", L"Other\\3270\\OI", L""}) {
        SCOPED_TRACE(Narrow(row));  // empty: no class registered
        const std::wstring folder = m_scratch.Sub(row, true);
        for (const wchar_t* name : {L"OI3Main.dll", L"mirovanoi.chm", L"notes.txt"}) {
            WriteFileBytes(JoinPath(folder, name), "old");
        }
        RegRemoveTree(HKEY_CLASSES_ROOT, kOldServer);
        if (!row.empty()) {
            RegPutString(HKEY_CLASSES_ROOT, kOldServer + L"\\InprocServer32", L"",
                         folder + L"\\OI3Main.dll");
        }
        Register(kMachine, kOutlookCode, 1);
        RegMakeKey(kMachine, kCopies + kOutlookCode);
        const size_t before = PendingDeleteCount();
        RunResult run = Program().Run(L"-uninstalloldoi");
        EXPECT_TRUE(run.HasTrace(
            " DelInstallerKeyByUpgrade: RegOpenKeyEx UpgradeID FAILED, Error = 2\n,\n"));
        EXPECT_EQ(0, EntriesLeft(kMachine, 0));
        EXPECT_FALSE(RegHasKey(kMachine, kCopies + kOutlookCode));
        const bool above = IsPendingDelete(m_scratch.Sub(row.substr(0, row.find(L'\\'))));
        EXPECT_EQ(row[0] == L'M', above);
        EXPECT_EQ(!row.empty(), IsPendingDelete(folder + L"\\mirovanoi.chm"));
        EXPECT_EQ(before + (row.empty() ? 0 : 3 + above), PendingDeleteCount());
    }
}

TEST_F(LegacyRemovalTest, UpdateLeftoversRetiredClassesAndAddinsGo) {
    const std::wstring updTemp = m_suite + L"\\upd_temp";
    for (const wchar_t* file : {L"a_upd_temp", L"components\\a_upd_temp", L"components\\b.txt",
                                L"chrome\\c_upd_temp", L"..\\x_upd_temp.dat"}) {
        WriteFileBytes(JoinPath(updTemp, file), "left over");
    }
    RegPutString(kMachine, kToolbarKey + L"\\InprocServer32", L"", L"x");
    RegPutString(kMachine, kToolbar, kToolbarClass.c_str(), L"");
    RegPutString(kMachine, kToolbar, L"QMTest-Neighbour", L"");
    CopyFileW(FakePath(L"addin64.dll").c_str(), (m_suite + L"\\qmMrvst64.dll").c_str(), FALSE);
    Program().Run(L"-deleteregfeaturecontrol");  // changes nothing at all
    EXPECT_TRUE(FileExists(updTemp + L"\\a_upd_temp"));
    EXPECT_TRUE(RegHasKey(kMachine, kToolbarKey));
    EXPECT_EQ(std::string::npos, ReadFileBytes(Program().callsLogPath()).find("Dll"));
    Program().Run(L"-delupdtemp");
    EXPECT_EQ(std::vector<std::wstring>{L"components"}, ListDir(updTemp));
    EXPECT_EQ(std::vector<std::wstring>{L"b.txt"}, ListDir(updTemp + L"\\components"));
    EXPECT_FALSE(FileExists(m_suite + L"\\x_upd_temp.dat"));
    EXPECT_FALSE(RegHasKey(kMachine, kToolbarKey));
    EXPECT_FALSE(RegHasValue(kMachine, kToolbar, kToolbarClass.c_str()));
    EXPECT_TRUE(RegHasValue(kMachine, kToolbar, L"QMTest-Neighbour"));
    // The add-in there through the 64-bit regsvr32, working in its folder.
    const std::string calls = ReadFileBytes(Program().callsLogPath());
    const std::string path = Narrow(JoinPath(m_suite, L"qmMrvst64.dll"));
    EXPECT_NE(std::string::npos,
              calls.find(path + " DllUnregisterServer in " + Narrow(m_suite) +
                         " by C:\\windows\\system32\\regsvr32.exe /s /u \"" + path + "\""))
        << calls;
}

}  // namespace
