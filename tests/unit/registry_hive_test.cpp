// Another user's hive under HKEY_USERS, cleaned by the guarded deletions
// RemoveRegKey / RemoveRegValue (which ask CObjectSecurity first), and the
// privileges that loading a hive needs (AdjustPrivileges).
#include <windows.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "base/privileges.h"
#include "base/registry_delete.h"
#include "base/win_handles.h"
#include "tests/unit/debug_output_capture.h"
#include "tests/unit/scratch_registry.h"

namespace {

const wchar_t kQmKey[] = L"Software\\Mirovan\\QmkTools";
const wchar_t kKeep[] = L"Software\\Mirovan\\Keep";

class RegistryHiveTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(AdjustPrivileges());
        m_hive = std::make_unique<LoadedHive>(
            std::vector<LoadedHive::Value>{{kQmKey, L"v1", L"1"},
                                           {kQmKey, L"v2", L"2"},
                                           {std::wstring(kQmKey) + L"\\Sub\\Deep", L"v", L"3"},
                                           {kKeep, L"v", L"4"}});
        ASSERT_TRUE(m_hive->ok()) << m_hive->error();
        m_user = m_hive->name().c_str();
    }
    bool Restrict(const wchar_t* key, const wchar_t* sddl) {
        return SetKeyDacl(HKEY_USERS, m_hive->Key(key), sddl);
    }

    std::unique_ptr<LoadedHive> m_hive;
    const wchar_t* m_user = nullptr;
};

TEST_F(RegistryHiveTest, RemoveRegValueAndRemoveRegKeyCleanAnotherUsersHive) {
    EXPECT_TRUE(RemoveRegValue(m_user, kQmKey, L"v1"));
    EXPECT_FALSE(RegHasValue(HKEY_USERS, m_hive->Key(kQmKey), L"v1"));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, m_hive->Key(kQmKey), L"v2"));

    EXPECT_TRUE(RemoveRegKey(m_user, kQmKey));
    EXPECT_FALSE(RegHasKey(HKEY_USERS, m_hive->Key(kQmKey)));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, m_hive->Key(kKeep), L"v"));
}

TEST_F(RegistryHiveTest, RefusedOrFailedDeletionsLeaveTheKeyAndWriteTheirDebuggerLine) {
    ASSERT_TRUE(Restrict(kKeep, kReadOnlyDacl));
    ASSERT_TRUE(Restrict(kQmKey, kNoDeleteDacl));
    DebugOutputCapture debug;

    // The descriptor was read (error 0); the check itself said no.
    EXPECT_FALSE(RemoveRegKey(m_user, kKeep));
    EXPECT_TRUE(debug.Has(L"RemoveRegKey failed!subkey Software\\Mirovan\\Keep, DeleteAllow 0"));
    EXPECT_FALSE(RemoveRegValue(m_user, kKeep, L"v"));
    EXPECT_TRUE(debug.Has(L"RemoveRegValue failed!subkey Software\\Mirovan\\Keep, DeleteAllow 0"));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, m_hive->Key(kKeep), L"v"));

    // Writable but not deletable: values go, the key stays.
    EXPECT_TRUE(RemoveRegValue(m_user, kQmKey, L"v1"));
    EXPECT_FALSE(RemoveRegKey(m_user, kQmKey));
    EXPECT_FALSE(RegHasValue(HKEY_USERS, m_hive->Key(kQmKey), L"v1"));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, m_hive->Key(std::wstring(kQmKey) + L"\\Sub\\Deep")));

    EXPECT_FALSE(RemoveRegValue(m_user, kQmKey, L"none"));
    EXPECT_TRUE(debug.Has(L"RemoveRegValue::DeleteValue Failed!"));
    // The access check cannot read a missing key's descriptor: error 2.
    EXPECT_FALSE(RemoveRegKey(m_user, L"Software\\None"));
    EXPECT_TRUE(debug.Has(L"RemoveRegKey failed!subkey Software\\None, DeleteAllow 2"));
}

TEST_F(RegistryHiveTest, EmptyNullAndOverlongNamesDeleteNothing) {
    EXPECT_FALSE(RemoveRegKey(m_user, L""));
    EXPECT_FALSE(RemoveRegKey(m_user, nullptr));
    EXPECT_FALSE(RemoveRegKey(L"", L"Software"));
    EXPECT_FALSE(RemoveRegKey(nullptr, L"Software"));
    EXPECT_FALSE(RemoveRegValue(m_user, L"", L"v"));
    EXPECT_FALSE(RemoveRegValue(m_user, kQmKey, nullptr));
    EXPECT_FALSE(RemoveRegValue(nullptr, kQmKey, L"v1"));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, m_hive->Key(kQmKey), L"v1"));

    // "USERS\<hive>\<subkey>" longer than the 256 characters the access check
    // takes: refused as a whole rather than checked on a shortened name.
    const std::wstring longKey = L"Software\\" + std::wstring(240, L'L');
    ASSERT_TRUE(RegMakeKey(HKEY_USERS, m_hive->Key(longKey)));
    DebugOutputCapture debug;
    EXPECT_FALSE(RemoveRegKey(m_user, longKey.c_str()));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, m_hive->Key(longKey)));
    ASSERT_EQ(1u, debug.lines().size());
    EXPECT_NE(std::wstring::npos, debug.lines()[0].find(L"DeleteAllow 206"));
}

TEST(PrivilegesTest, AllThreeMustBeGrantedForSuccess) {
    EXPECT_TRUE(AdjustPrivileges());
    EXPECT_FALSE(AdjustPrivilegesOf(nullptr));
    // A token without SeDebugPrivilege: the system enables the other two and
    // answers ERROR_NOT_ALL_ASSIGNED, which is a failure here.
    UniqueHandle process;
    ASSERT_TRUE(OpenProcessToken(GetCurrentProcess(), TOKEN_ALL_ACCESS, process.put()));
    LUID_AND_ATTRIBUTES removed = {};
    ASSERT_TRUE(LookupPrivilegeValueW(nullptr, L"SeDebugPrivilege", &removed.Luid));
    UniqueHandle restricted;
    ASSERT_TRUE(CreateRestrictedToken(process.get(), 0, 0, nullptr, 1, &removed, 0, nullptr,
                                      restricted.put()));
    EXPECT_FALSE(AdjustPrivilegesOf(restricted.get()));
    EXPECT_EQ(DWORD(ERROR_NOT_ALL_ASSIGNED), GetLastError());
}

}  // namespace
