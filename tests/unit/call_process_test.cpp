// Process lookup by executable name, the account a process runs as, and the
// active session's user token.
#include <windows.h>
#include <gtest/gtest.h>
#include <tlhelp32.h>
#include <wtsapi32.h>

#include <string>
#include <vector>

#include "base/call_process.h"
#include "base/win_handles.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/trace_capture.h"
#include "tests/unit/debug_output_capture.h"

namespace {

const DWORD kNoSession = 0xFFFFFFFF;

// Suspended copies of a small system program under a name of our own, so
// that no other process answers to it.
class SuspendedCopies {
public:
    SuspendedCopies(const ScratchDir& dir, int count) {
        m_exe = dir.Sub(L"QMTESTPROC.EXE");
        CopyFileW(L"C:\\windows\\system32\\hostname.exe", m_exe.c_str(), FALSE);
        for (int i = 0; i < count; ++i) {
            STARTUPINFOW startup = {};
            startup.cb = sizeof(startup);
            PROCESS_INFORMATION info = {};
            std::wstring line = L"\"" + m_exe + L"\"";
            if (CreateProcessW(m_exe.c_str(), &line[0], nullptr, nullptr, FALSE, CREATE_SUSPENDED,
                               nullptr, nullptr, &startup, &info)) {
                CloseHandle(info.hThread);
                m_processes.push_back(info.hProcess);
                m_ids.push_back(info.dwProcessId);
            }
        }
    }
    ~SuspendedCopies() {
        for (HANDLE process : m_processes) {
            TerminateProcess(process, 0);
            WaitForSingleObject(process, 5000);
            CloseHandle(process);
        }
    }
    const std::vector<DWORD>& ids() const { return m_ids; }

private:
    std::wstring m_exe;
    std::vector<HANDLE> m_processes;
    std::vector<DWORD> m_ids;
};

// The id of the first snapshot entry with this name, walked independently.
DWORD FirstInSnapshot(const wchar_t* name) {
    UniqueFileHandle snapshot(CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0));
    PROCESSENTRY32W entry = {};
    entry.dwSize = sizeof(entry);
    for (BOOL more = Process32FirstW(snapshot.get(), &entry); more;
         more = Process32NextW(snapshot.get(), &entry)) {
        if (lstrcmpiW(entry.szExeFile, name) == 0) {
            return entry.th32ProcessID;
        }
    }
    return 0;
}

std::wstring OwnUserName() {
    wchar_t name[MAX_PATH] = {};
    DWORD size = MAX_PATH;
    GetUserNameW(name, &size);
    return name;
}

TEST(CallProcessTest, FindsTheFirstOfTwoCopiesWhateverTheCase) {
    ScratchDir dir(L"proc");
    SuspendedCopies copies(dir, 2);
    ASSERT_EQ(2u, copies.ids().size());

    DWORD id = 0;
    ASSERT_EQ(S_OK, CQMCallProcess::MrvQMFindProcess(L"qmtestproc.exe", &id));
    EXPECT_EQ(FirstInSnapshot(L"QMTESTPROC.EXE"), id);
    EXPECT_TRUE(id == copies.ids()[0] || id == copies.ids()[1]);

    CStringEx account;
    ASSERT_TRUE(CQMCallProcess::GetProcessUserName(L"QmTestProc.exe", account));
    EXPECT_EQ(OwnUserName(), account.c_str());
    EXPECT_EQ(-1, account.Find(L'\\'));  // the name alone, without the domain
}

TEST(CallProcessTest, MissingNullAndEmptyNamesAreFailures) {
    DebugOutputCapture debug;
    DWORD id = 77;
    EXPECT_EQ(E_INVALIDARG, CQMCallProcess::MrvQMFindProcess(nullptr, &id));
    EXPECT_TRUE(debug.Has(L"CQMCallProcess::MrvQMFindProcess: input para is NULL!\n"));
    EXPECT_EQ(E_FAIL, CQMCallProcess::MrvQMFindProcess(L"", &id));
    EXPECT_TRUE(debug.Has(L"CQMCallProcess::MrvQMFindProcess: process name is empty!\n"));
    EXPECT_EQ(E_FAIL, CQMCallProcess::MrvQMFindProcess(L"qm-no-such-program.exe", &id));
    EXPECT_EQ(77u, id);
    // A name longer than any executable file name matches nothing.
    std::wstring longName(400, L'n');
    EXPECT_EQ(E_FAIL, CQMCallProcess::MrvQMFindProcess(longName.c_str(), &id));

    TraceCapture traces;
    CStringEx account(L"stale");
    EXPECT_FALSE(CQMCallProcess::GetProcessUserName(L"qm-no-such-program.exe", account));
    EXPECT_FALSE(CQMCallProcess::GetProcessUserName(nullptr, account));
    std::vector<TraceRecord> records = traces.Records();
    ASSERT_EQ(2u, records.size());
    EXPECT_EQ(8u, records[0].level);
    EXPECT_EQ(" CQMCallProcess::GetProcessUserName fail at find process,\n", records[0].text);
}

TEST(CallProcessTest, TheFirstActiveEntryOfASessionListIsTheActiveSession) {
    WTS_SESSION_INFOW sessions[3] = {};
    sessions[0].SessionId = 0;
    sessions[0].State = WTSDisconnected;
    sessions[1].SessionId = 2;
    sessions[1].State = WTSActive;
    sessions[2].SessionId = 3;
    sessions[2].State = WTSActive;
    EXPECT_EQ(2u, CQMCallProcess::FirstActiveSession(sessions, 3));
    EXPECT_EQ(kNoSession, CQMCallProcess::FirstActiveSession(sessions, 1));
    EXPECT_EQ(kNoSession, CQMCallProcess::FirstActiveSession(nullptr, 3));
}

TEST(CallProcessTest, NoSessionMeansNoTokenRatherThanThisSessionsToken) {
    // The system reads 0xFFFFFFFF as "the caller's session" and answers.
    HANDLE systemAnswer = nullptr;
    if (WTSQueryUserToken(kNoSession, &systemAnswer)) {
        CloseHandle(systemAnswer);
    }
    EXPECT_EQ(nullptr, CQMCallProcess::GetSessionUserToken(kNoSession));

    // This platform lists no sessions at all.
    EXPECT_EQ(kNoSession, CQMCallProcess::GetActiveSessionId());
    EXPECT_EQ(nullptr, CQMCallProcess::GetActiveSessionUserToken());
}

TEST(CallProcessTest, TheConsoleSessionsTokenIsAPrimaryTokenOfItsUser) {
    UniqueHandle token(CQMCallProcess::GetSessionUserToken(WTSGetActiveConsoleSessionId()));
    ASSERT_TRUE(token);
    TOKEN_TYPE type = TokenImpersonation;
    DWORD size = 0;
    ASSERT_TRUE(GetTokenInformation(token.get(), TokenType, &type, sizeof(type), &size));
    EXPECT_EQ(TokenPrimary, type);
    UniqueHandle duplicate;
    EXPECT_TRUE(DuplicateTokenEx(token.get(), TOKEN_QUERY, nullptr, SecurityImpersonation,
                                 TokenPrimary, duplicate.put()));
}

}  // namespace
