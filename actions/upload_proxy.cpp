#include "actions/upload_proxy.h"

#include <memory>
#include <new>

#include "actions/feedback_sender.h"
#include "actions/proxy_ppu.h"
#include "actions/proxy_upload_file.h"
#include "base/trace.h"

namespace {

// The page is looked at every 50 ms.
const DWORD kPollIntervalMs = 50;

CIEProxy* CreateProxy(const CommandInfo& commandInfo) {
    const wchar_t* url = commandInfo.strUrl.c_str();
    if (commandInfo.nAction == kActionPPU) {
        return new (std::nothrow) CProxyPPU(url);
    }
    if (commandInfo.nAction == kActionUploadFile) {
        return new (std::nothrow) CProxyUploadFile(url);
    }
    return nullptr;
}

}  // namespace

int RunUploadProxy(CommandInfo& commandInfo) {
    std::unique_ptr<CIEProxy> proxy(CreateProxy(commandInfo));
    if (!proxy) {
        return 0;
    }
    for (;;) {
        proxy->Run();
        int state = proxy->GetState();
        if (state == kProxyFinished || state == kProxyNoBrowser) {
            break;
        }
        Sleep(kPollIntervalMs);
    }
    if (proxy->GetState() == kProxyNoBrowser) {
        TraceLevel8(TraceValue("IE create failed"));
    }
    CStringEx feedback;
    proxy->GetResult(feedback);
    CFeedbackSender sender(reinterpret_cast<HWND>(static_cast<INT_PTR>(commandInfo.hWnd)));
    sender.SetFeedback(feedback.c_str());
    sender.Send();
    return 0;
}
