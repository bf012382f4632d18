// The registry keywords end to end: the smart-tag action in both registry
// views, the old context-menu classes, the console user's start-up entries and
// settings key, and the old Outlook integration's setting. Each removes exactly
// its own entries.

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"

namespace {

const HKEY kUser = HKEY_CURRENT_USER;
const std::wstring kActions = L"Software\\Microsoft\\Office\\Common\\Smart Tag\\Actions";
const std::wstring kSmartTag = kActions + L"\\{0A4C50AC-AD3F-4245-B324-3C8696A3408A}";
const std::wstring kRMenu = L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu";
const std::wstring kHandlers = L"SOFTWARE\\Classes\\*\\shellex\\ContextMenuHandlers\\";
const std::wstring kRun = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
const std::wstring kRunOnce = L"Software\\Microsoft\\Windows\\CurrentVersion\\Runonce";
const std::wstring kQmTools = L"Software\\Mirovan\\QmkTools";
const std::wstring kOutlookGeneral = L"Software\\Mirovan_Outlook\\General";
const wchar_t kNeighbour[] = L"QMTest-Neighbour";

class RegistryKeywordsTest : public MachineTest {
protected:
    ~RegistryKeywordsTest() override {
        for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
            RegRemoveTree(kUser, kActions + L"\\" + kNeighbour, view);
        }
        RegRemoveTree(kUser, kRMenu + L".2");
        RegRemoveTree(kUser, kHandlers + kNeighbour);
        RegRemoveValue(kUser, kRun, kNeighbour);
        RegRemoveValue(kUser, kRunOnce, kNeighbour);
    }
    void Run(const wchar_t* keyword) {
        RunResult run = Program().Run(std::wstring(L"-") + keyword);
        EXPECT_FALSE(run.crashed || run.timedOut) << Narrow(keyword);
        EXPECT_EQ(0, run.exitCode) << Narrow(keyword);
    }
};

TEST_F(RegistryKeywordsTest, SmartTagActionIsInstalledAndRemovedInBothViews) {
    for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
        ASSERT_TRUE(RegPutString(kUser, kActions + L"\\" + kNeighbour, L"v", L"kept", view));
    }
    Run(L"smsinstallsmarttag");
    for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
        EXPECT_TRUE(RegHasKey(kUser, kSmartTag, view)) << view;
        // Whatever Office put below it goes with it.
        ASSERT_TRUE(RegPutString(kUser, kSmartTag + L"\\Sub\\Deep", L"v", L"x", view));
    }
    Run(L"smsuninstallsmarttag");
    for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
        EXPECT_FALSE(RegHasKey(kUser, kSmartTag, view)) << view;
        EXPECT_TRUE(RegHasValue(kUser, kActions + L"\\" + kNeighbour, L"v", view)) << view;
    }
}

TEST_F(RegistryKeywordsTest, CleanupKeywordsRemoveExactlyTheirEntries) {
    // One machine for all three: each keyword must also spare the others' entries.
    ASSERT_TRUE(RegPutString(kUser, kRMenu + L"\\CLSID", L"", L"{x}"));
    ASSERT_TRUE(RegPutString(kUser, kRMenu + L".1\\CLSID", L"", L"{x}"));
    ASSERT_TRUE(RegPutString(kUser, kHandlers + L"MirovanShareMenu", L"", L"{y}"));
    ASSERT_TRUE(RegPutString(kUser, kRMenu + L".2", L"CLSID", L"{z}"));
    ASSERT_TRUE(RegPutString(kUser, kHandlers + kNeighbour, L"", L"{n}"));
    for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe", kNeighbour}) {
        ASSERT_TRUE(RegPutString(kUser, kRun, name, L"C:\\x.exe"));
    }
    ASSERT_TRUE(RegPutString(kUser, kQmTools + L"\\Sub", L"v", L"x"));
    ASSERT_TRUE(RegPutString(kUser, L"Software\\Mirovan\\Other", L"v", L"kept"));
    ASSERT_TRUE(RegPutString(kUser, kRunOnce, L"Mirovan_QM", L"C:\\x.exe"));
    ASSERT_TRUE(RegPutString(kUser, kRunOnce, kNeighbour, L"C:\\x.exe"));
    ASSERT_TRUE(RegPutDword(kUser, kOutlookGeneral, L"NoSchedulePermission", 1));
    ASSERT_TRUE(RegPutString(kUser, kOutlookGeneral, L"Other", L"kept"));

    Run(L"clearoldrmenureg");
    EXPECT_FALSE(RegHasKey(kUser, kRMenu));
    EXPECT_FALSE(RegHasKey(kUser, kRMenu + L".1"));
    EXPECT_FALSE(RegHasKey(kUser, kHandlers + L"MirovanShareMenu"));
    EXPECT_TRUE(RegHasValue(kUser, kRMenu + L".2", L"CLSID"));
    EXPECT_TRUE(RegHasKey(kUser, kHandlers + kNeighbour));
    EXPECT_TRUE(RegHasValue(kUser, kRun, L"QMOneClick"));

    Run(L"clearcuruserqmreg");
    for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe"}) {
        EXPECT_FALSE(RegHasValue(kUser, kRun, name)) << Narrow(name);
    }
    EXPECT_FALSE(RegHasKey(kUser, kQmTools));
    EXPECT_FALSE(RegHasValue(kUser, kRunOnce, L"Mirovan_QM"));
    EXPECT_TRUE(RegHasValue(kUser, kRun, kNeighbour));
    EXPECT_TRUE(RegHasValue(kUser, L"Software\\Mirovan\\Other", L"v"));
    EXPECT_TRUE(RegHasValue(kUser, kRunOnce, kNeighbour));
    EXPECT_TRUE(RegHasValue(kUser, kOutlookGeneral, L"NoSchedulePermission"));

    Run(L"smsclearoldoireg");
    EXPECT_FALSE(RegHasValue(kUser, kOutlookGeneral, L"NoSchedulePermission"));
    EXPECT_TRUE(RegHasValue(kUser, kOutlookGeneral, L"Other"));
}

}  // namespace
