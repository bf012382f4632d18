// The Action command record that every Action handler reads.
#pragma once

#include "base/string_ex.h"

struct CommandInfo {
    int hWnd = 0;                // a window handle given in decimal
    int nAction = 0;             // 1..17, see the Action table
    CStringEx strUrl;            // "LogUrl" (PostJMFLog), then "URL"
    CStringEx strAttendeeFile;   // "AttendeeFile" (PostAttendee)
    CStringEx strSharePathFile;  // "SharePathFile" (ShareAsApp)
    CStringEx strShareFlag;      // "ShareFlag" (ShareAsApp)
    int nClientOrErrorId = 0;    // "ErrorId" (PostJMFLog), then "Client": OI 0, NI 1, FireFox 2
    CStringEx strSiteUrl;        // "SiteUrl" (OpenQMSetting, CommonLogin)
    CStringEx strUsername;       // "Username" (CommonLogin)
    int bUserInfoEditable = 0;   // "Editable" (CommonLogin)
    CStringEx strEmail;          // "Email" (CommonLogin)
};

// Action numbers.
enum ActionNumber : int {
    kActionPPU = 1,
    kActionUploadFile = 2,
    kActionStartOCMeeting = 3,
    kActionOpenQMSetting = 4,
    kActionPostAttendee = 5,
    kActionShareAsApp = 6,
    kActionCommonLogin = 8,
    kActionShareWindow = 9,
    kActionStartAudioOnly = 10,
    kActionStartScheduledMeeting = 11,
    kActionScheduleMeeting = 12,
    kActionJoinMeeting = 13,
    kActionOpenHelp = 14,
    kActionOpenAbout = 15,
    kActionPostJMFLog = 16,
    kActionSendProblemReport = 17,
};

// Client kinds carried in nClientOrErrorId.
enum ClientKind : int {
    kClientOI = 0,
    kClientNI = 1,
    kClientFireFox = 2,
};
