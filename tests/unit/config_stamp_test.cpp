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
    EXPECT_EQ(std::vector<std::wstring>{L"last.config.stamp.bak"}, ListDir(m_config));
    EXPECT_EQ("new", ReadFileBytes(Config(L"last.config.stamp.bak")));

    // Without a stamp the old backup goes all the same.
    RenameConfigStamp(m_config.c_str());
    EXPECT_EQ(std::vector<std::wstring>{}, ListDir(m_config));
}

TEST_F(ConfigStamp, AnEmptyFolderNameIsRefused) {
    // A failed lookup must not reset the stamp of the current folder.
    wchar_t current[MAX_PATH] = {};
    GetCurrentDirectoryW(MAX_PATH, current);
    ASSERT_TRUE(SetCurrentDirectoryW(m_config.c_str()));
    ASSERT_TRUE(WriteFileBytes(Config(L"last.config.stamp"), "s"));
    RenameConfigStamp(L"");
    RenameConfigStamp(nullptr);
    ResetEclipseConfigStamp(L"");
    SetCurrentDirectoryW(current);
    EXPECT_TRUE(FileExists(Config(L"last.config.stamp")));
}

}  // namespace
