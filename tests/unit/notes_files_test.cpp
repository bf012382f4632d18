// The Notes plug-in file operations on scratch folders: the failure paths of
// the copy with backup (driven through the platform seam), the backup name,
// the read-write test, and the walks that the keyword runs do not reach.
#include <gtest/gtest.h>

#include <windows.h>

#include <string>
#include <vector>

#include "cleanup/legacy_removal.h"
#include "notes/copy_with_backup.h"
#include "notes/notes_plugin_files.h"
#include "notes/plugin_file_lists.h"
#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"

namespace {

SYSTEMTIME TimeOf(WORD year, WORD month, WORD day, WORD hour, WORD minute, WORD second) {
    return SYSTEMTIME{year, month, 0, day, hour, minute, second, 0};
}

// Writes each of `names` into folder with the same content.
template <size_t N>
void Fill(const std::wstring& folder, const wchar_t* const (&names)[N], const char* content) {
    for (const wchar_t* name : names) {
        WriteFileBytes(folder + L"\\" + name, content);
    }
}

// The real calls, with a fixed clock and single steps made to fail.
class ScriptedPlatform : public FileCopyPlatform {
public:
    SYSTEMTIME now = TimeOf(2025, 1, 1, 0, 0, 0);
    bool failStagingIntoTarget = false;  // the step after the rename-aside
    bool failMoveBack = false;
    bool copyStopsPartWay = false;
    int renamesTried = 0;

    BOOL CopyOne(const wchar_t* from, const wchar_t* to, BOOL failIfExists) override {
        if (copyStopsPartWay) {
            std::string bytes = ReadFileBytes(from);
            WriteFileBytes(to, bytes.substr(0, bytes.size() / 2));
            SetLastError(ERROR_HANDLE_DISK_FULL);
            return FALSE;
        }
        return FileCopyPlatform::CopyOne(from, to, failIfExists);
    }
    BOOL Rename(const wchar_t* from, const wchar_t* to, DWORD flags) override {
        ++renamesTried;
        const std::wstring source = from;
        bool intoTarget = to != nullptr && flags == 0 && source.find(L"~qm") != std::wstring::npos;
        bool moveBack = to != nullptr && source.find(L".bak") != std::wstring::npos;
        if ((failStagingIntoTarget && intoTarget) || (failMoveBack && moveBack)) {
            SetLastError(ERROR_ACCESS_DENIED);
            return FALSE;
        }
        return FileCopyPlatform::Rename(from, to, flags);
    }
    void Now(SYSTEMTIME* localTime) override { *localTime = now; }
};

class NotesFilesTest : public MachineTest {
protected:
    NotesFilesTest()
        : m_folder(m_scratch.Sub(L"notes", true)),
          m_source(m_scratch.Sub(L"suite", true) + L"\\qmnires.dll"),
          m_target(m_folder + L"\\qmnires.dll"),
          m_backup(m_target + L".2025.1.1.0.0.0.bak") {
        WriteFileBytes(m_source, "new content");
        WriteFileBytes(m_target, "old content");
    }

    // A copy over the target as a running Notes holds it, through `platform`.
    bool CopyOverLoadedTarget(ScriptedPlatform& platform) {
        HeldOpen holder(m_target, kLikeALoadedLibrary);
        EXPECT_TRUE(holder.ok());
        return CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE);
    }
    std::vector<std::wstring> Listing() const { return ListDir(m_folder); }

    std::wstring m_folder;
    std::wstring m_source;
    std::wstring m_target;
    std::wstring m_backup;
};

}  // namespace

TEST(BackupName, LocalTimeWithoutZeroPadding) {
    wchar_t name[MAX_PATH];
    ASSERT_TRUE(FormatBackupName(L"C:\\Notes\\qmnires.dll", TimeOf(2024, 3, 5, 14, 7, 9), name));
    EXPECT_STREQ(L"C:\\Notes\\qmnires.dll.2024.3.5.14.7.9.bak", name);
    ASSERT_TRUE(FormatBackupName(L"C:\\N\\a.dll", TimeOf(2025, 1, 1, 0, 0, 0), name));
    EXPECT_STREQ(L"C:\\N\\a.dll.2025.1.1.0.0.0.bak", name);
    // A name that would pass MAX_PATH is refused, never cut short.
    std::wstring longTarget = L"C:\\" + std::wstring(236, L'a');
    EXPECT_FALSE(FormatBackupName(longTarget.c_str(), TimeOf(2024, 12, 31, 23, 59, 59), name));
    EXPECT_STREQ(L"", name);
}

TEST_F(NotesFilesTest, FailedCopiesNeverLoseTheOriginal) {
    ScriptedPlatform platform;
    platform.copyStopsPartWay = true;  // a disk that fills up: the target is never touched
    EXPECT_FALSE(CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, Listing());
    EXPECT_EQ(0, platform.renamesTried);

    // The new copy cannot take the target's place: the original is moved back.
    platform.copyStopsPartWay = false;
    platform.failStagingIntoTarget = true;
    EXPECT_FALSE(CopyOverLoadedTarget(platform));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, Listing());
    EXPECT_FALSE(IsPendingDelete(m_backup));

    // Even the move back fails: the original stays under its backup name,
    // not slated for deletion.
    platform.failMoveBack = true;
    EXPECT_FALSE(CopyOverLoadedTarget(platform));
    EXPECT_EQ("old content", ReadFileBytes(m_backup));
    EXPECT_FALSE(IsPendingDelete(m_backup));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll.2025.1.1.0.0.0.bak"}, Listing());
}

TEST_F(NotesFilesTest, FileUnderTheBackupNameIsNeverReplaced) {
    ScriptedPlatform platform;
    WriteFileBytes(m_backup, "someone else's");
    EXPECT_FALSE(CopyOverLoadedTarget(platform));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ("someone else's", ReadFileBytes(m_backup));

    // Not even an earlier backup slated for deletion: had the original to
    // stay under that name, the restart would delete it.
    ASSERT_TRUE(MoveFileExW(m_backup.c_str(), nullptr, MOVEFILE_DELAY_UNTIL_REBOOT));
    EXPECT_FALSE(CopyOverLoadedTarget(platform));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ("someone else's", ReadFileBytes(m_backup));
    EXPECT_EQ(2u, Listing().size());

    platform.now.wSecond = 1;  // a second later the name is free
    EXPECT_TRUE(CopyOverLoadedTarget(platform));
    EXPECT_EQ("new content", ReadFileBytes(m_target));
    EXPECT_EQ("old content", ReadFileBytes(m_target + L".2025.1.1.0.0.1.bak"));
    EXPECT_TRUE(IsPendingDelete(m_target + L".2025.1.1.0.0.1.bak"));
}

TEST_F(NotesFilesTest, ReadWriteTestNeverTruncates) {
    EXPECT_TRUE(IsFileAllowRW(m_source.c_str()));
    EXPECT_EQ("new content", ReadFileBytes(m_source));
    EXPECT_FALSE(IsFileAllowRW((m_folder + L"\\missing.xml").c_str()));
    HeldOpen exclusive(m_source, 0);
    ASSERT_TRUE(exclusive.ok());
    EXPECT_FALSE(IsFileAllowRW(m_source.c_str()));
}

TEST_F(NotesFilesTest, CompletionCopiesOnlyMissingFilesAndStopsAtTheFirstFailure) {
    const std::wstring plugin = m_scratch.Sub(L"plugin", true);
    Fill(plugin, kPluginFiles, "plugin");
    Fill(m_folder, kPluginFiles, "present");
    // Missing in Notes: the 3rd, 5th and 10th; missing in the plug-in folder: the 5th.
    for (int i : {2, 4, 9}) {
        DeleteFileW((m_folder + L"\\" + kPluginFiles[i]).c_str());
    }
    DeleteFileW((plugin + L"\\" + kPluginFiles[4]).c_str());
    EXPECT_FALSE(CopyPluginRemainedFiles(m_folder.c_str(), plugin.c_str()));
    EXPECT_EQ("plugin", ReadFileBytes(m_folder + L"\\" + kPluginFiles[2]));
    EXPECT_EQ("present", ReadFileBytes(m_folder + L"\\" + kPluginFiles[3]));
    EXPECT_FALSE(FileExists(m_folder + L"\\" + kPluginFiles[4]));
    EXPECT_FALSE(FileExists(m_folder + L"\\" + kPluginFiles[9]));

    WriteFileBytes(plugin + L"\\" + kPluginFiles[4], "plugin");
    EXPECT_TRUE(CopyPluginRemainedFiles(m_folder.c_str(), plugin.c_str()));
    EXPECT_EQ("plugin", ReadFileBytes(m_folder + L"\\" + kPluginFiles[9]));
    EXPECT_EQ("present", ReadFileBytes(m_folder + L"\\" + kPluginFiles[3]));
}

TEST_F(NotesFilesTest, EmptyOrRelativeFoldersAreRefusedByEveryWalk) {
    // The current folder holds plug-in files, as the program's own folder does.
    const std::wstring current = m_scratch.Sub(L"current", true);
    Fill(current, kPluginFiles, "keep");
    Fill(current, kOldPluginFiles, "keep");
    WriteFileBytes(current + L"\\a_upd_temp", "keep");
    wchar_t saved[MAX_PATH];
    GetCurrentDirectoryW(MAX_PATH, saved);
    ASSERT_TRUE(SetCurrentDirectoryW(current.c_str()));
    const std::vector<std::wstring> before = ListDir(current);
    for (const wchar_t* folder : {L"", L".", L"C:", L"sub"}) {
        EXPECT_FALSE(RemoveNotesPluginFiles(folder)) << folder;
        EXPECT_FALSE(RemoveOldNotesPluginFiles(folder)) << folder;
        EXPECT_FALSE(DeleteInstallFolder(folder)) << folder;
        EXPECT_FALSE(RemoveFilesSpecPostfix(folder, L"*_upd_temp")) << folder;
        EXPECT_FALSE(CopyPluginRemainedFiles(folder, m_folder.c_str())) << folder;
        EXPECT_FALSE(CopyNotesPluginFiles(folder, m_folder.c_str())) << folder;
        EXPECT_FALSE(CopyNotesPluginFiles(m_folder.c_str(), folder)) << folder;
    }
    SetCurrentDirectoryW(saved);
    EXPECT_EQ(before, ListDir(current));
}

TEST_F(NotesFilesTest, OldInstallFolderWithAForeignFileStays) {
    Fill(m_folder, kOldPluginFiles, "old");
    Fill(m_folder, kOldInstallExtraFiles, "old");
    EXPECT_TRUE(DeleteInstallFolder(m_folder.c_str()));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, Listing());
}

TEST_F(NotesFilesTest, PatternRemovalDeletesMatchingFilesOnly) {
    WriteFileBytes(m_folder + L"\\a_upd_temp", "x");
    WriteFileBytes(m_folder + L"\\b.txt", "keep");
    MakeDirs(m_folder + L"\\d_upd_temp");
    WriteFileBytes(m_scratch.Sub(L"c_upd_temp"), "outside");
    EXPECT_TRUE(RemoveFilesSpecPostfix(m_folder.c_str(), L"*_upd_temp"));
    EXPECT_EQ((std::vector<std::wstring>{L"b.txt", L"d_upd_temp", L"qmnires.dll"}), Listing());
    // A pattern reaching into another folder is refused.
    EXPECT_FALSE(RemoveFilesSpecPostfix(m_folder.c_str(), L"..\\*_upd_temp"));
    EXPECT_TRUE(FileExists(m_scratch.Sub(L"c_upd_temp")));
}

TEST_F(NotesFilesTest, UpdateTemporaryFolderCleanupRefusesAnEmptyOrRelativeInstallPath) {
    WriteFileBytes(m_folder + L"\\x_upd_temp", "x");
    WriteFileBytes(m_folder + L"\\upd_temp\\a_upd_temp", "x");
    wchar_t saved[MAX_PATH];
    GetCurrentDirectoryW(MAX_PATH, saved);
    ASSERT_TRUE(SetCurrentDirectoryW(m_folder.c_str()));
    for (const wchar_t* bad : {L"", L"."}) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", bad));
        RemoveUpdTempFolder();
        EXPECT_EQ((std::vector<std::wstring>{L"qmnires.dll", L"upd_temp", L"x_upd_temp"}),
                  Listing());
        EXPECT_TRUE(FileExists(m_folder + L"\\upd_temp\\a_upd_temp")) << bad;
    }
    SetCurrentDirectoryW(saved);
}
