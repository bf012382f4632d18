// CUserProfile's decisions, driven through its platform seam: the cases of a
// process running as the system account (non-interactive, console user
// present or not, profile loadable or not) cannot be produced under this
// test platform, where every process is interactive. The real platform calls
// are exercised as far as the platform lets them run.
#include <windows.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "base/call_process.h"
#include "base/dll_handle.h"
#include "base/os_version.h"
#include "base/user_profile.h"
#include "base/win_handles.h"
#include "tests/support/registry_util.h"
#include "tests/unit/debug_output_capture.h"
#include "tests/unit/scratch_registry.h"

namespace {

const DWORD kNoSession = 0xFFFFFFFF;

// A real handle the fake can hand out, so closing it can be observed.
HANDLE DuplicateOwnToken() {
    HANDLE token = nullptr;
    OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY | TOKEN_DUPLICATE, &token);
    return token;
}

bool IsOpenHandle(HANDLE handle) {
    DWORD flags = 0;
    return GetHandleInformation(handle, &flags) != FALSE;
}

class FakeSessionPlatform : public UserSessionPlatform {
public:
    int interactive = 0;
    int osClass = kOSVistaOrLater;
    bool profileFunctions = true;
    bool consoleLookup = true;
    DWORD consoleSession = 1;
    bool hasToken = true;
    HKEY profileRoot = nullptr;

    std::vector<std::string> calls;
    std::vector<DWORD> searchedSessions;
    HANDLE handedToken = nullptr;
    HANDLE unloadedToken = nullptr;
    HKEY unloadedRoot = nullptr;
    bool tokenOpenAtUnload = false;

    int IsInteractiveProcess() override {
        calls.push_back("interactive");
        return interactive;
    }
    int OSVersionClass() override { return osClass; }
    bool HasProfileFunctions() override {
        calls.push_back("functions");
        return profileFunctions;
    }
    bool ActiveConsoleSessionId(DWORD* sessionId) override {
        calls.push_back("console");
        *sessionId = consoleSession;
        return consoleLookup;
    }
    HANDLE FindSessionToken(DWORD sessionId) override {
        calls.push_back("find");
        searchedSessions.push_back(sessionId);
        handedToken = hasToken ? DuplicateOwnToken() : nullptr;
        return handedToken;
    }
    HKEY LoadProfileOf(HANDLE token) override {
        calls.push_back("load");
        EXPECT_EQ(handedToken, token);
        return profileRoot;
    }
    void UnloadProfile(HANDLE token, HKEY root) override {
        calls.push_back("unload");
        unloadedToken = token;
        unloadedRoot = root;
        tokenOpenAtUnload = IsOpenHandle(token);
    }
};

TEST(UserProfileTest, AnInteractiveProcessUsesItsOwnHiveAndLoadsNothing) {
    FakeSessionPlatform platform;
    platform.interactive = 1;
    {
        CUserProfile profile(platform);
        EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
        EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
    }
    EXPECT_EQ(std::vector<std::string>{"interactive"}, platform.calls);
}

TEST(UserProfileTest, AnUnreadableGroupListCountsAsInteractive) {
    FakeSessionPlatform platform;
    platform.interactive = -1;
    CUserProfile profile(platform);
    EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
    EXPECT_EQ(std::vector<std::string>{"interactive"}, platform.calls);
}

TEST(UserProfileTest, WithoutTheProfileFunctionsNoTokenIsSought) {
    FakeSessionPlatform platform;
    platform.profileFunctions = false;
    CUserProfile profile(platform);
    EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
    EXPECT_EQ((std::vector<std::string>{"interactive", "functions"}), platform.calls);
}

TEST(UserProfileTest, WithNobodyAtTheConsoleTheRootIsTheOwnHive) {
    FakeSessionPlatform platform;
    platform.consoleSession = kNoSession;
    DebugOutputCapture debug;
    {
        CUserProfile profile(platform);
        EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
        EXPECT_EQ(nullptr, profile.GetCurrentLogonUserToken());
    }
    EXPECT_TRUE(platform.searchedSessions.empty());
    EXPECT_TRUE(debug.Has(
        L"CQMCallProcess::GetCurrentLogonUserToken: dwConsoleSessionId is 0xffffffff!\n"));
    EXPECT_EQ((std::vector<std::string>{"interactive", "functions", "console"}), platform.calls);
}

TEST(UserProfileTest, AMissingConsoleLookupEndsWithoutAToken) {
    FakeSessionPlatform platform;
    platform.consoleLookup = false;
    DebugOutputCapture debug;
    CUserProfile profile(platform);
    EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
    EXPECT_TRUE(platform.searchedSessions.empty());
    EXPECT_TRUE(debug.Has(
        L"CQMCallProcess::GetCurrentLogonUserToken: LoadSystemLibrary Kernel32.dll FAILED!\n"));
}

TEST(UserProfileTest, SystemsBeforeXPAndUnclassifiedOnesSearchForTheShell) {
    // Windows 2000 has no console session lookup; Server 2003 (class 0) is
    // not "above 5" either.
    for (int osClass : {int(kOSWin2000), int(kOSUnknown)}) {
        FakeSessionPlatform platform;
        platform.osClass = osClass;
        CUserProfile profile(platform);
        profile.GetUserRegRoot();
        EXPECT_EQ(std::vector<DWORD>{kNoSession}, platform.searchedSessions) << osClass;
        EXPECT_EQ(std::count(platform.calls.begin(), platform.calls.end(), "console"), 0);
    }
}

TEST(UserProfileTest, TheConsoleUsersLoadedProfileBecomesTheRootAndIsUnloadedAtTheEnd) {
    ScratchKey hive(HKEY_CURRENT_USER, L"Software", L"profile");
    HKEY root = nullptr;
    ASSERT_EQ(ERROR_SUCCESS,
              RegOpenKeyExW(HKEY_CURRENT_USER, hive.path().c_str(), 0, KEY_ALL_ACCESS, &root));
    UniqueHKey rootOwner(root);
    FakeSessionPlatform platform;
    platform.consoleSession = 3;
    platform.profileRoot = root;
    HANDLE token = nullptr;
    {
        CUserProfile profile(platform);
        EXPECT_EQ(root, profile.GetUserRegRoot());
        EXPECT_EQ(root, profile.GetUserRegRoot());
        token = profile.GetCurrentLogonUserToken();
        EXPECT_EQ(platform.handedToken, token);
        EXPECT_EQ(std::vector<DWORD>{3}, platform.searchedSessions);
        EXPECT_TRUE(IsOpenHandle(token));
    }
    EXPECT_EQ(
        (std::vector<std::string>{"interactive", "functions", "console", "find", "load", "unload"}),
        platform.calls);
    EXPECT_EQ(token, platform.unloadedToken);
    EXPECT_EQ(root, platform.unloadedRoot);
    EXPECT_TRUE(platform.tokenOpenAtUnload);
    EXPECT_FALSE(IsOpenHandle(token));  // closed after the unload
}

TEST(UserProfileTest, AProfileThatDoesNotLoadFallsBackAndIsNotUnloaded) {
    FakeSessionPlatform platform;
    HANDLE token = nullptr;
    {
        CUserProfile profile(platform);
        EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
        token = profile.GetCurrentLogonUserToken();
        EXPECT_TRUE(IsOpenHandle(token));
    }
    EXPECT_EQ(0, std::count(platform.calls.begin(), platform.calls.end(), "unload"));
    EXPECT_FALSE(IsOpenHandle(token));
}

TEST(UserProfileTest, TheTokenIsSoughtOnceEvenWhenNoneIsFound) {
    FakeSessionPlatform platform;
    platform.hasToken = false;
    CUserProfile profile(platform);
    EXPECT_EQ(nullptr, profile.GetCurrentLogonUserToken());
    EXPECT_EQ(nullptr, profile.GetCurrentLogonUserToken());
    EXPECT_EQ(HKEY_CURRENT_USER, profile.GetUserRegRoot());
    EXPECT_EQ(1u, platform.searchedSessions.size());
}

// The real platform, as far as this test platform lets it run.

std::vector<BYTE> TokenUserSid(HANDLE token) {
    std::vector<BYTE> info(512);
    DWORD size = 0;
    if (!GetTokenInformation(token, TokenUser, info.data(), 512, &size)) {
        return {};
    }
    PSID sid = reinterpret_cast<TOKEN_USER*>(info.data())->User.Sid;
    const BYTE* bytes = static_cast<const BYTE*>(sid);
    return std::vector<BYTE>(bytes, bytes + GetLengthSid(sid));
}

std::vector<BYTE> OwnUserSid() {
    HANDLE token = DuplicateOwnToken();
    UniqueHandle owner(token);
    return TokenUserSid(token);
}

TEST(SystemSessionPlatformTest, ThisProcessIsInteractiveAndTheConsoleSessionIsKnown) {
    UserSessionPlatform& platform = SystemUserSessionPlatform();
    EXPECT_EQ(1, platform.IsInteractiveProcess());
    EXPECT_EQ(int(kOSVistaOrLater), platform.OSVersionClass());
    EXPECT_TRUE(platform.HasProfileFunctions());
    DWORD session = kNoSession;
    ASSERT_TRUE(platform.ActiveConsoleSessionId(&session));
    EXPECT_NE(kNoSession, session);
    EXPECT_EQ(HKEY_CURRENT_USER, GetUserRegRoot());
}

TEST(SystemSessionPlatformTest, TheConsoleSessionsTokenBelongsToThisUser) {
    UserSessionPlatform& platform = SystemUserSessionPlatform();
    DWORD session = kNoSession;
    ASSERT_TRUE(platform.ActiveConsoleSessionId(&session));
    UniqueHandle token(platform.FindSessionToken(session));
    ASSERT_TRUE(token);
    EXPECT_EQ(OwnUserSid(), TokenUserSid(token.get()));

    // The profile "loads" here as the caller's own hive.
    HKEY root = platform.LoadProfileOf(token.get());
    EXPECT_NE(nullptr, root);
    platform.UnloadProfile(token.get(), root);

    // Without a session the shell's process is sought.
    DWORD explorer = 0;
    UniqueHandle shellToken(platform.FindSessionToken(kNoSession));
    if (CQMCallProcess::MrvQMFindProcess(L"explorer.exe", &explorer) == S_OK) {
        EXPECT_TRUE(shellToken);
    } else {
        EXPECT_FALSE(shellToken);
    }
    UniqueHandle none(platform.FindSessionToken(0x7FFFFFF0));  // no such session
    EXPECT_FALSE(none);
}

TEST(SystemSessionPlatformTest, ServiceAccountsAreNeverTakenForTheUser) {
    for (WELL_KNOWN_SID_TYPE type : {WinLocalSystemSid, WinLocalServiceSid, WinNetworkServiceSid}) {
        BYTE sid[SECURITY_MAX_SID_SIZE];
        DWORD size = sizeof(sid);
        ASSERT_TRUE(CreateWellKnownSid(type, nullptr, sid, &size));
        EXPECT_TRUE(IsServiceAccountSid(sid)) << type;
    }
    BYTE admins[SECURITY_MAX_SID_SIZE];
    DWORD size = sizeof(admins);
    ASSERT_TRUE(CreateWellKnownSid(WinBuiltinAdministratorsSid, nullptr, admins, &size));
    EXPECT_FALSE(IsServiceAccountSid(admins));
    std::vector<BYTE> own = OwnUserSid();
    ASSERT_FALSE(own.empty());
    EXPECT_FALSE(IsServiceAccountSid(own.data()));
    EXPECT_FALSE(IsServiceAccountSid(nullptr));
}

TEST(OSFactsTest, VersionClassesFollowThePlatformAndVersion) {
    EXPECT_EQ(int(kOSWin95), ClassifyOSVersion(VER_PLATFORM_WIN32_WINDOWS, 4, 0));
    EXPECT_EQ(int(kOSWin98), ClassifyOSVersion(VER_PLATFORM_WIN32_WINDOWS, 4, 10));
    EXPECT_EQ(int(kOSWinMe), ClassifyOSVersion(VER_PLATFORM_WIN32_WINDOWS, 4, 90));
    EXPECT_EQ(int(kOSUnknown), ClassifyOSVersion(VER_PLATFORM_WIN32_WINDOWS, 4, 3));
    EXPECT_EQ(int(kOSWinNT4), ClassifyOSVersion(VER_PLATFORM_WIN32_NT, 4, 0));
    EXPECT_EQ(int(kOSWinNT4), ClassifyOSVersion(VER_PLATFORM_WIN32_NT, 3, 51));
    EXPECT_EQ(int(kOSWin2000), ClassifyOSVersion(VER_PLATFORM_WIN32_NT, 5, 0));
    EXPECT_EQ(int(kOSWinXP), ClassifyOSVersion(VER_PLATFORM_WIN32_NT, 5, 1));
    EXPECT_EQ(int(kOSUnknown), ClassifyOSVersion(VER_PLATFORM_WIN32_NT, 5, 2));
    EXPECT_EQ(int(kOSVistaOrLater), ClassifyOSVersion(VER_PLATFORM_WIN32_NT, 6, 1));
    EXPECT_EQ(int(kOSVistaOrLater), ClassifyOSVersion(VER_PLATFORM_WIN32_NT, 10, 0));
    EXPECT_EQ(int(kOSUnknown), ClassifyOSVersion(VER_PLATFORM_WIN32s, 6, 1));
    // This prefix is Windows 7.
    EXPECT_EQ(int(kOSVistaOrLater), GetOSVersionClass());
}

TEST(OSFactsTest, SixtyFourBitSystemAndItsWow64Folder) {
    EXPECT_TRUE(Is64BitSystem());
    EXPECT_TRUE(Is64BitFromWow64Lookup(TRUE, 0));
    EXPECT_FALSE(Is64BitFromWow64Lookup(FALSE, ERROR_CALL_NOT_IMPLEMENTED));
    EXPECT_TRUE(Is64BitFromWow64Lookup(FALSE, ERROR_ACCESS_DENIED));

    wchar_t folder[MAX_PATH] = {};
    ASSERT_TRUE(MrvGetSystemWow64Directory(folder, MAX_PATH));
    EXPECT_EQ(0, lstrcmpiW(L"C:\\windows\\syswow64", folder));
    wchar_t small[8] = {};
    EXPECT_FALSE(MrvGetSystemWow64Directory(small, 8));
}

TEST(OSFactsTest, SystemLibrariesComeFromTheThirtyTwoBitSystemFolder) {
    HMODULE userenv = LoadSystemLibrary(L"userenv.dll");
    ASSERT_NE(nullptr, userenv);
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(userenv, path, MAX_PATH);
    EXPECT_EQ(0, lstrcmpiW(L"C:\\windows\\syswow64\\userenv.dll", path));
    FreeLibrary(userenv);
    EXPECT_EQ(nullptr, LoadSystemLibrary(L"qm-no-such-library.dll"));
    EXPECT_EQ(nullptr, LoadSystemLibrary(nullptr));

    EXPECT_NE(nullptr, Advapi32Module());
    EXPECT_EQ(Advapi32Module(), Advapi32Module());
    EXPECT_NE(nullptr, Userenv32Module());
}

TEST(OSFactsTest, CDLLHandleFreesOnlyWhatItOwns) {
    const wchar_t kLibrary[] = L"msimg32.dll";
    ASSERT_EQ(nullptr, GetModuleHandleW(kLibrary));
    {
        CDLLHandle borrowed(LoadSystemLibrary(kLibrary), FALSE);
        ASSERT_NE(nullptr, borrowed.Handle());
    }
    HMODULE stillLoaded = GetModuleHandleW(kLibrary);
    ASSERT_NE(nullptr, stillLoaded);
    { CDLLHandle owner(stillLoaded, TRUE); }
    EXPECT_EQ(nullptr, GetModuleHandleW(kLibrary));
    { CDLLHandle empty(nullptr, TRUE); }
}

}  // namespace
