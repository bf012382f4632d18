#include "app/run_command_line.h"

#include <shlwapi.h>

#include "actions/log_posting.h"
#include "actions/one_click_item_handler.h"
#include "actions/problem_report.h"
#include "actions/service_gate.h"
#include "actions/upload_proxy.h"
#include "app/cmdline_parser.h"
#include "app/ni_handle.h"
#include "base/trace.h"

namespace {

int RunOneClickItem(const wchar_t* browserName, CommandInfo& commandInfo) {
    COneClickItemHandler handler(browserName);
    return handler.Handle(commandInfo);
}

// Actions 3 and 4 go to the one-click library for the Firefox client and to
// the Suite service otherwise.
int RunMeetingOrSetting(CommandInfo& commandInfo) {
    if (commandInfo.nClientOrErrorId == kClientFireFox) {
        return RunOneClickItem(L"Firefox", commandInfo);
    }
    return QMServiceHandle(commandInfo);
}

}  // namespace

int DispatchAction(CommandInfo& commandInfo, const wchar_t* commandLine) {
    switch (commandInfo.nAction) {
        case kActionPPU:
        case kActionUploadFile:
            RunUploadProxy(commandInfo);
            return 0;
        case kActionStartOCMeeting:
        case kActionOpenQMSetting:
            return RunMeetingOrSetting(commandInfo);
        case kActionPostAttendee:
            PostAttendeeEx(commandLine);
            return 0;
        case kActionShareAsApp:
        case kActionCommonLogin:
            QMServiceHandle(commandInfo);
            return 0;
        case kActionShareWindow:
        case kActionStartAudioOnly:
        case kActionStartScheduledMeeting:
        case kActionScheduleMeeting:
        case kActionJoinMeeting:
        case kActionOpenHelp:
        case kActionOpenAbout:
            return RunOneClickItem(nullptr, commandInfo);
        case kActionPostJMFLog:
            PostJMFLog(commandInfo.strUrl, commandInfo.nClientOrErrorId);
            return 0;
        case kActionSendProblemReport: {
            CSendProblemReport report;
            report.Send();
            return 0;
        }
        default:
            return 0;
    }
}

int RunCommandLine(HINSTANCE instance, HINSTANCE /*previousInstance*/, const wchar_t* commandLine,
                   int showCommand) {
    if (commandLine == nullptr) {
        TraceLevel8(TraceValue("lpCmdLine == NULL"));
        return 0;
    }
    const wchar_t* actionText = StrStrW(commandLine, L"<CmdLine>");
    if (actionText == nullptr) {
        return NIHandle(instance, commandLine, showCommand);
    }
    CCmdLineParser parser;
    if (!parser.Parse(CStringEx(actionText))) {
        TraceLevel8(TraceValue("Parse cmdline Error"));
        return 0;
    }
    CommandInfo commandInfo;
    if (!parser.GetCommandInfo(commandInfo)) {
        TraceLevel8(TraceValue("GetCommandInfo failed"));
        return 0;
    }
    return DispatchAction(commandInfo, commandLine);
}
