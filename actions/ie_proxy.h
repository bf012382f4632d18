// CIEProxy: drives one Internet Explorer window through an upload page as a
// state machine, one step per Run(), and holds the feedback document for the
// suite program that started us. CProxyPPU and CProxyUploadFile read their own
// result from the page.
#pragma once

#include <windows.h>
#include <exdisp.h>

#include "base/com_owners.h"
#include "base/oixml.h"
#include "base/string_ex.h"

enum ProxyState : int {
    kProxyNotStarted = 0,
    kProxyResultRead = 1,  // the browser is to be closed
    kProxyWaiting = 2,     // page open, waiting for the result
    kProxyFinished = 3,
    kProxyNoBrowser = 4,  // Internet Explorer could not be created or navigate
};

// Reasons of the failure document.
enum FeedbackFailure : int {
    kFailurePlain = 0,
    kFailureNoPermission = 1,
    kFailureUserCanceled = 2,
};

class CIEProxy {
public:
    explicit CIEProxy(const wchar_t* url);
    virtual ~CIEProxy();
    CIEProxy(const CIEProxy&) = delete;
    CIEProxy& operator=(const CIEProxy&) = delete;

    // One step of the state machine.
    virtual void Run();
    // 1 when the page shows a successful result, else 0.
    virtual int ExaminePage() = 0;
    virtual void SetFailed(int reason);
    virtual void SetSuccess() = 0;

    int GetState() const { return m_state; }
    // The feedback document, serialised.
    void GetResult(CStringEx& out);

protected:
    IWebBrowserApp* Browser() const { return m_browser.Get(); }
    // Closes the browser window and lets the browser go.
    void QuitBrowser();
    // Starts the feedback document afresh: "Feedback" with its "Status".
    COIXML& NewFeedback(const wchar_t* status);

private:
    void Start();
    // The browser is held and its window still exists.
    bool BrowserWindowOpen() const;

    CStringEx m_url;
    COIXML m_feedback;
    int m_state = kProxyNotStarted;
    ComPtr<IWebBrowserApp> m_browser;
};
