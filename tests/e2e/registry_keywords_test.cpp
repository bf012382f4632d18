// The registry keywords end to end: the smart-tag action in both registry
// views, the old context-menu classes, the console user's start-up entries and
// settings key, and the old Outlook integration's setting. Each removes exactly
// its own entries, and a rerun with nothing left to remove completes silently.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"

namespace {

const REGSAM k64 = KEY_WOW64_64KEY;
const HKEY kUser = HKEY_CURRENT_USER;
const std::wstring kActions = L"Software\\Microsoft\\Office\\Common\\Smart Tag\\Actions";
const std::wstring kSmartTag = kActions + L"\\{0A4C50AC-AD3F-4245-B324-3C8696A3408A}";
const std::wstring kClasses = L"SOFTWARE\\Classes\\";
const std::wstring kRMenu = kClasses + L"MrvRMenu.MirovanRightMenu";
const std::wstring kHandlers = kClasses + L"*\\shellex\\ContextMenuHandlers\\";
const std::wstring kRun = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
const std::wstring kRunOnce = L"Software\\Microsoft\\Windows\\CurrentVersion\\Runonce";
const std::wstring kQmTools = L"Software\\Mirovan\\QmkTools";
const std::wstring kOutlookGeneral = L"Software\\Mirovan_Outlook\\General";
const wchar_t kNeighbour[] = L"QMTest-Neighbour";

class RegistryKeywordsTest : public MachineTest {
protected:
    ~RegistryKeywordsTest() override {
        for (REGSAM view : {REGSAM(0), k64}) {
            RegRemoveTree(kUser, kActions + L"\\" + kNeighbour, view);
        }
        RegRemoveTree(kUser, kRMenu + L".2");
        RegRemoveTree(kUser, kHandlers + kNeighbour);
        RegRemoveValue(kUser, kRun, kNeighbour);
        RegRemoveValue(kUser, kRunOnce, kNeighbour);
    }

    // Runs -keyword: no crash, result 0, the dispatcher's entry record, the
    // keyword's start message at level 1 and `records` records in all.
    RunResult RunKeyword(const wchar_t* keyword, const char* message, size_t records = 2) {
        std::wstring line = std::wstring(L"-") + keyword;
        SCOPED_TRACE(Narrow(line));
        RunResult run = Program().Run(line);
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        EXPECT_EQ(records, run.traces.size());
        if (run.traces.size() >= 2) {
            EXPECT_EQ("NIHandle lpCmdLine=" + Narrow(line) + ",\n", run.traces[0].text);
            EXPECT_EQ(1u, run.traces[1].level);
            EXPECT_EQ(std::string(" ") + message + "\n,\n", run.traces[1].text);
        }
        return run;
    }
};

TEST_F(RegistryKeywordsTest, SmartTagActionIsInstalledAndRemovedInBothViews) {
    for (REGSAM view : {REGSAM(0), k64}) {
        ASSERT_TRUE(RegPutString(kUser, kActions + L"\\" + kNeighbour, L"v", L"kept", view));
        ASSERT_FALSE(RegHasKey(kUser, kSmartTag, view));
    }
    RunKeyword(L"smsinstallsmarttag", "qmmirovanoni: For silent install smart tag!");
    for (REGSAM view : {REGSAM(0), k64}) {
        EXPECT_TRUE(RegHasKey(kUser, kSmartTag, view)) << view;
        // Whatever Office put below it goes with it.
        ASSERT_TRUE(RegPutString(kUser, kSmartTag + L"\\Sub\\Deep", L"v", L"x", view));
    }
    const char* uninstall = "qmmirovanoni: For silent uninstall smart tag!";
    RunKeyword(L"smsuninstallsmarttag", uninstall);
    for (REGSAM view : {REGSAM(0), k64}) {
        EXPECT_FALSE(RegHasKey(kUser, kSmartTag, view)) << view;
        EXPECT_TRUE(RegHasValue(kUser, kActions + L"\\" + kNeighbour, L"v", view)) << view;
    }
    RunKeyword(L"smsuninstallsmarttag", uninstall);
}

TEST_F(RegistryKeywordsTest, CleanupKeywordsRemoveExactlyTheirEntries) {
    // One machine for all three: each keyword must also spare the others' entries.
    ASSERT_TRUE(RegPutString(kUser, kRMenu, L"CurVer", L"MrvRMenu.MirovanRightMenu.1"));
    ASSERT_TRUE(RegPutString(kUser, kRMenu + L"\\CLSID", L"", L"{x}"));
    ASSERT_TRUE(RegPutString(kUser, kRMenu + L".1\\CLSID", L"", L"{x}"));
    ASSERT_TRUE(RegPutString(kUser, kHandlers + L"MirovanShareMenu", L"", L"{y}"));
    ASSERT_TRUE(RegPutString(kUser, kRMenu + L".2", L"CLSID", L"{z}"));
    ASSERT_TRUE(RegPutString(kUser, kHandlers + kNeighbour, L"", L"{n}"));
    for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe", kNeighbour}) {
        ASSERT_TRUE(RegPutString(kUser, kRun, name, L"C:\\x.exe"));
    }
    ASSERT_TRUE(RegPutString(kUser, kQmTools + L"\\Sub\\Deep", L"v", L"x"));
    ASSERT_TRUE(RegPutString(kUser, L"Software\\Mirovan\\Other", L"v", L"kept"));
    ASSERT_TRUE(RegPutString(kUser, kRunOnce, L"Mirovan_QM", L"C:\\x.exe"));
    ASSERT_TRUE(RegPutString(kUser, kRunOnce, kNeighbour, L"C:\\x.exe"));
    ASSERT_TRUE(RegPutDword(kUser, kOutlookGeneral, L"NoSchedulePermission", 1));
    ASSERT_TRUE(RegPutString(kUser, kOutlookGeneral, L"Other", L"kept"));

    const char* rmenu = "For silent REMOVE clear old rmenu registry from current user.";
    RunKeyword(L"clearoldrmenureg", rmenu);
    EXPECT_FALSE(RegHasKey(kUser, kRMenu));
    EXPECT_FALSE(RegHasKey(kUser, kRMenu + L".1"));
    EXPECT_FALSE(RegHasKey(kUser, kHandlers + L"MirovanShareMenu"));
    EXPECT_TRUE(RegHasValue(kUser, kRMenu + L".2", L"CLSID"));
    EXPECT_TRUE(RegHasKey(kUser, kHandlers + kNeighbour));
    EXPECT_TRUE(RegHasValue(kUser, kRun, L"QMOneClick"));
    EXPECT_TRUE(RegHasKey(kUser, kQmTools));

    const char* curUser = "qmmirovanoni.exe: Call clearcuruserqmreg.";
    RunKeyword(L"clearcuruserqmreg", curUser);
    for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe"}) {
        EXPECT_FALSE(RegHasValue(kUser, kRun, name)) << Narrow(name);
    }
    EXPECT_TRUE(RegHasValue(kUser, kRun, kNeighbour));
    EXPECT_FALSE(RegHasKey(kUser, kQmTools));
    EXPECT_TRUE(RegHasValue(kUser, L"Software\\Mirovan\\Other", L"v"));
    EXPECT_FALSE(RegHasValue(kUser, kRunOnce, L"Mirovan_QM"));
    EXPECT_TRUE(RegHasValue(kUser, kRunOnce, kNeighbour));
    EXPECT_TRUE(RegHasValue(kUser, kOutlookGeneral, L"NoSchedulePermission"));

    const char* oldOi = "qmmirovanoni: For silent install smsclearoldoireg!";
    const std::string removal = " RemoveOldOIRegistry(HKEY hMainKey).,\n";
    RunResult run = RunKeyword(L"smsclearoldoireg", oldOi, 3);
    ASSERT_EQ(3u, run.traces.size());
    EXPECT_EQ(1u, run.traces[2].level);
    EXPECT_EQ(removal, run.traces[2].text);
    EXPECT_FALSE(RegHasValue(kUser, kOutlookGeneral, L"NoSchedulePermission"));
    EXPECT_TRUE(RegHasValue(kUser, kOutlookGeneral, L"Other"));
    EXPECT_TRUE(RegHasValue(kUser, kRMenu + L".2", L"CLSID"));

    // Nothing left to remove: the same records and nothing else.
    RunKeyword(L"clearoldrmenureg", rmenu);
    RunKeyword(L"clearcuruserqmreg", curUser);
    EXPECT_EQ(removal, RunKeyword(L"smsclearoldoireg", oldOi, 3).traces.at(2).text);
}

}  // namespace
