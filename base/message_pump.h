// Keeping the main thread responsive while it waits.
#pragma once

#include <windows.h>

// Dispatches this thread's messages, one at a time, sleeping 100 ms whenever
// none is queued, until `milliseconds` have passed.
void PumpMessagesFor(DWORD milliseconds);
