// "PostJMFLog" and "PostAttendee" run by the real program, with the suite's
// URL library and UI library beside it as stand-ins that record their calls.
#include <windows.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

class LogPostingTest : public ::testing::Test {
protected:
    LogPostingTest() : m_program(m_scratch.Sub(L"bin"), NoSuiteLibrary()) {}

    // Without the suite library the calls log holds the stand-ins' calls only.
    static ProgramOptions NoSuiteLibrary() {
        ProgramOptions options;
        options.withSuiteLibrary = false;
        return options;
    }

    void Place(const wchar_t* library) {
        CopyFileW(FakePath(library).c_str(), JoinPath(m_program.folder(), library).c_str(), FALSE);
    }
    RunResult Run(const std::wstring& arguments) {
        RunResult run = m_program.Run(arguments);
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }
    std::string Calls() { return ReadFileBytes(m_program.callsLogPath()); }

    ScratchDir m_scratch{L"post"};
    ProgramUnderTest m_program;
};

// The request completes through a message of the program's thread, which
// ends the 10 s wait at once; the log URL ends in exactly one module and
// error number.
TEST_F(LogPostingTest, LogUrlGetsModuleAndErrorAndIsRequestedInSlotOrder) {
    struct Case {
        const wchar_t* urlElements;
        const char* url;
    };
    const Case cases[] = {
        {L"<LogUrl>http://h/log?id=1&amp;&amp;</LogUrl>",
         "http://h/log?id=1&Module=24&ErrorCode=7"},
        {L"<LogUrl>http://h/log?id=1</LogUrl>", "http://h/log?id=1&Module=24&ErrorCode=7"},
        {L"", "&Module=24&ErrorCode=7"},
    };
    Place(L"qmMRVURL.DLL");
    m_program.SetEnv(L"QM_FAKE_URL_MODE", L"message");
    for (const Case& c : cases) {
        SCOPED_TRACE(c.url);
        DWORD start = GetTickCount();
        RunResult run = Run(std::wstring(L"<CmdLine><Action>PostJMFLog</Action>") + c.urlElements +
                            L"<ErrorId>7</ErrorId></CmdLine>");
        EXPECT_LT(GetTickCount() - start, 8000u);
        EXPECT_EQ(std::string("URL slot4 1\nURL slot6 10\nURL slot11 url=") + c.url +
                      " data=(null) 0 0\nURL completed by a message of the caller's thread\n"
                      "URL slot12\nURL released\n",
                  Calls());
        EXPECT_TRUE(run.HasTrace(std::string(" Start PostJMFLog in MrvONI.exe,"
                                             "strLogUrl.GetConstBuffer()=") +
                                 c.url + ",\n"));
    }
}

TEST_F(LogPostingTest, MissingUrlLibraryIsLoggedAndEndsTheAction) {
    RunResult run = Run(L"<CmdLine><Action>PostJMFLog</Action><ErrorId>3</ErrorId></CmdLine>");
    EXPECT_TRUE(run.HasTrace(" Can not create URL Object,\n"));
}

// The UI library gets the command line exactly as the program received it,
// text before "<CmdLine>" included; a result of 0 is logged.
TEST_F(LogPostingTest, PostAttendeeGetsTheRawCommandLine) {
    const std::wstring arguments =
        L"lead text <CmdLine><Action>PostAttendee</Action><AttendeeFile>C:\\a b.xml"
        L"</AttendeeFile></CmdLine>";
    const char kFailed[] = " PostAttendeeEx: CALL qmONIUI.dll -->  PostAttendee FAILED!\n,\n";
    Place(L"qmONIUI.dll");
    for (const wchar_t* result : {L"1", L"0"}) {
        m_program.SetEnv(L"QM_FAKE_ONIUI_RESULT", result);
        RunResult run = Run(arguments);
        EXPECT_EQ("PostAttendee " + Narrow(arguments) + "\n", Calls());
        EXPECT_EQ(result[0] == L'0', run.HasTrace(kFailed));
    }
    DeleteFileW(JoinPath(m_program.folder(), L"qmONIUI.dll").c_str());
    RunResult run = Run(arguments);
    EXPECT_TRUE(run.HasTrace(" Load Lib failed or GetProcAddress failed.\n,\n"));
}

}  // namespace
