// The old integrations' Windows Installer registrations, removed by upgrade
// code (the console user's and the machine's; the SMS variant the caller's
// own only), and the hand-over to the installer-check library.
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
// Packed and braced product codes: two listed, one not.
const std::wstring kProducts[][2] = {
    {L"0123456789ABCDEF0123456789ABCDEF", L"{76543210-BA98-FEDC-1032-547698BADCFE}"},
    {L"FEDCBA9876543210FEDCBA9876543210", L"{89ABCDEF-4567-0123-EFCD-AB8967452301}"},
    {L"AAAAAAAABBBBCCCCDDDDEEEEEEEEEEEE", L"{AAAAAAAA-BBBB-CCCC-DDDD-EEEEEEEEEEEE}"}};

std::wstring Installer(HKEY root) {
    return root == kUser ? L"SOFTWARE\\Microsoft\\Installer\\" : L"SOFTWARE\\Classes\\Installer\\";
}

std::wstring Entry(HKEY root, int product, int part) {
    const wchar_t* lists[] = {L"Products\\", L"Features\\"};
    return part < 2 ? Installer(root) + lists[part] + kProducts[product][0]
                    : kUninstall + kProducts[product][1];
}

class InstallerRegistrationTest : public MachineTest {
protected:
    ~InstallerRegistrationTest() override {
        for (HKEY root : {kUser, kMachine}) {
            for (int product = 0; product < 3; ++product) {
                for (int part = 0; part < 3; ++part) {
                    RegRemoveTree(root, Entry(root, product, part));
                }
            }
            for (const std::wstring& code : {kNotesCode, kOutlookCode}) {
                RegRemoveTree(root, Installer(root) + code);
                RegRemoveTree(kMachine, kCopies + code);
            }
        }
    }
    // The products' entries under root; the first two listed under the code.
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
};

TEST_F(InstallerRegistrationTest, ListedProductsGoThenTheUpgradeCode) {
    for (const wchar_t* keyword : {L"-uninstalloldni", L"-smsdeloldnicuruserkey"}) {
        const bool machineToo = keyword[1] == L'u';
        for (HKEY root : {kUser, kMachine}) {
            Register(root, kNotesCode, 3);
        }
        RegMakeKey(kMachine, kCopies + kNotesCode + L"\\Sub");
        Program().Run(keyword);
        for (HKEY root : {kUser, kMachine}) {
            SCOPED_TRACE(Narrow(keyword) + (root == kUser ? " user" : " machine"));
            const bool cleaned = root == kUser || machineToo;
            EXPECT_EQ(cleaned ? 0 : 3, EntriesLeft(root, 0));
            EXPECT_EQ(cleaned ? 0 : 3, EntriesLeft(root, 1));
            EXPECT_EQ(3, EntriesLeft(root, 2));
            EXPECT_EQ(!cleaned, RegHasKey(root, Installer(root) + kNotesCode));
        }
        EXPECT_EQ(!machineToo, RegHasKey(kMachine, kCopies + kNotesCode));
    }
}

TEST_F(InstallerRegistrationTest, UnregisteredCodeIsLoggedAndTheMachineCopyStillGoes) {
    RegMakeKey(kUser, Installer(kUser) + L"Products");
    Register(kMachine, kOutlookCode, 1);
    RegMakeKey(kMachine, kCopies + kOutlookCode);
    const size_t pending = PendingDeleteCount();
    RunResult run = Program().Run(L"-uninstalloldoi");
    EXPECT_TRUE(
        run.HasTrace(" DelInstallerKeyByUpgrade: RegOpenKeyEx UpgradeID FAILED, Error = 2\n,\n"));
    EXPECT_EQ(0, EntriesLeft(kMachine, 0));
    EXPECT_FALSE(RegHasKey(kMachine, kCopies + kOutlookCode));
    // The old Outlook integration's class is not registered: no file is touched.
    EXPECT_EQ(pending, PendingDeleteCount());
}

// From the suite's folder; without one by name from the program's folder,
// never from the folder the program was started in.
TEST_F(InstallerRegistrationTest, InstallerCheckLibraryIsCalledFromTheSuiteFolder) {
    const std::wstring suite = m_scratch.Sub(L"suite", true);
    const std::wstring calls = Program().callsLogPath();
    auto called = [&calls](const std::wstring& folder) {
        return ReadFileBytes(calls).find("ModifyAdminMsiVersion from " + Narrow(folder) +
                                         "\\qminstck.dll\n") != std::string::npos;
    };
    CopyFileW(FakePath(L"qminstck.dll").c_str(), (suite + L"\\qminstck.dll").c_str(), FALSE);
    RegPutString(kMachine, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", suite);
    Program().Run(L"-modifyadminmsidisplayversion");
    EXPECT_TRUE(called(suite));

    RegRemoveTree(kMachine, L"SOFTWARE\\Mirovan");
    DeleteFileW(calls.c_str());
    SetEnvironmentVariableW(L"QM_FAKE_CALLS_LOG", calls.c_str());  // for the program
    RunDebuggee(L"\"" + Program().exePath() + L"\" -modifyadminmsidisplayversion", suite, 60000);
    SetEnvironmentVariableW(L"QM_FAKE_CALLS_LOG", nullptr);
    EXPECT_FALSE(called(suite));
    CopyFileW(FakePath(L"qminstck.dll").c_str(), (Program().folder() + L"\\qminstck.dll").c_str(),
              FALSE);
    Program().Run(L"-modifyadminmsidisplayversion");
    EXPECT_TRUE(called(Program().folder()));
}

}  // namespace
