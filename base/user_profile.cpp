#include "base/user_profile.h"

// The console-user lookup for a non-interactive process is completed with
// the user-session work; until then every process counts as interactive.
namespace {
class InteractiveOnlyPlatform : public UserSessionPlatform {
  public:
    int IsInteractiveProcess() override { return 1; }
    DWORD ActiveConsoleSessionId() override { return 0xFFFFFFFF; }
    HANDLE FindSessionToken(DWORD) override { return nullptr; }
    HKEY LoadProfileOf(HANDLE) override { return nullptr; }
    void UnloadProfile(HANDLE, HKEY) override {}
};
}  // namespace

UserSessionPlatform& SystemUserSessionPlatform() {
    static InteractiveOnlyPlatform platform;
    return platform;
}

CUserProfile::CUserProfile(UserSessionPlatform& platform) : m_platform(platform) {}

CUserProfile::~CUserProfile() = default;

HKEY CUserProfile::GetUserRegRoot() {
    if (m_userRegRoot == nullptr) {
        m_userRegRoot = HKEY_CURRENT_USER;
    }
    return m_userRegRoot;
}

HANDLE CUserProfile::GetCurrentLogonUserToken() {
    return m_token;
}

HKEY GetUserRegRoot() {
    static CUserProfile profile;
    return profile.GetUserRegRoot();
}
