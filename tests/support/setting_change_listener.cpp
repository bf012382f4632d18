#include "tests/support/setting_change_listener.h"

#include <future>

SettingChangeListener::SettingChangeListener() {
    std::promise<bool> created;
    std::future<bool> ready = created.get_future();
    m_thread = std::thread([this, &created] {
        WNDCLASSW windowClass = {};
        windowClass.lpfnWndProc = WindowProc;
        windowClass.lpszClassName = L"QMTestSettingChangeListener";
        RegisterClassW(&windowClass);  // an earlier listener's registration is fine
        HWND window = CreateWindowExW(0, windowClass.lpszClassName, L"", WS_POPUP, 0, 0, 0, 0,
                                      nullptr, nullptr, nullptr, nullptr);
        SetWindowLongPtrW(window, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(&m_count));
        MSG message;
        PeekMessageW(&message, nullptr, 0, 0, PM_NOREMOVE);  // a queue for WM_QUIT
        m_threadId = GetCurrentThreadId();
        created.set_value(window != nullptr);
        while (window != nullptr && GetMessageW(&message, nullptr, 0, 0) > 0) {
            DispatchMessageW(&message);
        }
        DestroyWindow(window);
    });
    m_ready = ready.get();
}

SettingChangeListener::~SettingChangeListener() {
    PostThreadMessageW(m_threadId, WM_QUIT, 0, 0);
    m_thread.join();
}

LRESULT CALLBACK SettingChangeListener::WindowProc(HWND window, UINT message, WPARAM wParam,
                                                   LPARAM lParam) {
    if (message == WM_SETTINGCHANGE && lParam != 0 &&
        lstrcmpW(reinterpret_cast<const wchar_t*>(lParam), L"Environment") == 0) {
        ++*reinterpret_cast<std::atomic<int>*>(GetWindowLongPtrW(window, GWLP_USERDATA));
    }
    return DefWindowProcW(window, message, wParam, lParam);
}
