// HKEY_CURRENT_USER as a process running as the system account sees it: the
// process-wide profile asks a platform that reports a non-interactive process
// whose console user's profile root is a scratch key. Value reads and writes
// under HKCU reach that root; deletions and existence tests stay with the
// process's own HKCU. The platform must be in place before the first registry
// call, so this test program has its own process.
#include <gtest/gtest.h>

#include "base/registry.h"
#include "base/registry_delete.h"
#include "base/user_profile.h"
#include "cleanup/user_registry_cleanup.h"
#include "tests/unit/scratch_key.h"

namespace {

const HKEY kUser = HKEY_CURRENT_USER;
const wchar_t kRunKey[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
const wchar_t kQmKey[] = L"Software\\Mirovan\\QmkTools";

// The console user's profile root is opened when asked for and closed when
// the process-wide profile ends at process exit, before this object.
class ConsoleUserPlatform : public UserSessionPlatform {
public:
    int IsInteractiveProcess() override { return 0; }
    int OSVersionClass() override { return 8; }
    bool HasProfileFunctions() override { return true; }
    bool ActiveConsoleSessionId(DWORD* sessionId) override { return *sessionId = 1, true; }
    HANDLE FindSessionToken(DWORD) override {
        HANDLE token = nullptr;
        OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, &token);
        return token;
    }
    HKEY LoadProfileOf(HANDLE) override {
        HKEY root = nullptr;
        RegOpenKeyExW(kUser, m_hive.path().c_str(), 0, KEY_ALL_ACCESS, &root);
        return root;
    }
    void UnloadProfile(HANDLE, HKEY root) override { RegCloseKey(root); }
    // The key below the console user's root.
    std::wstring Hive(const std::wstring& key) const { return m_hive.Sub(key); }

private:
    ScratchKey m_hive{kUser, L"Software"};
};

ConsoleUserPlatform g_consoleUser;
const bool g_platformSet = (SetProcessUserSessionPlatform(&g_consoleUser), true);

class RegistryRedirectTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(g_platformSet);
        ASSERT_NE(kUser, GetUserRegRoot());
    }
    std::wstring Hive(const std::wstring& key) const { return g_consoleUser.Hive(key); }

    ScratchKey m_own{kUser, L"Software"};
    const wchar_t* m_key = m_own.path().c_str();  // the same name below both roots
};

TEST_F(RegistryRedirectTest, ValuesReachTheConsoleUsersRootDeletionsStayWithTheOwn) {
    ASSERT_TRUE(SetRegString(kUser, m_key, L"Text", L"user", 0));
    ASSERT_TRUE(SetRegDWORD(kUser, m_key, L"Number", 5, 0));
    EXPECT_EQ(L"user", RegGetString(kUser, Hive(m_key), L"Text").value_or(L"?"));
    EXPECT_EQ(5u, RegGetDword(kUser, Hive(m_key), L"Number").value_or(0));
    ASSERT_TRUE(RegPutString(kUser, m_key, L"Text", L"own"));
    CStringEx text;
    ASSERT_TRUE(GetRegString(kUser, m_key, L"Text", text, 0));
    EXPECT_STREQ(L"user", text.c_str());

    EXPECT_TRUE(DeleteRegValue(kUser, m_key, L"Text", 0));
    EXPECT_FALSE(RegHasValue(kUser, m_key, L"Text"));
    EXPECT_TRUE(RegHasValue(kUser, Hive(m_key), L"Text"));
    const std::wstring gone = m_own.Sub(L"Gone");
    ASSERT_TRUE(RegMakeKey(kUser, Hive(gone)));
    EXPECT_FALSE(IsRegKeyExist(kUser, gone.c_str(), 0));
    ASSERT_TRUE(RegMakeKey(kUser, gone));
    EXPECT_TRUE(CRegistry::RecurDeleteKey(kUser, gone.c_str(), 0));
    EXPECT_TRUE(RegHasKey(kUser, Hive(gone)));
}

TEST_F(RegistryRedirectTest, ClearCurUserQMRegCleansTheConsoleUserNotTheCaller) {
    for (const std::wstring& base : {Hive(L""), std::wstring()}) {
        auto at = [&](const std::wstring& key) { return base.empty() ? key : base + L"\\" + key; };
        ASSERT_TRUE(RegPutString(kUser, at(kRunKey), L"QMOneClick", L"x.exe"));
        ASSERT_TRUE(RegPutString(kUser, at(std::wstring(kQmKey) + L"\\Sub"), L"v", L"1"));
    }
    ClearCurUserQMReg();
    EXPECT_FALSE(RegHasValue(kUser, Hive(kRunKey), L"QMOneClick"));
    EXPECT_FALSE(RegHasKey(kUser, Hive(kQmKey)));
    EXPECT_TRUE(RegHasValue(kUser, kRunKey, L"QMOneClick"));
    EXPECT_TRUE(RegHasKey(kUser, kQmKey));
    RegRemoveValue(kUser, kRunKey, L"QMOneClick");
    RegRemoveTree(kUser, L"Software\\Mirovan");
}

}  // namespace
