// Actions 3, 4, 6 and 8 through the Suite service, registered in the test's
// prefix as an out-of-process COM server: what reaches the service (calls and
// documents), which events end the wait, the retry after a failed call,
// hostile answers, and (ServiceGateSlow, labelled slow) the watchdog ending
// a wait that no event ends after 90 s or 120 s.
#include <windows.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "tests/fakes/qmsrv/fake_script.h"
#include "tests/fakes/qmsrv/stand_in_control.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

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
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
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

// True when the parts occur in text in this order.
bool InOrder(const std::string& text, const std::vector<std::string>& parts) {
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

const wchar_t kStartMeeting[] =
    L"<CmdLine><Action>StartOCMeeting</Action><Client>NI</Client><hWnd>1234</hWnd></CmdLine>";
const std::vector<std::string> kMeetingCalls = {"HasValidAccount", "StartOCMeeting",
                                                "CheckIfDisclaimerInProgress"};

double CallTime(const ServiceEntry& call) {
    return atof(call.args.back().c_str());
}

class EndingEventTest : public ServiceGateTest, public ::testing::WithParamInterface<int> {};

TEST_P(EndingEventTest, StartMeetingSendsTheWindowAndEndsOnTheEvent) {
    std::string event = std::to_string(GetParam());
    Run("Event=StartOCMeeting Meeting " + event + " 400 1 2\n", kStartMeeting);
    EXPECT_EQ(kMeetingCalls, m_service.CallNames());
    EXPECT_EQ(
        "<?xml version=\"1.0\"?><Mirovan_QM><Func_Params><ParentHWnd>1234</ParentHWnd>"
        "<StartType>1</StartType><QM>2</QM></Func_Params></Mirovan_QM>",
        OnlyDocument("StartOCMeeting"));
    EXPECT_LT(m_endMs - m_service.TimeOf("event", "Meeting." + event), 1000);
}

INSTANTIATE_TEST_SUITE_P(Dispids, EndingEventTest, ::testing::Values(96, 16));

TEST_F(ServiceGateTest, ProgressEventDoesNotEndTheWait) {
    Run("Event=StartOCMeeting Meeting 80 200 1 2\nEvent=StartOCMeeting Meeting 96 1500 1\n",
        kStartMeeting);
    EXPECT_GT(m_service.TimeOf("event", "Meeting.80"), 0);
    EXPECT_GT(m_service.TimeOf("call", "CheckIfDisclaimerInProgress"),
              m_service.TimeOf("event", "Meeting.96"));
}

TEST_F(ServiceGateTest, DisclaimerInProgressWaitsForAnotherEvent) {
    RunResult run =
        Run("DisclaimerCount=2\nEvent=StartOCMeeting Meeting 96 300 1\n"
            "Event=CheckIfDisclaimerInProgress Meeting 16 400 0 0\n",
            kStartMeeting);
    std::vector<ServiceEntry> checks = m_service.Calls("CheckIfDisclaimerInProgress");
    ASSERT_EQ(3u, checks.size());
    // Each later check waited for the event that the one before it started.
    EXPECT_GE(CallTime(checks[1]) - CallTime(checks[0]), 350);
    EXPECT_GE(CallTime(checks[2]) - CallTime(checks[1]), 350);
    EXPECT_EQ(2, run.CountTraces(" PSO LOG: QMServiceHandle, disclaimer is in progress, wait "
                                 "for more time to end,\n"));
}

TEST_F(ServiceGateTest, EventRaisedInsideTheCallStillEndsTheWait) {
    Run("Event=StartOCMeeting Meeting 96 sync 1\n", kStartMeeting, 30000);
    EXPECT_EQ(kMeetingCalls, m_service.CallNames());
}

TEST_F(ServiceGateTest, FailedCallIsRetriedOnARecreatedObjectWhoseEventEndsTheWait) {
    RunResult run = Run("Fail=StartOCMeeting 1 0x80040201\nEvent=StartOCMeeting Meeting 96 300 1\n",
                        kStartMeeting);
    EXPECT_EQ(2u, m_service.Calls("StartOCMeeting").size());
    EXPECT_TRUE(run.HasTrace(
        " Exception,IDispatch error #1,CIMeetingWrapper::StartOCMeeting,errorID=0x80040201,\n"))
        << run.TraceText();
    EXPECT_TRUE(run.HasTrace(" ReCreateInstance Success, qmSrv Recover success,\n"));
    EXPECT_LT(m_endMs - m_service.TimeOf("event", "Meeting.96"), 1000);
}

TEST_F(ServiceGateTest, RejectedRequestAsksForTheErrorAndDoesNotWait) {
    Run("StartOCMeetingResult=5\n", kStartMeeting);
    EXPECT_EQ((std::vector<std::string>{"HasValidAccount", "StartOCMeeting", "GetLastError"}),
              m_service.CallNames());
}

TEST_F(ServiceGateTest, NoServiceRegisteredLogsTheCreationFailure) {
    ASSERT_TRUE(m_service.Unregister());
    RunResult run = Run("", kStartMeeting);
    EXPECT_TRUE(run.HasTrace(" CreateInstance fail,hr=-2147221164,\n")) << run.TraceText();
    EXPECT_TRUE(m_service.Log().empty());
}

class WithoutAccountTest : public ServiceGateTest,
                           public ::testing::WithParamInterface<const wchar_t*> {};

TEST_P(WithoutAccountTest, BecomesALoginWithTheAccountsSiteAndUser) {
    Run("HasValidAccount=0\nAccountInfo=<?xml version=\"1.0\"?><Mirovan_QM><Func_Params>"
        "<SiteUrl>https://mrv.example/s</SiteUrl><UserName>jdoe</UserName></Func_Params>"
        "</Mirovan_QM>\n",
        GetParam());
    EXPECT_EQ((std::vector<std::string>{"HasValidAccount", "GetAccountInfo", "GeneralCall"}),
              m_service.CallNames());
    std::string request = OnlyDocument("GeneralCall");
    EXPECT_TRUE(
        InOrder(request, {"<ParentHWnd>0</ParentHWnd>", "<SiteUrl>https://mrv.example/s</SiteUrl>",
                          "<UserName>jdoe</UserName>", "<Editable>1</Editable>"}))
        << request;
}

INSTANTIATE_TEST_SUITE_P(MeetingAndSettings, WithoutAccountTest,
                         ::testing::Values(kStartMeeting,
                                           L"<CmdLine><Action>OpenQMSetting</Action><SiteUrl>"
                                           L"https://other.example</SiteUrl></CmdLine>"));

TEST_F(ServiceGateTest, CommonLoginSendsItsFieldsInOrderWithParentWindowZero) {
    RunResult run = Run(
        "LoginResponse=<Mirovan_QM><Func_Params><LoginResult>success</LoginResult>"
        "</Func_Params></Mirovan_QM>\n",
        L"<CmdLine><Action>CommonLogin</Action><SiteUrl>https://a.example</SiteUrl><Username>u1"
        L"</Username><Editable>0</Editable><Email>u1@a.example</Email><hWnd>77</hWnd></CmdLine>");
    std::string request = OnlyDocument("GeneralCall");
    EXPECT_TRUE(InOrder(
        request, {"<Mirovan_QM>", "<Func_Params>", "<CommonLogin>", "<ParentHWnd>0</ParentHWnd>",
                  "<SiteUrl>https://a.example</SiteUrl>", "<UserName>u1</UserName>",
                  "<Editable>0</Editable>", "<Email>u1@a.example</Email>", "</CommonLogin>"}))
        << request;
    EXPECT_TRUE(run.HasTraceContaining("<LoginResult>success</LoginResult>"));  // level 2
}

class SettingsDialogTest
    : public ServiceGateTest,
      public ::testing::WithParamInterface<std::pair<const wchar_t*, std::vector<std::string>>> {};

TEST_P(SettingsDialogTest, OpensTheDialogAndPumpsUntilItIsClosed) {
    Run("SettingDlgOpenMs=1200\n", GetParam().first);
    std::string document = OnlyDocument("OpenSettingDlg");
    EXPECT_TRUE(InOrder(document, GetParam().second)) << document;
    std::vector<ServiceEntry> polls = m_service.Calls("IsSettingDlgOpened");
    ASSERT_FALSE(polls.empty());
    EXPECT_GE(CallTime(polls.back()) - m_service.TimeOf("call", "OpenSettingDlg"), 1200);
    EXPECT_EQ("IsSettingDlgOpened", m_service.CallNames().back());
}

INSTANTIATE_TEST_SUITE_P(
    WithAndWithoutSite, SettingsDialogTest,
    ::testing::Values(
        std::make_pair(L"<CmdLine><Action>OpenQMSetting</Action></CmdLine>",
                       std::vector<std::string>{"(null)"}),
        std::make_pair(L"<CmdLine><Action>OpenQMSetting</Action><SiteUrl>https://b.example"
                       L"</SiteUrl></CmdLine>",
                       std::vector<std::string>{"<SwitchSite>",
                                                "<SiteUrl>https://b.example</SiteUrl>",
                                                "</SwitchSite>"})));

TEST_F(ServiceGateTest, ServiceEndingWhileTheDialogIsOpenEndsThePump) {
    RunResult run = Run("SettingDlgOpenMs=600000\nExitAfter=OpenSettingDlg 300\n",
                        L"<CmdLine><Action>OpenQMSetting</Action></CmdLine>");
    EXPECT_TRUE(run.HasTraceContaining(",CISettingWrapper::IsSettingDlgOpened,errorID=0x"))
        << run.TraceText();
}

class ShareNothingTest : public ServiceGateTest,
                         public ::testing::WithParamInterface<const wchar_t*> {};

TEST_P(ShareNothingTest, EmptyPathOrFlagSendsNothing) {
    Run("", GetParam());
    EXPECT_TRUE(m_service.CallNames().empty());
}

INSTANTIATE_TEST_SUITE_P(
    EmptyFields, ShareNothingTest,
    ::testing::Values(L"<CmdLine><Action>ShareAsApp</Action><ShareFlag>2</ShareFlag></CmdLine>",
                      L"<CmdLine><Action>ShareAsApp</Action><SharePathFile>C:\\a.exe"
                      L"</SharePathFile><ShareFlag></ShareFlag></CmdLine>"));

TEST_F(ServiceGateTest, ShareSendsFlagPathAndWindowInOrderAndEndsOnTheEvent) {
    RunResult run = Run("Event=StartOCMeeting Meeting 96 300 1\n",
                        L"<CmdLine><Action>ShareAsApp</Action><SharePathFile>C:\\Apps\\deck.exe"
                        L"</SharePathFile><ShareFlag>2</ShareFlag><hWnd>55</hWnd></CmdLine>");
    std::string request = OnlyDocument("StartOCMeeting");
    EXPECT_TRUE(
        InOrder(request, {"<StartType>1</StartType>", "<QM>2</QM>", "<ShareFlag>2</ShareFlag>",
                          "<SharePathFile>C:\\Apps\\deck.exe</SharePathFile>",
                          "<ParentHWnd>55</ParentHWnd>", "</Func_Params>"}))
        << request;
    EXPECT_TRUE(run.HasTraceContaining(" bstrXML.m_str=<?xml"));
    EXPECT_LT(m_endMs - m_service.TimeOf("event", "Meeting.96"), 2000);
}

class HostileAnswerTest : public ServiceGateTest,
                          public ::testing::WithParamInterface<const char*> {};

TEST_P(HostileAnswerTest, LoginIsStillSentAndTheProgramEndsCleanly) {
    Run(std::string("HasValidAccount=0\n") + GetParam(), kStartMeeting);
    EXPECT_EQ(1u, m_service.Calls("GeneralCall").size());
}

INSTANTIATE_TEST_SUITE_P(
    Answers, HostileAnswerTest,
    ::testing::Values("AccountInfo=this is <not xml\nLoginResponse=<<<\n",
                      "AccountInfo=<Mirovan_QM><Func_Params><SiteUrl><b>x</b></SiteUrl>"
                      "</Func_Params><Func_Params><UserName/></Func_Params></Mirovan_QM>\n"
                      "LoginResponse=<LoginResult>success</LoginResult>\n",
                      "AccountInfoResult=1\n"));

class ServiceGateSlow : public ServiceGateTest {};

TEST_F(ServiceGateSlow, ServiceEndingDuringTheMeetingWaitLeavesItToTheWatchdog) {
    RunResult run =
        Run("ExitAfter=StartOCMeeting 300\n",
            L"<CmdLine><Action>StartOCMeeting</Action><hWnd>1</hWnd></CmdLine>", 150000);
    EXPECT_GE(m_endMs - m_service.TimeOf("call", "StartOCMeeting"), 89500);
    EXPECT_LT(m_endMs - m_startMs, 110000);
    // The disclaimer question after the wait reached a new service process.
    EXPECT_TRUE(run.HasTrace(" ReCreateInstance Success, qmSrv Recover success,\n"));
}

TEST_F(ServiceGateSlow, ShareWithoutAnEventEndsAfterTwoMinutes) {
    Run("",
        L"<CmdLine><Action>ShareAsApp</Action><SharePathFile>C:\\a.exe</SharePathFile>"
        L"<ShareFlag>1</ShareFlag></CmdLine>",
        170000);
    EXPECT_GE(m_endMs - m_service.TimeOf("call", "StartOCMeeting"), 119500);
    EXPECT_LT(m_endMs - m_startMs, 140000);
}

}  // namespace
