// Keeping the thread's messages flowing while it waits.
#pragma once

#include <windows.h>

// Dispatches the thread's messages for up to `seconds`; returns earlier once
// a WM_QUIT was taken from the queue.
void PumpMessagesFor(DWORD seconds);
