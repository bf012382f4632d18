// The Notes plug-in file operations the keyword runs cannot drive: the
// failure paths of the copy with backup (through its platform seam), the
// backup name, and the old install folder with a foreign file.

#include "notes/copy_with_backup.h"
#include "notes/notes_plugin_files.h"
#include "notes/plugin_file_lists.h"
#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"

namespace {

// The real calls, with a fixed clock and single steps made to fail.
class ScriptedPlatform : public FileCopyPlatform {
public:
    SYSTEMTIME now = {2025, 1, 0, 1, 0, 0, 0, 0};
    bool copyStopsPartWay = false;
    bool failStagingIntoTarget = false;  // the step after the rename-aside
    bool failMoveBack = false;

    BOOL CopyOne(const wchar_t* from, const wchar_t* to, BOOL failIfExists) override {
        if (copyStopsPartWay) {  // a disk that fills up
            WriteFileBytes(to, ReadFileBytes(from).substr(0, 3));
            SetLastError(ERROR_HANDLE_DISK_FULL);
            return FALSE;
        }
        return FileCopyPlatform::CopyOne(from, to, failIfExists);
    }
    BOOL Rename(const wchar_t* from, const wchar_t* to, DWORD flags) override {
        const std::wstring source = from;
        if (to != nullptr &&
            ((failStagingIntoTarget && flags == 0 && source.find(L"~qm") != std::wstring::npos) ||
             (failMoveBack && source.find(L".bak") != std::wstring::npos))) {
            SetLastError(ERROR_ACCESS_DENIED);
            return FALSE;
        }
        return FileCopyPlatform::Rename(from, to, flags);
    }
    void Now(SYSTEMTIME* localTime) override { *localTime = now; }
};

class NotesFilesTest : public MachineTest {
protected:
    NotesFilesTest() {
        WriteFileBytes(m_source, "new content");
        WriteFileBytes(m_target, "old content");
    }
    // A copy over the target as a running Notes holds it.
    bool CopyOverLoadedTarget(ScriptedPlatform& platform) {
        HeldOpen holder(m_target, kLikeALoadedLibrary);
        EXPECT_TRUE(holder.ok());
        return CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE);
    }

    const std::wstring m_folder = m_scratch.Sub(L"notes", true);
    const std::wstring m_source = m_scratch.Sub(L"suite\\qmnires.dll");
    const std::wstring m_target = m_folder + L"\\qmnires.dll";
    const std::wstring m_backup = m_target + L".2025.1.1.0.0.0.bak";
};

TEST(BackupName, NeverCutShort) {
    wchar_t name[MAX_PATH];
    const std::wstring longTarget = L"C:\\" + std::wstring(236, L'a');
    EXPECT_FALSE(FormatBackupName(longTarget.c_str(), {2024, 12, 0, 31, 23, 59, 59, 0}, name));
    EXPECT_STREQ(L"", name);
}

TEST_F(NotesFilesTest, FailedCopiesNeverLoseTheOriginal) {
    ScriptedPlatform platform;
    platform.copyStopsPartWay = true;  // the target is never touched
    EXPECT_FALSE(CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, ListDir(m_folder));

    // The new copy cannot take the target's place: the original is moved back.
    platform.copyStopsPartWay = false;
    platform.failStagingIntoTarget = true;
    EXPECT_FALSE(CopyOverLoadedTarget(platform));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, ListDir(m_folder));

    // Even the move back fails: the original stays under its backup name,
    // not slated for deletion.
    platform.failMoveBack = true;
    EXPECT_FALSE(CopyOverLoadedTarget(platform));
    EXPECT_EQ("old content", ReadFileBytes(m_backup));
    EXPECT_FALSE(IsPendingDelete(m_backup));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll.2025.1.1.0.0.0.bak"}, ListDir(m_folder));
}

TEST_F(NotesFilesTest, OldInstallFolderWithAForeignFileStays) {
    for (const wchar_t* name : kOldPluginFiles) {
        WriteFileBytes(JoinPath(m_folder, name), "old");
    }
    for (const wchar_t* name : kOldInstallExtraFiles) {
        WriteFileBytes(JoinPath(m_folder, name), "old");
    }
    EXPECT_TRUE(DeleteInstallFolder(m_folder.c_str()));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, ListDir(m_folder));
}

}  // namespace
