// Every Maintenance command keyword, run on a machine without any of the
// products: the start message each one logs (level 1, byte for byte) and the
// exit code it ends with.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"

namespace {

struct KeywordCase {
    const wchar_t* keyword;
    // Logged right after the dispatcher's entry record; null when the
    // keyword's first record is not a start message of its own.
    const char* startMessage;
    int exitCode;
};

const KeywordCase kKeywords[] = {
    {L"nendupdate", nullptr, 0},
    {L"nendupdatefail", nullptr, 0},
    {L"copyfilestonotes", "Start Copy notesplugin files to notes path!", 0},
    {L"copyfilestosametime", "Start Copy sametimeplugin files to sametime path!", 0},
    {L"delnifiles", "Start Delete notes plugin Files for QM Uninstall!", 0},
    {L"deloldnifiles", "Start Delete old notes plugin Files for QM Uninstall!", 0},
    {L"delsametimefiles", "Start Delete sametime plugin Files for QM Uninstall!", 0},
    {L"enablesametime8confige", "qmMirovanONI: Command is enablesametime8confige.", 0},
    {L"disablesametime8confige", "qmMirovanONI: Command is disablesametime8confige.", 0},
    {L"issametime8enable", "qmMirovanONI: Command is issametime8enable.", 0},
    {L"enablesametime7confige", nullptr, 0},
    {L"disablesametime7confige", nullptr, 0},
    {L"enableSTembedded", nullptr, 0},
    {L"disableSTembedded", nullptr, 0},
    {L"isembedST8enable", nullptr, 0},
    {L"delsametimestampfile", "Start Delete sametime last.config.stamp file for sametime install!",
     0},
    {L"delsametimefilesreboot", "For silent install Start Delete sametime files after pc restart!",
     0},
    {L"smsinstallsametimeex", "smsinstallsametimeex, execute some operator for current user!", 0},
    {L"smsinstallsmarttag", "qmmirovanoni: For silent install smart tag!", 0},
    {L"smsuninstallsmarttag", "qmmirovanoni: For silent uninstall smart tag!", 0},
    {L"uninstalloldoini", "qmmirovanoni: for uninstall old OI and NI!", 0},
    {L"uninstalloldoi", "qmmirovanoni: Only for uninstall old OI!", 0},
    {L"uninstalloldni", "qmmirovanoni: for uninstall old NI!", 0},
    {L"smsdeloldnicuruserkey",
     "qmmirovanoni: smsdeloldnicuruserkey: Delete old NI HKEY_CURRENT_USER key!", 0},
    {L"smsdeloldoicuruserkey",
     "qmmirovanoni: smsdeloldoicuruserkey: Delete old OI HKEY_CURRENT_USER key!", 0},
    {L"clearoldrmenureg", "For silent REMOVE clear old rmenu registry from current user.", 0},
    {L"delallqmfiles", "qmmirovanoni.exe: Call delallqmfiles.", 0},
    {L"delupdtemp", "qmmirovanoni.exe: Call delupdtemp.", 0},
    {L"delsametimefilesEx",
     "For disable sametime to delete sametime plugin Files for QM Uninstall!", 0},
    {L"mocvistainstall", "qmmirovanoni.exe: Call mocvistainstall.", 0},
    {L"clearcuruserqmreg", "qmmirovanoni.exe: Call clearcuruserqmreg.", 0},
    {L"smsclearoldoireg", "qmmirovanoni: For silent install smsclearoldoireg!", 0},
    {L"deleteregfeaturecontrol", "qmmirovanoni: For silent install deleteregfeaturecontrol!", 0},
    {L"smsrefreshsysenv", "qmmirovanoni.exe: Call smsrefreshsysenv.", 0},
    {L"updateshortcuts", "qmmirovanoni.exe: Call udpateshortlinks.", 0},
    {L"addshortcuts", "qmmirovanoni.exe: Call addshortcutslinks.", 0},
    {L"delunuseddata", "qmmirovanoni.exe: Call delshortcuts and ClearAllCurUserqmreg.", 0},
    {L"delshortcuts", "qmmirovanoni.exe: Call delshortcuts.", 0},
    {L"modifyadminmsidisplayversion", "qmmirovanoni.exe: Call modifymsiadmindisplayversion.", 0},
};

class KeywordsTest : public MachineTest {};

TEST_F(KeywordsTest, EachKeywordLogsItsStartMessageAndEndsWithItsResult) {
    for (const KeywordCase& c : kKeywords) {
        std::wstring line = std::wstring(L"-") + c.keyword;
        RunResult run = Program().Run(line);
        SCOPED_TRACE(Narrow(line));
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(c.exitCode, run.exitCode);
        ASSERT_FALSE(run.traces.empty());
        EXPECT_EQ("NIHandle lpCmdLine=" + Narrow(line) + ",\n", run.traces[0].text);
        if (c.startMessage != nullptr) {
            ASSERT_GE(run.traces.size(), 2u);
            EXPECT_EQ(1u, run.traces[1].level);
            EXPECT_EQ(std::string(" ") + c.startMessage + "\n,\n", run.traces[1].text);
        }
    }
}

}  // namespace
