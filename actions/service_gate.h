// The Suite service gate: Actions 3 (start meeting), 4 (settings dialog),
// 6 (share as application) and 8 (common login) carried out by the Suite
// service's Meeting and Setting objects.
#pragma once

#include "actions/command_info.h"
#include "actions/service_event_sinks.h"
#include "actions/service_wrappers.h"
#include "base/string_ex.h"

// Sends the Action to the Suite service and waits for it; always 0.
int QMServiceHandle(CommandInfo& commandInfo);

// One connection to the service for one Action, on the main thread (COM
// initialised as a single-threaded apartment). Results: 1 or 0.
class CServiceGate : public MyIServiceMeetingEvent, public MyIServiceSettingEvent {
public:
    CServiceGate();
    ~CServiceGate() override;
    CServiceGate(const CServiceGate&) = delete;
    CServiceGate& operator=(const CServiceGate&) = delete;

    // 1 when both service objects exist; connects the gate's event sinks.
    int Init();
    int HasValidAccount();
    int GetUserInfo(CStringEx& siteUrl, CStringEx& userName);
    // clientKind 0 or 1; 1 when the service accepted.
    int StartOCMeeting(int clientKind, int parentHWnd);
    int IsDisclaimerInProgress();
    // An empty siteUrl opens the dialog without a document.
    int OpenSettingDlg(const CStringEx& siteUrl);
    int IsSettingDlgClosed();
    int ShareAsAPP(const CStringEx& sharePathFile, const CStringEx& shareFlag, int parentHWnd);
    // 1 when the service's login result begins with "success" (any case).
    int CommonLogin(int parentHWnd, const CStringEx& siteUrl, const CStringEx& userName,
                    int editable, const CStringEx& email);
    // Disconnects everything and releases both objects; 1.
    int Uninit();

    // Events: 96 and 16 end the wait (WM_QUIT), the others are ignored.
    HRESULT OnMeetingEvent96(long arg0) override;
    HRESULT OnMeetingEvent80(long arg0, long arg1) override;
    HRESULT OnMeetingEvent16(long arg0, long arg1) override;
    HRESULT OnSettingEvent(long arg0, long arg1) override;

private:
    CIMeetingWrapper m_meeting;
    CISettingWrapper m_setting;
    CServiceMeetingSink m_meetingSink;
    CServiceSettingSink m_settingSink;
};
