// Parts of the problem report and the log posting that the end-to-end runs
// cannot reach: two accounts, a file changing size while it is read, a
// resource text with stray format marks, and the posting's wait.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "actions/problem_report.h"
#include "actions/rpt_stream.h"
#include "base/message_pump.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/trace_capture.h"

namespace {

const wchar_t* g_outlookUser = L"";
const wchar_t* g_oneClickUser = L"";

BOOL LookUpAccount(const wchar_t* processName, CStringEx& accountName) {
    accountName = lstrcmpiW(processName, L"OUTLOOK.EXE") == 0 ? g_outlookUser : g_oneClickUser;
    return TRUE;
}

// Wine runs every process under one account: the two accounts come through
// the report's account lookup.
TEST(ProblemReportAccounts, OutlookAndOneClickUnderDifferentAccountsStopTheReport) {
    struct Case {
        const wchar_t* outlook;
        const wchar_t* oneClick;
        bool stops;
    };
    const Case cases[] = {{L"alice", L"Bob", true}, {L"alice", L"ALICE", false}};
    for (const Case& c : cases) {
        g_outlookUser = c.outlook;
        g_oneClickUser = c.oneClick;
        TraceCapture traces;
        CSendProblemReport report(&LookUpAccount);
        report.Send();
        std::string line =
            " CSendProblemReport::Send Outlook.exe and qmoneclk.exe are running at different user "
            "level\n,(LPCTSTR)strQMOneClkUserName=" +
            Narrow(c.oneClick) + ",(LPCTSTR)strOutlookUserName=" + Narrow(c.outlook) + ",\n";
        EXPECT_EQ(c.stops, traces.Has(line));
        // Going on, the report looks for its resource library next.
        EXPECT_EQ(!c.stops,
                  traces.Has(" COneClickItemHandler::SendReportProblem() load qmocres.dll "
                             "failed!\n,\n"));
    }
}

// The size was measured before the read: a file that shrank since fails, one
// that grew gives the bytes that were measured.
TEST(RptStream, FileChangingSizeBetweenMeasureAndReadNeverGivesAShortOrPaddedBuffer) {
    ScratchDir scratch(L"rpt");
    std::wstring path = scratch.Sub(L"t.mvt");
    WriteFileBytes(path, std::string(100, 'x') + std::string(100, 'y'));
    HANDLE file = CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                              0, nullptr);
    ASSERT_NE(INVALID_HANDLE_VALUE, file);
    CRptStream stream;
    EXPECT_FALSE(stream.ReadExpected(file, 300, 0));  // measured 300, 200 left
    EXPECT_EQ(nullptr, stream.Data());
    EXPECT_EQ(0u, stream.Size());

    SetFilePointer(file, 0, nullptr, FILE_BEGIN);
    EXPECT_TRUE(stream.ReadExpected(file, 150, 2));  // measured 150, grew to 200
    ASSERT_EQ(150u, stream.Size());
    EXPECT_EQ(std::string(100, 'x') + std::string(50, 'y'),
              std::string(reinterpret_cast<const char*>(stream.Data()), 150));
    EXPECT_EQ(0, stream.Data()[150] | stream.Data()[151]);
    CloseHandle(file);
}

TEST(FormatWithOneText, PutsTheVersionInTheOneStringMarkOnly) {
    struct Case {
        const wchar_t* format;
        const wchar_t* result;
    };
    const Case cases[] = {
        {L"100%% of %s", L"100% of 2.0"},
        {L"%s and %s %d %n", L"2.0 and %s %d %n"},
        {L"trailing %", L"trailing %"},
    };
    for (const Case& c : cases) {
        EXPECT_STREQ(c.result, FormatWithOneText(c.format, L"2.0").c_str());
    }
}

int g_ticks = 0;
void CALLBACK CountTick(HWND, UINT, UINT_PTR, DWORD) {
    ++g_ticks;
}

// Messages keep arriving all through the wait: they are dispatched, and the
// wait still ends on time.
TEST(PumpMessagesFor, DispatchesMessagesAndEndsOnTimeWhileTheyKeepComing) {
    g_ticks = 0;
    UINT_PTR timer = SetTimer(nullptr, 0, 50, CountTick);
    DWORD start = GetTickCount();
    PumpMessagesFor(1);
    DWORD elapsed = GetTickCount() - start;
    KillTimer(nullptr, timer);
    EXPECT_GE(elapsed, 990u);
    EXPECT_LT(elapsed, 1500u);
    EXPECT_GE(g_ticks, 5);
}

}  // namespace
