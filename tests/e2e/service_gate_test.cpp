// Actions 3, 4, 6 and 8 through the Suite service: what reaches the service
// (calls and documents), which events end the wait, the retry after a failed
// call, and hostile answers.
#include <cstdlib>

#include "tests/e2e/service_gate_fixture.h"

namespace {

const char kStartMeetingRequest[] =
    "<?xml version=\"1.0\"?><Mirovan_QM><Func_Params><ParentHWnd>1234</ParentHWnd>"
    "<StartType>1</StartType><QM>2</QM></Func_Params></Mirovan_QM>";
const wchar_t kStartMeeting[] =
    L"<CmdLine><Action>StartOCMeeting</Action><Client>NI</Client><hWnd>1234</hWnd></CmdLine>";
const char kAccount[] =
    "AccountInfo=<?xml version=\"1.0\"?><Mirovan_QM><Func_Params><SiteUrl>https://mrv.example/s"
    "</SiteUrl><UserName>jdoe</UserName></Func_Params></Mirovan_QM>\n";

class EndingEventTest : public ServiceGateTest, public ::testing::WithParamInterface<int> {};

TEST_P(EndingEventTest, StartMeetingSendsTheWindowAndEndsOnTheEvent) {
    m_service.SetScript("Event=StartOCMeeting Meeting " + std::to_string(GetParam()) +
                        " 400 1 2\n");
    RunResult run = Run(kStartMeeting);
    ExpectCleanExit(run);
    EXPECT_EQ((std::vector<std::string>{"HasValidAccount", "StartOCMeeting",
                                        "CheckIfDisclaimerInProgress"}),
              m_service.CallNames());
    EXPECT_EQ(kStartMeetingRequest, OnlyDocument("StartOCMeeting"));
    double eventMs = m_service.TimeOf("event", "Meeting." + std::to_string(GetParam()));
    ASSERT_GT(eventMs, 0);
    EXPECT_LT(m_endMs - eventMs, 1000);
}

INSTANTIATE_TEST_SUITE_P(Dispids, EndingEventTest, ::testing::Values(96, 16));

TEST_F(ServiceGateTest, ProgressEventDoesNotEndTheWait) {
    m_service.SetScript(
        "Event=StartOCMeeting Meeting 80 200 1 2\n"
        "Event=StartOCMeeting Meeting 96 1500 1\n");
    RunResult run = Run(kStartMeeting);
    ExpectCleanExit(run);
    double progressMs = m_service.TimeOf("event", "Meeting.80");
    double endedMs = m_service.TimeOf("event", "Meeting.96");
    double checkMs = m_service.TimeOf("call", "CheckIfDisclaimerInProgress");
    ASSERT_GT(progressMs, 0);
    EXPECT_GT(checkMs, endedMs);
}

TEST_F(ServiceGateTest, DisclaimerInProgressWaitsForAnotherEvent) {
    m_service.SetScript(
        "DisclaimerCount=2\n"
        "Event=StartOCMeeting Meeting 96 300 1\n"
        "Event=CheckIfDisclaimerInProgress Meeting 16 400 0 0\n");
    RunResult run = Run(kStartMeeting);
    ExpectCleanExit(run);
    std::vector<ServiceEntry> checks = m_service.Calls("CheckIfDisclaimerInProgress");
    ASSERT_EQ(3u, checks.size());
    // Each check after the first waited for the event the previous one started.
    for (size_t i = 1; i < checks.size(); ++i) {
        EXPECT_GE(atof(checks[i].args.back().c_str()) - atof(checks[i - 1].args.back().c_str()),
                  350)
            << i;
    }
    EXPECT_EQ(2, run.CountTraces(" PSO LOG: QMServiceHandle, disclaimer is in progress, wait "
                                 "for more time to end,\n"));
    EXPECT_EQ(1,
              run.CountTraces(" PSO LOG: CServiceGate::IsDisclaimerInProgress, lInProgress=0,\n"));
}

TEST_F(ServiceGateTest, EventDuringTheCallStillEndsTheWait) {
    m_service.SetScript("Event=StartOCMeeting Meeting 96 sync 1\n");
    RunResult run = Run(kStartMeeting, 30000);
    ExpectCleanExit(run);
    // Raised inside the call, delivered while the program waited for its answer.
    EXPECT_GT(m_service.TimeOf("event", "Meeting.96"), 0);
    EXPECT_LT(m_endMs - m_startMs, 10000);
}

TEST_F(ServiceGateTest, FailedCallIsRetriedOnARecreatedObjectThatStillEndsTheWait) {
    m_service.SetScript(
        "Fail=StartOCMeeting 1 0x80040201\n"
        "Event=StartOCMeeting Meeting 96 300 1\n");
    RunResult run = Run(kStartMeeting);
    ExpectCleanExit(run);
    EXPECT_EQ(2u, m_service.Calls("StartOCMeeting").size());
    EXPECT_TRUE(run.HasTrace(
        " Exception,IDispatch error #1,CIMeetingWrapper::StartOCMeeting,errorID=0x80040201,\n"))
        << run.TraceText();
    EXPECT_TRUE(run.HasTrace(" ReCreateInstance Success, qmSrv Recover success,\n"));
    // The gate's sink followed the new object: the event ended the wait.
    double eventMs = m_service.TimeOf("event", "Meeting.96");
    ASSERT_GT(eventMs, 0);
    EXPECT_LT(m_endMs - eventMs, 1000);
}

TEST_F(ServiceGateTest, NoServiceRegisteredLogsTheCreationFailure) {
    ASSERT_TRUE(ServiceStandIn::RunStandIn(L"-UnregServer"));
    RunResult run = Run(kStartMeeting);
    ExpectCleanExit(run);
    EXPECT_TRUE(run.HasTrace(" CreateInstance fail,hr=-2147221164,\n")) << run.TraceText();
    EXPECT_TRUE(m_service.Log().empty());
}

class WithoutAccountTest : public ServiceGateTest,
                           public ::testing::WithParamInterface<const wchar_t*> {};

TEST_P(WithoutAccountTest, BecomesALoginWithTheAccountsSiteAndUser) {
    m_service.SetScript(std::string("HasValidAccount=0\n") + kAccount);
    RunResult run = Run(GetParam());
    ExpectCleanExit(run);
    EXPECT_EQ((std::vector<std::string>{"HasValidAccount", "GetAccountInfo", "GeneralCall"}),
              m_service.CallNames());
    EXPECT_TRUE(InOrder(
        OnlyDocument("GeneralCall"),
        {"<CommonLogin>", "<ParentHWnd>0</ParentHWnd>", "<SiteUrl>https://mrv.example/s</SiteUrl>",
         "<UserName>jdoe</UserName>", "<Editable>1</Editable>", "<Email", "</CommonLogin>"}))
        << OnlyDocument("GeneralCall");
}

INSTANTIATE_TEST_SUITE_P(
    MeetingAndSettings, WithoutAccountTest,
    ::testing::Values(kStartMeeting,
                      L"<CmdLine><Action>OpenQMSetting</Action><SiteUrl>https://other.example"
                      L"</SiteUrl><hWnd>5</hWnd></CmdLine>"));

TEST_F(ServiceGateTest, CommonLoginSendsItsFieldsWithParentWindowZero) {
    m_service.SetScript(
        "LoginResponse=<Mirovan_QM><Func_Params><LoginResult>success</LoginResult>"
        "</Func_Params></Mirovan_QM>\n");
    RunResult run =
        Run(L"<CmdLine><Action>CommonLogin</Action><SiteUrl>https://a.example</SiteUrl>"
            L"<Username>u1</Username><Editable>0</Editable><Email>u1@a.example</Email>"
            L"<hWnd>77</hWnd></CmdLine>");
    ExpectCleanExit(run);
    EXPECT_EQ(std::vector<std::string>{"GeneralCall"}, m_service.CallNames());
    std::string request = OnlyDocument("GeneralCall");
    EXPECT_TRUE(InOrder(
        request, {"<Mirovan_QM>", "<Func_Params>", "<CommonLogin>", "<ParentHWnd>0</ParentHWnd>",
                  "<SiteUrl>https://a.example</SiteUrl>", "<UserName>u1</UserName>",
                  "<Editable>0</Editable>", "<Email>u1@a.example</Email>", "</CommonLogin>"}))
        << request;
    // Request and response are logged at level 2.
    EXPECT_TRUE(run.HasTraceContaining("<Email>u1@a.example</Email>"));
    EXPECT_TRUE(run.HasTraceContaining("<LoginResult>success</LoginResult>"));
}

class SettingsDialogTest
    : public ServiceGateTest,
      public ::testing::WithParamInterface<std::pair<const wchar_t*, const char*>> {};

TEST_P(SettingsDialogTest, OpensTheDialogAndPumpsUntilItIsClosed) {
    m_service.SetScript("SettingDlgOpenMs=1200\n");
    RunResult run = Run(GetParam().first);
    ExpectCleanExit(run);
    std::vector<std::string> names = m_service.CallNames();
    ASSERT_GE(names.size(), 3u);
    EXPECT_EQ("HasValidAccount", names[0]);
    EXPECT_EQ("OpenSettingDlg", names[1]);
    EXPECT_EQ("IsSettingDlgOpened", names.back());
    std::string document = OnlyDocument("OpenSettingDlg");
    EXPECT_NE(std::string::npos, document.find(GetParam().second)) << document;
    // It ended only once the dialog had been closed.
    EXPECT_GE(atof(m_service.Calls("IsSettingDlgOpened").back().args.back().c_str()) -
                  m_service.TimeOf("call", "OpenSettingDlg"),
              1200);
}

INSTANTIATE_TEST_SUITE_P(
    WithAndWithoutSite, SettingsDialogTest,
    ::testing::Values(
        std::make_pair(L"<CmdLine><Action>OpenQMSetting</Action></CmdLine>", "(null)"),
        std::make_pair(L"<CmdLine><Action>OpenQMSetting</Action><SiteUrl>https://b.example"
                       L"</SiteUrl></CmdLine>",
                       "<SwitchSite><SiteUrl>https://b.example</SiteUrl></SwitchSite>")));

TEST_F(ServiceGateTest, ServiceEndingWhileTheDialogIsOpenEndsThePump) {
    m_service.SetScript("SettingDlgOpenMs=600000\nExitAfter=OpenSettingDlg 300\n");
    RunResult run = Run(L"<CmdLine><Action>OpenQMSetting</Action></CmdLine>");
    ExpectCleanExit(run);
    EXPECT_TRUE(run.HasTraceContaining(",CISettingWrapper::IsSettingDlgOpened,errorID=0x"))
        << run.TraceText();
}

class ShareNothingTest : public ServiceGateTest,
                         public ::testing::WithParamInterface<const wchar_t*> {};

TEST_P(ShareNothingTest, EmptyPathOrFlagSendsNothing) {
    RunResult run = Run(GetParam());
    ExpectCleanExit(run);
    EXPECT_TRUE(m_service.CallNames().empty());
}

INSTANTIATE_TEST_SUITE_P(
    EmptyFields, ShareNothingTest,
    ::testing::Values(
        L"<CmdLine><Action>ShareAsApp</Action><ShareFlag>2</ShareFlag></CmdLine>",
        L"<CmdLine><Action>ShareAsApp</Action><SharePathFile>C:\\a.exe</SharePathFile>"
        L"<ShareFlag></ShareFlag></CmdLine>"));

TEST_F(ServiceGateTest, ShareSendsFlagPathAndWindowInOrderAndEndsOnTheEvent) {
    m_service.SetScript("Event=StartOCMeeting Meeting 96 300 1\n");
    RunResult run =
        Run(L"<CmdLine><Action>ShareAsApp</Action><SharePathFile>C:\\Apps\\deck.exe</SharePathFile>"
            L"<ShareFlag>2</ShareFlag><hWnd>55</hWnd></CmdLine>");
    ExpectCleanExit(run);
    EXPECT_EQ(std::vector<std::string>{"StartOCMeeting"}, m_service.CallNames());
    std::string request = OnlyDocument("StartOCMeeting");
    EXPECT_TRUE(InOrder(
        request, {"<Func_Params>", "<StartType>1</StartType>", "<QM>2</QM>",
                  "<ShareFlag>2</ShareFlag>", "<SharePathFile>C:\\Apps\\deck.exe</SharePathFile>",
                  "<ParentHWnd>55</ParentHWnd>", "</Func_Params>"}))
        << request;
    EXPECT_TRUE(run.HasTraceContaining(" bstrXML.m_str=<?xml"));
    EXPECT_LT(m_endMs - m_service.TimeOf("event", "Meeting.96"), 2000);
}

struct HostileAnswer {
    const char* name;
    const char* script;
};

class HostileAnswerTest : public ServiceGateTest,
                          public ::testing::WithParamInterface<HostileAnswer> {};

TEST_P(HostileAnswerTest, LoginIsSentAndTheProgramEndsCleanly) {
    m_service.SetScript(std::string("HasValidAccount=0\n") + GetParam().script);
    RunResult run = Run(kStartMeeting);
    ExpectCleanExit(run);
    EXPECT_EQ(1u, m_service.Calls("GeneralCall").size());
}

INSTANTIATE_TEST_SUITE_P(
    Answers, HostileAnswerTest,
    ::testing::Values(HostileAnswer{"NotXml", "AccountInfo=this is <not xml\nLoginResponse=<<<\n"},
                      HostileAnswer{
                          "UnexpectedElements",
                          "AccountInfo=<Mirovan_QM><Func_Params><Other>1</Other><SiteUrl><b>x</b>"
                          "</SiteUrl></Func_Params><Func_Params><UserName/></Func_Params>"
                          "</Mirovan_QM>\nLoginResponse=<Mirovan_QM><LoginResult>success"
                          "</LoginResult></Mirovan_QM>\n"},
                      HostileAnswer{"AccountRefused", "AccountInfoResult=1\n"}),
    [](const ::testing::TestParamInfo<HostileAnswer>& info) { return info.param.name; });

}  // namespace
