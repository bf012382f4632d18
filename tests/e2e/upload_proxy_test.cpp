// The upload proxies end to end: the program drives the browser stand-in
// through a scripted page and hands the feedback document to the caller's
// window or to the shared memory "MRVPPUINFO".
#include <windows.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/fakes/caller/feedback_receiver.h"
#include "tests/fakes/common/call_stamps.h"
#include "tests/support/browser_standin.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"

namespace {

const std::wstring kUserCanceled =
    L"<Feedback><Status>Failed</Status><Reason>User canceled</Reason></Feedback>";
const std::wstring kPlainFailure = L"<Feedback><Status>Failed</Status></Feedback>";

std::wstring Success(const std::wstring& field, const std::wstring& value) {
    return L"<Feedback><Status>Success</Status><" + field + L">" + value + L"</" + field +
           L"></Feedback>";
}

std::string Island(const std::string& cd) {
    return "<r><Status>success</Status><CD>" + cd + "</CD></r>";
}

class UploadProxyTest : public ::testing::Test {
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
        Run(action, m_caller.HandleText());
        std::vector<CopyData> received = m_caller.Received();
        if (received.size() != before + 1) {
            ADD_FAILURE() << received.size() - before << " feedbacks for " << page.substr(0, 80);
            return std::wstring();
        }
        EXPECT_EQ(0u, received.back().dwData);
        EXPECT_EQ((received.back().text.size() + 1) * sizeof(wchar_t), received.back().cbData);
        return received.back().text;
    }

    ScratchDir m_scratch{L"upload"};
    ProgramUnderTest m_program{m_scratch.Sub(L"bin")};
    std::unique_ptr<BrowserStandIn> m_browser =
        std::make_unique<BrowserStandIn>(m_scratch.Sub(L"browser"), BrowserServer::kInProcess);
    FeedbackWindow m_caller;
};

TEST_F(UploadProxyTest, PpuPageDeliversItsConferenceIdToTheCallersWindow) {
    EXPECT_EQ(Success(L"ConfID", L"12345"),
              FeedbackFor(L"PPU", "island 100 <r><Status> success </Status><CD>12345</CD></r>"));
    // Shown, read, closed; the optional Navigate arguments are empty.
    EXPECT_EQ("Created\nNavigate http://pages.example/up?a=1 0 0 0 0\nVisible -1\nQuit\nReleased\n",
              m_browser->Calls());
}

TEST_F(UploadProxyTest, PageResultsBecomeFeedbackDocuments) {
    const std::string pending = "island 0 <r><Status>Pending</Status></r>\n";
    struct Row {
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
        {L"PPU", pending + "island 400 " + Island("1"), kUserCanceled},
        {L"PPU", "island 0 <r><Status>Success</Status></r>",
         L"<Feedback><Status>Success</Status></Feedback>"},
        // Lower-case field names stand in for missing ones; slashes go
        // before backslashes.
        {L"PPU", "island 0 <r><status>SuCcEsS</status><cd>7</cd></r>", Success(L"ConfID", L"7")},
        {L"UPLOAD_FILE", "island 0 <r><Status>success</Status><filepath>\\/x</filepath></r>",
         Success(L"FileName", L"/x")},
        // The result is unescaped once and escaped once.
        {L"PPU", "island 0 " + Island("a&amp;b"), Success(L"ConfID", L"a&amp;b")},
        {L"PPU", "island 0 " + Island("9").insert(3, std::string(4 << 20, ' ')),
         Success(L"ConfID", L"9")},
        {L"PPU", "island 0 not <xml at all", kUserCanceled},
        {L"UPLOAD_FILE", "island 0 <<</>>\nclose 300", kUserCanceled},
        {L"UPLOAD_FILE", "close 300", kUserCanceled},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(row.feedback, FeedbackFor(row.action, row.page)) << row.page.substr(0, 80);
    }
}

TEST_F(UploadProxyTest, BusyPpuPageIsReadOnlyOnceLoaded) {
    FeedbackFor(L"PPU", "stamp\nbusy 600\nisland 0 " + Island("5"));
    std::string calls = m_browser->Calls();
    EXPECT_GE(fake::CallStamp(calls, "Quit") - fake::CallStamp(calls, "Navigate"), 600.0) << calls;
}

TEST_F(UploadProxyTest, IslandIsFoundOnlyDirectlyUnderHtmlOrBody) {
    std::string deep, hostile;
    for (int i = 0; i < 20; ++i) {
        deep += "BODY(";
    }
    for (int i = 0; i < 3000; ++i) {
        hostile += "BODY(";
    }
    struct Row {
        std::string page;
        std::wstring confId;  // empty: never found
    } rows[] = {
        {"tree HTML(HEAD,BODY(DIV,xml,P))", L"7"},
        {"tree hTmL(bOdY(XmL))", L"7"},
        {"tree HTML(xml,BODY)", L"7"},
        {"tree HTML(" + deep + "xml))", L"7"},
        {"tree HTML(BODY(FORM(xml)))", L""},
        {"tree HTML(BODY(DIV(xml)))", L""},
        {"tree DIV(xml)", L""},
        {"tree HTML(" + hostile + "xml))", L""},
        // The body's children are searched from the last.
        {"tree HTML(BODY(xml,DIV,xml))\nisland#0 0 " + Island("first") + "\nisland#1 0 " +
             Island("last"),
         L"last"},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(row.confId.empty() ? kUserCanceled : Success(L"ConfID", row.confId),
                  FeedbackFor(L"PPU", "island 0 " + Island("7") + "\nclose 400\n" + row.page))
            << row.page.substr(0, 60);
    }
}

TEST_F(UploadProxyTest, BrowserErrorsNeverEndInSuccess) {
    for (const char* failing : {"get_Document", "get_documentElement", "get_children", "get_length",
                                "item", "get_tagName", "get_innerHTML", "get_HWND"}) {
        EXPECT_EQ(kUserCanceled,
                  FeedbackFor(L"PPU", std::string("fail ") + failing + "\nisland 0 " + Island("3") +
                                          "\nclose 400"))
            << failing;
    }
    // A page that cannot tell whether it is busy is read all the same.
    EXPECT_EQ(Success(L"ConfID", L"3"),
              FeedbackFor(L"PPU", "fail get_Busy\nisland 0 " + Island("3")));
    // The browser goes away between two calls, before the island appears.
    EXPECT_EQ(kUserCanceled, FeedbackFor(L"UPLOAD_FILE", "gone 150\nisland 300 " + Island("3")));
}

TEST_F(UploadProxyTest, WithoutBrowserThePlainFailureIsDelivered) {
    UseBrowser(BrowserServer::kMissing);
    m_browser->SetPage("");
    RunResult run = Run(L"PPU", m_caller.HandleText());
    EXPECT_EQ(1, run.CountTraces(" IE create failed,\n"));
    ASSERT_EQ(1u, m_caller.Received().size());
    EXPECT_EQ(kPlainFailure, m_caller.Received()[0].text);
}

TEST_F(UploadProxyTest, BrowserThatCannotNavigateIsClosedAndThePlainFailureDelivered) {
    EXPECT_EQ(kPlainFailure, FeedbackFor(L"UPLOAD_FILE", "fail Navigate"));
    EXPECT_EQ("Created\nNavigate http://pages.example/up?a=1 0 0 0 0\nQuit\nReleased\n",
              m_browser->Calls());
}

TEST_F(UploadProxyTest, LocalServerBrowserIsDrivenAcrossProcesses) {
    UseBrowser(BrowserServer::kLocalServer);
    EXPECT_EQ(Success(L"ConfID", L"12345"), FeedbackFor(L"PPU", "island 0 " + Island("12345")));
}

TEST_F(UploadProxyTest, WithoutWindowTheFeedbackGoesToSharedMemoryWhenItFits) {
    SharedFeedbackMemory shared(4096);
    m_browser->SetPage("island 0 " + Island("12345"));
    Run(L"PPU", L"0");
    std::wstring expected = Success(L"ConfID", L"12345");
    EXPECT_EQ(expected, shared.Text());
    EXPECT_TRUE(shared.UntouchedFrom((expected.size() + 1) * sizeof(wchar_t)));

    m_browser->SetPage("island 0 " + Island(std::string(3000, '7')));
    RunResult run = Run(L"PPU", L"0");
    EXPECT_EQ(expected, shared.Text());  // a larger one is not written at all
    EXPECT_TRUE(shared.UntouchedFrom((expected.size() + 1) * sizeof(wchar_t)));
    EXPECT_EQ(1, run.CountTraces(" CFeedbackSender::Send: Feedback larger than the view of file,"
                                 "cbFeedback=6126,cbView=4096,\n"));
    EXPECT_TRUE(m_caller.Received().empty());
}

}  // namespace
