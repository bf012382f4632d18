// After StartScheduledMeeting the program stays responsive for a minute: the
// messages of the one-click library's windows on its thread are dispatched
// until 60 s have passed. Slow by nature: labelled "slow".
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/call_stamps.h"
#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

// Waits for the one-click library's meeting window and posts it a message.
DWORD WINAPI PostToMeetingWindow(void*) {
    for (int i = 0; i < 300; ++i) {
        HWND meeting = FindWindowW(L"QmFakeOneClickMeeting", nullptr);
        if (meeting != nullptr) {
            Sleep(1000);  // well inside the wait
            PostMessageW(meeting, 0x8001, 42, 0);
            return 0;
        }
        Sleep(100);
    }
    return 1;
}

TEST(OneClickWaitTest, StartScheduledMeetingKeepsDispatchingForOneMinute) {
    ScratchDir scratch(L"oneclickwait");
    ProgramOptions options;
    options.withSuiteLibrary = false;
    ProgramUnderTest program(scratch.Sub(L"bin"), options);
    CopyFileW(FakePath(L"qmMrvMS.DLL").c_str(), JoinPath(program.folder(), L"qmMrvMS.DLL").c_str(),
              FALSE);
    program.SetEnv(L"QM_FAKE_STAMP_CALLS", L"1");
    HANDLE poster = CreateThread(nullptr, 0, PostToMeetingWindow, nullptr, 0, nullptr);

    RunResult run =
        program.Run(L"<CmdLine><Action>StartScheduledMeeting</Action></CmdLine>", 120000);
    WaitForSingleObject(poster, 30000);
    CloseHandle(poster);

    EXPECT_FALSE(run.crashed);
    EXPECT_EQ(1, run.exitCode);
    std::string calls = ReadFileBytes(program.callsLogPath());
    EXPECT_GT(CallStamp(calls, "meeting window got message 42"), 0) << calls;
    double waited = CallStamp(calls, "Released") - CallStamp(calls, "StartScheduledMeeting");
    EXPECT_GE(waited, 60000.0) << calls;
    EXPECT_LT(waited, 61000.0) << calls;
}

}  // namespace
