// Parts of the problem report that the end-to-end runs cannot reach: two
// accounts, and a trace file changing size while it is read.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "actions/problem_report.h"
#include "actions/rpt_stream.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"

namespace {

const wchar_t* g_oneClickUser = L"";

// Wine runs every process under one account: Outlook's is "alice".
BOOL LookUpAccount(const wchar_t* processName, CStringEx& accountName) {
    accountName = lstrcmpiW(processName, L"OUTLOOK.EXE") == 0 ? L"alice" : g_oneClickUser;
    return TRUE;
}

TEST(ProblemReportAccounts, OutlookAndOneClickUnderDifferentAccountsStopTheReport) {
    // The trace stand-in beside this test writes to the file this variable names.
    ScratchDir scratch(L"trace");
    const std::wstring log = scratch.Sub(L"trace.log");
    SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", log.c_str());
    for (const wchar_t* oneClick : {L"Bob", L"ALICE"}) {
        g_oneClickUser = oneClick;
        const bool stops = oneClick[0] == L'B';
        DeleteFileW(log.c_str());
        CSendProblemReport(&LookUpAccount).Send();
        const std::string traces = ReadFileBytes(log);
        EXPECT_EQ(stops,
                  CountOf(traces,
                          " CSendProblemReport::Send Outlook.exe and qmoneclk.exe are "
                          "running at different user level\n,(LPCTSTR)"
                          "strQMOneClkUserName=" +
                              Narrow(oneClick) + ",(LPCTSTR)strOutlookUserName=alice,\n") == 1);
        // Going on, the report looks for its resource library next.
        EXPECT_EQ(!stops, CountOf(traces,
                                  " COneClickItemHandler::SendReportProblem() load "
                                  "qmocres.dll failed!\n,\n") == 1);
    }
    SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", nullptr);
}

// The size was measured before the read: a file that shrank since fails, one
// that grew gives the bytes that were measured, terminated.
TEST(RptStream, FileChangingSizeAfterItWasMeasuredNeverGivesAShortOrPaddedBuffer) {
    ScratchDir scratch(L"rpt");
    std::wstring path = scratch.Sub(L"t.mvt");
    WriteFileBytes(path, std::string(100, 'x') + std::string(100, 'y'));
    HANDLE file = CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                              0, nullptr);
    ASSERT_NE(INVALID_HANDLE_VALUE, file);
    CRptStream stream;
    EXPECT_FALSE(stream.ReadExpected(file, 300, 0));  // measured 300, 200 left
    SetFilePointer(file, 0, nullptr, FILE_BEGIN);
    EXPECT_TRUE(stream.ReadExpected(file, 150, 2));  // measured 150, grew to 200
    ASSERT_EQ(150u, stream.Size());
    EXPECT_EQ(std::string(100, 'x') + std::string(50, 'y') + std::string(2, '\0'),
              std::string(reinterpret_cast<const char*>(stream.Data()), 152));
    CloseHandle(file);
}

}  // namespace
