// Other processes and sessions: finding a program by name, its account, and
// the token of the active session's user.
#pragma once

#include <windows.h>
#include <wtsapi32.h>

#include "base/string_ex.h"

class CQMCallProcess {
public:
    // S_OK with the id of the first process whose executable name equals
    // name (any case); E_FAIL when none, the name is empty or the snapshot
    // fails; E_INVALIDARG for a null name.
    static HRESULT MrvQMFindProcess(const wchar_t* name, DWORD* processId);
    // 1 with the account name (no domain) of the first process found.
    static BOOL GetProcessUserName(const wchar_t* name, CStringEx& accountName);
    // The id of the first active session, 0xFFFFFFFF when none.
    static DWORD GetActiveSessionId();
    // A primary token of the active session's user, or null; the caller closes it.
    static HANDLE GetActiveSessionUserToken();

    // The id of the first WTSActive entry of a session list, 0xFFFFFFFF when none.
    static DWORD FirstActiveSession(const WTS_SESSION_INFOW* sessions, DWORD count);
    // A primary token of the user of sessionId, or null; null at once for
    // 0xFFFFFFFF (no session), which the system would read as "this session".
    static HANDLE GetSessionUserToken(DWORD sessionId);
};
