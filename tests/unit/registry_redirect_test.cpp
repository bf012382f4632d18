// HKEY_CURRENT_USER redirection as a process running as the system account
// sees it: the process-wide profile asks a platform that reports a
// non-interactive process whose console user's profile is a hive loaded under
// HKEY_USERS. Value reads and writes under HKCU reach that hive; deletions,
// existence tests and enumerations stay with the process's own HKCU. This
// program needs its own process: the platform must be in place before the
// first registry call.
#include <windows.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "base/privileges.h"
#include "base/registry.h"
#include "base/registry_delete.h"
#include "base/user_profile.h"
#include "cleanup/user_registry_cleanup.h"
#include "tests/unit/scratch_registry.h"

namespace {

const HKEY kUser = HKEY_CURRENT_USER;

const wchar_t kRunKey[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
const wchar_t kRunOnceKey[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Runonce";
const wchar_t kQmKey[] = L"Software\\Mirovan\\QmkTools";

// The console user's profile is loaded when asked for and unloaded when the
// process-wide profile ends at process exit.
class ConsoleUserPlatform : public UserSessionPlatform {
public:
    int IsInteractiveProcess() override { return 0; }
    int OSVersionClass() override { return 8; }
    bool HasProfileFunctions() override { return true; }
    bool ActiveConsoleSessionId(DWORD* sessionId) override {
        *sessionId = 1;
        return true;
    }
    HANDLE FindSessionToken(DWORD) override {
        HANDLE token = nullptr;
        OpenProcessToken(GetCurrentProcess(), TOKEN_QUERY, &token);
        return token;
    }
    HKEY LoadProfileOf(HANDLE) override {
        HKEY root = nullptr;
        if (AdjustPrivileges()) {
            m_hive = std::make_unique<LoadedHive>(
                std::vector<LoadedHive::Value>{{L"Software\\Seed", L"v", L"seed"}});
            RegOpenKeyExW(HKEY_USERS, m_hive->name().c_str(), 0, KEY_ALL_ACCESS, &root);
        }
        return root;
    }
    void UnloadProfile(HANDLE, HKEY root) override {
        RegCloseKey(root);
        m_hive.reset();
    }
    // The key in the console user's hive ("-\key" while none is loaded).
    std::wstring Hive(const std::wstring& key) const {
        return m_hive ? m_hive->Key(key) : L"-\\" + key;
    }

private:
    std::unique_ptr<LoadedHive> m_hive;
};

// Created before the process-wide profile, so it outlives it.
ConsoleUserPlatform g_consoleUser;
const bool g_platformSet = (SetProcessUserSessionPlatform(&g_consoleUser), true);

class RegistryRedirectTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(g_platformSet);
        ASSERT_NE(kUser, GetUserRegRoot());
    }
    // The console user's hive goes at process exit; the own one is cleaned here.
    void TearDown() override {
        RegRemoveValue(kUser, kRunKey, L"QMOneClick");
        RegRemoveValue(kUser, kRunOnceKey, L"Mirovan_QM");
        RegRemoveTree(kUser, L"Software\\Mirovan");
    }
    std::wstring Hive(const std::wstring& key) const { return g_consoleUser.Hive(key); }

    ScratchKey m_own{kUser, L"Software", L"own"};
    // The same relative name serves in both hives.
    const wchar_t* m_key = m_own.path().c_str();
};

TEST_F(RegistryRedirectTest, ValueReadsAndWritesUnderHkcuReachTheConsoleUsersHive) {
    ASSERT_TRUE(SetRegString(kUser, m_key, L"Text", L"user", 0));
    ASSERT_TRUE(SetRegDWORD(kUser, m_key, L"Number", 5, 0));
    EXPECT_EQ(L"user", RegGetString(HKEY_USERS, Hive(m_key), L"Text").value_or(L"?"));
    EXPECT_EQ(5u, RegGetDword(HKEY_USERS, Hive(m_key), L"Number").value_or(0));
    EXPECT_FALSE(RegHasValue(kUser, m_key, L"Text"));

    ASSERT_TRUE(RegPutString(HKEY_USERS, Hive(m_key), L"Only", L"in hive"));
    ASSERT_TRUE(RegPutString(kUser, m_key, L"Only", L"own"));
    CStringEx text;
    ASSERT_TRUE(GetRegString(kUser, m_key, L"Only", text, 0));
    EXPECT_STREQ(L"in hive", text.c_str());
    EXPECT_EQ(DWORD(REG_SZ), GetRegValueType(kUser, m_key, L"Only", 0));
    EXPECT_EQ(16, GetRegValueSize(kUser, m_key, L"Only", 0));
    DWORD number = 0;
    ASSERT_TRUE(GetRegDWORD(kUser, m_key, L"Number", &number, 0));
    EXPECT_EQ(5u, number);

    // Other roots are never redirected.
    ScratchKey machine(HKEY_LOCAL_MACHINE, L"SOFTWARE", L"redir");
    ASSERT_TRUE(SetRegString(HKEY_LOCAL_MACHINE, machine.path().c_str(), L"m", L"x", 0));
    EXPECT_TRUE(RegHasValue(HKEY_LOCAL_MACHINE, machine.path(), L"m"));
}

TEST_F(RegistryRedirectTest, DeletionExistenceAndEnumerationStayWithTheOwnHive) {
    ASSERT_TRUE(RegPutString(HKEY_USERS, Hive(m_key), L"Both", L"hive"));
    ASSERT_TRUE(RegPutString(kUser, m_key, L"Both", L"own"));
    EXPECT_TRUE(DeleteRegValue(kUser, m_key, L"Both", 0));
    EXPECT_FALSE(RegHasValue(kUser, m_key, L"Both"));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, Hive(m_key), L"Both"));

    std::vector<CStringEx> names;
    ASSERT_TRUE(RegPutString(kUser, m_key, L"OwnValue", L"own"));
    ASSERT_TRUE(EnumRegValueNames(kUser, m_key, names, 0));
    ASSERT_EQ(1u, names.size());
    EXPECT_STREQ(L"OwnValue", names[0].c_str());

    EXPECT_TRUE(IsRegKeyExist(kUser, m_key, 0));
    EXPECT_FALSE(IsRegKeyExist(kUser, L"Software\\Seed", 0));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, Hive(L"Software\\Seed")));

    std::wstring made = m_own.Sub(L"Made");
    EXPECT_TRUE(UniqueHKey(CreateRegKey(kUser, made.c_str(), 0)));
    EXPECT_TRUE(RegHasKey(kUser, made));
    EXPECT_FALSE(RegHasKey(HKEY_USERS, Hive(made)));

    std::wstring gone = m_own.Sub(L"Gone");
    ASSERT_TRUE(RegMakeKey(HKEY_USERS, Hive(gone)));
    ASSERT_TRUE(RegMakeKey(kUser, gone));
    EXPECT_TRUE(CRegistry::RecurDeleteKey(kUser, gone.c_str(), 0));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, Hive(gone)));
}

TEST_F(RegistryRedirectTest, ClearCurUserQMRegCleansTheConsoleUserNotTheCaller) {
    // Which entries go and which neighbours stay is the end-to-end test's concern.
    for (HKEY root : {HKEY_USERS, kUser}) {
        auto at = [&](const std::wstring& key) { return root == HKEY_USERS ? Hive(key) : key; };
        ASSERT_TRUE(RegPutString(root, at(kRunKey), L"QMOneClick", L"x.exe"));
        ASSERT_TRUE(RegPutString(root, at(std::wstring(kQmKey) + L"\\Sub"), L"v", L"1"));
        ASSERT_TRUE(RegPutString(root, at(kRunOnceKey), L"Mirovan_QM", L"x.exe"));
    }
    ClearCurUserQMReg();
    EXPECT_FALSE(RegHasValue(HKEY_USERS, Hive(kRunKey), L"QMOneClick"));
    EXPECT_FALSE(RegHasKey(HKEY_USERS, Hive(kQmKey)));
    EXPECT_FALSE(RegHasValue(HKEY_USERS, Hive(kRunOnceKey), L"Mirovan_QM"));
    EXPECT_TRUE(RegHasValue(kUser, kRunKey, L"QMOneClick"));
    EXPECT_TRUE(RegHasKey(kUser, kQmKey));
    EXPECT_TRUE(RegHasValue(kUser, kRunOnceKey, L"Mirovan_QM"));
}

}  // namespace
