// The browser stand-in as a local server, the way Internet Explorer is
// registered: started by COM as "iexplore.exe <page script> -Embedding".
#include "tests/fakes/browser/browser_standin.h"

#include <exdisp.h>
#include <shellapi.h>

namespace {

// A server nobody talks to any more ends after this.
const UINT kLifetimeLimitMs = 10 * 60 * 1000;

void CALLBACK LifetimeOver(HWND, UINT, UINT_PTR, DWORD) {
    PostQuitMessage(0);
}

}  // namespace

int WINAPI wWinMain(HINSTANCE, HINSTANCE, LPWSTR, int) {
    int argc = 0;
    wchar_t** argv = CommandLineToArgvW(GetCommandLineW(), &argc);
    std::wstring script;
    for (int i = 1; i < argc; ++i) {
        if (argv[i][0] != L'-' && argv[i][0] != L'/') {
            script = argv[i];
        }
    }
    LocalFree(argv);

    CoInitialize(nullptr);
    StartBrowserStandIn(script, true);
    DWORD cookie = 0;
    CoRegisterClassObject(CLSID_InternetExplorer,
                          reinterpret_cast<IUnknown*>(BrowserClassFactory()), CLSCTX_LOCAL_SERVER,
                          REGCLS_SINGLEUSE, &cookie);
    SetTimer(nullptr, 0, kLifetimeLimitMs, LifetimeOver);
    MSG message;
    while (GetMessageW(&message, nullptr, 0, 0) > 0) {
        TranslateMessage(&message);
        DispatchMessageW(&message);
    }
    CoRevokeClassObject(cookie);
    CoUninitialize();
    return 0;
}
