// CUserProfile's decisions, driven through its platform seam: under this test
// platform every process is interactive, so the system-account cases exist
// only there.
#include <gtest/gtest.h>

#include "base/os_version.h"
#include "base/user_profile.h"

namespace {

const HKEY kLoadedRoot = reinterpret_cast<HKEY>(0x4321);  // a stand-in nobody opens or closes

bool IsOpenHandle(HANDLE handle) {
    DWORD flags = 0;
    return handle != nullptr && GetHandleInformation(handle, &flags) != FALSE;
}

class FakePlatform : public UserSessionPlatform {
public:
    int interactive = 0;
    int osClass = kOSVistaOrLater;
    bool profileFunctions = true;
    bool consoleLookup = true;
    DWORD consoleSession = 1;
    bool hasToken = true;
    HKEY profileRoot = nullptr;

    std::string calls;  // the steps taken, each followed by a space
    HANDLE token = nullptr;
    HKEY unloadedRoot = nullptr;
    bool tokenOpenAtUnload = false;

    int IsInteractiveProcess() override { return calls += "interactive ", interactive; }
    int OSVersionClass() override { return osClass; }
    bool HasProfileFunctions() override { return calls += "functions ", profileFunctions; }
    bool ActiveConsoleSessionId(DWORD* sessionId) override {
        calls += "console ";
        *sessionId = consoleSession;
        return consoleLookup;
    }
    HANDLE FindSessionToken(DWORD sessionId) override {
        calls += "find" + std::to_string(sessionId) + " ";
        if (hasToken) {  // a real handle, so its closing can be observed
            OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, &token);
        }
        return token;
    }
    HKEY LoadProfileOf(HANDLE) override { return calls += "load ", profileRoot; }
    void UnloadProfile(HANDLE handed, HKEY root) override {
        calls += "unload ";
        unloadedRoot = root;
        tokenOpenAtUnload = handed == token && IsOpenHandle(handed);
    }
};

TEST(UserProfile, ConsoleUsersProfileOrOnAnyFailedStepTheOwnHive) {
    const struct {
        const char* name;
        void (*arrange)(FakePlatform&);
        const char* calls;
    } cases[] = {
        {"interactive", [](FakePlatform& p) { p.interactive = 1; }, "interactive "},
        {"groups unreadable", [](FakePlatform& p) { p.interactive = -1; }, "interactive "},
        {"no profile functions", [](FakePlatform& p) { p.profileFunctions = false; },
         "interactive functions "},
        {"nobody at the console", [](FakePlatform& p) { p.consoleSession = 0xFFFFFFFF; },
         "interactive functions console "},
        {"no console lookup", [](FakePlatform& p) { p.consoleLookup = false; },
         "interactive functions console "},
        {"no token", [](FakePlatform& p) { p.hasToken = false; },
         "interactive functions console find1 "},
        {"profile not loaded", [](FakePlatform&) {}, "interactive functions console find1 load "},
        // Without the console session lookup (2000) the shell is sought.
        {"2000", [](FakePlatform& p) { p.osClass = kOSWin2000; },
         "interactive functions find4294967295 load "},
        // The console user's loaded profile is the root until the end.
        {"profile loaded", [](FakePlatform& p) { p.profileRoot = kLoadedRoot; },
         "interactive functions console find1 load unload "},
    };
    for (const auto& c : cases) {
        FakePlatform platform;
        c.arrange(platform);
        const HKEY expected = platform.profileRoot ? platform.profileRoot : HKEY_CURRENT_USER;
        {
            CUserProfile profile(platform);
            EXPECT_EQ(expected, profile.GetUserRegRoot()) << c.name;
            EXPECT_EQ(expected, profile.GetUserRegRoot()) << c.name;  // asked once
        }
        EXPECT_EQ(c.calls, platform.calls) << c.name;
        EXPECT_EQ(platform.profileRoot, platform.unloadedRoot) << c.name;
        EXPECT_EQ(platform.profileRoot != nullptr, platform.tokenOpenAtUnload) << c.name;
        EXPECT_FALSE(IsOpenHandle(platform.token)) << c.name;  // closed after the unload
    }
}

}  // namespace
