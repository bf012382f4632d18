// A hidden top-level window on its own thread that counts the
// WM_SETTINGCHANGE broadcasts naming "Environment".
#pragma once

#include <windows.h>

#include <atomic>
#include <thread>

class SettingChangeListener {
public:
    SettingChangeListener();  // returns once the window exists (or failed)
    ~SettingChangeListener();
    SettingChangeListener(const SettingChangeListener&) = delete;
    SettingChangeListener& operator=(const SettingChangeListener&) = delete;

    bool ready() const { return m_ready; }
    int environmentChanges() const { return m_count; }

private:
    static LRESULT CALLBACK WindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam);

    std::atomic<int> m_count{0};
    std::atomic<DWORD> m_threadId{0};
    bool m_ready = false;
    std::thread m_thread;
};
