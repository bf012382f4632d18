// The registry keywords end to end: smart-tag action install and removal in
// both registry views, the old context-menu classes, the console user's
// start-up entries and settings key, and the old Outlook integration's
// setting. Each is run once on arranged keys and once more with nothing left
// to remove, when it must complete silently.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"

namespace {

const REGSAM k64 = KEY_WOW64_64KEY;
const wchar_t kActions[] = L"Software\\Microsoft\\Office\\Common\\Smart Tag\\Actions";
const wchar_t kSmartTag[] =
    L"Software\\Microsoft\\Office\\Common\\Smart Tag\\Actions\\"
    L"{0A4C50AC-AD3F-4245-B324-3C8696A3408A}";
const wchar_t kRMenu[] = L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu";
const wchar_t kRMenu1[] = L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu.1";
const wchar_t kHandlers[] = L"SOFTWARE\\Classes\\*\\shellex\\ContextMenuHandlers";
const wchar_t kShareMenu[] =
    L"SOFTWARE\\Classes\\*\\shellex\\ContextMenuHandlers\\MirovanShareMenu";
const wchar_t kRun[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
const wchar_t kRunOnce[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Runonce";
const wchar_t kOutlookGeneral[] = L"Software\\Mirovan_Outlook\\General";

std::string StartRecord(const char* message) {
    return std::string(" ") + message + "\n,\n";
}

// The neighbours a test puts beside the product keys, removed at its end.
class RegistryKeywordsTest : public MachineTest {
protected:
    ~RegistryKeywordsTest() override {
        for (REGSAM view : {REGSAM(0), k64}) {
            RegRemoveTree(HKEY_CURRENT_USER, std::wstring(kActions) + L"\\QMTest-Neighbour", view);
        }
        RegRemoveTree(HKEY_CURRENT_USER, L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu.2");
        RegRemoveTree(HKEY_CURRENT_USER, std::wstring(kHandlers) + L"\\QMTest-Neighbour");
        RegRemoveValue(HKEY_CURRENT_USER, kRun, L"QMTest-Neighbour");
        RegRemoveValue(HKEY_CURRENT_USER, kRunOnce, L"QMTest-Neighbour");
    }

    // Runs -keyword and checks the common frame: no crash, result 0, the
    // dispatcher's entry record and the keyword's start message.
    RunResult RunKeyword(const wchar_t* keyword, const char* message) {
        std::wstring line = std::wstring(L"-") + keyword;
        RunResult run = Program().Run(line);
        EXPECT_FALSE(run.crashed) << Narrow(line);
        EXPECT_FALSE(run.timedOut) << Narrow(line);
        EXPECT_EQ(0, run.exitCode) << Narrow(line);
        EXPECT_GE(run.traces.size(), 2u) << Narrow(line);
        if (run.traces.size() >= 2) {
            EXPECT_EQ("NIHandle lpCmdLine=" + Narrow(line) + ",\n", run.traces[0].text);
            EXPECT_EQ(1u, run.traces[1].level);
            EXPECT_EQ(StartRecord(message), run.traces[1].text);
        }
        return run;
    }
};

TEST_F(RegistryKeywordsTest, SmartTagActionIsInstalledAndRemovedInBothViews) {
    for (REGSAM view : {REGSAM(0), k64}) {
        ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, std::wstring(kActions) + L"\\QMTest-Neighbour",
                                 L"v", L"kept", view));
        ASSERT_FALSE(RegHasKey(HKEY_CURRENT_USER, kSmartTag, view));
    }

    RunResult install =
        RunKeyword(L"smsinstallsmarttag", "qmmirovanoni: For silent install smart tag!");
    EXPECT_EQ(2u, install.traces.size());
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, kSmartTag, 0));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, kSmartTag, k64));

    // Whatever Office put below it goes with it.
    for (REGSAM view : {REGSAM(0), k64}) {
        ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, std::wstring(kSmartTag) + L"\\Sub\\Deep", L"v",
                                 L"x", view));
    }
    RunResult uninstall =
        RunKeyword(L"smsuninstallsmarttag", "qmmirovanoni: For silent uninstall smart tag!");
    EXPECT_EQ(2u, uninstall.traces.size());
    for (REGSAM view : {REGSAM(0), k64}) {
        EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, kSmartTag, view)) << view;
        EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, std::wstring(kActions) + L"\\QMTest-Neighbour",
                                L"v", view))
            << view;
    }

    RunResult again =
        RunKeyword(L"smsuninstallsmarttag", "qmmirovanoni: For silent uninstall smart tag!");
    EXPECT_EQ(2u, again.traces.size());
}

TEST_F(RegistryKeywordsTest, OldContextMenuClassesAndHandlerAreRemoved) {
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kRMenu, L"CurVer", L"MrvRMenu.MirovanRightMenu.1"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kRMenu, L"CLSID", L"{x}"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kRMenu, L"", L"Mirovan right menu"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, std::wstring(kRMenu) + L"\\CLSID", L"", L"{x}"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kRMenu1, L"CLSID", L"{x}"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, std::wstring(kRMenu1) + L"\\CLSID", L"", L"{x}"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kShareMenu, L"", L"{y}"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu.2",
                             L"CLSID", L"{z}"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, std::wstring(kHandlers) + L"\\QMTest-Neighbour",
                             L"", L"{n}"));

    const char* message = "For silent REMOVE clear old rmenu registry from current user.";
    RunResult run = RunKeyword(L"clearoldrmenureg", message);
    EXPECT_EQ(2u, run.traces.size());
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, kRMenu));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, kRMenu1));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, kShareMenu));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu.2",
                            L"CLSID"));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, std::wstring(kHandlers) + L"\\QMTest-Neighbour"));

    RunResult again = RunKeyword(L"clearoldrmenureg", message);
    EXPECT_EQ(2u, again.traces.size());
}

TEST_F(RegistryKeywordsTest, ConsoleUsersStartupEntriesAndSettingsKeyAreRemoved) {
    for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe", L"QMTest-Neighbour"}) {
        ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kRun, name, L"C:\\x.exe"));
    }
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, L"Software\\Mirovan\\QmkTools", L"Path", L"C:\\"));
    ASSERT_TRUE(
        RegPutString(HKEY_CURRENT_USER, L"Software\\Mirovan\\QmkTools\\Sub\\Deep", L"v", L"x"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, L"Software\\Mirovan\\Other", L"v", L"kept"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kRunOnce, L"Mirovan_QM", L"C:\\x.exe"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kRunOnce, L"QMTest-Neighbour", L"C:\\x.exe"));

    const char* message = "qmmirovanoni.exe: Call clearcuruserqmreg.";
    RunResult run = RunKeyword(L"clearcuruserqmreg", message);
    EXPECT_EQ(2u, run.traces.size());
    for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe"}) {
        EXPECT_FALSE(RegHasValue(HKEY_CURRENT_USER, kRun, name)) << Narrow(name);
    }
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, kRun, L"QMTest-Neighbour"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, L"Software\\Mirovan\\QmkTools"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, L"Software\\Mirovan\\Other", L"v"));
    EXPECT_FALSE(RegHasValue(HKEY_CURRENT_USER, kRunOnce, L"Mirovan_QM"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, kRunOnce, L"QMTest-Neighbour"));

    RunResult again = RunKeyword(L"clearcuruserqmreg", message);
    EXPECT_EQ(2u, again.traces.size());
}

TEST_F(RegistryKeywordsTest, OldOutlookIntegrationSettingIsRemoved) {
    ASSERT_TRUE(RegPutDword(HKEY_CURRENT_USER, kOutlookGeneral, L"NoSchedulePermission", 1));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kOutlookGeneral, L"Other", L"kept"));

    const char* message = "qmmirovanoni: For silent install smsclearoldoireg!";
    const std::string removal = " RemoveOldOIRegistry(HKEY hMainKey).,\n";
    RunResult run = RunKeyword(L"smsclearoldoireg", message);
    ASSERT_EQ(3u, run.traces.size());
    EXPECT_EQ(1u, run.traces[2].level);
    EXPECT_EQ(removal, run.traces[2].text);
    EXPECT_FALSE(RegHasValue(HKEY_CURRENT_USER, kOutlookGeneral, L"NoSchedulePermission"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, kOutlookGeneral, L"Other"));

    RunResult again = RunKeyword(L"smsclearoldoireg", message);
    ASSERT_EQ(3u, again.traces.size());
    EXPECT_EQ(removal, again.traces[2].text);
}

}  // namespace
