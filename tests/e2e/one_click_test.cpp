// One-click Actions and the upload proxies end to end, with the one-click
// library and browser stand-ins. OneClickSlow (labelled slow) waits a minute.
#include <windows.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <thread>

#include "tests/fakes/caller/feedback_receiver.h"
#include "tests/fakes/common/call_stamps.h"
#include "tests/support/browser_standin.h"
#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

// Without the suite library, whose records would mix with the stand-ins'.
class ActionTest : public ::testing::Test {
protected:
    std::string Calls() { return ReadFileBytes(m_program.callsLogPath()); }
    // The stand-in built as `built` becomes the one-click library (none: "").
    void InstallLibrary(const wchar_t* built) {
        std::wstring library = JoinPath(m_program.folder(), L"qmMrvMS.DLL");
        DeleteFileW(library.c_str());
        if (*built != L'\0') {
            CopyFileW(FakePath(built).c_str(), library.c_str(), FALSE);
        }
    }

    ScratchDir m_scratch{L"webaction"};
    ProgramUnderTest m_program{m_scratch.Sub(L"bin"), ProgramOptions{TraceLibrary::kBoth, false}};
};

using OneClickTest = ActionTest;

TEST_F(OneClickTest, ActionCallsItsMethodWithTheTopLevelWindowUnderTheCursor) {
    InstallLibrary(L"qmMrvMS.DLL");
    // Another program's window, the cursor on a button inside a panel of it.
    HWND client = CreateWindowW(L"STATIC", L"Meeting client", WS_POPUP | WS_VISIBLE, 0, 0,
                                GetSystemMetrics(SM_CXSCREEN), GetSystemMetrics(SM_CYSCREEN),
                                nullptr, nullptr, nullptr, nullptr);
    HWND panel = CreateWindowW(L"STATIC", L"", WS_CHILD | WS_VISIBLE, 50, 50, 400, 300, client,
                               nullptr, nullptr, nullptr);
    CreateWindowW(L"BUTTON", L"Join", WS_CHILD | WS_VISIBLE, 100, 100, 200, 40, panel, nullptr,
                  nullptr, nullptr);
    SetCursorPos(250, 170);  // on the button
    const std::string owner = std::to_string(HandleToLong(client));
    // JoinMeeting stands for the Actions whose method takes the owner alone.
    const struct {
        const wchar_t* command;
        std::string calls;
    } rows[] = {
        {L"<Action>ShareWindow</Action>", "ShareWindow " + owner + " " + owner},
        {L"<Action>JoinMeeting</Action><hWnd>77</hWnd>", "JoinMeeting " + owner},
        {L"<Action>StartOCMeeting</Action><Client>FireFox</Client>",
         "SetBrowser Firefox\nStartOCMeeting " + owner},
        {L"<Action>OpenQMSetting</Action><Client>FireFox</Client>",
         "SetBrowser Firefox\nOpenQMSetting " + owner},
    };
    for (const auto& row : rows) {
        RunResult run = m_program.Run(std::wstring(L"<CmdLine>") + row.command + L"</CmdLine>");
        EXPECT_EQ(1, run.exitCode) << Narrow(row.command);
        EXPECT_EQ("qmMrvMS.DLL loaded\nDllGetClassObject\nCreateInstance\n" + row.calls +
                      "\nReleased\nqmMrvMS.DLL unloaded\n",
                  Calls());
    }
    DestroyWindow(client);
}

// A missing library, a missing export, a failing class object or instance.
TEST_F(OneClickTest, WithoutTheOneClickObjectNothingIsCalledAndTheResultIsZero) {
    const struct {
        const wchar_t* library;  // empty: none in the program's folder
        const wchar_t* failure;  // QM_FAKE_ONECLICK_FAIL
    } rows[] = {{L"", L""},
                {L"noexport\\qmMrvMS.DLL", L""},
                {L"qmMrvMS.DLL", L"DllGetClassObject"},
                {L"qmMrvMS.DLL", L"CreateInstance"}};
    for (const auto& row : rows) {
        InstallLibrary(row.library);
        m_program.SetEnv(L"QM_FAKE_ONECLICK_FAIL", row.failure);
        RunResult run = m_program.Run(L"<CmdLine><Action>JoinMeeting</Action></CmdLine>");
        EXPECT_EQ(0, run.exitCode);
        ASSERT_EQ(4u, run.traces.size()) << run.TraceText();
        EXPECT_EQ(8u, run.traces[2].level);
        EXPECT_EQ(" Failed CoCreateInstance\n,\n", run.traces[2].text);
        EXPECT_EQ(8u, run.traces[3].level);
        EXPECT_EQ(" m_spOneClickItems == NULL,\n", run.traces[3].text);
        EXPECT_EQ(std::string::npos, Calls().find("JoinMeeting"));
    }
}

const std::wstring kUserCanceled =
    L"<Feedback><Status>Failed</Status><Reason>User canceled</Reason></Feedback>";
const std::wstring kPlainFailure = L"<Feedback><Status>Failed</Status></Feedback>";

std::wstring Success(const std::wstring& field, const std::wstring& value) {
    return L"<Feedback><Status>Success</Status><" + field + L">" + value + L"</" + field +
           L"></Feedback>";
}

std::string Result(const std::string& cd) {
    return "<r><Status>success</Status><CD>" + cd + "</CD></r>";
}

// A PPU page's island, and the user closing a window left open.
std::string Island(const std::string& cd) {
    return "island 0 " + Result(cd) + "\nclose 400\n";
}

class UploadProxyTest : public ActionTest {
protected:
    void UseBrowser(BrowserServer server) {
        m_browser.reset();
        m_browser = std::make_unique<BrowserStandIn>(m_scratch.Sub(L"browser"), server);
    }
    RunResult Run(const std::wstring& action, const std::wstring& hwnd) {
        RunResult run = m_program.Run(L"<CmdLine><Action>" + action +
                                      L"</Action><URL>http://pages.example/up?a=1</URL><hWnd>" +
                                      hwnd + L"</hWnd></CmdLine>");
        EXPECT_FALSE(run.crashed || run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }

    // The one feedback the caller's window received for the page.
    std::wstring FeedbackFor(const std::wstring& action, const std::string& page) {
        m_browser->SetPage(page);
        size_t before = m_caller.Received().size();
        m_run = Run(action, m_caller.HandleText());
        std::vector<CopyData> received = m_caller.Received();
        if (received.size() != before + 1) {
            ADD_FAILURE() << received.size() - before << " feedbacks for " << page.substr(0, 80);
            return std::wstring();
        }
        EXPECT_EQ(0u, received.back().dwData);
        EXPECT_EQ((received.back().text.size() + 1) * sizeof(wchar_t), received.back().cbData);
        return received.back().text;
    }

    std::unique_ptr<BrowserStandIn> m_browser =
        std::make_unique<BrowserStandIn>(m_scratch.Sub(L"browser"), BrowserServer::kInProcess);
    FeedbackWindow m_caller;
    RunResult m_run;  // FeedbackFor's
};

TEST_F(UploadProxyTest, PpuPageDeliversItsConferenceIdToTheCallersWindow) {
    const std::string page = "island 100 <r><Status> success </Status><CD>12345</CD></r>";
    EXPECT_EQ(Success(L"ConfID", L"12345"), FeedbackFor(L"PPU", page));
    // Shown, read, closed; the optional Navigate arguments are empty.
    EXPECT_EQ("Created\nNavigate http://pages.example/up?a=1 0 0 0 0\nVisible -1\nQuit\nReleased\n",
              m_browser->Calls());
    // Internet Explorer runs in a process of its own.
    UseBrowser(BrowserServer::kLocalServer);
    EXPECT_EQ(Success(L"ConfID", L"12345"), FeedbackFor(L"PPU", page));
}

TEST_F(UploadProxyTest, PageResultsBecomeFeedbackDocuments) {
    const std::string pending = "island 0 <r><Status>Pending</Status></r>\n";
    const struct {
        const wchar_t* action;
        std::string page;
        std::wstring feedback;
    } rows[] = {
        {L"UPLOAD_FILE",
         "island 0 <r><Status>SUCCESS</Status><FilePath>/\\docs/a.txt</FilePath></r>",
         Success(L"FileName", L"docs/a.txt")},
        // An upload page stays open until its status turns to success; a PPU
        // page is closed as soon as its island is read, whatever it says.
        {L"UPLOAD_FILE",
         pending + "island 400 <r><Status>Success</Status><FilePath>b</FilePath></r>",
         Success(L"FileName", L"b")},
        {L"PPU", pending + "island 400 " + Result("1"), kUserCanceled},
        // A busy PPU page is read once it is loaded.
        {L"PPU", "busy 600\nisland 0 " + Result("early") + "\nisland 300 " + Result("late"),
         Success(L"ConfID", L"late")},
        // Lower-case field names stand in for missing ones.
        {L"PPU", "island 0 <r><status>SuCcEsS</status><cd>7</cd></r>", Success(L"ConfID", L"7")},
        {L"UPLOAD_FILE", "close 300", kUserCanceled},
        // The island lies directly under HTML or BODY, whose children are
        // searched from the last.
        {L"PPU", Island("7") + "tree HTML(HEAD,BODY(DIV,xml,P))", Success(L"ConfID", L"7")},
        {L"PPU", Island("7") + "tree hTmL(bOdY(XmL))", Success(L"ConfID", L"7")},
        {L"PPU", Island("7") + "tree HTML(xml,BODY)", Success(L"ConfID", L"7")},
        {L"PPU", Island("7") + "tree HTML(BODY(xml,DIV,xml))\nisland#1 0 " + Result("9"),
         Success(L"ConfID", L"9")},
        {L"PPU", Island("7") + "tree HTML(BODY(FORM(xml)))", kUserCanceled},
        {L"PPU", Island("7") + "tree HTML(BODY(DIV(xml)))", kUserCanceled},
        // A browser that cannot navigate gets no further; one that fails or
        // goes away never ends in success.
        {L"UPLOAD_FILE", "fail Navigate", kPlainFailure},
        {L"UPLOAD_FILE", "gone 150\nisland 300 <r><Status>success</Status></r>", kUserCanceled},
        {L"PPU", "fail get_Document\n" + Island("3"), kUserCanceled},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(row.feedback, FeedbackFor(row.action, row.page)) << row.page.substr(0, 80);
    }
}

TEST_F(UploadProxyTest, WithoutBrowserThePlainFailureIsDelivered) {
    UseBrowser(BrowserServer::kMissing);
    EXPECT_EQ(kPlainFailure, FeedbackFor(L"PPU", ""));
    EXPECT_EQ(1, m_run.CountTraces(" IE create failed,\n"));
}

// A feedback that does not fit the view the receiver chose is not written.
TEST_F(UploadProxyTest, WithoutWindowTheFeedbackGoesToSharedMemoryWhenItFits) {
    SharedFeedbackMemory shared(4096);
    m_browser->SetPage(Island("12345"));
    Run(L"PPU", L"0");
    std::wstring expected = Success(L"ConfID", L"12345");
    EXPECT_EQ(expected, shared.Text());

    m_browser->SetPage(Island(std::string(3000, '7')));
    RunResult run = Run(L"PPU", L"0");
    EXPECT_EQ(expected, shared.Text());
    EXPECT_TRUE(shared.UntouchedFrom((expected.size() + 1) * sizeof(wchar_t)));
    EXPECT_EQ(1, run.CountTraces(" CFeedbackSender::Send: Feedback larger than the view of file,"
                                 "cbFeedback=6126,cbView=4096,\n"));
    EXPECT_TRUE(m_caller.Received().empty());
}

class OneClickSlow : public OneClickTest {};

// The library's windows on the program's thread keep working for a minute.
TEST_F(OneClickSlow, StartScheduledMeetingKeepsDispatchingForOneMinute) {
    InstallLibrary(L"qmMrvMS.DLL");
    m_program.SetEnv(L"QM_FAKE_STAMP_CALLS", L"1");
    std::thread poster([] {
        HWND meeting = nullptr;
        for (int i = 0; i < 300 && meeting == nullptr; ++i, Sleep(100)) {
            meeting = FindWindowW(L"QmFakeOneClickMeeting", nullptr);
        }
        PostMessageW(meeting, 0x8001, 42, 0);
    });
    RunResult run =
        m_program.Run(L"<CmdLine><Action>StartScheduledMeeting</Action></CmdLine>", 90000);
    poster.join();
    EXPECT_EQ(1, run.exitCode);
    std::string calls = Calls();
    EXPECT_GT(fake::CallStamp(calls, "meeting window got message 42"), 0) << calls;
    double waited =
        fake::CallStamp(calls, "Released") - fake::CallStamp(calls, "StartScheduledMeeting");
    EXPECT_NEAR(60500.0, waited, 500.0) << calls;
}

}  // namespace
