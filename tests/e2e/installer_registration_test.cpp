// The old integrations' Windows Installer registrations, removed by upgrade
// code: the console user's and the machine's, the SMS variant in the caller's
// own hive, and the hand-over to the installer-check library.
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
const std::wstring kUserInstaller = L"SOFTWARE\\Microsoft\\Installer\\";
const std::wstring kMachineInstaller = L"SOFTWARE\\Classes\\Installer\\";
const std::wstring kCopies = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Installer\\";
const std::wstring kUninstall = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\";

struct Product {
    std::wstring packed;
    std::wstring braced;
};
const Product kFirst{L"0123456789ABCDEF0123456789ABCDEF",
                     L"{76543210-BA98-FEDC-1032-547698BADCFE}"};
const Product kSecond{L"FEDCBA9876543210FEDCBA9876543210",
                      L"{89ABCDEF-4567-0123-EFCD-AB8967452301}"};
const Product kOther{L"AAAAAAAABBBBCCCCDDDDEEEEEEEEEEEE",
                     L"{AAAAAAAA-BBBB-CCCC-DDDD-EEEEEEEEEEEE}"};

class InstallerRegistrationTest : public MachineTest {
protected:
    ~InstallerRegistrationTest() override {
        for (HKEY root : {kUser, kMachine}) {
            const std::wstring& installer = root == kUser ? kUserInstaller : kMachineInstaller;
            for (const Product& p : {kFirst, kSecond, kOther}) {
                RegRemoveTree(root, installer + L"Products\\" + p.packed);
                RegRemoveTree(root, installer + L"Features\\" + p.packed);
                RegRemoveTree(root, kUninstall + p.braced);
            }
            for (const std::wstring& code : {kNotesCode, kOutlookCode}) {
                RegRemoveTree(root, installer + code);
            }
        }
        RegRemoveTree(kMachine, kCopies + kNotesCode);
        RegRemoveTree(kMachine, kCopies + kOutlookCode);
    }

    // A product's entries under root, listed under the upgrade code or not.
    static void Register(HKEY root, const std::wstring& code, const Product& p, bool listed) {
        const std::wstring& installer = root == kUser ? kUserInstaller : kMachineInstaller;
        RegPutString(root, installer + L"Products\\" + p.packed + L"\\SourceList", L"v", L"x");
        RegPutString(root, installer + L"Features\\" + p.packed, L"f", L"x");
        RegPutString(root, kUninstall + p.braced, L"DisplayName", L"old");
        RegMakeKey(root, installer + code);
        if (listed) {
            RegPutString(root, installer + code, p.packed.c_str(), L"");
        }
    }
    static int EntriesLeft(HKEY root, const Product& p) {
        const std::wstring& installer = root == kUser ? kUserInstaller : kMachineInstaller;
        return RegHasKey(root, installer + L"Products\\" + p.packed) +
               RegHasKey(root, installer + L"Features\\" + p.packed) +
               RegHasKey(root, kUninstall + p.braced);
    }
};

TEST_F(InstallerRegistrationTest, ListedProductsGoThenTheUpgradeCode) {
    struct Row {
        const wchar_t* keyword;
        bool machineToo;
    };
    for (const Row& row : {Row{L"uninstalloldni", true}, Row{L"smsdeloldnicuruserkey", false}}) {
        SCOPED_TRACE(Narrow(row.keyword));
        for (HKEY root : {kUser, kMachine}) {
            Register(root, kNotesCode, kFirst, true);
            Register(root, kNotesCode, kSecond, true);
            Register(root, kNotesCode, kOther, false);
        }
        RegMakeKey(kMachine, kCopies + kNotesCode + L"\\Sub");
        RunResult run = Program().Run(std::wstring(L"-") + row.keyword);
        EXPECT_EQ(0, run.exitCode);

        for (HKEY root : {kUser, kMachine}) {
            bool cleaned = root == kUser || row.machineToo;
            EXPECT_EQ(cleaned ? 0 : 3, EntriesLeft(root, kFirst));
            EXPECT_EQ(cleaned ? 0 : 3, EntriesLeft(root, kSecond));
            EXPECT_EQ(3, EntriesLeft(root, kOther));
            EXPECT_EQ(
                !cleaned,
                RegHasKey(root, (root == kUser ? kUserInstaller : kMachineInstaller) + kNotesCode));
        }
        EXPECT_EQ(!row.machineToo, RegHasKey(kMachine, kCopies + kNotesCode));
    }
}

TEST_F(InstallerRegistrationTest, UnregisteredCodeIsLoggedAndTheMachineCopyStillGoes) {
    RegMakeKey(kUser, kUserInstaller + L"Products");
    Register(kMachine, kOutlookCode, kFirst, true);
    RegMakeKey(kMachine, kCopies + kOutlookCode);
    const size_t pending = PendingDeleteCount();
    RunResult run = Program().Run(L"-uninstalloldoi");
    // The old Outlook integration's class is not registered: no file is touched.
    EXPECT_TRUE(run.HasTrace(" RemoveOldOIInstallFiles: GetOldOIInstallPath FAILED!\n,\n"));
    EXPECT_EQ(pending, PendingDeleteCount());
    EXPECT_TRUE(run.HasTrace(" DelInstallerKeyByUpgrade: Delete Current user key!\n,\n"));
    EXPECT_TRUE(run.HasTrace(" DelInstallerKeyByUpgrade : hCurKey = -2147483647\n,\n"));
    EXPECT_TRUE(
        run.HasTrace(" DelInstallerKeyByUpgrade: RegOpenKeyEx UpgradeID FAILED, Error = 2\n,\n"));
    EXPECT_EQ(0, EntriesLeft(kMachine, kFirst));
    EXPECT_FALSE(RegHasKey(kMachine, kCopies + kOutlookCode));
}

TEST_F(InstallerRegistrationTest, InstallerCheckLibraryIsCalledFromTheSuiteFolder) {
    const std::wstring suite = m_scratch.Sub(L"suite", true);
    const std::wstring library = FakePath(L"qminstck.dll");
    auto calledFrom = [](const std::wstring& log) {
        std::string calls = ReadFileBytes(log);
        size_t at = calls.find("ModifyAdminMsiVersion from ");
        return at == std::string::npos ? std::string()
                                       : calls.substr(at + 27, calls.find('\n', at) - at - 27);
    };
    CopyFileW(library.c_str(), (suite + L"\\qminstck.dll").c_str(), FALSE);
    RegPutString(kMachine, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", suite);
    Program().Run(L"-modifyadminmsidisplayversion");
    EXPECT_EQ(Narrow(suite) + "\\qminstck.dll", calledFrom(Program().callsLogPath()));

    // No suite folder: by name, from the program's folder but never from the
    // folder it was started in.
    RegRemoveTree(kMachine, L"SOFTWARE\\Mirovan");
    DeleteFileW(Program().callsLogPath().c_str());
    RunResult run;
    RunAsDebuggee(L"\"" + Program().exePath() + L"\" -modifyadminmsidisplayversion",
                  BuildEnvironmentBlock({{L"QM_FAKE_CALLS_LOG", Program().callsLogPath()}}), suite,
                  60000, &run);
    EXPECT_EQ(0, run.exitCode);
    EXPECT_EQ("", calledFrom(Program().callsLogPath()));
    CopyFileW(library.c_str(), (Program().folder() + L"\\qminstck.dll").c_str(), FALSE);
    Program().Run(L"-modifyadminmsidisplayversion");
    EXPECT_EQ(Narrow(Program().folder()) + "\\qminstck.dll", calledFrom(Program().callsLogPath()));
}

}  // namespace
