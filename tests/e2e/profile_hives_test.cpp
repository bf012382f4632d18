// "delunuseddata": the suite's key leaves every loadable profile hive and the
// caller's HKCU. Wine does not write a hive back on unload, so the program is
// stopped at each RegUnLoadKeyW and the hive looked at then.
#include <windows.h>
#include <gtest/gtest.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <map>
#include <string>

#include "base/privileges.h"
#include "base/registry_no_links.h"
#include "tests/support/entry_stop.h"
#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"

namespace {

const std::wstring kQm = L"SOFTWARE\\Mirovan\\QmkTools";
const std::wstring kKeep = L"SOFTWARE\\Mirovan\\Keep";
const std::wstring kSource = L"Software\\QMTest-HiveSource";
// A machine key (64-bit view) that a link planted in the hives points at.
const std::wstring kTarget = L"SOFTWARE\\QMTest-LinkTarget";
const wchar_t* const kUsers[] = {L"QMTest-A", L"QMTest-B", L"QMTest-InUse"};

// Saves a profile hive: the suite's key with a subkey and a link to the
// machine's kTarget, and another key.
bool SaveHive(const std::wstring& file) {
    RegMakeKey(HKEY_CURRENT_USER, kSource + L"\\" + kQm + L"\\Sub\\Deep");
    RegMakeKey(HKEY_CURRENT_USER, kSource + L"\\" + kKeep);
    HKEY link = nullptr;
    const std::wstring target = L"\\Registry\\Machine\\" + kTarget;
    RegCreateKeyExW(HKEY_CURRENT_USER, (kSource + L"\\" + kQm + L"\\Shared").c_str(), 0, nullptr,
                    REG_OPTION_CREATE_LINK, KEY_ALL_ACCESS, nullptr, &link, nullptr);
    RegSetValueExW(link, L"SymbolicLinkValue", 0, REG_LINK,
                   reinterpret_cast<const BYTE*>(target.c_str()),
                   static_cast<DWORD>(target.size() * sizeof(wchar_t)));
    RegCloseKey(link);
    MakeDirs(file.substr(0, file.rfind(L'\\')));
    HKEY source = nullptr;
    RegOpenKeyExW(HKEY_CURRENT_USER, kSource.c_str(), 0, KEY_READ, &source);
    bool saved = RegSaveKeyW(source, file.c_str(), nullptr) == ERROR_SUCCESS;
    RegCloseKey(source);
    DeleteKeyTreeNoLinks(HKEY_CURRENT_USER, kSource.c_str());
    return saved;
}

class ProfileHivesTest : public MachineTest {
protected:
    ProfileHivesTest() {
        wchar_t own[MAX_PATH] = {};
        SHGetFolderPathW(nullptr, CSIDL_PROFILE, nullptr, 0, own);
        PathRemoveFileSpecW(own);
        m_profiles = own;
        EXPECT_TRUE(AdjustPrivileges());
        for (const wchar_t* user : kUsers) {
            EXPECT_TRUE(SaveHive(Hive(user)));
        }
        RegMakeKey(HKEY_LOCAL_MACHINE, kTarget + L"\\Child", KEY_WOW64_64KEY);
        RegPutString(HKEY_CURRENT_USER, kQm + L"\\Sub", L"v", L"x");
        RegPutString(HKEY_CURRENT_USER, kKeep, L"v", L"kept");
    }
    ~ProfileHivesTest() override {
        for (const wchar_t* user : kUsers) {
            RemoveTree(Profile(user));
        }
        RegRemoveTree(HKEY_LOCAL_MACHINE, kTarget, KEY_WOW64_64KEY);
    }
    std::wstring Profile(const wchar_t* user) const { return JoinPath(m_profiles, user); }
    std::wstring Hive(const wchar_t* user) const { return Profile(user) + L"\\NTUSER.DAT"; }
    // At each unload, each loaded hive's keys: 1 the suite's, 2 the other.
    RunResult Run(HANDLE token = nullptr) {
        EntryStop stop(reinterpret_cast<const void*>(
                           GetProcAddress(GetModuleHandleW(L"advapi32.dll"), "RegUnLoadKeyW")),
                       [this] {
                           for (std::wstring user : kUsers) {
                               if (RegHasKey(HKEY_USERS, user)) {
                                   m_seen[user] = RegHasKey(HKEY_USERS, user + L"\\" + kQm) +
                                                  2 * RegHasKey(HKEY_USERS, user + L"\\" + kKeep);
                               }
                           }
                       });
        RunResult run = Program().Run(L"-delunuseddata", 60000, {token, &stop});
        EXPECT_EQ(0, run.exitCode);
        return run;
    }
    std::wstring m_profiles;
    std::map<std::wstring, int> m_seen;
};

TEST_F(ProfileHivesTest, EveryLoadableHiveLosesTheKeyAndIsUnloaded) {
    HeldOpen loggedOn(Hive(L"QMTest-InUse"), 0);
    ASSERT_TRUE(loggedOn.ok());
    RunResult run = Run();
    // The other key kept, the planted link deleted as a link; all unloaded.
    EXPECT_EQ(2, m_seen[L"QMTest-A"]);
    EXPECT_EQ(2, m_seen[L"QMTest-B"]);
    EXPECT_TRUE(RegHasKey(HKEY_LOCAL_MACHINE, kTarget + L"\\Child", KEY_WOW64_64KEY));
    for (const wchar_t* user : kUsers) {
        EXPECT_FALSE(RegHasKey(HKEY_USERS, user)) << Narrow(user);
    }
    // In use: skipped with the line.
    EXPECT_TRUE(run.HasDebugOutput(
        "NIHandle::DeleteAllCurUserReg: RegLoadKey failed!user = QMTest-InUse,error = 32"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, kQm));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, kKeep, L"v"));
}

TEST_F(ProfileHivesTest, WithoutBackupAndRestorePrivilegesNothingIsRemoved) {
    HANDLE own = nullptr;
    ASSERT_TRUE(OpenProcessToken(GetCurrentProcess(), TOKEN_ALL_ACCESS, &own));
    LUID_AND_ATTRIBUTES removed[2] = {};
    LookupPrivilegeValueW(nullptr, L"SeBackupPrivilege", &removed[0].Luid);
    LookupPrivilegeValueW(nullptr, L"SeRestorePrivilege", &removed[1].Luid);
    HANDLE restricted = nullptr;
    ASSERT_TRUE(CreateRestrictedToken(own, 0, 0, nullptr, 2, removed, 0, nullptr, &restricted));
    RunResult run = Run(restricted);
    CloseHandle(restricted);
    CloseHandle(own);
    EXPECT_TRUE(run.HasDebugOutput("NIHandle::DeleteAllCurUserReg: AdjustPrivileges failed.\n"));
    EXPECT_TRUE(m_seen.empty());
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, kQm));
}

}  // namespace
