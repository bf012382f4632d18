#include "app/cmdline_parser.h"

#include "base/oixml.h"
#include "base/trace.h"

namespace {

struct ActionName {
    const wchar_t* name;
    int number;
};

// Compared exactly, in this order; the first equal name wins.
const ActionName kActions[] = {
    {L"PPU", kActionPPU},
    {L"UPLOAD_FILE", kActionUploadFile},
    {L"StartOCMeeting", kActionStartOCMeeting},
    {L"OpenQMSetting", kActionOpenQMSetting},
    {L"ShareWindow", kActionShareWindow},
    {L"StartAudioOnly", kActionStartAudioOnly},
    {L"StartScheduledMeeting", kActionStartScheduledMeeting},
    {L"ScheduleMeeting", kActionScheduleMeeting},
    {L"JoinMeeting", kActionJoinMeeting},
    {L"OpenHelp", kActionOpenHelp},
    {L"OpenAbout", kActionOpenAbout},
    {L"PostAttendee", kActionPostAttendee},
    {L"PostJMFLog", kActionPostJMFLog},
    {L"ShareAsApp", kActionShareAsApp},
    {L"SendProblemReport", kActionSendProblemReport},
    {L"CommonLogin", kActionCommonLogin},
};

// Reads the Action's own elements into the record.
void ReadActionElements(const COIXML& root, CommandInfo& info) {
    switch (info.nAction) {
        case kActionOpenQMSetting:
            root.GetChildValue(L"SiteUrl", info.strSiteUrl);
            break;
        case kActionPostAttendee:
            root.GetChildValue(L"AttendeeFile", info.strAttendeeFile);
            break;
        case kActionPostJMFLog:
            root.GetChildValue(L"LogUrl", info.strUrl);
            root.GetChildValue(L"ErrorId", info.nClientOrErrorId);
            break;
        case kActionShareAsApp:
            root.GetChildValue(L"SharePathFile", info.strSharePathFile);
            root.GetChildValue(L"ShareFlag", info.strShareFlag);
            break;
        case kActionCommonLogin:
            root.GetChildValue(L"SiteUrl", info.strSiteUrl);
            root.GetChildValue(L"Username", info.strUsername);
            root.GetChildValue(L"Editable", info.bUserInfoEditable);
            root.GetChildValue(L"Email", info.strEmail);
            TraceLevel1(TraceValue("CommonLogin"),
                        TraceNamed("m_sCommandInfo.strSiteUrl.c_str()", info.strSiteUrl),
                        TraceNamed("m_sCommandInfo.strUsername.c_str()", info.strUsername),
                        TraceNamed("m_sCommandInfo.bUserInfoEditable", info.bUserInfoEditable));
            break;
        default:
            break;
    }
}

void ReadClientKind(const COIXML& root, CommandInfo& info) {
    CStringEx client;
    if (root.GetChildValue(L"Client", client) != 0) {
        return;
    }
    if (client == L"OI") {
        info.nClientOrErrorId = kClientOI;
    } else if (client == L"NI") {
        info.nClientOrErrorId = kClientNI;
    } else if (client == L"FireFox") {
        info.nClientOrErrorId = kClientFireFox;
    }
}

}  // namespace

int ActionNumberFromName(const wchar_t* name) {
    if (name == nullptr) {
        return 0;
    }
    for (const ActionName& action : kActions) {
        if (wcscmp(name, action.name) == 0) {
            return action.number;
        }
    }
    return 0;
}

int CCmdLineParser::Parse(const CStringEx& text) {
    CAutoFunTrace trace("CCmdLineParser::Parse");
    if (text.IsEmpty()) {
        return 0;
    }
    COIXML root;
    root.SetXML(text.c_str());
    CStringEx rootName;
    root.GetName(rootName);
    if (rootName != L"CmdLine") {
        return 0;
    }
    CStringEx actionName;
    root.GetChildValue(L"Action", actionName);
    int action = ActionNumberFromName(actionName.c_str());
    if (action == 0) {
        return 0;
    }
    m_sCommandInfo.nAction = action;
    ReadActionElements(root, m_sCommandInfo);
    ReadClientKind(root, m_sCommandInfo);
    int hWnd = 0;
    root.GetChildValue(L"hWnd", hWnd);
    m_sCommandInfo.hWnd = hWnd;
    root.GetChildValue(L"URL", m_sCommandInfo.strUrl);
    return 1;
}

int CCmdLineParser::GetCommandInfo(CommandInfo& out) const {
    if (m_sCommandInfo.nAction == 0) {
        return 0;
    }
    out = m_sCommandInfo;
    return 1;
}
