// The console user's token and registry root, for a process that may run as
// the system account.
#pragma once

#include <windows.h>

#include "base/win_handles.h"

// What CUserProfile asks of the system; tests replace it to drive the
// decisions that a real non-interactive process would take.
class UserSessionPlatform {
public:
    virtual ~UserSessionPlatform() = default;

    // 1 when the process token is a member of INTERACTIVE (S-1-5-4), 0 when
    // not, -1 when that cannot be determined.
    virtual int IsInteractiveProcess() = 0;
    // The operating-system class (GetOSVersionClass).
    virtual int OSVersionClass() = 0;
    // True when LoadUserProfileW, ImpersonateLoggedOnUser and RevertToSelf
    // can all be had from the system libraries.
    virtual bool HasProfileFunctions() = 0;
    // The console session's id (0xFFFFFFFF when nobody is at the console);
    // false when the lookup itself is missing.
    virtual bool ActiveConsoleSessionId(DWORD* sessionId) = 0;
    // A token (TOKEN_ALL_ACCESS) of the first process of that session whose
    // token opens and that does not run as a service account; with an
    // unknown session (0xFFFFFFFF), of the first "explorer.exe". Null when
    // none; the caller closes it.
    virtual HANDLE FindSessionToken(DWORD sessionId) = 0;
    // Loads the profile of the token's user; its registry root or null.
    virtual HKEY LoadProfileOf(HANDLE token) = 0;
    virtual void UnloadProfile(HANDLE token, HKEY root) = 0;
};

// The real calls.
UserSessionPlatform& SystemUserSessionPlatform();

// True for the accounts services run as (LocalSystem, LocalService,
// NetworkService): their tokens never stand for the console user.
bool IsServiceAccountSid(PSID sid);

class CUserProfile {
public:
    explicit CUserProfile(UserSessionPlatform& platform = SystemUserSessionPlatform());
    virtual ~CUserProfile();
    CUserProfile(const CUserProfile&) = delete;
    CUserProfile& operator=(const CUserProfile&) = delete;

    // The registry root that stands for the console user's HKEY_CURRENT_USER:
    // determined once, HKEY_CURRENT_USER whenever the user's profile cannot
    // be loaded (or the process is interactive anyway).
    HKEY GetUserRegRoot();
    // The console user's token (kept in the object), or null. Searched once.
    HANDLE GetCurrentLogonUserToken();

private:
    UserSessionPlatform& m_platform;
    HKEY m_userRegRoot = nullptr;
    UniqueHandle m_token;
    bool m_tokenSearched = false;
};

// The process-wide profile, created on first use and unloaded at exit.
CUserProfile& ProcessUserProfile();
// The process-wide profile's root.
HKEY GetUserRegRoot();

// Tests: the platform the process-wide profile will ask. Takes effect only
// before its first use; the platform must outlive the process-wide profile.
void SetProcessUserSessionPlatform(UserSessionPlatform* platform);
