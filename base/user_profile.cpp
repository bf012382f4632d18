#include "base/user_profile.h"

#include <psapi.h>
#include <shlwapi.h>
#include <userenv.h>

#include <cwchar>

#include "base/dll_handle.h"
#include "base/os_version.h"
#include "base/proc_address.h"

namespace {

const DWORD kNoSession = 0xFFFFFFFF;
const DWORD kMaxProcesses = 1024;

using LoadUserProfileWFn = BOOL(WINAPI*)(HANDLE, LPPROFILEINFOW);
using UnloadUserProfileFn = BOOL(WINAPI*)(HANDLE, HANDLE);
using ImpersonateLoggedOnUserFn = BOOL(WINAPI*)(HANDLE);
using RevertToSelfFn = BOOL(WINAPI*)();
using WTSGetActiveConsoleSessionIdFn = DWORD(WINAPI*)();

// The process token's group list, read into a LocalAlloc block of 256 bytes
// that grows once to the size the system asks for.
UniqueLocalMem ReadTokenGroups(HANDLE token) {
    DWORD size = 256;
    UniqueLocalMem block(LocalAlloc(LPTR, size));
    if (!block) {
        return block;
    }
    DWORD needed = 0;
    if (GetTokenInformation(token, TokenGroups, block.get(), size, &needed)) {
        return block;
    }
    if (GetLastError() != ERROR_INSUFFICIENT_BUFFER || needed == 0) {
        block.reset();
        return block;
    }
    block.reset(LocalAlloc(LPTR, needed));
    if (block && !GetTokenInformation(token, TokenGroups, block.get(), needed, &needed)) {
        block.reset();
    }
    return block;
}

// True when the token's user is a service account; a token whose user
// cannot be read counts as one too, as it cannot be shown to be the user's.
bool RunsAsServiceAccount(HANDLE token) {
    union {
        TOKEN_USER user;
        BYTE bytes[sizeof(TOKEN_USER) + SECURITY_MAX_SID_SIZE];
    } info = {};
    DWORD size = 0;
    if (!GetTokenInformation(token, TokenUser, &info, sizeof(info), &size)) {
        return true;
    }
    return IsServiceAccountSid(info.user.User.Sid);
}

bool IsExplorerProcess(HANDLE process) {
    wchar_t image[MAX_PATH] = {};
    if (GetProcessImageFileNameW(process, image, MAX_PATH) == 0) {
        return false;
    }
    wchar_t name[_MAX_FNAME] = {};
    wchar_t extension[_MAX_EXT] = {};
    if (_wsplitpath_s(PathFindFileNameW(image), nullptr, 0, nullptr, 0, name, _MAX_FNAME, extension,
                      _MAX_EXT) != 0) {
        return false;
    }
    return lstrcmpiW(name, L"explorer") == 0 && lstrcmpiW(extension, L".exe") == 0;
}

class SystemPlatform : public UserSessionPlatform {
public:
    int IsInteractiveProcess() override {
        UniqueHandle token;
        if (!OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, token.put())) {
            return -1;
        }
        UniqueLocalMem block = ReadTokenGroups(token.get());
        if (!block) {
            return -1;
        }
        BYTE sidBuffer[SECURITY_MAX_SID_SIZE];
        DWORD sidSize = sizeof(sidBuffer);
        if (!CreateWellKnownSid(WinInteractiveSid, nullptr, sidBuffer, &sidSize)) {
            return -1;
        }
        const TOKEN_GROUPS* groups = static_cast<const TOKEN_GROUPS*>(block.get());
        for (DWORD i = 0; i < groups->GroupCount; ++i) {
            if (EqualSid(groups->Groups[i].Sid, sidBuffer)) {
                return 1;
            }
        }
        return 0;
    }

    int OSVersionClass() override { return GetOSVersionClass(); }

    bool HasProfileFunctions() override {
        return GetProcAs<LoadUserProfileWFn>(Userenv32Module(), "LoadUserProfileW") != nullptr &&
               GetProcAs<ImpersonateLoggedOnUserFn>(Advapi32Module(), "ImpersonateLoggedOnUser") !=
                   nullptr &&
               GetProcAs<RevertToSelfFn>(Advapi32Module(), "RevertToSelf") != nullptr;
    }

    bool ActiveConsoleSessionId(DWORD* sessionId) override {
        auto consoleSession = GetProcAs<WTSGetActiveConsoleSessionIdFn>(
            GetModuleHandleW(L"Kernel32.dll"), "WTSGetActiveConsoleSessionId");
        if (consoleSession == nullptr) {
            return false;
        }
        *sessionId = consoleSession();
        return true;
    }

    HANDLE FindSessionToken(DWORD sessionId) override {
        DWORD ids[kMaxProcesses] = {};
        DWORD bytes = 0;
        if (!EnumProcesses(ids, sizeof(ids), &bytes)) {
            OutputDebugStringW(
                L"CQMCallProcess::GetCurrentLogonUserToken: pfnEnumProcesses FAILED!\n");
            return nullptr;
        }
        for (DWORD i = 0; i < bytes / sizeof(DWORD); ++i) {
            UniqueHandle process(
                OpenProcess(PROCESS_QUERY_LIMITED_INFORMATION | PROCESS_VM_READ, FALSE, ids[i]));
            if (!process) {
                continue;
            }
            if (sessionId != kNoSession) {
                DWORD processSession = kNoSession;
                if (!ProcessIdToSessionId(ids[i], &processSession) || processSession != sessionId) {
                    continue;
                }
            } else if (!IsExplorerProcess(process.get())) {
                continue;
            }
            UniqueHandle token;
            if (!OpenProcessToken(process.get(), TOKEN_ALL_ACCESS, token.put())) {
                continue;
            }
            // The console session also holds system processes (the logon
            // process among them); their token is not the user's.
            if (RunsAsServiceAccount(token.get())) {
                continue;
            }
            return token.release();
        }
        return nullptr;
    }

    HKEY LoadProfileOf(HANDLE token) override {
        auto loadProfile = GetProcAs<LoadUserProfileWFn>(Userenv32Module(), "LoadUserProfileW");
        auto impersonate =
            GetProcAs<ImpersonateLoggedOnUserFn>(Advapi32Module(), "ImpersonateLoggedOnUser");
        auto revert = GetProcAs<RevertToSelfFn>(Advapi32Module(), "RevertToSelf");
        if (loadProfile == nullptr || impersonate == nullptr || revert == nullptr ||
            !impersonate(token)) {
            return nullptr;
        }
        wchar_t userName[MAX_PATH] = {};
        DWORD nameChars = MAX_PATH;
        BOOL named = GetUserNameW(userName, &nameChars);
        revert();
        if (!named) {
            return nullptr;
        }
        PROFILEINFOW profile = {};
        profile.dwSize = sizeof(profile);
        profile.dwFlags = PI_NOUI;
        profile.lpUserName = userName;
        if (!loadProfile(token, &profile)) {
            return nullptr;
        }
        return static_cast<HKEY>(profile.hProfile);
    }

    void UnloadProfile(HANDLE token, HKEY root) override {
        // Runs at process exit, possibly after the process-wide userenv
        // handle was released: hold a reference of its own.
        UniqueModule userenv(LoadSystemLibrary(L"userenv.dll"));
        auto unloadProfile = GetProcAs<UnloadUserProfileFn>(userenv.get(), "UnloadUserProfile");
        if (unloadProfile != nullptr) {
            unloadProfile(token, root);
        }
    }
};

UserSessionPlatform* g_processPlatform = nullptr;

}  // namespace

UserSessionPlatform& SystemUserSessionPlatform() {
    static SystemPlatform platform;
    return platform;
}

bool IsServiceAccountSid(PSID sid) {
    return sid != nullptr && IsValidSid(sid) &&
           (IsWellKnownSid(sid, WinLocalSystemSid) || IsWellKnownSid(sid, WinLocalServiceSid) ||
            IsWellKnownSid(sid, WinNetworkServiceSid));
}

CUserProfile::CUserProfile(UserSessionPlatform& platform) : m_platform(platform) {}

CUserProfile::~CUserProfile() {
    if (m_userRegRoot != nullptr && m_userRegRoot != HKEY_CURRENT_USER && m_token) {
        m_platform.UnloadProfile(m_token.get(), m_userRegRoot);
    }
}

HKEY CUserProfile::GetUserRegRoot() {
    if (m_userRegRoot != nullptr) {
        return m_userRegRoot;
    }
    // Whatever fails below, the caller's own hive stands for the user.
    m_userRegRoot = HKEY_CURRENT_USER;
    // An interactive process already runs as the console user; so does one
    // whose group list cannot be read, for want of anything better.
    if (m_platform.IsInteractiveProcess() != 0) {
        return m_userRegRoot;
    }
    if (!m_platform.HasProfileFunctions()) {
        return m_userRegRoot;
    }
    HANDLE token = GetCurrentLogonUserToken();
    if (token == nullptr) {
        return m_userRegRoot;
    }
    HKEY root = m_platform.LoadProfileOf(token);
    if (root != nullptr) {
        m_userRegRoot = root;
    }
    return m_userRegRoot;
}

HANDLE CUserProfile::GetCurrentLogonUserToken() {
    if (m_token || m_tokenSearched) {
        return m_token.get();
    }
    m_tokenSearched = true;
    DWORD sessionId = kNoSession;
    if (m_platform.OSVersionClass() > kOSWin2000) {
        if (!m_platform.ActiveConsoleSessionId(&sessionId)) {
            OutputDebugStringW(
                L"CQMCallProcess::GetCurrentLogonUserToken: LoadSystemLibrary Kernel32.dll "
                L"FAILED!\n");
            return nullptr;
        }
        if (sessionId == kNoSession) {
            OutputDebugStringW(
                L"CQMCallProcess::GetCurrentLogonUserToken: dwConsoleSessionId is 0xffffffff!\n");
            return nullptr;
        }
    }
    m_token.reset(m_platform.FindSessionToken(sessionId));
    return m_token.get();
}

void SetProcessUserSessionPlatform(UserSessionPlatform* platform) {
    g_processPlatform = platform;
}

CUserProfile& ProcessUserProfile() {
    // Created on first use. The platform it asks already exists at that
    // point (the system one is made while evaluating the argument), so it is
    // destroyed after the profile has unloaded the user's hive.
    static CUserProfile profile(g_processPlatform != nullptr ? *g_processPlatform
                                                             : SystemUserSessionPlatform());
    return profile;
}

HKEY GetUserRegRoot() {
    return ProcessUserProfile().GetUserRegRoot();
}
