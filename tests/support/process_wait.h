// Waiting for programs that the program under test starts and leaves running.
#pragma once

#include <windows.h>

// Waits for every process of this prefix running the executable `name` (any
// case) to end; false when one is still running after timeoutMs.
bool AwaitProcessesNamed(const wchar_t* name, DWORD timeoutMs);
