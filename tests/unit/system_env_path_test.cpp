// The suite folder in the machine-wide "Path", through the real registry value.
#include <gtest/gtest.h>

#include <string>

#include "cleanup/system_env_path.h"
#include "tests/support/registry_util.h"
#include "tests/support/setting_change_listener.h"

namespace {

const wchar_t kEnvironment[] = L"SYSTEM\\CurrentControlSet\\Control\\Session Manager\\Environment";

class SystemEnvPath : public ::testing::Test {
protected:
    void SetPath(const std::wstring& text, DWORD type = REG_EXPAND_SZ) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kEnvironment, L"Path", text, 0, type));
    }
    std::wstring PathText(DWORD* type = nullptr) {
        return RegGetString(HKEY_LOCAL_MACHINE, kEnvironment, L"Path", 0, type)
            .value_or(L"<missing>");
    }

    RegValueGuard m_guard{HKEY_LOCAL_MACHINE, kEnvironment, L"Path"};
};

TEST_F(SystemEnvPath, AddAppendsTheFolderAsExpandableText) {
    SetPath(L"C:\\Windows\\system32;C:\\Windows", REG_SZ);
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qmtools\\");
    DWORD type = 0;
    EXPECT_EQ(L"C:\\Windows\\system32;C:\\Windows;C:\\Suite\\qmtools", PathText(&type));
    EXPECT_EQ(static_cast<DWORD>(REG_EXPAND_SZ), type);

    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qmtools");
    EXPECT_EQ(L"C:\\Windows\\system32;C:\\Windows;C:\\Suite\\qmtools", PathText());
}

TEST_F(SystemEnvPath, AddKeepsVariablesUnexpanded) {
    SetPath(L"%SystemRoot%\\system32;%SystemRoot%;");
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(L"%SystemRoot%\\system32;%SystemRoot%;C:\\Suite\\qm", PathText());
}

TEST_F(SystemEnvPath, AddWhenPresentOnlyRepairsTheType) {
    SetPath(L"C:\\A;c:\\suite\\QM\\;C:\\B", REG_SZ);
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    DWORD type = 0;
    EXPECT_EQ(L"C:\\A;c:\\suite\\QM\\;C:\\B", PathText(&type));
    EXPECT_EQ(static_cast<DWORD>(REG_EXPAND_SZ), type);
}

TEST_F(SystemEnvPath, AddIsNotFooledByALongerEntry) {
    SetPath(L"C:\\A;C:\\Suite\\qm2");
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(L"C:\\A;C:\\Suite\\qm2;C:\\Suite\\qm", PathText());
}

TEST_F(SystemEnvPath, RemoveTakesOutTheWholeEntryOnly) {
    SetPath(L"C:\\A;C:\\Suite\\qmtools;C:\\B");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qmtools\\");
    EXPECT_EQ(L"C:\\A;C:\\B", PathText());

    SetPath(L"C:\\A;C:\\Suite\\qm2;%ProgramFiles%\\X;C:\\B");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qm");
    DWORD type = 0;
    EXPECT_EQ(L"C:\\A;C:\\Suite\\qm2;%ProgramFiles%\\X;C:\\B", PathText(&type));
    EXPECT_EQ(static_cast<DWORD>(REG_EXPAND_SZ), type);
}

TEST_F(SystemEnvPath, RemoveTakesOutTheOnlyEntry) {
    SetPath(L"C:\\Suite\\qmtools");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qmtools");
    EXPECT_EQ(L"", PathText());
}

TEST_F(SystemEnvPath, AnUnreadableValueIsNeverWritten) {
    RegRemoveValue(HKEY_LOCAL_MACHINE, kEnvironment, L"Path");
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qm");
    EXPECT_FALSE(RegHasValue(HKEY_LOCAL_MACHINE, kEnvironment, L"Path"));

    ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kEnvironment, L"Path", 7));
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(7u, RegGetDword(HKEY_LOCAL_MACHINE, kEnvironment, L"Path").value_or(0));
}

TEST_F(SystemEnvPath, AnEmptyOrMissingFolderChangesNothing) {
    SetPath(L"C:\\A;;C:\\B;", REG_SZ);
    for (const wchar_t* folder : {static_cast<const wchar_t*>(nullptr), L"", L"\\"}) {
        SetQMInstallPathToSystemEnv(folder);
        RemoveQMInstallPathFromSystemEnv(folder);
    }
    DWORD type = 0;
    EXPECT_EQ(L"C:\\A;;C:\\B;", PathText(&type));
    EXPECT_EQ(static_cast<DWORD>(REG_SZ), type);
}

TEST_F(SystemEnvPath, RestoreRewritesOnlyPlainText) {
    SetPath(L"%SystemRoot%;C:\\A", REG_SZ);
    RestoreSysEnvironment();
    DWORD type = 0;
    EXPECT_EQ(L"%SystemRoot%;C:\\A", PathText(&type));
    EXPECT_EQ(static_cast<DWORD>(REG_EXPAND_SZ), type);
}

TEST_F(SystemEnvPath, EveryChangeIsAnnounced) {
    SettingChangeListener listener;
    ASSERT_TRUE(listener.ready());
    RefreshSysEnv();
    EXPECT_EQ(1, listener.environmentChanges());

    SetPath(L"C:\\A");
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(2, listener.environmentChanges());
    RemoveQMInstallPathFromSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(3, listener.environmentChanges());
    // Present and already expandable: nothing to write, nothing to announce.
    SetPath(L"C:\\A;C:\\Suite\\qm");
    SetQMInstallPathToSystemEnv(L"C:\\Suite\\qm");
    EXPECT_EQ(3, listener.environmentChanges());
}

}  // namespace
