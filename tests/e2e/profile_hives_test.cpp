// "delunuseddata", registry half: the suite's key leaves every loadable
// profile hive of the machine (real NTUSER.DAT files loaded by the program)
// and the caller's own HKEY_CURRENT_USER. Wine does not write a hive back when
// it is unloaded, so each hive is looked at while the program holds it
// loaded: the program is stopped at each RegUnLoadKeyW.
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
#include "tests/support/host_shell.h"
#include "tests/support/machine_fixture.h"

namespace {

const HKEY kUsers = HKEY_USERS;
const std::wstring kQm = L"SOFTWARE\\Mirovan\\QmkTools";
const std::wstring kKeep = L"SOFTWARE\\Mirovan\\Keep";
const std::wstring kSource = L"Software\\QMTest-HiveSource";
// Machine keys that links planted in two hives point at (64-bit view).
const std::wstring kTarget = L"SOFTWARE\\QMTest-LinkTarget";
const std::wstring kMachineMirovan = L"SOFTWARE\\QMTest-MachineMirovan";
const wchar_t* const kProfiles[] = {L"QMTest-A",      L"QMTest-B",      L"QMTest-InUse",
                                    L"QMTest-Linked", L"QMTest-NoHive", L"QMTest-Junction"};

struct SeenHive {
    bool loaded = false;
    bool qmLeft = false;
    bool keepLeft = false;
};

// Keys (a link where a target is given) saved as the file with RegSaveKeyW.
bool SaveHive(const std::wstring& file,
              const std::vector<std::pair<std::wstring, std::wstring>>& keys) {
    for (const auto& key : keys) {
        HKEY made = nullptr;
        std::wstring path = kSource + L"\\" + key.first;
        DWORD options = key.second.empty() ? 0 : REG_OPTION_CREATE_LINK;
        if (RegCreateKeyExW(HKEY_CURRENT_USER, path.c_str(), 0, nullptr, options, KEY_ALL_ACCESS,
                            nullptr, &made, nullptr) != ERROR_SUCCESS) {
            return false;
        }
        std::wstring target = L"\\Registry\\Machine\\" + key.second;
        if (!key.second.empty()) {
            RegSetValueExW(made, L"SymbolicLinkValue", 0, REG_LINK,
                           reinterpret_cast<const BYTE*>(target.c_str()),
                           static_cast<DWORD>(target.size() * sizeof(wchar_t)));
        }
        RegCloseKey(made);
    }
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
        for (const wchar_t* user : {L"QMTest-A", L"QMTest-InUse"}) {
            EXPECT_TRUE(SaveHive(
                Hive(user),
                {{kQm + L"\\Sub\\Deep", L""}, {kQm + L"\\Shared", kTarget}, {kKeep, L""}}));
        }
        EXPECT_TRUE(SaveHive(Hive(L"QMTest-B"), {{kQm, L""}, {kKeep, L""}}));
        EXPECT_TRUE(SaveHive(Hive(L"QMTest-Linked"), {{L"SOFTWARE\\Mirovan", kMachineMirovan}}));
        EXPECT_TRUE(SaveHive(m_scratch.Sub(L"elsewhere\\NTUSER.DAT"), {{kQm, L""}}));
        MakeDirs(Profile(L"QMTest-NoHive"));
        WriteFileBytes(Profile(L"QMTest-File.txt"), "not a profile");
        EXPECT_EQ(0, RunHostShell("ln -s \"$1\" \"$2\"", {HostPath(m_scratch.Sub(L"elsewhere")),
                                                          HostPath(Profile(L"QMTest-Junction"))}));
        for (const std::wstring& key : {kTarget + L"\\Child", kMachineMirovan + L"\\QmkTools"}) {
            EXPECT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, key, KEY_WOW64_64KEY));
        }
        EXPECT_TRUE(RegPutString(HKEY_CURRENT_USER, kQm + L"\\Sub", L"v", L"x"));
        EXPECT_TRUE(RegPutString(HKEY_CURRENT_USER, kKeep, L"v", L"kept"));
    }
    ~ProfileHivesTest() override {
        RunHostShell("rm -f \"$1\"", {HostPath(Profile(L"QMTest-Junction"))});
        for (const wchar_t* user : kProfiles) {
            RemoveTree(Profile(user));
        }
        DeleteFileW(Profile(L"QMTest-File.txt").c_str());
        RegRemoveTree(HKEY_LOCAL_MACHINE, kTarget, KEY_WOW64_64KEY);
        RegRemoveTree(HKEY_LOCAL_MACHINE, kMachineMirovan, KEY_WOW64_64KEY);
    }

    std::wstring Profile(const wchar_t* user) const { return JoinPath(m_profiles, user); }
    std::wstring Hive(const wchar_t* user) const { return Profile(user) + L"\\NTUSER.DAT"; }

    // Runs -delunuseddata, noting at each unload which test hives are loaded
    // and what they still hold.
    RunResult Run(HANDLE token = nullptr) {
        EntryStop stop(reinterpret_cast<const void*>(
                           GetProcAddress(GetModuleHandleW(L"advapi32.dll"), "RegUnLoadKeyW")),
                       [this] {
                           for (const wchar_t* user : kProfiles) {
                               if (RegHasKey(kUsers, user)) {
                                   m_seen[user] = {
                                       true, RegHasKey(kUsers, std::wstring(user) + L"\\" + kQm),
                                       RegHasKey(kUsers, std::wstring(user) + L"\\" + kKeep)};
                               }
                           }
                       });
        RunResult run = Program().Run(L"-delunuseddata", 60000, {token, &stop});
        EXPECT_EQ(0, run.exitCode);
        EXPECT_FALSE(run.crashed);
        m_stops = stop.stops();
        return run;
    }

    std::wstring m_profiles;
    std::map<std::wstring, SeenHive> m_seen;
    int m_stops = 0;
};

TEST_F(ProfileHivesTest, EveryLoadableHiveLosesTheKeyAndIsUnloaded) {
    HeldOpen loggedOn(Hive(L"QMTest-InUse"), 0);
    ASSERT_TRUE(loggedOn.ok());
    RunResult run = Run();

    // Cleaned while loaded, other keys kept; the link inside went as a link.
    for (const wchar_t* user : {L"QMTest-A", L"QMTest-B"}) {
        EXPECT_TRUE(m_seen[user].loaded) << Narrow(user);
        EXPECT_FALSE(m_seen[user].qmLeft) << Narrow(user);
        EXPECT_TRUE(m_seen[user].keepLeft) << Narrow(user);
        EXPECT_FALSE(RegHasKey(kUsers, user)) << Narrow(user);
    }
    EXPECT_TRUE(RegHasKey(HKEY_LOCAL_MACHINE, kTarget + L"\\Child", KEY_WOW64_64KEY));
    // A hive whose key lies behind a link elsewhere: nothing deleted there,
    // and the hive is unloaded all the same.
    EXPECT_TRUE(m_seen[L"QMTest-Linked"].loaded);
    EXPECT_TRUE(RegHasKey(HKEY_LOCAL_MACHINE, kMachineMirovan + L"\\QmkTools", KEY_WOW64_64KEY));
    EXPECT_TRUE(run.HasDebugOutput("CRegistry::RecurDeleteKey RegDeleteKey Failed!"));
    EXPECT_FALSE(RegHasKey(kUsers, L"QMTest-Linked"));
    EXPECT_EQ(3, m_stops);

    const std::string failed = "NIHandle::DeleteAllCurUserReg: RegLoadKey failed!user = ";
    EXPECT_TRUE(run.HasDebugOutput(failed + "QMTest-InUse,error = 32"));
    EXPECT_TRUE(run.HasDebugOutput(failed + "QMTest-NoHive,error = 2"));
    // Neither the file nor the linked folder (leading out of the profiles
    // folder) is taken for a profile.
    for (const std::string& line : run.debugOutput) {
        EXPECT_EQ(std::string::npos, line.find("QMTest-File")) << line;
        EXPECT_EQ(std::string::npos, line.find("QMTest-Junction")) << line;
    }
    EXPECT_FALSE(m_seen[L"QMTest-Junction"].loaded);

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
    EXPECT_EQ(0, m_stops);
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, kQm));
}

}  // namespace
