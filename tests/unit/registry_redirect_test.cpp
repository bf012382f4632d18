// HKEY_CURRENT_USER redirection as a process running as the system account
// sees it: the process-wide profile is made to ask a platform that reports a
// non-interactive process whose console user's profile is a real hive loaded
// under HKEY_USERS. Value reads and writes under HKCU then reach that hive;
// key creation, deletion, value deletion, existence tests and enumerations
// stay with the process's own HKCU. This program needs its own process: the
// platform must be in place before the first registry call.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "base/privileges.h"
#include "base/registry.h"
#include "base/registry_delete.h"
#include "base/user_profile.h"
#include "cleanup/user_registry_cleanup.h"
#include "tests/support/registry_util.h"
#include "tests/unit/scratch_registry.h"

namespace {

const wchar_t kRunKey[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
const wchar_t kRunOnceKey[] = L"Software\\Microsoft\\Windows\\CurrentVersion\\Runonce";

// The console user's profile: a hive file made from a scratch key and
// loaded under HKEY_USERS when the profile is asked for, unloaded when the
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
        if (!AdjustPrivileges()) {
            return nullptr;
        }
        m_name = scratch_registry::UniqueName(L"profile");
        wchar_t temp[MAX_PATH] = {};
        GetTempPathW(MAX_PATH, temp);
        m_file = std::wstring(temp) + m_name + L".dat";
        {
            ScratchKey source(HKEY_CURRENT_USER, L"Software", L"profilesrc");
            RegPutString(HKEY_CURRENT_USER, source.Sub(L"Software\\Seed"), L"v", L"seed");
            HKEY key = nullptr;
            if (RegOpenKeyExW(HKEY_CURRENT_USER, source.path().c_str(), 0, KEY_READ, &key) !=
                ERROR_SUCCESS) {
                return nullptr;
            }
            LONG saved = RegSaveKeyW(key, m_file.c_str(), nullptr);
            RegCloseKey(key);
            if (saved != ERROR_SUCCESS ||
                RegLoadKeyW(HKEY_USERS, m_name.c_str(), m_file.c_str()) != ERROR_SUCCESS) {
                return nullptr;
            }
        }
        HKEY root = nullptr;
        if (RegOpenKeyExW(HKEY_USERS, m_name.c_str(), 0, KEY_ALL_ACCESS, &root) != ERROR_SUCCESS) {
            return nullptr;
        }
        return root;
    }
    void UnloadProfile(HANDLE, HKEY root) override {
        RegCloseKey(root);
        RegUnLoadKeyW(HKEY_USERS, m_name.c_str());
        DeleteFileW(m_file.c_str());
    }

    const std::wstring& hiveName() const { return m_name; }

private:
    std::wstring m_name;
    std::wstring m_file;
};

// Created before the process-wide profile, so it outlives it.
ConsoleUserPlatform g_consoleUser;
const bool g_platformSet = (SetProcessUserSessionPlatform(&g_consoleUser), true);

class RegistryRedirectTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(g_platformSet);
        m_root = GetUserRegRoot();
        ASSERT_NE(HKEY_CURRENT_USER, m_root);
        ASSERT_FALSE(g_consoleUser.hiveName().empty());
    }
    void TearDown() override {
        RegRemoveTree(HKEY_USERS, Hive(m_key));
        RegRemoveTree(HKEY_USERS, Hive(L"Software\\Mirovan"));
        RegRemoveTree(HKEY_USERS, Hive(kRunKey));
        RegRemoveTree(HKEY_USERS, Hive(kRunOnceKey));
        for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe", L"Other"}) {
            RegRemoveValue(HKEY_CURRENT_USER, kRunKey, name);
        }
        RegRemoveValue(HKEY_CURRENT_USER, kRunOnceKey, L"Mirovan_QM");
        RegRemoveTree(HKEY_CURRENT_USER, L"Software\\Mirovan");
    }
    // The key in the console user's hive.
    std::wstring Hive(const std::wstring& key) const {
        return g_consoleUser.hiveName() + L"\\" + key;
    }

    HKEY m_root = nullptr;
    ScratchKey m_own{HKEY_CURRENT_USER, L"Software", L"own"};
    // The same relative name in the console user's hive.
    std::wstring m_key = m_own.path();
};

TEST_F(RegistryRedirectTest, ValueReadsAndWritesUnderHkcuReachTheConsoleUsersHive) {
    ASSERT_TRUE(SetRegString(HKEY_CURRENT_USER, m_key.c_str(), L"Text", L"user", 0));
    ASSERT_TRUE(SetRegDWORD(HKEY_CURRENT_USER, m_key.c_str(), L"Number", 5, 0));
    EXPECT_EQ(L"user", RegGetString(HKEY_USERS, Hive(m_key), L"Text").value_or(L"?"));
    EXPECT_EQ(5u, RegGetDword(HKEY_USERS, Hive(m_key), L"Number").value_or(0));
    EXPECT_FALSE(RegHasValue(HKEY_CURRENT_USER, m_key, L"Text"));

    ASSERT_TRUE(RegPutString(HKEY_USERS, Hive(m_key), L"Only", L"in hive"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, m_key, L"Only", L"own"));
    CStringEx text;
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, m_key.c_str(), L"Only", text, 0));
    EXPECT_STREQ(L"in hive", text.c_str());
    EXPECT_EQ(DWORD(REG_SZ), GetRegValueType(HKEY_CURRENT_USER, m_key.c_str(), L"Only", 0));
    EXPECT_EQ(16, GetRegValueSize(HKEY_CURRENT_USER, m_key.c_str(), L"Only", 0));
    DWORD number = 0;
    ASSERT_TRUE(GetRegDWORD(HKEY_CURRENT_USER, m_key.c_str(), L"Number", &number, 0));
    EXPECT_EQ(5u, number);

    // Other roots are never redirected.
    ScratchKey machine(HKEY_LOCAL_MACHINE, L"SOFTWARE", L"redir");
    ASSERT_TRUE(SetRegString(HKEY_LOCAL_MACHINE, machine.path().c_str(), L"m", L"x", 0));
    EXPECT_TRUE(RegHasValue(HKEY_LOCAL_MACHINE, machine.path(), L"m"));
}

TEST_F(RegistryRedirectTest, DeletionExistenceAndEnumerationStayWithTheOwnHive) {
    ASSERT_TRUE(RegPutString(HKEY_USERS, Hive(m_key), L"Both", L"hive"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, m_key, L"Both", L"own"));

    EXPECT_TRUE(DeleteRegValue(HKEY_CURRENT_USER, m_key.c_str(), L"Both", 0));
    EXPECT_FALSE(RegHasValue(HKEY_CURRENT_USER, m_key, L"Both"));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, Hive(m_key), L"Both"));

    std::vector<CStringEx> names;
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, m_key, L"OwnValue", L"own"));
    ASSERT_TRUE(EnumRegValueNames(HKEY_CURRENT_USER, m_key.c_str(), names, 0));
    ASSERT_EQ(1u, names.size());
    EXPECT_STREQ(L"OwnValue", names[0].c_str());

    EXPECT_TRUE(IsRegKeyExist(HKEY_CURRENT_USER, m_key.c_str(), 0));
    EXPECT_FALSE(IsRegKeyExist(HKEY_CURRENT_USER, L"Software\\Seed", 0));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, Hive(L"Software\\Seed")));

    EXPECT_TRUE(CreateRegKey(HKEY_CURRENT_USER, (m_key + L"\\Made").c_str(), 0));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, m_key + L"\\Made"));
    EXPECT_FALSE(RegHasKey(HKEY_USERS, Hive(m_key + L"\\Made")));

    ASSERT_TRUE(RegMakeKey(HKEY_USERS, Hive(m_key + L"\\Gone")));
    ASSERT_TRUE(RegMakeKey(HKEY_CURRENT_USER, m_key + L"\\Gone"));
    EXPECT_TRUE(CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, (m_key + L"\\Gone").c_str(), 0));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, Hive(m_key + L"\\Gone")));
}

TEST_F(RegistryRedirectTest, ClearCurUserQMRegCleansTheConsoleUserNotTheCaller) {
    for (HKEY root : {HKEY_USERS, HKEY_CURRENT_USER}) {
        auto at = [&](const std::wstring& key) { return root == HKEY_USERS ? Hive(key) : key; };
        for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe", L"Other"}) {
            ASSERT_TRUE(RegPutString(root, at(kRunKey), name, L"x.exe"));
        }
        ASSERT_TRUE(RegPutString(root, at(L"Software\\Mirovan\\QmkTools\\Sub"), L"v", L"1"));
        ASSERT_TRUE(RegPutString(root, at(L"Software\\Mirovan\\Other"), L"v", L"1"));
        ASSERT_TRUE(RegPutString(root, at(kRunOnceKey), L"Mirovan_QM", L"x.exe"));
    }

    ClearCurUserQMReg();

    for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe"}) {
        EXPECT_FALSE(RegHasValue(HKEY_USERS, Hive(kRunKey), name)) << name;
        EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, kRunKey, name)) << name;
    }
    EXPECT_TRUE(RegHasValue(HKEY_USERS, Hive(kRunKey), L"Other"));
    EXPECT_FALSE(RegHasKey(HKEY_USERS, Hive(L"Software\\Mirovan\\QmkTools")));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, Hive(L"Software\\Mirovan\\Other")));
    EXPECT_FALSE(RegHasValue(HKEY_USERS, Hive(kRunOnceKey), L"Mirovan_QM"));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, L"Software\\Mirovan\\QmkTools\\Sub"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, kRunOnceKey, L"Mirovan_QM"));
}

}  // namespace
