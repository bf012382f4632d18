// The suite folder in the machine-wide "Path", through the real registry value.
#include <gtest/gtest.h>

#include <string>

#include "cleanup/system_env_path.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/setting_change_listener.h"

namespace {

class SystemEnvPath : public ::testing::Test {
protected:
    void SetPath(const std::wstring& text, DWORD type = REG_EXPAND_SZ) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", text, 0, type));
    }
    // The stored text, checked to be stored as REG_EXPAND_SZ.
    std::wstring ExpandablePath() {
        DWORD type = 0;
        std::wstring text =
            RegGetString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", 0, &type).value_or(L"?");
        EXPECT_EQ(static_cast<DWORD>(REG_EXPAND_SZ), type) << "Path type";
        return text;
    }

    RegValueGuard m_guard{HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path"};
};

TEST_F(SystemEnvPath, AddAppendsOnceAndStoresExpandableText) {
    SetPath(L"C:\\Windows\\system32;C:\\Windows", REG_SZ);
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qmtools\\");
    EXPECT_EQ(L"C:\\Windows\\system32;C:\\Windows;C:\\Suite\\qmtools", ExpandablePath());
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qmtools");
    EXPECT_EQ(L"C:\\Windows\\system32;C:\\Windows;C:\\Suite\\qmtools", ExpandablePath());

    // Already present (other case, trailing backslash): only the type is repaired.
    SetPath(L"C:\\A;c:\\suite\\QM\\;C:\\B", REG_SZ);
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(L"C:\\A;c:\\suite\\QM\\;C:\\B", ExpandablePath());

    // Read as stored, never expanded.
    SetPath(L"%SystemRoot%\\system32;%SystemRoot%;");
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(L"%SystemRoot%\\system32;%SystemRoot%;C:\\Suite\\qm", ExpandablePath());
}

TEST_F(SystemEnvPath, RemoveTakesOutTheWholeEntryOnly) {
    SetPath(L"C:\\A;C:\\Suite\\qmtools;C:\\B");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qmtools\\");
    EXPECT_EQ(L"C:\\A;C:\\B", ExpandablePath());

    SetPath(L"C:\\A;C:\\Suite\\qm2;%ProgramFiles%\\X;C:\\B");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(L"C:\\A;C:\\Suite\\qm2;%ProgramFiles%\\X;C:\\B", ExpandablePath());
}

TEST_F(SystemEnvPath, AnUnreadableValueOrAnEmptyFolderChangesNothing) {
    RegRemoveValue(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path");
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qm");
    EXPECT_FALSE(RegHasValue(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path"));

    ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", 7));
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(7u, RegGetDword(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path").value_or(0));

    SetPath(L"C:\\A;;C:\\B;", REG_SZ);
    for (const wchar_t* folder : {static_cast<const wchar_t*>(nullptr), L"", L"\\"}) {
        SetQMInstallPathToSystemEnv(folder);
        RemoveQMInstallPathFromSystemEnv(folder);
    }
    DWORD type = 0;
    EXPECT_EQ(L"C:\\A;;C:\\B;",
              RegGetString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", 0, &type).value_or(L"?"));
    EXPECT_EQ(static_cast<DWORD>(REG_SZ), type);
}

TEST_F(SystemEnvPath, EveryChangeIsAnnounced) {
    SettingChangeListener listener;
    ASSERT_TRUE(listener.ready());
    SetPath(L"C:\\A");
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(1, listener.environmentChanges());
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(2, listener.environmentChanges());
}

}  // namespace
