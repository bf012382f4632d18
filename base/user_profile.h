// The console user's token and registry root, for a process that may run as
// the system account.
#pragma once

#include <windows.h>

// What CUserProfile asks of the system; tests replace it to drive the
// decisions that a real non-interactive process would take.
class UserSessionPlatform {
  public:
    virtual ~UserSessionPlatform() = default;

    // 1 when the process token is a member of INTERACTIVE (S-1-5-4), 0 when
    // not, -1 when that cannot be determined.
    virtual int IsInteractiveProcess() = 0;
    // The console session's id, 0xFFFFFFFF when there is none or unknown.
    virtual DWORD ActiveConsoleSessionId() = 0;
    // A token (TOKEN_ALL_ACCESS) of the first process of that session whose
    // token opens; with an unknown session, of the first "explorer.exe".
    virtual HANDLE FindSessionToken(DWORD sessionId) = 0;
    // Loads the profile of the token's user; its registry root or null.
    virtual HKEY LoadProfileOf(HANDLE token) = 0;
    virtual void UnloadProfile(HANDLE token, HKEY root) = 0;
};

// The real calls.
UserSessionPlatform& SystemUserSessionPlatform();

class CUserProfile {
  public:
    explicit CUserProfile(UserSessionPlatform& platform = SystemUserSessionPlatform());
    virtual ~CUserProfile();
    CUserProfile(const CUserProfile&) = delete;
    CUserProfile& operator=(const CUserProfile&) = delete;

    // The registry root that stands for the console user's HKEY_CURRENT_USER.
    HKEY GetUserRegRoot();
    // The console user's token (kept in the object), or null.
    HANDLE GetCurrentLogonUserToken();

  private:
    UserSessionPlatform& m_platform;
    HKEY m_userRegRoot = nullptr;
    HANDLE m_token = nullptr;
    bool m_tokenSearched = false;
};

// The process-wide profile's root.
HKEY GetUserRegRoot();
