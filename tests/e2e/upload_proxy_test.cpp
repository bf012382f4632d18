// The upload proxies end to end: the program drives the browser stand-in
// through an upload page and hands the feedback document to the caller's
// window or to the shared memory "MRVPPUINFO".
#include <windows.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/support/browser_standin.h"
#include "tests/support/call_stamps.h"
#include "tests/support/feedback_receiver.h"
#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"

namespace {

const wchar_t kUserCanceled[] =
    L"<Feedback><Status>Failed</Status><Reason>User canceled</Reason></Feedback>";
const wchar_t kPlainFailure[] = L"<Feedback><Status>Failed</Status></Feedback>";

std::wstring PpuSuccess(const std::wstring& confId) {
    return L"<Feedback><Status>Success</Status><ConfID>" + confId + L"</ConfID></Feedback>";
}

std::wstring UploadSuccess(const std::wstring& fileName) {
    return L"<Feedback><Status>Success</Status><FileName>" + fileName + L"</FileName></Feedback>";
}

std::string Repeat(const std::string& text, int times) {
    std::string all;
    for (int i = 0; i < times; ++i) {
        all += text;
    }
    return all;
}

class UploadProxyTest : public ::testing::Test {
protected:
    UploadProxyTest() : m_program(m_scratch.Sub(L"bin")) { UseBrowser(BrowserServer::kInProcess); }

    void UseBrowser(BrowserServer server) {
        m_browser.reset();
        m_browser = std::make_unique<BrowserStandIn>(m_scratch.Sub(L"browser"), server);
        m_browser->ServeTo(m_program);
    }

    RunResult Run(const std::wstring& action, const std::wstring& hwnd) {
        RunResult run = m_program.Run(L"<CmdLine><Action>" + action +
                                      L"</Action><URL>http://pages.example/up?a=1</URL><hWnd>" +
                                      hwnd + L"</hWnd></CmdLine>");
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }

    // Shows the page to the Action and returns the one feedback the caller's
    // window received.
    std::wstring FeedbackFor(const std::wstring& action, const std::string& page) {
        m_browser->SetPage(page);
        Run(action, m_receiver.HandleText());
        std::vector<CopyData> received = m_receiver.Received();
        m_receivedBefore = received.size() - 1;
        if (received.empty()) {
            ADD_FAILURE() << "no feedback for " << page;
            return std::wstring();
        }
        const CopyData& last = received.back();
        EXPECT_EQ(0u, last.dwData);
        EXPECT_EQ((last.Text().size() + 1) * sizeof(wchar_t), last.cbData);
        return last.Text();
    }

    ScratchDir m_scratch{L"upload"};
    ProgramUnderTest m_program;
    std::unique_ptr<BrowserStandIn> m_browser;
    FeedbackWindow m_receiver;
    size_t m_receivedBefore = 0;
};

TEST_F(UploadProxyTest, PpuPageDeliversItsConferenceIdToTheCallersWindow) {
    std::wstring feedback =
        FeedbackFor(L"PPU", "island 100 <r><Status> success </Status><CD>12345</CD></r>\n");
    EXPECT_EQ(PpuSuccess(L"12345"), feedback);
    EXPECT_EQ(0u, m_receivedBefore);  // exactly one message
    // Shown, read, closed: the optional Navigate arguments are empty.
    EXPECT_EQ("Created\nNavigate http://pages.example/up?a=1 0 0 0 0\nVisible -1\nQuit\nReleased\n",
              m_browser->Calls());
}

TEST_F(UploadProxyTest, PageResultsBecomeFeedbackDocuments) {
    struct Row {
        const wchar_t* action;
        const char* page;
        std::wstring feedback;
    } rows[] = {
        {L"UPLOAD_FILE",
         "island 0 <r><Status>SUCCESS</Status><FilePath>/\\docs/a.txt</FilePath></r>",
         UploadSuccess(L"docs/a.txt")},
        // An upload page stays open until its status turns to success.
        {L"UPLOAD_FILE",
         "island 0 <r><Status>Pending</Status></r>\n"
         "island 400 <r><Status>Success</Status><FilePath>b.txt</FilePath></r>",
         UploadSuccess(L"b.txt")},
        // A PPU page is closed as soon as its island is read, whatever it says.
        {L"PPU",
         "island 0 <r><Status>Pending</Status></r>\n"
         "island 400 <r><Status>Success</Status><CD>1</CD></r>",
         kUserCanceled},
        {L"PPU", "island 0 <r><Status>Success</Status></r>",
         L"<Feedback><Status>Success</Status></Feedback>"},
        // The result's text is unescaped once and escaped once.
        {L"PPU", "island 0 <r><Status>success</Status><CD>a&amp;b</CD></r>",
         PpuSuccess(L"a&amp;b")},
        {L"PPU", "island 0 not <xml at all", kUserCanceled},
        {L"UPLOAD_FILE", "island 0 <<</>>\nclose 300", kUserCanceled},
        // A page that never publishes a result, closed by the user.
        {L"UPLOAD_FILE", "close 300", kUserCanceled},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(row.feedback, FeedbackFor(row.action, row.page)) << row.page;
    }
}

TEST_F(UploadProxyTest, BusyPpuPageIsReadOnlyOnceLoaded) {
    m_browser->SetPage("stamp\nbusy 600\nisland 0 <r><Status>success</Status><CD>5</CD></r>\n");
    Run(L"PPU", m_receiver.HandleText());
    ASSERT_EQ(1u, m_receiver.Received().size());
    std::string calls = m_browser->Calls();
    EXPECT_GE(CallStamp(calls, "Quit") - CallStamp(calls, "Navigate"), 600.0) << calls;
}

TEST_F(UploadProxyTest, IslandIsFoundOnlyDirectlyUnderHtmlOrBody) {
    const std::string success = "<r><Status>success</Status><CD>7</CD></r>";
    std::string deepBodies = Repeat("BODY(", 20) + "xml" + Repeat(")", 20);
    std::string hostileDepth = Repeat("BODY(", 3000) + "xml" + Repeat(")", 3000);
    struct Row {
        std::string tree;
        bool found;
    } rows[] = {
        {"HTML(HEAD,BODY(DIV,xml,P))", true},
        {"hTmL(bOdY(XmL))", true},
        {"HTML(xml,BODY)", true},
        {"HTML(BODY(HTML(BODY(xml))))", true},
        {"HTML(" + deepBodies + ")", true},
        {"HTML(BODY(FORM(xml)))", false},
        {"HTML(BODY(DIV(xml)))", false},
        {"HTML(BODY(TABLE(TR(TD(xml)))))", false},
        {"DIV(xml)", false},
        {"HTML(" + hostileDepth + ")", false},
    };
    for (const Row& row : rows) {
        std::wstring feedback =
            FeedbackFor(L"PPU", "tree " + row.tree + "\nisland 0 " + success + "\nclose 400\n");
        EXPECT_EQ(row.found ? PpuSuccess(L"7") : std::wstring(kUserCanceled), feedback)
            << row.tree.substr(0, 60);
    }
}

TEST_F(UploadProxyTest, LastIslandOfTheBodyWins) {
    EXPECT_EQ(PpuSuccess(L"last"),
              FeedbackFor(L"PPU",
                          "tree HTML(BODY(xml,DIV,xml))\n"
                          "island#0 0 <r><Status>success</Status><CD>first</CD></r>\n"
                          "island#1 0 <r><Status>success</Status><CD>last</CD></r>\n"));
}

TEST_F(UploadProxyTest, HugeIslandIsRead) {
    std::string padding(4 * 1024 * 1024, 'x');
    EXPECT_EQ(PpuSuccess(L"9"),
              FeedbackFor(L"PPU", "island 0 <r><Status>success</Status><CD>9</CD><Pad>" + padding +
                                      "</Pad></r>\n"));
}

TEST_F(UploadProxyTest, BrowserErrorsNeverEndTheWaitWithASuccess) {
    const std::string success = "<r><Status>success</Status><CD>3</CD></r>";
    struct Row {
        std::string page;
        std::wstring feedback;
    } rows[] = {
        {"fail get_Document", kUserCanceled},
        {"fail get_documentElement", kUserCanceled},
        {"fail get_children", kUserCanceled},
        {"fail get_length", kUserCanceled},
        {"fail item", kUserCanceled},
        {"fail get_tagName", kUserCanceled},
        {"fail get_innerHTML", kUserCanceled},
        // Without its window the page counts as closed.
        {"fail get_HWND", kUserCanceled},
        // A page that cannot say whether it is busy is read all the same.
        {"fail get_Busy", PpuSuccess(L"3")},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(row.feedback,
                  FeedbackFor(L"PPU", row.page + "\nisland 0 " + success + "\nclose 400\n"))
            << row.page;
    }
    // The browser goes away between two calls, before the island appears.
    EXPECT_EQ(kUserCanceled, FeedbackFor(L"UPLOAD_FILE", "gone 150\nisland 300 " + success));
}

TEST_F(UploadProxyTest, WithoutBrowserThePlainFailureIsDelivered) {
    UseBrowser(BrowserServer::kMissing);
    RunResult run = Run(L"PPU", m_receiver.HandleText());
    EXPECT_EQ(1, run.CountTraces(" IE create failed,\n"));
    ASSERT_EQ(1u, m_receiver.Received().size());
    EXPECT_EQ(kPlainFailure, m_receiver.Received()[0].Text());
}

TEST_F(UploadProxyTest, BrowserThatCannotNavigateIsClosedAndThePlainFailureDelivered) {
    EXPECT_EQ(kPlainFailure, FeedbackFor(L"UPLOAD_FILE", "fail Navigate\n"));
    EXPECT_EQ("Created\nNavigate http://pages.example/up?a=1 0 0 0 0\nQuit\nReleased\n",
              m_browser->Calls());
}

TEST_F(UploadProxyTest, LocalServerBrowserIsDrivenAcrossProcesses) {
    UseBrowser(BrowserServer::kLocalServer);
    EXPECT_EQ(PpuSuccess(L"12345"),
              FeedbackFor(L"PPU", "island 0 <r><Status>success</Status><CD>12345</CD></r>\n"));
}

TEST_F(UploadProxyTest, WithoutWindowTheFeedbackGoesToSharedMemory) {
    SharedFeedbackMemory shared(4096);
    m_browser->SetPage("island 0 <r><Status>success</Status><CD>12345</CD></r>\n");
    Run(L"PPU", L"0");
    EXPECT_TRUE(m_receiver.Received().empty());
    std::wstring expected = PpuSuccess(L"12345");
    EXPECT_EQ(expected, shared.Text());
    EXPECT_TRUE(shared.FillIntactFrom((expected.size() + 1) * sizeof(wchar_t)));
}

TEST_F(UploadProxyTest, FeedbackLargerThanTheSharedMemoryIsNotWritten) {
    SharedFeedbackMemory shared(4096);
    m_browser->SetPage("island 0 <r><Status>success</Status><CD>" + std::string(3000, '7') +
                       "</CD></r>\n");
    RunResult run = Run(L"PPU", L"0");
    EXPECT_TRUE(shared.FillIntactFrom(0));
    EXPECT_EQ(1, run.CountTraces(" CFeedbackSender::Send: Feedback larger than the view of file,"
                                 "cbFeedback=6126,cbView=4096,\n"))
        << run.TraceText();
}

TEST_F(UploadProxyTest, WithoutWindowOrSharedMemoryTheFeedbackIsLost) {
    m_browser->SetPage("island 0 <r><Status>success</Status><CD>1</CD></r>\n");
    RunResult run = Run(L"PPU", L"0");
    EXPECT_EQ(1, run.CountTraces(" Could not open file-mapping object.,\n"));
}

}  // namespace
