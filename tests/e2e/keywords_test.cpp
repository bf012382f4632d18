// The Maintenance command keywords on a machine without the products: the
// start message each logs after the entry record (level 1, byte for byte) and
// the exit code 0. And the registry keywords, each removing exactly its own
// entries (the smart-tag action in both registry views).

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"

namespace {

const struct {
    const wchar_t* keyword;
    const char* startMessage;
} kKeywords[] = {
    {L"copyfilestonotes", "Start Copy notesplugin files to notes path!"},
    {L"copyfilestosametime", "Start Copy sametimeplugin files to sametime path!"},
    {L"delnifiles", "Start Delete notes plugin Files for QM Uninstall!"},
    {L"deloldnifiles", "Start Delete old notes plugin Files for QM Uninstall!"},
    {L"delsametimefiles", "Start Delete sametime plugin Files for QM Uninstall!"},
    {L"enablesametime8confige", "qmMirovanONI: Command is enablesametime8confige."},
    {L"disablesametime8confige", "qmMirovanONI: Command is disablesametime8confige."},
    {L"issametime8enable", "qmMirovanONI: Command is issametime8enable."},
    {L"delsametimestampfile", "Start Delete sametime last.config.stamp file for sametime install!"},
    {L"delsametimefilesreboot", "For silent install Start Delete sametime files after pc restart!"},
    {L"smsinstallsametimeex", "smsinstallsametimeex, execute some operator for current user!"},
    {L"smsinstallsmarttag", "qmmirovanoni: For silent install smart tag!"},
    {L"smsuninstallsmarttag", "qmmirovanoni: For silent uninstall smart tag!"},
    {L"uninstalloldoini", "qmmirovanoni: for uninstall old OI and NI!"},
    {L"uninstalloldoi", "qmmirovanoni: Only for uninstall old OI!"},
    {L"uninstalloldni", "qmmirovanoni: for uninstall old NI!"},
    {L"smsdeloldnicuruserkey",
     "qmmirovanoni: smsdeloldnicuruserkey: Delete old NI HKEY_CURRENT_USER key!"},
    {L"smsdeloldoicuruserkey",
     "qmmirovanoni: smsdeloldoicuruserkey: Delete old OI HKEY_CURRENT_USER key!"},
    {L"clearoldrmenureg", "For silent REMOVE clear old rmenu registry from current user."},
    {L"delallqmfiles", "qmmirovanoni.exe: Call delallqmfiles."},
    {L"delupdtemp", "qmmirovanoni.exe: Call delupdtemp."},
    {L"delsametimefilesEx",
     "For disable sametime to delete sametime plugin Files for QM Uninstall!"},
    {L"mocvistainstall", "qmmirovanoni.exe: Call mocvistainstall."},
    {L"clearcuruserqmreg", "qmmirovanoni.exe: Call clearcuruserqmreg."},
    {L"smsclearoldoireg", "qmmirovanoni: For silent install smsclearoldoireg!"},
    {L"smsrefreshsysenv", "qmmirovanoni.exe: Call smsrefreshsysenv."},
    {L"updateshortcuts", "qmmirovanoni.exe: Call udpateshortlinks."},
    {L"addshortcuts", "qmmirovanoni.exe: Call addshortcutslinks."},
    {L"delunuseddata", "qmmirovanoni.exe: Call delshortcuts and ClearAllCurUserqmreg."},
    {L"delshortcuts", "qmmirovanoni.exe: Call delshortcuts."},
    {L"modifyadminmsidisplayversion", "qmmirovanoni.exe: Call modifymsiadmindisplayversion."},
};

const HKEY kUser = HKEY_CURRENT_USER;
const std::wstring kActions = L"Software\\Microsoft\\Office\\Common\\Smart Tag\\Actions";
const std::wstring kSmartTag = kActions + L"\\{0A4C50AC-AD3F-4245-B324-3C8696A3408A}";
const std::wstring kRMenu = L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu";
const std::wstring kHandlers = L"SOFTWARE\\Classes\\*\\shellex\\ContextMenuHandlers\\";
const std::wstring kRun = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
const std::wstring kRunOnce = L"Software\\Microsoft\\Windows\\CurrentVersion\\Runonce";
const std::wstring kOutlookGeneral = L"Software\\Mirovan_Outlook\\General";
const wchar_t kNeighbour[] = L"QMTest-Neighbour";
const REGSAM kViews[] = {0, KEY_WOW64_64KEY};

class KeywordsTest : public MachineTest {
protected:
    ~KeywordsTest() override {
        for (REGSAM view : kViews) {
            RegRemoveTree(kUser, kActions + L"\\" + kNeighbour, view);
        }
        RegRemoveTree(kUser, kRMenu + L".2");
        RegRemoveTree(kUser, kHandlers + kNeighbour);
        RegRemoveValue(kUser, kRun, kNeighbour);
        RegRemoveValue(kUser, kRunOnce, kNeighbour);
    }
    RunResult Run(const std::wstring& keyword) {
        RunResult run = Program().Run(L"-" + keyword);
        EXPECT_FALSE(run.crashed || run.timedOut) << Narrow(keyword);
        EXPECT_EQ(0, run.exitCode) << Narrow(keyword);
        return run;
    }
};

TEST_F(KeywordsTest, EachKeywordLogsItsStartMessageAndEndsWithZero) {
    for (const auto& c : kKeywords) {
        RunResult run = Run(c.keyword);
        ASSERT_GE(run.traces.size(), 2u) << Narrow(c.keyword);
        EXPECT_EQ("NIHandle lpCmdLine=-" + Narrow(c.keyword) + ",\n", run.traces[0].text);
        EXPECT_EQ(1u, run.traces[1].level);
        EXPECT_EQ(std::string(" ") + c.startMessage + "\n,\n", run.traces[1].text);
    }
}

TEST_F(KeywordsTest, SmartTagActionIsInstalledAndRemovedInBothViews) {
    for (REGSAM view : kViews) {
        ASSERT_TRUE(RegPutString(kUser, kActions + L"\\" + kNeighbour, L"v", L"kept", view));
    }
    Run(L"smsinstallsmarttag");
    for (REGSAM view : kViews) {
        EXPECT_TRUE(RegHasKey(kUser, kSmartTag, view)) << view;
        // Whatever Office put below it goes with it.
        ASSERT_TRUE(RegPutString(kUser, kSmartTag + L"\\Sub\\Deep", L"v", L"x", view));
    }
    Run(L"smsuninstallsmarttag");
    for (REGSAM view : kViews) {
        EXPECT_FALSE(RegHasKey(kUser, kSmartTag, view)) << view;
        EXPECT_TRUE(RegHasValue(kUser, kActions + L"\\" + kNeighbour, L"v", view)) << view;
    }
}

TEST_F(KeywordsTest, CleanupKeywordsRemoveExactlyTheirEntries) {
    // One machine for all three: each keyword must also spare the others' entries.
    const wchar_t* const keywords[] = {L"clearoldrmenureg", L"clearcuruserqmreg",
                                       L"smsclearoldoireg"};
    const struct {
        std::wstring key;
        const wchar_t* value;  // nullptr: the key itself, holding a subkey
        int removedBy;         // the index of the keyword that removes it; 3: none
    } entries[] = {
        {kRMenu, nullptr, 0},
        {kRMenu + L".1", nullptr, 0},
        {kHandlers + L"MirovanShareMenu", nullptr, 0},
        {kRMenu + L".2", L"CLSID", 3},
        {kHandlers + kNeighbour, nullptr, 3},
        {kRun, L"QMOneClick", 1},
        {kRun, L"QMIM.exe", 1},
        {kRun, L"qmmsgfrm.exe", 1},
        {kRun, kNeighbour, 3},
        {L"Software\\Mirovan\\QmkTools", nullptr, 1},
        {L"Software\\Mirovan\\Other", L"v", 3},
        {kRunOnce, L"Mirovan_QM", 1},
        {kRunOnce, kNeighbour, 3},
        {kOutlookGeneral, L"NoSchedulePermission", 2},
        {kOutlookGeneral, L"Other", 3},
    };
    for (const auto& e : entries) {
        ASSERT_TRUE(e.value ? RegPutString(kUser, e.key, e.value, L"C:\\x.exe")
                            : RegPutString(kUser, e.key + L"\\CLSID", L"", L"{x}"));
    }
    for (int k = 0; k < 3; ++k) {
        Run(keywords[k]);
        for (const auto& e : entries) {
            EXPECT_EQ(e.removedBy > k,
                      e.value ? RegHasValue(kUser, e.key, e.value) : RegHasKey(kUser, e.key))
                << Narrow(keywords[k]) << ": " << Narrow(e.key) << " "
                << Narrow(e.value ? e.value : L"");
        }
    }
}

}  // namespace
