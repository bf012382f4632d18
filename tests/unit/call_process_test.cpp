// Process lookup by executable name, the account a process runs as, and the
// active session's user token.
#include <windows.h>
#include <gtest/gtest.h>
#include <shlwapi.h>
#include <wtsapi32.h>

#include <string>
#include <vector>

#include "base/call_process.h"
#include "base/win_handles.h"
#include "tests/support/trace_capture.h"
#include "tests/unit/debug_output_capture.h"

namespace {

const DWORD kNoSession = 0xFFFFFFFF;

TEST(CallProcessTest, FindsThisProcessWhateverTheCaseAndItsAccount) {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, path, MAX_PATH);
    std::wstring upper = PathFindFileNameW(path);
    CharUpperBuffW(&upper[0], static_cast<DWORD>(upper.size()));
    DWORD id = 0;
    ASSERT_EQ(S_OK, CQMCallProcess::MrvQMFindProcess(upper.c_str(), &id));
    EXPECT_EQ(GetCurrentProcessId(), id);

    wchar_t own[MAX_PATH] = {};
    DWORD size = MAX_PATH;
    ASSERT_TRUE(GetUserNameW(own, &size));
    CStringEx account;
    ASSERT_TRUE(CQMCallProcess::GetProcessUserName(upper.c_str(), account));
    EXPECT_STREQ(own, account.c_str());  // the name alone, without the domain
}

TEST(CallProcessTest, MissingNullAndEmptyNamesAreFailures) {
    DebugOutputCapture debug;
    DWORD id = 77;
    EXPECT_EQ(E_INVALIDARG, CQMCallProcess::MrvQMFindProcess(nullptr, &id));
    EXPECT_TRUE(debug.Has(L"CQMCallProcess::MrvQMFindProcess: input para is NULL!\n"));
    EXPECT_EQ(E_FAIL, CQMCallProcess::MrvQMFindProcess(L"", &id));
    EXPECT_TRUE(debug.Has(L"CQMCallProcess::MrvQMFindProcess: process name is empty!\n"));
    EXPECT_EQ(E_FAIL, CQMCallProcess::MrvQMFindProcess(L"qm-no-such-program.exe", &id));
    EXPECT_EQ(E_FAIL, CQMCallProcess::MrvQMFindProcess(std::wstring(400, L'n').c_str(), &id));
    EXPECT_EQ(77u, id);

    TraceCapture traces;
    CStringEx account(L"stale");
    EXPECT_FALSE(CQMCallProcess::GetProcessUserName(L"qm-no-such-program.exe", account));
    EXPECT_FALSE(CQMCallProcess::GetProcessUserName(nullptr, account));
    std::vector<TraceRecord> records = traces.Records();
    ASSERT_EQ(2u, records.size());
    EXPECT_EQ(8u, records[0].level);
    EXPECT_EQ(" CQMCallProcess::GetProcessUserName fail at find process,\n", records[0].text);
}

TEST(CallProcessTest, WithoutAnActiveSessionThereIsNoToken) {
    WTS_SESSION_INFOW sessions[3] = {};
    sessions[0] = {0, nullptr, WTSDisconnected};
    sessions[1] = {2, nullptr, WTSActive};
    sessions[2] = {3, nullptr, WTSActive};
    EXPECT_EQ(2u, CQMCallProcess::FirstActiveSession(sessions, 3));
    EXPECT_EQ(kNoSession, CQMCallProcess::FirstActiveSession(sessions, 1));
    EXPECT_EQ(kNoSession, CQMCallProcess::FirstActiveSession(nullptr, 3));

    // The system would read 0xFFFFFFFF as "the caller's session" and answer.
    EXPECT_EQ(nullptr, CQMCallProcess::GetSessionUserToken(kNoSession));
    // This platform lists no sessions at all.
    EXPECT_EQ(kNoSession, CQMCallProcess::GetActiveSessionId());
    EXPECT_EQ(nullptr, CQMCallProcess::GetActiveSessionUserToken());

    UniqueHandle token(CQMCallProcess::GetSessionUserToken(WTSGetActiveConsoleSessionId()));
    ASSERT_TRUE(token);
    TOKEN_TYPE type = TokenImpersonation;
    DWORD size = 0;
    ASSERT_TRUE(GetTokenInformation(token.get(), TokenType, &type, sizeof(type), &size));
    EXPECT_EQ(TokenPrimary, type);
}

}  // namespace
