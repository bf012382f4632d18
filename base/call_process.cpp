#include "base/call_process.h"

#include <tlhelp32.h>
#include <wtsapi32.h>

#include "base/trace.h"
#include "base/win_handles.h"

namespace {

const DWORD kNoSession = 0xFFFFFFFF;
const DWORD kAccountChars = MAX_PATH;

void DebugLine(const wchar_t* text) {
    OutputDebugStringW(text);
}

}  // namespace

HRESULT CQMCallProcess::MrvQMFindProcess(const wchar_t* name, DWORD* processId) {
    if (name == nullptr) {
        DebugLine(L"CQMCallProcess::MrvQMFindProcess: input para is NULL!\n");
        return E_INVALIDARG;
    }
    if (name[0] == L'\0') {
        DebugLine(L"CQMCallProcess::MrvQMFindProcess: process name is empty!\n");
        return E_FAIL;
    }
    UniqueFileHandle snapshot(CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0));
    if (!snapshot) {
        DWORD error = GetLastError();
        DebugLine(L"CQMCallProcess::MrvQMFindProcess: CreateToolhelp32Snapshot FAILED!\n");
        CStringEx detail;
        detail.Format(L"GetLastError=%lu\n", error);
        DebugLine(detail.c_str());
        return E_FAIL;
    }
    PROCESSENTRY32W entry = {};
    entry.dwSize = sizeof(entry);
    if (!Process32FirstW(snapshot.get(), &entry)) {
        DebugLine(L"CQMCallProcess::MrvQMFindProcess: Process32First FAILED!\n");
        return E_FAIL;
    }
    do {
        if (lstrcmpiW(entry.szExeFile, name) == 0) {
            if (processId != nullptr) {
                *processId = entry.th32ProcessID;
            }
            return S_OK;
        }
        entry.dwSize = sizeof(entry);
    } while (Process32NextW(snapshot.get(), &entry));
    return E_FAIL;
}

BOOL CQMCallProcess::GetProcessUserName(const wchar_t* name, CStringEx& accountName) {
    DWORD processId = 0;
    if (MrvQMFindProcess(name, &processId) != S_OK) {
        TraceLevel8(TraceValue("CQMCallProcess::GetProcessUserName fail at find process"));
        return FALSE;
    }
    UniqueHandle process(
        OpenProcess(SYNCHRONIZE | PROCESS_QUERY_INFORMATION | PROCESS_VM_READ, FALSE, processId));
    if (!process) {
        TraceLevel8(TraceValue("CQMCallProcess::GetProcessUserName fail at OpenProcess process"));
        return FALSE;
    }
    UniqueHandle token;
    if (!OpenProcessToken(process.get(), TOKEN_QUERY, token.put())) {
        return FALSE;
    }
    DWORD size = 0;
    GetTokenInformation(token.get(), TokenUser, nullptr, 0, &size);
    if (size == 0) {
        return FALSE;
    }
    UniqueGlobalMem block(GlobalAlloc(GPTR, size));
    if (!block || !GetTokenInformation(token.get(), TokenUser, block.get(), size, &size)) {
        return FALSE;
    }
    const TOKEN_USER* user = static_cast<const TOKEN_USER*>(block.get());
    wchar_t account[kAccountChars] = {};
    wchar_t domain[kAccountChars] = {};
    DWORD accountChars = kAccountChars;
    DWORD domainChars = kAccountChars;
    SID_NAME_USE use = SidTypeUnknown;
    if (!LookupAccountSidW(nullptr, user->User.Sid, account, &accountChars, domain, &domainChars,
                           &use)) {
        CStringEx line;
        line.Format(L"!!CQMCallProcess::IsSysProcess: LookupAccountSid FAILED. ERROR is %d!\n",
                    static_cast<int>(GetLastError()));
        TraceLevel8(TraceValue(line));
        return FALSE;
    }
    accountName = account;
    return TRUE;
}

DWORD CQMCallProcess::GetActiveSessionId() {
    WTS_SESSION_INFOW* sessions = nullptr;
    DWORD count = 0;
    if (!WTSEnumerateSessionsW(WTS_CURRENT_SERVER_HANDLE, 0, 1, &sessions, &count)) {
        return kNoSession;
    }
    DWORD active = FirstActiveSession(sessions, count);
    if (sessions != nullptr) {
        WTSFreeMemory(sessions);
    }
    return active;
}

DWORD CQMCallProcess::FirstActiveSession(const WTS_SESSION_INFOW* sessions, DWORD count) {
    for (DWORD i = 0; sessions != nullptr && i < count; ++i) {
        if (sessions[i].State == WTSActive) {
            return sessions[i].SessionId;
        }
    }
    return kNoSession;
}

HANDLE CQMCallProcess::GetActiveSessionUserToken() {
    return GetSessionUserToken(GetActiveSessionId());
}

HANDLE CQMCallProcess::GetSessionUserToken(DWORD sessionId) {
    // 0xFFFFFFFF is WTS_CURRENT_SESSION to WTSQueryUserToken: asking for it
    // would hand out this process's own session instead of "nobody".
    if (sessionId == kNoSession) {
        return nullptr;
    }
    UniqueHandle sessionToken;
    if (!WTSQueryUserToken(sessionId, sessionToken.put())) {
        sessionToken.release();  // nothing was handed out
        return nullptr;
    }
    UniqueHandle primary;
    if (!DuplicateTokenEx(sessionToken.get(), MAXIMUM_ALLOWED | TOKEN_ALL_ACCESS, nullptr,
                          SecurityImpersonation, TokenPrimary, primary.put())) {
        primary.release();  // nothing was handed out
        return nullptr;
    }
    return primary.release();
}
