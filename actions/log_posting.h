// Log and attendee posting: the "PostAttendee" and "PostJMFLog" Actions.
#pragma once

#include "base/string_ex.h"

// commandLine is the whole command line as received.
void PostAttendeeEx(const wchar_t* commandLine);
void PostJMFLog(const CStringEx& logUrl, int errorId);
