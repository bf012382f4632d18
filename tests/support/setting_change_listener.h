// A hidden top-level window on its own thread that counts the
// WM_SETTINGCHANGE broadcasts naming "Environment".
#pragma once

#include <windows.h>

#include <atomic>

class SettingChangeListener {
public:
    SettingChangeListener();  // returns once the window exists (or failed)
    ~SettingChangeListener();
    SettingChangeListener(const SettingChangeListener&) = delete;
    SettingChangeListener& operator=(const SettingChangeListener&) = delete;

    bool ready() const { return m_window != nullptr; }
    int environmentChanges() const { return m_count.load(); }

private:
    static DWORD WINAPI ThreadMain(void* self);
    static LRESULT CALLBACK WindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam);

    HANDLE m_thread = nullptr;
    HANDLE m_started = nullptr;
    DWORD m_threadId = 0;
    HWND m_window = nullptr;
    std::atomic<int> m_count{0};
};
