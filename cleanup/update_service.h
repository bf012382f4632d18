// Removal of the suite's update service. Problems are reported to the Windows
// event log (source "MirovanService"), where administrators look for them.
#pragma once

#include <windows.h>

// Stops and deletes "MirovanService"; 1 when deleted or already marked for
// deletion.
BOOL SvcUninstall();

// Writes one event-log entry of type (EVENTLOG_WARNING_TYPE...) with the
// printf-formatted message (at most 511 characters).
void SvcReportEvent(WORD type, const wchar_t* format, ...);
