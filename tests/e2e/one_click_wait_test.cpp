// After StartScheduledMeeting the program keeps dispatching the messages of
// the one-click library's windows on its thread until 60 s have passed.
// Labelled "slow".
#include <windows.h>
#include <gtest/gtest.h>

#include "tests/fakes/common/call_stamps.h"
#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

// Posts the library's meeting window a message once it is there.
DWORD WINAPI PostToMeetingWindow(void*) {
    for (int i = 0; i < 300; ++i, Sleep(100)) {
        if (HWND meeting = FindWindowW(L"QmFakeOneClickMeeting", nullptr)) {
            PostMessageW(meeting, 0x8001, 42, 0);
            return 0;
        }
    }
    return 1;
}

TEST(OneClickWaitTest, StartScheduledMeetingKeepsDispatchingForOneMinute) {
    ScratchDir scratch(L"oneclickwait");
    ProgramUnderTest program(scratch.Sub(L"bin"));
    CopyFileW(FakePath(L"qmMrvMS.DLL").c_str(), JoinPath(program.folder(), L"qmMrvMS.DLL").c_str(),
              FALSE);
    program.SetEnv(L"QM_FAKE_STAMP_CALLS", L"1");
    HANDLE poster = CreateThread(nullptr, 0, PostToMeetingWindow, nullptr, 0, nullptr);
    RunResult run =
        program.Run(L"<CmdLine><Action>StartScheduledMeeting</Action></CmdLine>", 90000);
    WaitForSingleObject(poster, 30000);
    CloseHandle(poster);

    EXPECT_EQ(1, run.exitCode);
    std::string calls = ReadFileBytes(program.callsLogPath());
    EXPECT_GT(fake::CallStamp(calls, "meeting window got message 42"), 0) << calls;
    double waited =
        fake::CallStamp(calls, "Released") - fake::CallStamp(calls, "StartScheduledMeeting");
    EXPECT_GE(waited, 60000.0) << calls;
    EXPECT_LT(waited, 61000.0) << calls;
}

}  // namespace
