// The Sametime file keywords run by the real program: copying the feature
// into the three client layouts, removing it at once or at the next restart,
// the configuration stamps, and the suite folder in the machine "Path".
#include "tests/e2e/sametime_machine.h"
#include "tests/support/setting_change_listener.h"

#include <memory>

using namespace sametime_test;

namespace {

// Folders of the layouts: Sametime 8 and the Notes data folder (embedded).
const wchar_t kST8Plugins[] = L"shared\\eclipse\\plugins";
const wchar_t kST8Features[] = L"shared\\eclipse\\features";
const wchar_t kDataPlugins[] = L"workspace\\applications\\eclipse\\plugins";
const wchar_t kDataFeatures[] = L"workspace\\applications\\eclipse\\features";
const wchar_t* const kOldRuntime[] = {L"msvcp90.dll", L"msvcr90.dll",
                                      L"Microsoft.VC90.CRT.manifest"};

std::wstring In(const std::wstring& base, const wchar_t* folder, const wchar_t* name) {
    return JoinPath(JoinPath(base, folder), name);
}

// The file holds what InstallSuite put into the suite's file of that name.
void ExpectFromSuite(const std::wstring& path) {
    EXPECT_EQ("suite:" + Narrow(path.substr(path.rfind(L'\\') + 1)), ReadFileBytes(path))
        << Narrow(path);
}

class SametimeFilesE2E : public SametimeMachine {
protected:
    std::wstring MachinePath() const {
        DWORD type = 0;
        std::wstring text = RegGetString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", 0, &type)
                                .value_or(L"<missing>");
        EXPECT_EQ(static_cast<DWORD>(REG_EXPAND_SZ), type) << "Path type";
        return text;
    }
    void SetMachinePath(const std::wstring& text) {
        ASSERT_TRUE(
            RegPutString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", text, 0, REG_EXPAND_SZ));
    }
};

TEST_F(SametimeFilesE2E, Sametime8AndEmbeddedLayoutsAreFilledAndCleared) {
    InstallSuite();
    InstallSametime(8);
    InstallNotes8();
    Put(In(m_sametime, kST8Plugins, L"other.jar"), "other");
    MakeDirs(JoinPath(m_sametime, kST8Features));
    MakeDirs(JoinPath(m_data, kDataPlugins));
    MakeDirs(JoinPath(m_data, kDataFeatures));
    for (const wchar_t* name : kOldRuntime) {  // left by an older install
        Put(In(m_sametime, L"rcp", name), "old");
        Put(In(m_notes, L"native", name), "old");
    }
    // A running client holds its native library.
    Put(In(m_sametime, L"rcp", kNativeLibrary), "running");
    auto loaded =
        std::make_unique<HeldOpen>(In(m_sametime, L"rcp", kNativeLibrary), kLikeALoadedLibrary);
    ASSERT_TRUE(loaded->ok());
    // An entry that merely starts with the suite folder is another folder.
    SetMachinePath(L"%SystemRoot%\\system32;" + m_suite + L"2;");
    SettingChangeListener listener;
    ASSERT_TRUE(listener.ready());

    RunResult run = Program().Run(L"-copyfilestosametime");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining("szSametimePath=" + Narrow(m_sametime)));
    EXPECT_TRUE(run.HasTraceContaining("szEmbeddedSTPath=" + Narrow(m_notes)));
    EXPECT_TRUE(run.HasTraceContaining("End Copy sametimeplugin files to sametime path!\n"));
    for (const std::wstring& path : {
             In(m_sametime, L"rcp", kNativeLibrary),
             In(m_sametime, L"rcp", kRuntimeC),
             In(m_sametime, L"rcp", L"msvcp120.dll"),
             In(m_sametime, kST8Plugins, kJar),
             In(m_sametime, kST8Features, kFeatureXml),
             // Embedded: the library into the Notes program folder, the rest into the data folder.
             JoinPath(m_notes, kNativeLibrary),
             In(m_data, kDataPlugins, kJar),
             In(m_data, kDataFeatures, kFeatureXml),
         }) {
        ExpectFromSuite(path);
    }
    // The locked library went aside, untouched: the 3 old and 3 new files and it.
    EXPECT_EQ(7u, ListDir(JoinPath(m_sametime, L"rcp")).size());
    EXPECT_EQ("running", loaded->Read());
    loaded.reset();
    EXPECT_EQ(L"%SystemRoot%\\system32;" + m_suite + L"2;" + m_suite, MachinePath());
    EXPECT_EQ(1, listener.environmentChanges());

    run = Program().Run(L"-delsametimefiles");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining("Delete Mirovan files from Embedded ST Path."));
    EXPECT_TRUE(run.HasTraceContaining("End Delete sametime plugin Files for QM Uninstall!\n"));
    // Only what the suite put there goes: the new runtime is shared and stays,
    // and so does the library set aside (it goes at the next restart).
    EXPECT_FALSE(FileExists(In(m_sametime, L"rcp", kNativeLibrary)));
    EXPECT_EQ(3u, ListDir(JoinPath(m_sametime, L"rcp")).size());
    ExpectFromSuite(In(m_sametime, L"rcp", kRuntimeC));
    ExpectFromSuite(In(m_sametime, L"rcp", L"msvcp120.dll"));
    EXPECT_EQ(std::vector<std::wstring>{L"other.jar"}, ListDir(JoinPath(m_sametime, kST8Plugins)));
    EXPECT_EQ((std::vector<std::wstring>{L"Data", L"native"}), ListDir(m_notes));
    for (const std::wstring& folder :
         {JoinPath(m_sametime, kST8Features), JoinPath(m_notes, L"native"),
          JoinPath(m_data, kDataPlugins), JoinPath(m_data, kDataFeatures)}) {
        EXPECT_EQ(std::vector<std::wstring>{}, ListDir(folder)) << Narrow(folder);
    }
    EXPECT_EQ(L"%SystemRoot%\\system32;" + m_suite + L"2", MachinePath());
}

TEST_F(SametimeFilesE2E, Sametime7LayoutAndAStopAtItsLockedLibrary) {
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Lotus\\Notes\\7.0"));
    const size_t pending = PendingDeleteCount();
    // Without Sametime Connect (and Notes below 8) nothing is scheduled.
    EXPECT_EQ(0, Program().Run(L"-delsametimefilesreboot").exitCode);
    EXPECT_EQ(pending, PendingDeleteCount());

    InstallSuite();
    DeleteFileW(JoinPath(m_suite, kRuntimeC).c_str());
    InstallSametime(0);  // no version: Sametime 7
    for (const wchar_t* folder : {L"native", L"plugins", L"features"}) {
        MakeDirs(JoinPath(m_sametime, folder));
    }
    SetMachinePath(L"C:\\A;" + m_suite + L"\\");
    RunResult run = Program().Run(L"-copyfilestosametime");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining(
        "CQMCommon::CopySametimePluginFiles: CopyFile MSVCR120_DLL Failed!\n"));
    // The C runtime comes first; without it the C++ runtime is not tried.
    EXPECT_EQ(std::vector<std::wstring>{kNativeLibrary}, ListDir(JoinPath(m_sametime, L"native")));
    ExpectFromSuite(In(m_sametime, L"plugins", kJar));
    ExpectFromSuite(In(m_sametime, L"features", kFeatureXml));
    EXPECT_FALSE(DirExists(JoinPath(m_sametime, L"rcp")));
    EXPECT_EQ(L"C:\\A;" + m_suite + L"\\", MachinePath());  // already there: unchanged

    EXPECT_EQ(0, Program().Run(L"-delsametimefilesreboot").exitCode);
    EXPECT_TRUE(IsPendingDelete(In(m_sametime, L"native", kNativeLibrary)));
    EXPECT_TRUE(IsPendingDelete(In(m_sametime, L"plugins", kJar)));
    EXPECT_EQ(pending + 2, PendingDeleteCount());

    HeldOpen locked(In(m_sametime, L"native", kNativeLibrary), FILE_SHARE_READ);
    ASSERT_TRUE(locked.ok());
    SetMachinePath(m_suite);
    run = Program().Run(L"-delsametimefilesEx");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_EQ(2u, CountOf(run.TraceText(),
                          "For disable sametime to delete sametime plugin Files "
                          "for QM Uninstall!\n"));
    EXPECT_TRUE(
        run.HasTraceContaining("CQMCommon::RemoveSametimePluginFiles: DeleteFile Failed!\n"));
    EXPECT_TRUE(FileExists(In(m_sametime, L"native", kNativeLibrary)));
    EXPECT_TRUE(FileExists(In(m_sametime, L"plugins", kJar)));
    EXPECT_TRUE(FileExists(In(m_sametime, L"features", kFeatureXml)));
    // The suite folder as the only entry stays: an empty machine Path is never written.
    EXPECT_EQ(m_suite, MachinePath());
    EXPECT_TRUE(run.HasTraceContaining("the Path would be empty, left as it is"));
}

TEST_F(SametimeFilesE2E, CopyNeverWritesForAFailedLookupAndRefreshWritesNothing) {
    // Sametime without a folder, Notes 8 without a program folder: the
    // lookups hand over empty folders, which must not become the drive root.
    InstallSuite();
    InstallSametime(8, L"");
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"DataPath", m_data));
    SetMachinePath(L"C:\\A");

    RunResult run = Program().Run(L"-copyfilestosametime");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_FALSE(run.crashed);
    for (const wchar_t* path : {L"C:\\qmmrvjni.dll", L"C:\\rcp", L"C:\\shared", L"C:\\workspace"}) {
        EXPECT_FALSE(FileExists(path) || DirExists(path)) << Narrow(path);
    }
    EXPECT_EQ(std::vector<std::wstring>{}, ListDir(m_data));
    EXPECT_EQ(L"C:\\A;" + m_suite, MachinePath());

    // The refresh keyword announces the environment and changes no value.
    SettingChangeListener listener;
    ASSERT_TRUE(listener.ready());
    EXPECT_EQ(0, Program().Run(L"-smsrefreshsysenv").exitCode);
    EXPECT_EQ(1, listener.environmentChanges());
    EXPECT_EQ(L"C:\\A;" + m_suite, MachinePath());
}

TEST_F(SametimeFilesE2E, RestartRemovalStampsAndThePerUserCopy) {
    InstallSuite();
    InstallSametime(8);
    InstallNotes8();
    const size_t pending = PendingDeleteCount();
    EXPECT_EQ(0, Program().Run(L"-delsametimefilesreboot").exitCode);
    const std::wstring stFeature = In(m_sametime, kST8Features, kFeatureXml);
    const std::wstring dataFeature = In(m_data, kDataFeatures, kFeatureXml);
    for (const std::wstring& path : {
             JoinPath(m_notes, kNativeLibrary),
             In(m_data, kDataPlugins, kJar),
             dataFeature,
             dataFeature.substr(0, dataFeature.rfind(L'\\')),
             In(m_sametime, L"rcp", kNativeLibrary),
             In(m_sametime, kST8Plugins, kJar),
             stFeature,
             stFeature.substr(0, stFeature.rfind(L'\\')),
         }) {
        EXPECT_TRUE(IsPendingDelete(path)) << Narrow(path);
    }
    EXPECT_EQ(pending + 8, PendingDeleteCount());

    const std::wstring stConfig = JoinPath(m_sametime, L"configuration\\org.eclipse.update");
    const std::wstring dataConfig = JoinPath(m_data, L"configuration\\org.eclipse.update");
    Put(JoinPath(stConfig, L"last.config.stamp"), "st-new");
    Put(JoinPath(stConfig, L"last.config.stamp.bak"), "st-old");
    Put(JoinPath(dataConfig, L"last.config.stamp"), "data-new");
    RunResult run = Program().Run(L"-delsametimestampfile");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining(
        "End Delete sametime last.config.stamp file for sametime install!\n"));
    EXPECT_EQ(std::vector<std::wstring>{L"last.config.stamp.bak"}, ListDir(stConfig));
    EXPECT_EQ("st-new", ReadFileBytes(JoinPath(stConfig, L"last.config.stamp.bak")));
    EXPECT_EQ("data-new", ReadFileBytes(JoinPath(dataConfig, L"last.config.stamp.bak")));

    // The per-user install: the data folder's feature files and its stamp again.
    MakeDirs(JoinPath(m_data, kDataPlugins));
    MakeDirs(JoinPath(m_data, kDataFeatures));
    Put(JoinPath(dataConfig, L"last.config.stamp"), "data-newer");
    EXPECT_EQ(0, Program().Run(L"-smsinstallsametimeex").exitCode);
    ExpectFromSuite(In(m_data, kDataPlugins, kJar));
    ExpectFromSuite(dataFeature);
    EXPECT_FALSE(FileExists(JoinPath(m_notes, kNativeLibrary)));  // not the program folder
    EXPECT_EQ(std::vector<std::wstring>{L"last.config.stamp.bak"}, ListDir(dataConfig));
    EXPECT_EQ("data-newer", ReadFileBytes(JoinPath(dataConfig, L"last.config.stamp.bak")));
}

}  // namespace
