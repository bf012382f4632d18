// Actions 3, 4, 6 and 8 through the stand-in Suite service, an out-of-process
// COM server; ServiceGateSlow (labelled slow) waits out the watchdog.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/fakes/qmsrv/fake_script.h"
#include "tests/fakes/qmsrv/stand_in_control.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

using Names = std::vector<std::string>;

std::wstring Command(const std::wstring& action, const std::wstring& elements = L"") {
    return L"<CmdLine><Action>" + action + L"</Action>" + elements + L"</CmdLine>";
}

const std::wstring kStartMeeting =
    Command(L"StartOCMeeting", L"<Client>NI</Client><hWnd>1234</hWnd>");
const Names kMeetingCalls = {"HasValidAccount", "StartOCMeeting", "CheckIfDisclaimerInProgress"};

// True when the parts occur in text in this order.
bool InOrder(const std::string& text, const Names& parts) {
    size_t at = 0;
    for (const std::string& part : parts) {
        at = text.find(part, at);
        if (at == std::string::npos) {
            return false;
        }
        at += part.size();
    }
    return true;
}

class ServiceGateTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(m_service.registered());
        m_program.SetEnv(L"QM_FAKE_QMSRV_SCRIPT", m_service.scriptPath());
        m_program.SetEnv(L"QM_FAKE_QMSRV_LOG", m_service.logPath());
    }

    // Runs the command line with the script; m_endMs is when it ended.
    RunResult Run(const std::string& script, const std::wstring& commandLine,
                  DWORD timeoutMs = 60000) {
        m_service.SetScript(script);
        m_startMs = fake::CounterMs();
        RunResult run = m_program.Run(commandLine, timeoutMs);
        m_endMs = fake::CounterMs();
        ServiceStandIn::WaitForServersToEnd();
        EXPECT_FALSE(run.crashed || run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }

    // The document of the only call of method.
    std::string OnlyDocument(const std::string& method) const {
        std::vector<ServiceEntry> calls = m_service.Calls(method);
        EXPECT_EQ(1u, calls.size()) << method;
        return calls.size() == 1 && calls[0].args.size() == 2 ? calls[0].args[0] : std::string();
    }

    ScratchDir m_scratch{L"gate"};
    ProgramUnderTest m_program{m_scratch.Sub(L"bin")};
    ServiceStandIn m_service{FakePath(L"qmSrv.exe"), m_scratch.Sub(L"service", true)};
    double m_startMs = 0;
    double m_endMs = 0;
};

// The request's document, and the events that end the wait: 96 and 16, not 80.
// The share's watchdog keeps half a second on the way out.
TEST_F(ServiceGateTest, MeetingAndShareSendTheirDocumentAndEndOnTheEvent) {
    const Names meeting = {"<ParentHWnd>1234</ParentHWnd>", "<StartType>1</StartType>",
                           "<QM>2</QM>", "</Func_Params>"};
    const struct {
        const char* events;
        std::wstring command;
        Names document;
        const char* ending;
        double limitMs;
    } rows[] = {
        {"Event=StartOCMeeting Meeting 96 400 1 2\n", kStartMeeting, meeting, "Meeting.96", 1000},
        {"Event=StartOCMeeting Meeting 16 400 1 2\n", kStartMeeting, meeting, "Meeting.16", 1000},
        {"Event=StartOCMeeting Meeting 80 200 1 2\nEvent=StartOCMeeting Meeting 96 1500 1\n",
         kStartMeeting, meeting, "Meeting.96", 1000},
        {"Event=StartOCMeeting Meeting 96 300 1\n",
         Command(L"ShareAsApp",
                 L"<SharePathFile>C:\\Apps\\deck.exe</SharePathFile><ShareFlag>2"
                 L"</ShareFlag><hWnd>55</hWnd>"),
         {"<StartType>1</StartType>", "<QM>2</QM>", "<ShareFlag>2</ShareFlag>",
          "<SharePathFile>C:\\Apps\\deck.exe</SharePathFile>", "<ParentHWnd>55</ParentHWnd>",
          "</Func_Params>"},
         "Meeting.96",
         2000},
    };
    for (const auto& row : rows) {
        Run(row.events, row.command);
        std::string document = OnlyDocument("StartOCMeeting");
        EXPECT_TRUE(InOrder(document, row.document)) << document;
        // The process ended within limitMs after the service raised the event.
        double since = m_endMs - m_service.TimeOf("event", row.ending);
        EXPECT_TRUE(since >= 0 && since < row.limitMs) << row.ending << " " << since;
    }
}

TEST_F(ServiceGateTest, DisclaimerInProgressWaitsForAnotherEvent) {
    Run("DisclaimerCount=2\nEvent=StartOCMeeting Meeting 96 300 1\n"
        "Event=CheckIfDisclaimerInProgress Meeting 16 400 0 0\n",
        kStartMeeting);
    // Each later check waited for the event that the one before it started.
    EXPECT_EQ(3u, m_service.Calls("CheckIfDisclaimerInProgress").size());
    EXPECT_GE(m_endMs - m_startMs, 1100);
}

TEST_F(ServiceGateTest, FailedCallIsRetriedOnARecreatedObjectWhoseEventEndsTheWait) {
    RunResult run = Run("Fail=StartOCMeeting 1 0x80040201\nEvent=StartOCMeeting Meeting 96 300 1\n",
                        kStartMeeting);
    EXPECT_EQ(2u, m_service.Calls("StartOCMeeting").size());
    EXPECT_TRUE(run.HasTrace(
        " Exception,IDispatch error #1,CIMeetingWrapper::StartOCMeeting,errorID=0x80040201,\n"))
        << run.TraceText();
    EXPECT_TRUE(run.HasTrace(" ReCreateInstance Success, qmSrv Recover success,\n"));
}

// However the service answers, each run ends by itself well within 30 s.
TEST_F(ServiceGateTest, CallsThatReachTheService) {
    const std::string noAccount = "HasValidAccount=0\n";
    const Names login = {"HasValidAccount", "GetAccountInfo", "GeneralCall"};
    const struct {
        std::string script;
        std::wstring command;
        Names calls;
    } rows[] = {
        // A request the service turns down is followed by its error, not a wait.
        {"StartOCMeetingResult=5\n",
         kStartMeeting,
         {"HasValidAccount", "StartOCMeeting", "GetLastError"}},
        {"Event=StartOCMeeting Meeting 96 sync 1\n", kStartMeeting, kMeetingCalls},
        {"", Command(L"ShareAsApp", L"<ShareFlag>2</ShareFlag>"), {}},
        {"", Command(L"ShareAsApp", L"<SharePathFile>C:\\a.exe</SharePathFile><ShareFlag/>"), {}},
        // An account that is not XML or cannot be read still gives the login.
        {noAccount + "AccountInfo=this is <not xml\nLoginResponse=<<<\n", kStartMeeting, login},
        {noAccount + "AccountInfoResult=1\n", kStartMeeting, login},
    };
    for (const auto& row : rows) {
        Run(row.script, row.command, 30000);
        EXPECT_EQ(row.calls, m_service.CallNames()) << row.script;
    }
}

// Action 8, and Actions 3 and 4 without a valid account, send one login
// request and nothing after it.
TEST_F(ServiceGateTest, LoginSendsItsFieldsInOrderWithParentWindowZero) {
    const std::string account =
        "HasValidAccount=0\nAccountInfo=<?xml version=\"1.0\"?><Mirovan_QM><Func_Params>"
        "<SiteUrl>https://mrv.example/s</SiteUrl><UserName>jdoe</UserName></Func_Params>"
        "</Mirovan_QM>\n";
    const Names fromAccount = {"<ParentHWnd>0</ParentHWnd>",
                               "<SiteUrl>https://mrv.example/s</SiteUrl>",
                               "<UserName>jdoe</UserName>", "<Editable>1</Editable>"};
    const struct {
        std::string script;
        std::wstring command;
        Names request;
    } rows[] = {
        {"",
         Command(L"CommonLogin",
                 L"<SiteUrl>https://a.example</SiteUrl><Username>u1</Username>"
                 L"<Editable>0</Editable><Email>u1@a.example</Email><hWnd>77</hWnd>"),
         {"<Mirovan_QM>", "<Func_Params>", "<CommonLogin>", "<ParentHWnd>0</ParentHWnd>",
          "<SiteUrl>https://a.example</SiteUrl>", "<UserName>u1</UserName>",
          "<Editable>0</Editable>", "<Email>u1@a.example</Email>", "</CommonLogin>"}},
        {account, kStartMeeting, fromAccount},
        {account, Command(L"OpenQMSetting", L"<SiteUrl>https://b.example</SiteUrl>"), fromAccount},
    };
    for (const auto& row : rows) {
        Run(row.script, row.command);
        EXPECT_EQ("GeneralCall", m_service.CallNames().back());
        std::string request = OnlyDocument("GeneralCall");
        EXPECT_TRUE(InOrder(request, row.request)) << request;
    }
}

TEST_F(ServiceGateTest, SettingsDialogIsPumpedUntilItIsClosed) {
    const struct {
        std::wstring command;
        Names document;
    } rows[] = {
        {Command(L"OpenQMSetting"), {"(null)"}},
        {Command(L"OpenQMSetting", L"<SiteUrl>https://b.example</SiteUrl>"),
         {"<SwitchSite>", "<SiteUrl>https://b.example</SiteUrl>", "</SwitchSite>"}},
    };
    for (const auto& row : rows) {
        Run("SettingDlgOpenMs=1200\n", row.command);
        std::string document = OnlyDocument("OpenSettingDlg");
        EXPECT_TRUE(InOrder(document, row.document)) << document;
        EXPECT_GE(m_endMs - m_service.TimeOf("call", "OpenSettingDlg"), 1200);
    }
}

class ServiceGateSlow : public ServiceGateTest {};

// The watchdog ends the meeting's wait after 90 s, also when the service ended
// during it, and the share's after 120 s.
TEST_F(ServiceGateSlow, WatchdogEndsAWaitThatNoEventEnds) {
    const struct {
        const char* script;
        std::wstring command;
        double waitMs;
    } rows[] = {
        {"ExitAfter=StartOCMeeting 300\n", kStartMeeting, 90000},
        {"",
         Command(L"ShareAsApp",
                 L"<SharePathFile>C:\\a.exe</SharePathFile><ShareFlag>1</ShareFlag>"),
         120000},
    };
    for (const auto& row : rows) {
        Run(row.script, row.command, static_cast<DWORD>(row.waitMs) + 20000);
        EXPECT_GE(m_endMs - m_service.TimeOf("call", "StartOCMeeting"), row.waitMs - 500);
    }
}

}  // namespace
