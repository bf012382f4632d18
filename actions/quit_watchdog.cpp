#include "actions/quit_watchdog.h"

#include <process.h>

#include "base/win_handles.h"

unsigned __stdcall QuitTimerProc(void* param) {
    QuitTimerRecord* record = static_cast<QuitTimerRecord*>(param);
    while (record->remainingMs.load() > 0) {
        if (record->wake != nullptr) {
            WaitForSingleObject(record->wake, 500);
        } else {
            Sleep(500);
        }
        record->remainingMs.fetch_sub(500);
    }
    PostThreadMessageW(record->threadId, WM_QUIT, 0, 0);
    return 0;
}

void PumpUntilQuit() {
    MSG message;
    while (GetMessageW(&message, nullptr, 0, 0) > 0) {
        TranslateMessage(&message);
        DispatchMessageW(&message);
    }
}

void RunWatchdogWait(LONG timeMs, LONG stopRemainingMs) {
    UniqueHandle wake(CreateEventW(nullptr, TRUE, FALSE, nullptr));
    QuitTimerRecord record;
    record.remainingMs.store(timeMs);
    record.threadId = GetCurrentThreadId();
    record.wake = wake.get();
    UniqueHandle thread(
        reinterpret_cast<HANDLE>(_beginthreadex(nullptr, 0, QuitTimerProc, &record, 0, nullptr)));
    PumpUntilQuit();
    if (!thread) {
        return;
    }
    record.remainingMs.store(stopRemainingMs);
    if (stopRemainingMs <= 0 && wake) {
        SetEvent(wake.get());
    }
    WaitForSingleObject(thread.get(), INFINITE);
    MSG stale;
    PeekMessageW(&stale, nullptr, WM_QUIT, WM_QUIT, PM_REMOVE);
}
