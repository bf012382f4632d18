#include "actions/service_gate.h"

#include "actions/service_requests.h"
#include "base/trace.h"

CServiceGate::CServiceGate() : m_meetingSink(this), m_settingSink(this) {}

CServiceGate::~CServiceGate() {
    Uninit();
}

int CServiceGate::Init() {
    if (!m_meeting.CreateInstance()) {
        return 0;
    }
    if (!m_setting.CreateInstance()) {
        return 0;
    }
    // Through the wrappers, so the sinks follow an object that is re-created.
    m_meeting.Advise(&m_meetingSink);
    m_setting.Advise(&m_settingSink);
    return 1;
}

int CServiceGate::HasValidAccount() {
    if (!m_setting.HasObject()) {
        return 0;
    }
    return m_setting.HasValidAccount() != 0 ? 1 : 0;
}

int CServiceGate::GetUserInfo(CStringEx& siteUrl, CStringEx& userName) {
    CAutoFunTrace trace("CServiceGate::GetUserInfo");
    if (!m_setting.HasObject()) {
        return 0;
    }
    UniqueBstr account;
    if (m_setting.GetAccountInfo(account) != 0) {
        return 0;
    }
    ReadAccountDocument(account.get(), siteUrl, userName);
    return 1;
}

int CServiceGate::StartOCMeeting(int clientKind, int parentHWnd) {
    if (!m_meeting.HasObject()) {
        return 0;
    }
    if (clientKind != kClientOI && clientKind != kClientNI) {
        return 0;
    }
    CStringEx request = BuildStartMeetingRequest(parentHWnd);
    UniqueBstr text(SysAllocString(request.c_str()));
    if (m_meeting.StartOCMeeting(text.get()) != 0) {
        m_meeting.GetLastError();
        return 0;
    }
    return 1;
}

int CServiceGate::IsDisclaimerInProgress() {
    if (!m_meeting.HasObject()) {
        TraceLevel8(
            TraceValue("PSO LOG : CServiceGate::IsDisclaimerInProgress, m_spMeeting is NULL"));
        return 0;
    }
    long inProgress = 0;
    m_meeting.CheckIfDisclaimerInProgress(&inProgress);
    CStringEx text;
    text.Format(L"PSO LOG: CServiceGate::IsDisclaimerInProgress, lInProgress=%ld", inProgress);
    TraceLevel2(TraceValue(text));
    return inProgress == 1 ? 1 : 0;
}

int CServiceGate::OpenSettingDlg(const CStringEx& siteUrl) {
    if (!m_setting.HasObject()) {
        return 0;
    }
    UniqueBstr request;
    if (!siteUrl.IsEmpty()) {
        BuildSwitchSiteRequest(siteUrl, request);
    }
    if (m_setting.OpenSettingDlg(request.get()) != 0) {
        TraceLevel8(TraceValue("OpenSettingDlg failed"));
        return 0;
    }
    return 1;
}

int CServiceGate::IsSettingDlgClosed() {
    if (!m_setting.HasObject()) {
        return 0;
    }
    return m_setting.IsSettingDlgOpened() == VARIANT_FALSE ? 1 : 0;
}

int CServiceGate::ShareAsAPP(const CStringEx& sharePathFile, const CStringEx& shareFlag,
                             int parentHWnd) {
    CAutoFunTrace trace("CServiceGate::ShareAsAPP");
    if (!m_meeting.HasObject() || sharePathFile.IsEmpty() || shareFlag.IsEmpty()) {
        return 0;
    }
    UniqueBstr request;
    BuildShareRequest(sharePathFile, shareFlag, parentHWnd, request);
    TraceLevel1(TraceNamed("bstrXML.m_str", request.get()));
    if (m_meeting.StartOCMeeting(request.get()) != 0) {
        m_meeting.GetLastError();
        return 0;
    }
    return 1;
}

int CServiceGate::CommonLogin(int parentHWnd, const CStringEx& siteUrl, const CStringEx& userName,
                              int editable, const CStringEx& email) {
    if (!m_setting.HasObject()) {
        return 0;
    }
    UniqueBstr request;
    BuildCommonLoginRequest(parentHWnd, siteUrl, userName, editable, email, request);
    TraceLevel2(TraceValue(request.get()));
    UniqueBstr response;
    m_setting.GeneralCall(request.get(), response);
    TraceLevel2(TraceValue(response.get()));
    return ReadLoginResult(response.get());
}

int CServiceGate::Uninit() {
    m_meeting.Unadvise(&m_meetingSink);
    m_setting.Unadvise(&m_settingSink);
    m_meeting.ReleaseInstance();
    m_setting.ReleaseInstance();
    return 1;
}

HRESULT CServiceGate::OnMeetingEvent96(long) {
    PostQuitMessage(0);
    return S_OK;
}

HRESULT CServiceGate::OnMeetingEvent80(long, long) {
    return S_OK;
}

HRESULT CServiceGate::OnMeetingEvent16(long, long) {
    PostQuitMessage(0);
    return S_OK;
}

HRESULT CServiceGate::OnSettingEvent(long, long) {
    return S_OK;
}
