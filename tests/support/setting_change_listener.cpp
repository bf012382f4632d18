#include "tests/support/setting_change_listener.h"

namespace {
const wchar_t kClassName[] = L"QMTestSettingChangeListener";
}  // namespace

SettingChangeListener::SettingChangeListener() {
    m_started = CreateEventW(nullptr, TRUE, FALSE, nullptr);
    m_thread = CreateThread(nullptr, 0, ThreadMain, this, 0, &m_threadId);
    if (m_thread != nullptr) {
        WaitForSingleObject(m_started, 10000);
    }
}

SettingChangeListener::~SettingChangeListener() {
    if (m_thread != nullptr) {
        PostThreadMessageW(m_threadId, WM_QUIT, 0, 0);
        WaitForSingleObject(m_thread, 10000);
        CloseHandle(m_thread);
    }
    if (m_started != nullptr) {
        CloseHandle(m_started);
    }
}

DWORD WINAPI SettingChangeListener::ThreadMain(void* param) {
    auto* self = static_cast<SettingChangeListener*>(param);
    WNDCLASSW windowClass = {};
    windowClass.lpfnWndProc = WindowProc;
    windowClass.hInstance = GetModuleHandleW(nullptr);
    windowClass.lpszClassName = kClassName;
    RegisterClassW(&windowClass);  // already registered by an earlier listener is fine
    HWND window = CreateWindowExW(0, kClassName, L"", WS_POPUP, 0, 0, 0, 0, nullptr, nullptr,
                                  windowClass.hInstance, nullptr);
    if (window != nullptr) {
        SetWindowLongPtrW(window, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(self));
    }
    self->m_window = window;
    // Make sure the thread has a queue before the owner may post WM_QUIT.
    MSG msg;
    PeekMessageW(&msg, nullptr, 0, 0, PM_NOREMOVE);
    SetEvent(self->m_started);
    if (window == nullptr) {
        return 1;
    }
    while (GetMessageW(&msg, nullptr, 0, 0) > 0) {
        TranslateMessage(&msg);
        DispatchMessageW(&msg);
    }
    DestroyWindow(window);
    return 0;
}

LRESULT CALLBACK SettingChangeListener::WindowProc(HWND window, UINT message, WPARAM wParam,
                                                   LPARAM lParam) {
    if (message == WM_SETTINGCHANGE && lParam != 0 &&
        lstrcmpW(reinterpret_cast<const wchar_t*>(lParam), L"Environment") == 0) {
        auto* self =
            reinterpret_cast<SettingChangeListener*>(GetWindowLongPtrW(window, GWLP_USERDATA));
        if (self != nullptr) {
            ++self->m_count;
        }
    }
    return DefWindowProcW(window, message, wParam, lParam);
}
