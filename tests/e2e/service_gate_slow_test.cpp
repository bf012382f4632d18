// The watchdog of the Suite service waits: when no ending event comes, the
// wait ends after 90 s (start meeting) or 120 s (share). Labelled "slow".
#include "tests/e2e/service_gate_fixture.h"

namespace {

TEST_F(ServiceGateTest, ServiceEndingDuringTheMeetingWaitLeavesItToTheWatchdog) {
    RunResult run =
        Run("ExitAfter=StartOCMeeting 300\n",
            L"<CmdLine><Action>StartOCMeeting</Action><hWnd>1</hWnd></CmdLine>", 150000);
    EXPECT_GE(m_endMs - m_service.TimeOf("call", "StartOCMeeting"), 89500);
    EXPECT_LT(m_endMs - m_startMs, 110000);
    // The disclaimer question after the wait reached a new service process.
    EXPECT_TRUE(run.HasTrace(" ReCreateInstance Success, qmSrv Recover success,\n"));
}

TEST_F(ServiceGateTest, ShareWithoutAnEventEndsAfterTwoMinutes) {
    Run("",
        L"<CmdLine><Action>ShareAsApp</Action><SharePathFile>C:\\a.exe</SharePathFile>"
        L"<ShareFlag>1</ShareFlag></CmdLine>",
        170000);
    EXPECT_GE(m_endMs - m_service.TimeOf("call", "StartOCMeeting"), 119500);
    EXPECT_LT(m_endMs - m_startMs, 140000);
}

}  // namespace
