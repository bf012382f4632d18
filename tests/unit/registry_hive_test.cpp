// Another user's hive under HKEY_USERS: a scratch key saved with RegSaveKeyW
// and loaded with RegLoadKeyW stands for a profile's NTUSER.DAT. The guarded
// deletions RemoveRegKey / RemoveRegValue ask CObjectSecurity first; the
// privileges that loading needs come from AdjustPrivileges.
#include <windows.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "base/object_security.h"
#include "base/privileges.h"
#include "base/registry_delete.h"
#include "base/win_handles.h"
#include "tests/support/file_util.h"
#include "tests/support/registry_util.h"
#include "tests/support/scratch_dir.h"
#include "tests/unit/debug_output_capture.h"
#include "tests/unit/scratch_registry.h"

namespace {

const wchar_t kQmKey[] = L"Software\\Mirovan\\QmkTools";

// A saved scratch tree loaded as HKEY_USERS\<name>, unloaded at the end.
class LoadedHive {
public:
    explicit LoadedHive(const ScratchDir& dir) : m_name(scratch_registry::UniqueName(L"hive")) {
        ScratchKey source(HKEY_CURRENT_USER, L"Software", L"hivesrc");
        RegPutString(HKEY_CURRENT_USER, source.Sub(L"Software\\Mirovan\\QmkTools"), L"v1", L"1");
        RegPutString(HKEY_CURRENT_USER, source.Sub(L"Software\\Mirovan\\QmkTools"), L"v2", L"2");
        RegPutString(HKEY_CURRENT_USER, source.Sub(L"Software\\Mirovan\\QmkTools\\Sub\\Deep"), L"v",
                     L"3");
        RegPutString(HKEY_CURRENT_USER, source.Sub(L"Software\\Mirovan\\Keep"), L"v", L"4");
        m_file = dir.Sub(m_name + L".dat");
        HKEY key = nullptr;
        if (RegOpenKeyExW(HKEY_CURRENT_USER, source.path().c_str(), 0, KEY_READ, &key) ==
            ERROR_SUCCESS) {
            m_saved = RegSaveKeyW(key, m_file.c_str(), nullptr);
            RegCloseKey(key);
        }
        if (m_saved == ERROR_SUCCESS) {
            m_loaded = RegLoadKeyW(HKEY_USERS, m_name.c_str(), m_file.c_str());
        }
    }
    ~LoadedHive() {
        for (const std::wstring& key : m_restricted) {
            scratch_registry::SetKeyDacl(HKEY_USERS, key, scratch_registry::kFullAccessDacl);
        }
        if (m_loaded == ERROR_SUCCESS) {
            RegUnLoadKeyW(HKEY_USERS, m_name.c_str());
        }
        DeleteFileW(m_file.c_str());
    }

    bool ok() const { return m_saved == ERROR_SUCCESS && m_loaded == ERROR_SUCCESS; }
    LONG saved() const { return m_saved; }
    LONG loaded() const { return m_loaded; }
    const std::wstring& name() const { return m_name; }
    // HKEY_USERS\<name>\rel
    std::wstring Key(const std::wstring& rel) const { return m_name + L"\\" + rel; }
    bool Restrict(const std::wstring& rel, const wchar_t* sddl) {
        m_restricted.push_back(Key(rel));
        return scratch_registry::SetKeyDacl(HKEY_USERS, Key(rel), sddl);
    }

private:
    std::wstring m_name;
    std::wstring m_file;
    LONG m_saved = ERROR_INVALID_FUNCTION;
    LONG m_loaded = ERROR_INVALID_FUNCTION;
    std::vector<std::wstring> m_restricted;
};

class RegistryHiveTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(AdjustPrivileges());
        m_hive = std::make_unique<LoadedHive>(m_dir);
        ASSERT_TRUE(m_hive->ok()) << "save " << m_hive->saved() << " load " << m_hive->loaded();
    }

    ScratchDir m_dir{L"hive"};
    std::unique_ptr<LoadedHive> m_hive;
};

TEST_F(RegistryHiveTest, RemoveRegValueAndRemoveRegKeyCleanAnotherUsersHive) {
    const std::wstring& user = m_hive->name();
    EXPECT_TRUE(RemoveRegValue(user.c_str(), kQmKey, L"v1"));
    EXPECT_FALSE(RegHasValue(HKEY_USERS, m_hive->Key(kQmKey), L"v1"));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, m_hive->Key(kQmKey), L"v2"));

    EXPECT_TRUE(RemoveRegKey(user.c_str(), kQmKey));
    EXPECT_FALSE(RegHasKey(HKEY_USERS, m_hive->Key(kQmKey)));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, m_hive->Key(L"Software\\Mirovan\\Keep"), L"v"));
}

TEST_F(RegistryHiveTest, MissingKeysAndValuesGiveZeroAndTheirDebuggerLine) {
    const std::wstring& user = m_hive->name();
    DebugOutputCapture debug;
    EXPECT_FALSE(RemoveRegValue(user.c_str(), kQmKey, L"none"));
    EXPECT_TRUE(debug.Has(L"RemoveRegValue::DeleteValue Failed!"));

    // The access check cannot read a missing key's descriptor: error 2.
    EXPECT_FALSE(RemoveRegKey(user.c_str(), L"Software\\None"));
    EXPECT_TRUE(debug.Has(L"RemoveRegKey failed!subkey Software\\None, DeleteAllow 2"));
    EXPECT_FALSE(RemoveRegValue(user.c_str(), L"Software\\None", L"v"));
    EXPECT_TRUE(debug.Has(L"RemoveRegValue failed!subkey Software\\None, DeleteAllow 2"));
}

TEST_F(RegistryHiveTest, ADeniedAccessCheckLeavesTheKeyAndReportsTheStoredError) {
    const std::wstring& user = m_hive->name();
    const std::wstring keep = L"Software\\Mirovan\\Keep";
    ASSERT_TRUE(m_hive->Restrict(keep, scratch_registry::kReadOnlyDacl));
    DebugOutputCapture debug;

    EXPECT_FALSE(RemoveRegKey(user.c_str(), keep.c_str()));
    EXPECT_FALSE(RemoveRegValue(user.c_str(), keep.c_str(), L"v"));
    // The descriptor was read (error 0); the check itself said no.
    EXPECT_TRUE(debug.Has(L"RemoveRegKey failed!subkey Software\\Mirovan\\Keep, DeleteAllow 0"));
    EXPECT_TRUE(debug.Has(L"RemoveRegValue failed!subkey Software\\Mirovan\\Keep, DeleteAllow 0"));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, m_hive->Key(keep), L"v"));
}

TEST_F(RegistryHiveTest, AKeyThatMayBeWrittenButNotDeletedLosesValuesOnly) {
    const std::wstring& user = m_hive->name();
    ASSERT_TRUE(m_hive->Restrict(kQmKey, scratch_registry::kNoDeleteDacl));

    EXPECT_TRUE(RemoveRegValue(user.c_str(), kQmKey, L"v1"));
    EXPECT_FALSE(RemoveRegKey(user.c_str(), kQmKey));
    EXPECT_FALSE(RegHasValue(HKEY_USERS, m_hive->Key(kQmKey), L"v1"));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, m_hive->Key(L"Software\\Mirovan\\QmkTools\\Sub\\Deep")));
}

TEST_F(RegistryHiveTest, EmptyNullAndOverlongNamesDeleteNothing) {
    const std::wstring& user = m_hive->name();
    EXPECT_FALSE(RemoveRegKey(user.c_str(), L""));
    EXPECT_FALSE(RemoveRegKey(user.c_str(), nullptr));
    EXPECT_FALSE(RemoveRegKey(L"", L"Software"));
    EXPECT_FALSE(RemoveRegKey(nullptr, L"Software"));
    EXPECT_FALSE(RemoveRegValue(user.c_str(), L"", L"v"));
    EXPECT_FALSE(RemoveRegValue(user.c_str(), kQmKey, nullptr));
    EXPECT_FALSE(RemoveRegValue(nullptr, kQmKey, L"v1"));
    EXPECT_TRUE(RegHasValue(HKEY_USERS, m_hive->Key(kQmKey), L"v1"));

    // "USERS\<hive>\<subkey>" longer than the 256 characters the access check
    // takes: refused as a whole rather than checked on a shortened name.
    const std::wstring longKey = L"Software\\" + std::wstring(240, L'L');
    ASSERT_TRUE(RegMakeKey(HKEY_USERS, m_hive->Key(longKey)));
    DebugOutputCapture debug;
    EXPECT_FALSE(RemoveRegKey(user.c_str(), longKey.c_str()));
    EXPECT_TRUE(RegHasKey(HKEY_USERS, m_hive->Key(longKey)));
    ASSERT_EQ(1u, debug.lines().size());
    EXPECT_NE(std::wstring::npos, debug.lines()[0].find(L"DeleteAllow 206"));
}

TEST(PrivilegesTest, AllThreeMustBeGrantedForSuccess) {
    EXPECT_TRUE(AdjustPrivileges());
    EXPECT_TRUE(EnablePrivilege(L"SeBackupPrivilege"));
    EXPECT_FALSE(EnablePrivilege(L"SeNoSuchPrivilege"));
    EXPECT_FALSE(EnablePrivilege(nullptr));

    // A token without SeDebugPrivilege: the system enables the other two and
    // answers ERROR_NOT_ALL_ASSIGNED, which is a failure here.
    HANDLE process = nullptr;
    ASSERT_TRUE(OpenProcessToken(GetCurrentProcess(), TOKEN_ALL_ACCESS, &process));
    UniqueHandle processToken(process);
    LUID_AND_ATTRIBUTES removed = {};
    ASSERT_TRUE(LookupPrivilegeValueW(nullptr, L"SeDebugPrivilege", &removed.Luid));
    HANDLE restricted = nullptr;
    ASSERT_TRUE(CreateRestrictedToken(processToken.get(), 0, 0, nullptr, 1, &removed, 0, nullptr,
                                      &restricted));
    UniqueHandle restrictedToken(restricted);
    EXPECT_FALSE(AdjustPrivilegesOf(restrictedToken.get()));
    EXPECT_EQ(DWORD(ERROR_NOT_ALL_ASSIGNED), GetLastError());
    EXPECT_FALSE(AdjustPrivilegesOf(nullptr));
}

TEST(ObjectSecurityTest, FilesAndKeysAreCheckedAgainstTheirOwnDescriptor) {
    ScratchDir dir(L"sec");
    std::wstring file = dir.Sub(L"f.txt");
    ASSERT_TRUE(WriteFileBytes(file, "x"));
    CObjectSecurity present(file.c_str());
    EXPECT_EQ(0u, present.GetLastError());
    EXPECT_TRUE(present.CanDelete());
    EXPECT_TRUE(present.CanWrite());

    CObjectSecurity missing(dir.Sub(L"none.txt").c_str());
    EXPECT_EQ(DWORD(ERROR_FILE_NOT_FOUND), missing.GetLastError());
    EXPECT_FALSE(missing.CanDelete());

    std::wstring longPath = L"C:\\" + std::wstring(254, L'p');  // 257 characters
    CObjectSecurity tooLong(longPath.c_str());
    EXPECT_EQ(DWORD(ERROR_FILENAME_EXCED_RANGE), tooLong.GetLastError());
    EXPECT_FALSE(tooLong.CanDelete());
    CObjectSecurity none(static_cast<const wchar_t*>(nullptr));
    EXPECT_FALSE(none.CanWrite());

    ScratchKey key(HKEY_LOCAL_MACHINE, L"SOFTWARE", L"sec");
    CObjectSecurity open(HKEY_LOCAL_MACHINE, key.path().c_str());
    EXPECT_EQ(0u, open.GetLastError());
    EXPECT_TRUE(open.CanDelete());
    ASSERT_TRUE(key.Restrict(L"", scratch_registry::kNoDeleteDacl));
    CObjectSecurity noDelete(HKEY_LOCAL_MACHINE, key.path().c_str());
    EXPECT_FALSE(noDelete.CanDelete());
    EXPECT_TRUE(noDelete.CanWrite());
    EXPECT_TRUE(noDelete.CheckAccess(KEY_READ));

    CObjectSecurity otherRoot(HKEY_CURRENT_CONFIG, L"Software");
    EXPECT_EQ(DWORD(ERROR_INVALID_PARAMETER), otherRoot.GetLastError());
    EXPECT_FALSE(otherRoot.CheckAccess(KEY_READ));
}

}  // namespace
