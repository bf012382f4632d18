// CUserProfile's decisions, driven through its platform seam (under this test
// platform every process is interactive, so the system-account cases exist
// only there), the real platform as far as it runs here, and the OS facts.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "base/os_version.h"
#include "base/user_profile.h"
#include "base/win_handles.h"
#include "tests/unit/debug_output_capture.h"
#include "tests/unit/scratch_registry.h"

namespace {

const DWORD kNoSession = 0xFFFFFFFF;

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
    std::vector<DWORD> searchedSessions;
    HANDLE handedToken = nullptr;
    HKEY unloadedRoot = nullptr;
    bool tokenOpenAtUnload = false;

    int IsInteractiveProcess() override {
        calls += "interactive ";
        return interactive;
    }
    int OSVersionClass() override { return osClass; }
    bool HasProfileFunctions() override {
        calls += "functions ";
        return profileFunctions;
    }
    bool ActiveConsoleSessionId(DWORD* sessionId) override {
        calls += "console ";
        *sessionId = consoleSession;
        return consoleLookup;
    }
    HANDLE FindSessionToken(DWORD sessionId) override {
        calls += "find ";
        searchedSessions.push_back(sessionId);
        if (hasToken) {  // a real handle, so its closing can be observed
            OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, &handedToken);
        }
        return handedToken;
    }
    HKEY LoadProfileOf(HANDLE token) override {
        calls += "load ";
        EXPECT_EQ(handedToken, token);
        return profileRoot;
    }
    void UnloadProfile(HANDLE token, HKEY root) override {
        calls += "unload ";
        EXPECT_EQ(handedToken, token);
        unloadedRoot = root;
        tokenOpenAtUnload = IsOpenHandle(token);
    }
};

// Every failed step falls back to the own hive, loads or unloads nothing
// more, and leaves no token open.
void ExpectFallback(const char* name, void (*arrange)(FakePlatform&), const std::string& calls,
                    const std::vector<DWORD>& searched, const wchar_t* debugLine = nullptr) {
    SCOPED_TRACE(name);
    FakePlatform platform;
    arrange(platform);
    DebugOutputCapture debug;
    {
        CUserProfile profile(platform);
        EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
        EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
        if (calls.find("console") != std::string::npos) {
            profile.GetCurrentLogonUserToken();  // sought already: not a second time
        }
    }
    EXPECT_EQ(calls, platform.calls);
    EXPECT_EQ(searched, platform.searchedSessions);
    EXPECT_FALSE(IsOpenHandle(platform.handedToken));
    EXPECT_TRUE(debugLine == nullptr || debug.Has(debugLine));
}

TEST(UserProfileTest, EveryFailedStepFallsBackToTheOwnHive) {
    ExpectFallback("interactive", [](FakePlatform& p) { p.interactive = 1; }, "interactive ", {});
    ExpectFallback("groups unreadable", [](FakePlatform& p) { p.interactive = -1; }, "interactive ",
                   {});
    ExpectFallback("no profile functions", [](FakePlatform& p) { p.profileFunctions = false; },
                   "interactive functions ", {});
    ExpectFallback(
        "nobody at the console", [](FakePlatform& p) { p.consoleSession = kNoSession; },
        "interactive functions console ", {},
        L"CQMCallProcess::GetCurrentLogonUserToken: dwConsoleSessionId is 0xffffffff!\n");
    ExpectFallback(
        "no console lookup", [](FakePlatform& p) { p.consoleLookup = false; },
        "interactive functions console ", {},
        L"CQMCallProcess::GetCurrentLogonUserToken: LoadSystemLibrary Kernel32.dll FAILED!\n");
    ExpectFallback("no token", [](FakePlatform& p) { p.hasToken = false; },
                   "interactive functions console find ", {1});
    ExpectFallback("profile not loaded", [](FakePlatform&) {},
                   "interactive functions console find load ", {1});
    // Without the console session lookup (2000; 5.2 is class 0) the shell is sought.
    ExpectFallback("2000", [](FakePlatform& p) { p.osClass = kOSWin2000; },
                   "interactive functions find load ", {kNoSession});
    ExpectFallback("unclassified", [](FakePlatform& p) { p.osClass = kOSUnknown; },
                   "interactive functions find load ", {kNoSession});
}

TEST(UserProfileTest, TheConsoleUsersLoadedProfileBecomesTheRootAndIsUnloadedAtTheEnd) {
    ScratchKey hive(HKEY_CURRENT_USER, L"Software", L"profile");
    UniqueHKey root;
    ASSERT_EQ(ERROR_SUCCESS,
              RegOpenKeyExW(HKEY_CURRENT_USER, hive.path().c_str(), 0, KEY_ALL_ACCESS, root.put()));
    FakePlatform platform;
    platform.consoleSession = 3;
    platform.profileRoot = root.get();
    {
        CUserProfile profile(platform);
        EXPECT_EQ(root.get(), profile.GetUserRegRoot());
        EXPECT_EQ(root.get(), profile.GetUserRegRoot());
        EXPECT_EQ(platform.handedToken, profile.GetCurrentLogonUserToken());
        EXPECT_EQ(std::vector<DWORD>{3}, platform.searchedSessions);
    }
    EXPECT_EQ("interactive functions console find load unload ", platform.calls);
    EXPECT_EQ(root.get(), platform.unloadedRoot);
    EXPECT_TRUE(platform.tokenOpenAtUnload);
    EXPECT_FALSE(IsOpenHandle(platform.handedToken));  // closed after the unload
}

TEST(SystemSessionPlatformTest, ThisProcessIsInteractiveAndServiceAccountsAreRefused) {
    UserSessionPlatform& platform = SystemUserSessionPlatform();
    EXPECT_EQ(1, platform.IsInteractiveProcess());
    EXPECT_TRUE(platform.HasProfileFunctions());
    EXPECT_EQ(HKEY_CURRENT_USER, GetUserRegRoot());
    DWORD session = kNoSession;
    ASSERT_TRUE(platform.ActiveConsoleSessionId(&session));
    ASSERT_NE(kNoSession, session);
    UniqueHandle token(platform.FindSessionToken(session));
    ASSERT_TRUE(token);
    EXPECT_FALSE(UniqueHandle(platform.FindSessionToken(0x7FFFFFF0)));  // no such session
    // Service accounts never stand for the console user.
    for (WELL_KNOWN_SID_TYPE type : {WinLocalSystemSid, WinLocalServiceSid, WinNetworkServiceSid}) {
        BYTE sid[SECURITY_MAX_SID_SIZE];
        DWORD size = sizeof(sid);
        ASSERT_TRUE(CreateWellKnownSid(type, nullptr, sid, &size));
        EXPECT_TRUE(IsServiceAccountSid(sid)) << type;
    }
}

TEST(OSFactsTest, VersionClassesFollowThePlatformAndVersion) {
    const DWORD k9x = VER_PLATFORM_WIN32_WINDOWS, kNT = VER_PLATFORM_WIN32_NT;
    struct {
        DWORD platform, major, minor;
        int osClass;
    } cases[] = {
        {k9x, 4, 0, kOSWin95},         {k9x, 4, 10, kOSWin98},
        {k9x, 4, 90, kOSWinMe},        {k9x, 4, 3, kOSUnknown},
        {kNT, 4, 0, kOSWinNT4},        {kNT, 3, 51, kOSWinNT4},
        {kNT, 5, 0, kOSWin2000},       {kNT, 5, 1, kOSWinXP},
        {kNT, 5, 2, kOSUnknown},       {kNT, 6, 1, kOSVistaOrLater},
        {kNT, 10, 0, kOSVistaOrLater}, {VER_PLATFORM_WIN32s, 6, 1, kOSUnknown},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(c.osClass, ClassifyOSVersion(c.platform, c.major, c.minor))
            << c.platform << " " << c.major << "." << c.minor;
    }
    EXPECT_EQ(int(kOSVistaOrLater), GetOSVersionClass());  // this prefix is Windows 7
}

TEST(OSFactsTest, SixtyFourBitDecisionAndTheThirtyTwoBitSystemFolder) {
    EXPECT_TRUE(Is64BitSystem());
    EXPECT_TRUE(Is64BitFromWow64Lookup(TRUE, 0));
    EXPECT_FALSE(Is64BitFromWow64Lookup(FALSE, ERROR_CALL_NOT_IMPLEMENTED));
    EXPECT_TRUE(Is64BitFromWow64Lookup(FALSE, ERROR_ACCESS_DENIED));

    wchar_t folder[MAX_PATH] = {};
    ASSERT_TRUE(MrvGetSystemWow64Directory(folder, MAX_PATH));
    EXPECT_EQ(0, lstrcmpiW(L"C:\\windows\\syswow64", folder));
    wchar_t small[8] = {};
    EXPECT_FALSE(MrvGetSystemWow64Directory(small, 8));

    UniqueModule userenv(LoadSystemLibrary(L"userenv.dll"));
    ASSERT_TRUE(userenv);
    GetModuleFileNameW(userenv.get(), folder, MAX_PATH);
    EXPECT_EQ(0, lstrcmpiW(L"C:\\windows\\syswow64\\userenv.dll", folder));
    EXPECT_EQ(nullptr, LoadSystemLibrary(L"qm-no-such-library.dll"));
    EXPECT_EQ(nullptr, LoadSystemLibrary(nullptr));
}

}  // namespace
