#include "actions/log_posting.h"

// Both postings go through the suite's URL library, which arrives with the
// posting work; until then they do nothing.
void PostAttendeeEx(const wchar_t* /*commandLine*/) {}

void PostJMFLog(const CStringEx& /*logUrl*/, int /*errorId*/) {}
