#include "actions/ie_proxy.h"

CIEProxy::CIEProxy(const wchar_t* url) : m_url(url) {}

CIEProxy::~CIEProxy() = default;

void CIEProxy::Run() {
    switch (m_state) {
        case kProxyNotStarted:
            Start();
            break;
        case kProxyResultRead:
            if (BrowserWindowOpen()) {
                m_browser->Quit();
            }
            m_browser.Reset();
            m_state = kProxyFinished;
            break;
        case kProxyWaiting:
            if (BrowserWindowOpen()) {
                if (ExaminePage() == 1) {
                    SetSuccess();
                    m_state = kProxyResultRead;
                }
            } else {
                SetFailed(kFailureUserCanceled);
                m_state = kProxyFinished;
            }
            break;
        default:
            break;
    }
}

void CIEProxy::Start() {
    if (!m_browser) {
        CoCreateInstance(CLSID_InternetExplorer, nullptr, CLSCTX_ALL, IID_IWebBrowserApp,
                         reinterpret_cast<void**>(m_browser.ReleaseAndGetAddressOf()));
    }
    if (!m_browser) {
        m_state = kProxyNoBrowser;
        SetFailed(kFailurePlain);
        return;
    }
    UniqueBstr url(SysAllocString(m_url.c_str()));
    UniqueVariant flags, targetFrame, postData, headers;
    if (SUCCEEDED(m_browser->Navigate(url.get(), flags.get(), targetFrame.get(), postData.get(),
                                      headers.get()))) {
        m_browser->put_Visible(VARIANT_TRUE);
        m_state = kProxyWaiting;
        return;
    }
    // Nobody would ever see or close the hidden window of a browser that
    // could not navigate: end it rather than leave it running.
    QuitBrowser();
    m_state = kProxyNoBrowser;
    SetFailed(kFailurePlain);
}

bool CIEProxy::BrowserWindowOpen() const {
    if (!m_browser) {
        return false;
    }
    SHANDLE_PTR window = 0;
    if (FAILED(m_browser->get_HWND(&window))) {
        return false;
    }
    return IsWindow(reinterpret_cast<HWND>(window)) != FALSE;
}

void CIEProxy::QuitBrowser() {
    if (m_browser) {
        m_browser->Quit();
        m_browser.Reset();
    }
}

COIXML& CIEProxy::NewFeedback(const wchar_t* status) {
    m_feedback.SetXML(nullptr);
    m_feedback.SetName(L"Feedback");
    m_feedback.AddChild(L"Status", status, true);
    return m_feedback;
}

void CIEProxy::SetFailed(int reason) {
    COIXML& feedback = NewFeedback(L"Failed");
    if (reason == kFailureNoPermission) {
        feedback.AddChild(L"Reason", L"No execute Permission", true);
    } else if (reason == kFailureUserCanceled) {
        feedback.AddChild(L"Reason", L"User canceled", true);
    }
}

void CIEProxy::GetResult(CStringEx& out) {
    m_feedback.GetXML(out);
}
