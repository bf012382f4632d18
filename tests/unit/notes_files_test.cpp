// The Notes plug-in file operations on scratch folders: the copy with backup
// of a file in use (and its failure paths, driven through the platform seam),
// the backup name, the read-write test, the checked path joins, and the
// removal and completion walks, including their refusal of empty and
// relative folders.
#include <gtest/gtest.h>

#include <windows.h>

#include <algorithm>
#include <string>
#include <vector>

#include "cleanup/legacy_removal.h"
#include "notes/copy_with_backup.h"
#include "notes/notes_plugin_files.h"
#include "notes/plugin_file_lists.h"
#include "notes/plugin_paths.h"
#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"

namespace {

SYSTEMTIME TimeOf(WORD year, WORD month, WORD day, WORD hour, WORD minute, WORD second) {
    SYSTEMTIME t = {};
    t.wYear = year;
    t.wMonth = month;
    t.wDay = day;
    t.wHour = hour;
    t.wMinute = minute;
    t.wSecond = second;
    return t;
}

bool IsStagingName(const std::wstring& path) {
    return path.find(L"~qm") != std::wstring::npos;
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
        bool intoTarget = to != nullptr && flags == 0 && IsStagingName(from);
        bool moveBack = to != nullptr && std::wstring(from).find(L".bak") != std::wstring::npos;
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
    }

    // Names in the Notes scratch folder.
    std::vector<std::wstring> Listing() const { return ListDir(m_folder); }

    std::wstring m_folder;
    std::wstring m_source;
    std::wstring m_target;
    std::wstring m_backup;
};

}  // namespace

// --- Backup names and checked joins ------------------------------------------

TEST(BackupName, LocalTimeWithoutZeroPadding) {
    wchar_t name[MAX_PATH];
    ASSERT_TRUE(FormatBackupName(L"C:\\Notes\\qmnires.dll", TimeOf(2024, 3, 5, 14, 7, 9), name));
    EXPECT_STREQ(L"C:\\Notes\\qmnires.dll.2024.3.5.14.7.9.bak", name);
    ASSERT_TRUE(FormatBackupName(L"C:\\N\\a.dll", TimeOf(2025, 1, 1, 0, 0, 0), name));
    EXPECT_STREQ(L"C:\\N\\a.dll.2025.1.1.0.0.0.bak", name);
    ASSERT_TRUE(FormatBackupName(L"C:\\N\\a.dll", TimeOf(2024, 12, 31, 23, 59, 59), name));
    EXPECT_STREQ(L"C:\\N\\a.dll.2024.12.31.23.59.59.bak", name);

    // A name that would pass MAX_PATH is refused, never cut short.
    std::wstring longTarget = L"C:\\" + std::wstring(236, L'a');
    EXPECT_FALSE(FormatBackupName(longTarget.c_str(), TimeOf(2024, 12, 31, 23, 59, 59), name));
    EXPECT_STREQ(L"", name);
}

TEST(JoinFilePath, FailsInsteadOfCuttingShort) {
    wchar_t out[MAX_PATH];
    const std::wstring name = L"qmnires.dll";                 // 11 characters
    std::wstring folder = L"C:\\" + std::wstring(244, L'f');  // 247 characters
    ASSERT_TRUE(JoinFilePath(folder.c_str(), name.c_str(), out));
    EXPECT_EQ(259u, wcslen(out));
    EXPECT_EQ(folder + L"\\" + name, out);
    folder += L'g';  // 248 + 1 + 11 = 260: no room for the terminator
    EXPECT_FALSE(JoinFilePath(folder.c_str(), name.c_str(), out));
    EXPECT_STREQ(L"", out);

    ASSERT_TRUE(JoinFilePath(L"C:\\Notes\\", L"a.dll", out));
    EXPECT_STREQ(L"C:\\Notes\\a.dll", out);
    ASSERT_TRUE(JoinFilePath(L"C:\\", L"a.dll", out));
    EXPECT_STREQ(L"C:\\a.dll", out);
    ASSERT_TRUE(JoinFilePath(L"C:\\A", L"IBM\\x..y\\p.xml", out));

    // Nothing that could leave the folder, and no empty parts.
    for (const wchar_t* bad : {L"", L"..\\a.dll", L"x\\..\\a.dll", L"..", L"\\a.dll", L"D:a.dll"}) {
        EXPECT_FALSE(JoinFilePath(L"C:\\Notes", bad, out)) << bad;
    }
    EXPECT_FALSE(JoinFilePath(L"", L"a.dll", out));
    EXPECT_FALSE(JoinFilePath(nullptr, L"a.dll", out));
}

TEST_F(NotesFilesTest, OnlyFullPathsOfExistingFoldersAreUsable) {
    EXPECT_TRUE(IsUsableFolder(m_folder.c_str()));
    EXPECT_TRUE(IsUsableFolder(L"C:\\"));
    for (const wchar_t* bad : {L"", L".", L"C:", L"notes", L"\\"}) {
        EXPECT_FALSE(IsUsableFolder(bad)) << bad;
    }
    EXPECT_FALSE(IsUsableFolder(nullptr));
    EXPECT_FALSE(IsUsableFolder(m_source.c_str()));  // a file
    EXPECT_FALSE(IsUsableFolder((m_folder + L"\\missing").c_str()));
}

// --- Copy with backup ----------------------------------------------------------

TEST_F(NotesFilesTest, CopyCreatesOrReplacesAFreeTargetWithoutBackup) {
    EXPECT_TRUE(CopyFileWithBackup(m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("new content", ReadFileBytes(m_target));

    WriteFileBytes(m_target, "old");
    EXPECT_TRUE(CopyFileWithBackup(m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("new content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, Listing());
}

TEST_F(NotesFilesTest, TargetInUseIsRenamedToTimeStampedBackupAndReplaced) {
    WriteFileBytes(m_target, "old content");
    HeldOpen holder(m_target, kLikeALoadedLibrary);
    ASSERT_TRUE(holder.ok());

    SYSTEMTIME before;
    GetLocalTime(&before);
    ASSERT_TRUE(CopyFileWithBackup(m_source.c_str(), m_target.c_str(), FALSE));
    SYSTEMTIME after;
    GetLocalTime(&after);

    EXPECT_EQ("new content", ReadFileBytes(m_target));
    EXPECT_EQ("old content", holder.Read());  // the holder keeps its file
    std::vector<std::wstring> names = Listing();
    ASSERT_EQ(2u, names.size());
    std::wstring backupName = names[0] == L"qmnires.dll" ? names[1] : names[0];
    wchar_t early[MAX_PATH];
    wchar_t late[MAX_PATH];
    FormatBackupName(L"qmnires.dll", before, early);
    FormatBackupName(L"qmnires.dll", after, late);
    EXPECT_TRUE(backupName == early || backupName == late) << Narrow(backupName);
    const std::wstring backup = m_folder + L"\\" + backupName;
    EXPECT_EQ("old content", ReadFileBytes(backup));
    EXPECT_TRUE(IsPendingDelete(backup));
}

TEST_F(NotesFilesTest, TargetThatCannotBeRenamedStaysAsItWas) {
    WriteFileBytes(m_target, "old content");
    HeldOpen holder(m_target, FILE_SHARE_READ);
    ASSERT_TRUE(holder.ok());
    EXPECT_FALSE(CopyFileWithBackup(m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, Listing());
}

TEST_F(NotesFilesTest, FailedReplacementMovesTheOriginalBack) {
    WriteFileBytes(m_target, "old content");
    HeldOpen holder(m_target, kLikeALoadedLibrary);
    ScriptedPlatform platform;
    platform.failStagingIntoTarget = true;
    EXPECT_FALSE(CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, Listing());
    EXPECT_FALSE(IsPendingDelete(m_backup));
}

TEST_F(NotesFilesTest, OriginalThatCannotBeMovedBackStaysAsUnscheduledBackup) {
    WriteFileBytes(m_target, "old content");
    HeldOpen holder(m_target, kLikeALoadedLibrary);
    ScriptedPlatform platform;
    platform.failStagingIntoTarget = true;
    platform.failMoveBack = true;
    EXPECT_FALSE(CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_backup));
    EXPECT_FALSE(IsPendingDelete(m_backup));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll.2025.1.1.0.0.0.bak"}, Listing());
}

TEST_F(NotesFilesTest, CopyFailingPartWayNeverTouchesTheTarget) {
    WriteFileBytes(m_source, std::string(4096, 'n'));
    WriteFileBytes(m_target, "old content");
    ScriptedPlatform platform;
    platform.copyStopsPartWay = true;
    EXPECT_FALSE(CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, Listing());
    EXPECT_EQ(0, platform.renamesTried);
}

TEST_F(NotesFilesTest, FileUnderTheBackupNameIsNeverReplaced) {
    WriteFileBytes(m_target, "old content");
    HeldOpen holder(m_target, kLikeALoadedLibrary);
    ScriptedPlatform platform;
    WriteFileBytes(m_backup, "someone else's");
    EXPECT_FALSE(CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ("someone else's", ReadFileBytes(m_backup));
    EXPECT_EQ(2u, Listing().size());

    // Not even an earlier backup of this target that is slated for deletion:
    // had the original to stay under that name, the restart would delete it.
    ASSERT_TRUE(MoveFileExW(m_backup.c_str(), nullptr, MOVEFILE_DELAY_UNTIL_REBOOT));
    EXPECT_FALSE(CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ("someone else's", ReadFileBytes(m_backup));
    EXPECT_EQ(2u, Listing().size());

    // A second later the name is free again.
    platform.now.wSecond = 1;
    EXPECT_TRUE(CopyFileWithBackup(platform, m_source.c_str(), m_target.c_str(), FALSE));
    EXPECT_EQ("new content", ReadFileBytes(m_target));
    EXPECT_EQ("old content", ReadFileBytes(m_target + L".2025.1.1.0.0.1.bak"));
}

TEST_F(NotesFilesTest, FailIfExistsAndMissingSourceLeaveTheTarget) {
    WriteFileBytes(m_target, "old content");
    HeldOpen holder(m_target, kLikeALoadedLibrary);
    EXPECT_FALSE(CopyFileWithBackup(m_source.c_str(), m_target.c_str(), TRUE));
    const std::wstring missing = m_scratch.Sub(L"suite") + L"\\missing.dll";
    EXPECT_FALSE(CopyFileWithBackup(missing.c_str(), m_target.c_str(), FALSE));
    EXPECT_FALSE(CopyFileWithBackup(nullptr, m_target.c_str(), FALSE));
    EXPECT_FALSE(CopyFileWithBackup(m_source.c_str(), nullptr, FALSE));
    EXPECT_EQ("old content", ReadFileBytes(m_target));
    EXPECT_EQ(std::vector<std::wstring>{L"qmnires.dll"}, Listing());

    const std::wstring fresh = m_folder + L"\\fresh.dll";
    EXPECT_TRUE(CopyFileWithBackup(m_source.c_str(), fresh.c_str(), TRUE));
    EXPECT_EQ("new content", ReadFileBytes(fresh));
}

// --- Read-write test -----------------------------------------------------------

TEST_F(NotesFilesTest, ReadWriteTest) {
    EXPECT_TRUE(IsFileAllowRW(m_source.c_str()));
    EXPECT_EQ("new content", ReadFileBytes(m_source));  // not truncated
    EXPECT_FALSE(IsFileAllowRW(nullptr));
    EXPECT_FALSE(IsFileAllowRW((m_folder + L"\\missing.xml").c_str()));
    HeldOpen exclusive(m_source, 0);
    ASSERT_TRUE(exclusive.ok());
    EXPECT_FALSE(IsFileAllowRW(m_source.c_str()));
}

// --- Walks over the file lists -------------------------------------------------

TEST_F(NotesFilesTest, CompletionCopiesOnlyMissingFilesAndStopsAtTheFirstFailure) {
    const std::wstring plugin = m_scratch.Sub(L"plugin", true);
    for (const wchar_t* name : kPluginFiles) {
        WriteFileBytes(plugin + L"\\" + name, "plugin");
        WriteFileBytes(m_folder + L"\\" + name, "present");
    }
    EXPECT_TRUE(CopyPluginRemainedFiles(m_folder.c_str(), plugin.c_str()));
    for (const wchar_t* name : kPluginFiles) {
        EXPECT_EQ("present", ReadFileBytes(m_folder + L"\\" + name));
    }

    // Missing in Notes: the 3rd and the 10th; missing in the plug-in folder: the 5th.
    DeleteFileW((m_folder + L"\\" + kPluginFiles[2]).c_str());
    DeleteFileW((m_folder + L"\\" + kPluginFiles[9]).c_str());
    DeleteFileW((m_folder + L"\\" + kPluginFiles[4]).c_str());
    DeleteFileW((plugin + L"\\" + kPluginFiles[4]).c_str());
    EXPECT_FALSE(CopyPluginRemainedFiles(m_folder.c_str(), plugin.c_str()));
    EXPECT_EQ("plugin", ReadFileBytes(m_folder + L"\\" + kPluginFiles[2]));
    EXPECT_FALSE(FileExists(m_folder + L"\\" + kPluginFiles[4]));
    EXPECT_FALSE(FileExists(m_folder + L"\\" + kPluginFiles[9]));

    EXPECT_FALSE(CopyPluginRemainedFiles(L"", plugin.c_str()));
    EXPECT_FALSE(CopyPluginRemainedFiles(m_folder.c_str(), nullptr));
}

TEST_F(NotesFilesTest, EmptyOrRelativeFoldersAreRefusedByEveryWalk) {
    // The current folder holds plug-in files, as the program's own folder does.
    const std::wstring current = m_scratch.Sub(L"current", true);
    for (const wchar_t* name : kPluginFiles) {
        WriteFileBytes(current + L"\\" + name, "keep");
    }
    for (const wchar_t* name : kOldPluginFiles) {
        WriteFileBytes(current + L"\\" + name, "keep");
    }
    WriteFileBytes(current + L"\\a_upd_temp", "keep");
    wchar_t saved[MAX_PATH];
    GetCurrentDirectoryW(MAX_PATH, saved);
    ASSERT_TRUE(SetCurrentDirectoryW(current.c_str()));
    const std::vector<std::wstring> before = ListDir(current);
    const std::wstring suite = m_scratch.Sub(L"suite");
    for (const wchar_t* folder : {L"", L".", L"C:", L"sub"}) {
        EXPECT_FALSE(RemoveNotesPluginFiles(folder)) << folder;
        EXPECT_FALSE(RemoveOldNotesPluginFiles(folder)) << folder;
        EXPECT_FALSE(DeleteInstallFolder(folder)) << folder;
        EXPECT_FALSE(RemoveFilesSpecPostfix(folder, L"*_upd_temp")) << folder;
        EXPECT_FALSE(CopyNotesPluginFiles(folder, suite.c_str())) << folder;
        EXPECT_FALSE(CopyNotesPluginFiles(suite.c_str(), folder)) << folder;
    }
    EXPECT_FALSE(RemoveNotesPluginFiles(nullptr));
    EXPECT_FALSE(CopyNotesPluginFiles(nullptr, suite.c_str()));
    SetCurrentDirectoryW(saved);
    EXPECT_EQ(before, ListDir(current));
    for (const std::wstring& name : ListDir(current)) {
        EXPECT_EQ("keep", ReadFileBytes(current + L"\\" + name));
    }
}

TEST_F(NotesFilesTest, OldFilesInUseAreDeletedAtRestart) {
    for (const wchar_t* name : kOldPluginFiles) {
        WriteFileBytes(m_folder + L"\\" + name, "old");
    }
    WriteFileBytes(m_folder + L"\\notes.ini", "user's");
    const std::wstring busy = m_folder + L"\\nwmsgctl.dll";
    {
        HeldOpen holder(busy, FILE_SHARE_READ);
        ASSERT_TRUE(holder.ok());
        EXPECT_TRUE(RemoveOldNotesPluginFiles(m_folder.c_str()));
    }
    EXPECT_EQ((std::vector<std::wstring>{L"notes.ini", L"nwmsgctl.dll"}), Listing());
    EXPECT_TRUE(IsPendingDelete(busy));
}

TEST_F(NotesFilesTest, OldInstallFolderGoesWhenNothingForeignRemains) {
    const std::wstring old = m_scratch.Sub(L"oldni", true);
    for (const wchar_t* name : kOldPluginFiles) {
        WriteFileBytes(old + L"\\" + name, "old");
    }
    for (const wchar_t* name : kOldInstallExtraFiles) {
        WriteFileBytes(old + L"\\" + name, "old");
    }
    WriteFileBytes(old + L"\\readme.txt", "foreign");
    EXPECT_TRUE(DeleteInstallFolder(old.c_str()));
    EXPECT_EQ(std::vector<std::wstring>{L"readme.txt"}, ListDir(old));
    DeleteFileW((old + L"\\readme.txt").c_str());
    EXPECT_TRUE(DeleteInstallFolder(old.c_str()));
    EXPECT_FALSE(DirExists(old));
    EXPECT_FALSE(DeleteInstallFolder(old.c_str()));
}

TEST_F(NotesFilesTest, PatternRemovalDeletesMatchingFilesOnly) {
    WriteFileBytes(m_folder + L"\\a_upd_temp", "x");
    WriteFileBytes(m_folder + L"\\b_upd_temp", "x");
    WriteFileBytes(m_folder + L"\\b.txt", "keep");
    MakeDirs(m_folder + L"\\d_upd_temp");
    WriteFileBytes(m_scratch.Sub(L"c_upd_temp"), "outside");
    EXPECT_TRUE(RemoveFilesSpecPostfix(m_folder.c_str(), L"*_upd_temp"));
    EXPECT_EQ((std::vector<std::wstring>{L"b.txt", L"d_upd_temp"}), Listing());
    EXPECT_TRUE(RemoveFilesSpecPostfix(m_folder.c_str(), L"*.none"));  // nothing matched

    // A pattern reaching into another folder is refused.
    EXPECT_FALSE(RemoveFilesSpecPostfix(m_folder.c_str(), L"..\\*_upd_temp"));
    EXPECT_TRUE(FileExists(m_scratch.Sub(L"c_upd_temp")));
    EXPECT_FALSE(RemoveFilesSpecPostfix(m_folder.c_str(), nullptr));
}

TEST_F(NotesFilesTest, UpdateTemporaryFolderCleanup) {
    const std::wstring install = m_scratch.Sub(L"qm", true);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", install));
    const std::wstring upd = install + L"\\upd_temp";
    WriteFileBytes(upd + L"\\a_upd_temp", "x");
    WriteFileBytes(upd + L"\\components\\c_upd_temp", "x");
    WriteFileBytes(upd + L"\\components\\b.txt", "keep");
    WriteFileBytes(upd + L"\\chrome\\h_upd_temp", "x");
    WriteFileBytes(install + L"\\qmniupd.exe_upd_temp.exe", "x");
    WriteFileBytes(install + L"\\x_upd_temp", "x");
    WriteFileBytes(install + L"\\qmniupd.exe", "keep");

    RemoveUpdTempFolder();
    EXPECT_EQ(std::vector<std::wstring>{L"components"}, ListDir(upd));
    EXPECT_EQ(std::vector<std::wstring>{L"b.txt"}, ListDir(upd + L"\\components"));
    EXPECT_EQ((std::vector<std::wstring>{L"qmniupd.exe", L"upd_temp"}), ListDir(install));

    DeleteFileW((upd + L"\\components\\b.txt").c_str());
    RemoveUpdTempFolder();
    EXPECT_FALSE(DirExists(upd));
    EXPECT_EQ(std::vector<std::wstring>{L"qmniupd.exe"}, ListDir(install));

    // An empty or relative install path touches nothing.
    for (const wchar_t* bad : {L"", L"."}) {
        WriteFileBytes(install + L"\\y_upd_temp", "x");
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", bad));
        wchar_t saved[MAX_PATH];
        GetCurrentDirectoryW(MAX_PATH, saved);
        SetCurrentDirectoryW(install.c_str());
        RemoveUpdTempFolder();
        SetCurrentDirectoryW(saved);
        EXPECT_TRUE(FileExists(install + L"\\y_upd_temp")) << bad;
    }
}
