#include "base/message_pump.h"

#include "base/win_handles.h"

void DispatchMessagesFor(DWORD milliseconds) {
    DWORD start = GetTickCount();
    while (GetTickCount() - start < milliseconds) {
        MSG message;
        if (PeekMessageW(&message, nullptr, 0, 0, PM_REMOVE)) {
            TranslateMessage(&message);
            DispatchMessageW(&message);
        } else {
            Sleep(100);
        }
    }
}

void PumpMessagesFor(DWORD seconds) {
    // Never signalled: it gives the wait an object besides the queue.
    UniqueHandle idle(CreateEventW(nullptr, TRUE, FALSE, nullptr));
    if (!idle) {
        return;
    }
    const DWORD limit = seconds * 1000;
    const DWORD start = GetTickCount();
    bool quit = false;
    while (!quit) {
        DWORD elapsed = GetTickCount() - start;
        if (elapsed > limit) {
            break;
        }
        // Waits only for what is left, so messages arriving late cannot
        // stretch the wait past its time.
        HANDLE handles[] = {idle.get()};
        DWORD woke = MsgWaitForMultipleObjects(1, handles, FALSE, limit - elapsed, QS_ALLINPUT);
        if (woke != WAIT_OBJECT_0 + 1) {
            break;
        }
        MSG message;
        while (PeekMessageW(&message, nullptr, 0, 0, PM_REMOVE)) {
            if (message.message == WM_QUIT) {
                quit = true;
            }
            TranslateMessage(&message);
            DispatchMessageW(&message);
        }
    }
}
