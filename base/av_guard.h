// Structured exception guard for calls into code the program does not own
// (the trace library). An access violation inside the guarded call is
// reported to the debugger output and handled; every other exception passes on.
#pragma once

// Runs fn(context). Returns false when an access violation was caught (the
// call was abandoned at the fault), true when fn returned normally.
bool RunWithAccessViolationGuard(void (*fn)(void*), void* context);
