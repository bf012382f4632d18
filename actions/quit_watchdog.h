// The wait for the Suite service's ending event: the main thread pumps its
// messages until WM_QUIT, which an event handler posts or, when no event
// comes, the watchdog thread posts after a fixed time.
#pragma once

#include <windows.h>

#include <atomic>

// Shared by the main thread and the watchdog thread.
struct QuitTimerRecord {
    std::atomic<LONG> remainingMs{0};  // counted down in 500 ms steps
    DWORD threadId = 0;                // the thread to wake with WM_QUIT
    HANDLE wake = nullptr;             // set to end the current step at once
};

// The watchdog thread: while time remains, waits one 500 ms step (or until
// woken) and takes 500 off; then posts WM_QUIT to the record's thread.
unsigned __stdcall QuitTimerProc(void* record);

// Pumps the calling thread's messages until WM_QUIT, with a watchdog of
// timeMs. On the way out the watchdog's remaining time becomes
// stopRemainingMs (0 ends it at once) and the thread is waited for; the
// WM_QUIT it posts then is taken out of the queue unread.
void RunWatchdogWait(LONG timeMs, LONG stopRemainingMs);

// Pumps messages until WM_QUIT (GetMessageW returns 0 or fails).
void PumpUntilQuit();
