// Keeping the main thread responsive while it waits.
#pragma once

#include <windows.h>

// Dispatches this thread's messages, one at a time, sleeping 100 ms whenever
// none is queued, until `milliseconds` have passed.
void DispatchMessagesFor(DWORD milliseconds);

// Dispatches the thread's messages for up to `seconds`, waking as each one
// arrives; returns earlier once a WM_QUIT was taken from the queue.
void PumpMessagesFor(DWORD seconds);
