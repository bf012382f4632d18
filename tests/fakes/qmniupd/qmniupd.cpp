// Stand-in for the Notes plug-in's updater "qmniupd.exe", run by the
// self-update as "~TmpDown.exe -downstart -hParentWnd=<window> -sitename=...".
// It records its start, creates a window and reports its download to the
// parent window; QM_FAKE_UPDATER scripts what it does:
//   "post-wait" (or unset)  post 1125 and wait for commit or rollback;
//   "no-post"               exit at once without posting;
//   "post-exit"             post and exit at once;
//   "ignore"                post, then record commit or rollback but never
//                           act on it and never exit.
// Words that may follow: "msg=<n>" posts message n instead of 1125, "twice"
// posts it twice, "bogus" puts a handle that names no window in wParam.
#include <windows.h>

#include <cwchar>
#include <string>

#include "tests/fakes/common/fake_program.h"

namespace {

const UINT kDownloadFinished = 1125;
const UINT kRollback = 1128;
const UINT kCommit = 1129;

bool g_ignoreAnswer = false;

LRESULT CALLBACK WindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == kCommit || message == kRollback) {
        fake::RecordEvent(message == kCommit ? "received: commit" : "received: rollback");
        if (!g_ignoreAnswer) {
            PostQuitMessage(0);
        }
        return 0;
    }
    return DefWindowProcW(window, message, wParam, lParam);
}

HWND ParentWindow() {
    std::wstring arguments = fake::Arguments();
    size_t at = arguments.find(L"-hParentWnd=");
    if (at == std::wstring::npos) {
        return nullptr;
    }
    return reinterpret_cast<HWND>(static_cast<INT_PTR>(_wtoi(arguments.c_str() + at + 12)));
}

bool Has(const std::wstring& script, const wchar_t* word) {
    return script.find(word) != std::wstring::npos;
}

}  // namespace

int WINAPI wWinMain(HINSTANCE instance, HINSTANCE, PWSTR, int) {
    fake::RecordStart();
    std::wstring script = fake::EnvironmentValue(L"QM_FAKE_UPDATER");
    if (Has(script, L"no-post")) {
        return 1;
    }
    g_ignoreAnswer = Has(script, L"ignore");

    WNDCLASSW windowClass = {};
    windowClass.lpfnWndProc = WindowProc;
    windowClass.hInstance = instance;
    windowClass.lpszClassName = L"QMFakeUpdater";
    RegisterClassW(&windowClass);
    HWND window = CreateWindowW(L"QMFakeUpdater", L"", WS_OVERLAPPEDWINDOW, 0, 0, 0, 0, nullptr,
                                nullptr, instance, nullptr);

    UINT message = kDownloadFinished;
    size_t at = script.find(L"msg=");
    if (at != std::wstring::npos) {
        message = static_cast<UINT>(_wtoi(script.c_str() + at + 4));
    }
    WPARAM reported =
        Has(script, L"bogus") ? static_cast<WPARAM>(0x7FFF0000) : reinterpret_cast<WPARAM>(window);
    fake::RecordEvent("posted: " + std::to_string(message));
    for (int i = Has(script, L"twice") ? 2 : 1; i > 0; --i) {
        PostMessageW(ParentWindow(), message, reported, 0);
    }
    if (Has(script, L"post-exit")) {
        return 0;
    }
    MSG msg;
    while (GetMessageW(&msg, nullptr, 0, 0) > 0) {
        DispatchMessageW(&msg);
    }
    return 0;
}
