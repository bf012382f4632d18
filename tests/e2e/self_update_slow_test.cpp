// The self-update's final step when the updater never acts on the commit: the
// temporary copy gives it 30 seconds, ends it and still hands over.
#include <gtest/gtest.h>

#include "tests/e2e/self_update_machine.h"

namespace self_update_test {
namespace {

class SelfUpdateSlowE2E : public SelfUpdateMachine {};

TEST_F(SelfUpdateSlowE2E, UpdaterThatNeverEndsIsTerminatedAfterThirtySeconds) {
    Script(TemporaryCopy(), L"ignore", 0);
    DWORD start = GetTickCount();
    RunResult run = RunTemporaryCopy(90000);
    DWORD elapsed = GetTickCount() - start;
    EXPECT_TRUE(AwaitProcessesNamed(L"~TmpDown.exe", 5000));
    std::vector<std::string> calls = Calls(TemporaryCopy());

    EXPECT_FALSE(run.timedOut || run.crashed);
    EXPECT_EQ(0, run.exitCode);
    EXPECT_GE(elapsed, 29000u);
    EXPECT_LT(elapsed, 60000u);
    EXPECT_EQ(1, CountStartingWith(calls, "~TmpDown.exe received: commit"));
    EXPECT_EQ(1, CountStartingWith(calls, "qmMrvONI.exe started: -nendupdate |"));
}

}  // namespace
}  // namespace self_update_test
