// The Maintenance command keywords with a start message of their own, run on
// a machine without any of the products: the message each logs right after
// the dispatcher's entry record (level 1, byte for byte) and the exit code 0.

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
    {L"deleteregfeaturecontrol", "qmmirovanoni: For silent install deleteregfeaturecontrol!"},
    {L"smsrefreshsysenv", "qmmirovanoni.exe: Call smsrefreshsysenv."},
    {L"updateshortcuts", "qmmirovanoni.exe: Call udpateshortlinks."},
    {L"addshortcuts", "qmmirovanoni.exe: Call addshortcutslinks."},
    {L"delunuseddata", "qmmirovanoni.exe: Call delshortcuts and ClearAllCurUserqmreg."},
    {L"delshortcuts", "qmmirovanoni.exe: Call delshortcuts."},
    {L"modifyadminmsidisplayversion", "qmmirovanoni.exe: Call modifymsiadmindisplayversion."},
};

class KeywordsTest : public MachineTest {};

TEST_F(KeywordsTest, EachKeywordLogsItsStartMessageAndEndsWithZero) {
    for (const auto& c : kKeywords) {
        const std::wstring line = std::wstring(L"-") + c.keyword;
        SCOPED_TRACE(Narrow(line));
        RunResult run = Program().Run(line);
        EXPECT_FALSE(run.crashed || run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        ASSERT_GE(run.traces.size(), 2u);
        EXPECT_EQ("NIHandle lpCmdLine=" + Narrow(line) + ",\n", run.traces[0].text);
        EXPECT_EQ(1u, run.traces[1].level);
        EXPECT_EQ(std::string(" ") + c.startMessage + "\n,\n", run.traces[1].text);
    }
}

}  // namespace
