// The Eclipse configuration stamp of a folder.
#include <windows.h>
#include <gtest/gtest.h>

#include "notes/config_stamp.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"

namespace {

class ConfigStamp : public ::testing::Test {
protected:
    std::wstring Config(const wchar_t* name) const { return JoinPath(m_config, name); }

    ScratchDir m_scratch{L"stamp"};
    std::wstring m_config = m_scratch.Sub(L"configuration\\org.eclipse.update", true);
};

TEST_F(ConfigStamp, TheStampReplacesAnOlderBackup) {
    ASSERT_TRUE(WriteFileBytes(Config(L"last.config.stamp"), "new"));
    ASSERT_TRUE(WriteFileBytes(Config(L"last.config.stamp.bak"), "old"));
    RenameConfigStamp(m_config.c_str());
    EXPECT_FALSE(FileExists(Config(L"last.config.stamp")));
    EXPECT_EQ("new", ReadFileBytes(Config(L"last.config.stamp.bak")));
}

TEST_F(ConfigStamp, WithoutAStampTheOldBackupGoes) {
    ASSERT_TRUE(WriteFileBytes(Config(L"last.config.stamp.bak"), "old"));
    ASSERT_TRUE(WriteFileBytes(Config(L"platform.xml"), "<config/>"));
    RenameConfigStamp(m_config.c_str());
    EXPECT_EQ(std::vector<std::wstring>{L"platform.xml"}, ListDir(m_config));
}

TEST_F(ConfigStamp, AnInstallationFolderResetsItsUpdateConfiguration) {
    ASSERT_TRUE(WriteFileBytes(Config(L"last.config.stamp"), "s"));
    ResetEclipseConfigStamp(m_scratch.path().c_str());
    EXPECT_EQ(std::vector<std::wstring>{L"last.config.stamp.bak"}, ListDir(m_config));

    // A folder without that configuration: nothing happens anywhere.
    std::wstring other = m_scratch.Sub(L"other", true);
    ASSERT_TRUE(WriteFileBytes(JoinPath(other, L"last.config.stamp"), "s"));
    ResetEclipseConfigStamp(other.c_str());
    EXPECT_TRUE(FileExists(JoinPath(other, L"last.config.stamp")));
}

TEST_F(ConfigStamp, AnEmptyFolderNameIsRefused) {
    // The current folder must not be touched for a failed lookup.
    wchar_t current[MAX_PATH] = {};
    GetCurrentDirectoryW(MAX_PATH, current);
    ASSERT_TRUE(SetCurrentDirectoryW(m_config.c_str()));
    ASSERT_TRUE(WriteFileBytes(Config(L"last.config.stamp"), "s"));
    RenameConfigStamp(L"");
    ResetEclipseConfigStamp(L"");
    RenameConfigStamp(nullptr);
    SetCurrentDirectoryW(current);
    EXPECT_TRUE(FileExists(Config(L"last.config.stamp")));
}

}  // namespace
