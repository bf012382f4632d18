#include "actions/quit_watchdog.h"
#include "actions/service_gate.h"
#include "base/trace.h"

namespace {

const LONG kMeetingWaitMs = 90000;
const LONG kShareWaitMs = 120000;
// On the way out of the share wait the watchdog keeps this much time.
const LONG kShareStopRemainingMs = 500;
// The settings pump asks the service at least this often, so it ends even
// when no message comes (a service that closed its dialog silently or ended).
const UINT kSettingPollMs = 1000;

void WaitForMeetingEnd(CServiceGate& gate) {
    for (;;) {
        RunWatchdogWait(kMeetingWaitMs, 0);
        if (gate.IsDisclaimerInProgress() != 1) {
            return;
        }
        TraceLevel2(TraceValue(
            "PSO LOG: QMServiceHandle, disclaimer is in progress, wait for more time to end"));
    }
}

void PumpUntilSettingDialogCloses(CServiceGate& gate) {
    UINT_PTR poll = SetTimer(nullptr, 0, kSettingPollMs, nullptr);
    MSG message;
    while (GetMessageW(&message, nullptr, 0, 0) > 0) {
        TranslateMessage(&message);
        DispatchMessageW(&message);
        if (gate.IsSettingDlgClosed() == 1) {
            break;
        }
    }
    if (poll != 0) {
        KillTimer(nullptr, poll);
    }
}

void RunAction(CServiceGate& gate, CommandInfo& commandInfo) {
    switch (commandInfo.nAction) {
        case kActionStartOCMeeting:
            if (gate.StartOCMeeting(commandInfo.nClientOrErrorId, commandInfo.hWnd) != 0) {
                WaitForMeetingEnd(gate);
            }
            break;
        case kActionOpenQMSetting:
            if (gate.OpenSettingDlg(commandInfo.strSiteUrl) == 1) {
                PumpUntilSettingDialogCloses(gate);
            }
            break;
        case kActionShareAsApp:
            if (gate.ShareAsAPP(commandInfo.strSharePathFile, commandInfo.strShareFlag,
                                commandInfo.hWnd) != 0) {
                RunWatchdogWait(kShareWaitMs, kShareStopRemainingMs);
            }
            break;
        case kActionCommonLogin:
            // The request's ParentHWnd is always 0.
            gate.CommonLogin(0, commandInfo.strSiteUrl, commandInfo.strUsername,
                             commandInfo.bUserInfoEditable, commandInfo.strEmail);
            break;
        default:
            break;
    }
}

}  // namespace

int QMServiceHandle(CommandInfo& commandInfo) {
    CAutoFunTrace trace("QMServiceHandle");
    const int action = commandInfo.nAction;
    if (action != kActionStartOCMeeting && action != kActionOpenQMSetting &&
        action != kActionShareAsApp && action != kActionCommonLogin) {
        return 0;
    }
    try {
        CServiceGate gate;
        if (gate.Init() == 0) {
            return 0;
        }
        if ((action == kActionStartOCMeeting || action == kActionOpenQMSetting) &&
            gate.HasValidAccount() == 0) {
            // Without a valid account the command becomes a login.
            CStringEx siteUrl, userName;
            gate.GetUserInfo(siteUrl, userName);
            commandInfo.strSiteUrl = siteUrl;
            commandInfo.strUsername = userName;
            commandInfo.bUserInfoEditable = 1;
            commandInfo.nAction = kActionCommonLogin;
        }
        RunAction(gate, commandInfo);
        gate.Uninit();
    } catch (...) {
        TraceLevel8(TraceValue("QMServiceHandle: Exception"));
    }
    return 0;
}
