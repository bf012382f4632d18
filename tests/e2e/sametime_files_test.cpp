// The Sametime file keywords run by the real program: copying the feature
// into the three client layouts, removing it at once or at the next restart,
// the configuration stamps, and the suite folder in the machine "Path".
#include "tests/e2e/sametime_machine.h"
#include "tests/support/setting_change_listener.h"

using namespace sametime_test;

namespace {

class SametimeFilesE2E : public SametimeMachine {
protected:
    // The old runtime and the feature of a previous install in a layout.
    void PutInstalledFeature(const std::wstring& native, const std::wstring& plugins,
                             const std::wstring& features) {
        for (const wchar_t* name :
             {kNativeLibrary, L"msvcp90.dll", L"msvcr90.dll", L"Microsoft.VC90.CRT.manifest"}) {
            Put(In(native, name), "old");
        }
        Put(In(plugins, kJar), "old");
        Put(In(In(features, kFeatureFolder), kFeatureXml), "old");
    }
};

TEST_F(SametimeFilesE2E, CopyFilesToSametimeFillsTheSametime8AndEmbeddedLayouts) {
    InstallSuite();
    InstallSametime(8);
    InstallNotes8();
    MakeDirs(In(m_sametime, L"rcp"));
    MakeDirs(In(m_sametime, L"shared\\eclipse\\plugins"));
    MakeDirs(In(m_sametime, L"shared\\eclipse\\features"));
    MakeDirs(In(m_data, L"workspace\\applications\\eclipse\\plugins"));
    MakeDirs(In(m_data, L"workspace\\applications\\eclipse\\features"));
    // A running client holds its native library like a loaded library.
    Put(In(m_sametime, L"rcp\\qmmrvjni.dll"), "running");
    HeldOpen loaded(In(m_sametime, L"rcp\\qmmrvjni.dll"), FILE_SHARE_READ | FILE_SHARE_DELETE);
    ASSERT_TRUE(loaded.ok());
    // An entry that merely starts with the suite folder is another folder.
    SetMachinePath(L"%SystemRoot%\\system32;" + m_suite + L"2;");
    SettingChangeListener listener;
    ASSERT_TRUE(listener.ready());

    RunResult run = Program().Run(L"-copyfilestosametime");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_FALSE(run.crashed);
    EXPECT_TRUE(run.HasTraceContaining("Start Copy sametimeplugin files to sametime path!\n"));
    EXPECT_TRUE(run.HasTraceContaining("szSametimePath=" + Narrow(m_sametime)));
    EXPECT_TRUE(run.HasTraceContaining("szEmbeddedSTPath=" + Narrow(m_notes)));
    EXPECT_TRUE(run.HasTraceContaining("End Copy sametimeplugin files to sametime path!\n"));
    for (const wchar_t* name : {kNativeLibrary, kRuntimeC, kRuntimeCpp}) {
        EXPECT_EQ(Origin("suite", name), ReadFileBytes(In(In(m_sametime, L"rcp"), name)));
    }
    EXPECT_EQ(Origin("suite", kJar),
              ReadFileBytes(In(In(m_sametime, L"shared\\eclipse\\plugins"), kJar)));
    EXPECT_EQ(Origin("suite", kFeatureXml),
              ReadFileBytes(In(In(In(m_sametime, L"shared\\eclipse\\features"), kFeatureFolder),
                               kFeatureXml)));
    // The replaced library went aside (and is slated for deletion).
    EXPECT_EQ(4u, ListDir(In(m_sametime, L"rcp")).size());

    // Embedded: the library into the Notes program folder, the rest into the data folder.
    EXPECT_EQ(Origin("suite", kNativeLibrary), ReadFileBytes(In(m_notes, kNativeLibrary)));
    EXPECT_EQ(Origin("suite", kJar),
              ReadFileBytes(In(In(m_data, L"workspace\\applications\\eclipse\\plugins"), kJar)));
    EXPECT_EQ(Origin("suite", kFeatureXml),
              ReadFileBytes(
                  In(In(In(m_data, L"workspace\\applications\\eclipse\\features"), kFeatureFolder),
                     kFeatureXml)));

    DWORD type = 0;
    EXPECT_EQ(L"%SystemRoot%\\system32;" + m_suite + L"2;" + m_suite, MachinePath(&type));
    EXPECT_EQ(static_cast<DWORD>(REG_EXPAND_SZ), type);
    EXPECT_EQ(1, listener.environmentChanges());
}

TEST_F(SametimeFilesE2E, CopyFilesToSametime7KeepsGoingWithoutARuntime) {
    InstallSuite();
    DeleteFileW(In(m_suite, kRuntimeC).c_str());
    InstallSametime(0);  // no version: Sametime 7
    for (const wchar_t* folder : {L"native", L"plugins", L"features"}) {
        MakeDirs(In(m_sametime, folder));
    }
    SetMachinePath(L"C:\\A;" + m_suite + L"\\");

    RunResult run = Program().Run(L"-copyfilestosametime");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining(
        "CQMCommon::CopySametimePluginFiles: CopyFile MSVCR120_DLL Failed!\n"));
    // The C runtime comes first; without it the C++ runtime is not tried.
    EXPECT_EQ(std::vector<std::wstring>{kNativeLibrary}, ListDir(In(m_sametime, L"native")));
    EXPECT_EQ(Origin("suite", kJar), ReadFileBytes(In(In(m_sametime, L"plugins"), kJar)));
    EXPECT_EQ(Origin("suite", kFeatureXml),
              ReadFileBytes(In(In(In(m_sametime, L"features"), kFeatureFolder), kFeatureXml)));
    EXPECT_FALSE(DirExists(In(m_sametime, L"rcp")));
    // Already in the path (with a trailing backslash): unchanged.
    EXPECT_EQ(L"C:\\A;" + m_suite + L"\\", MachinePath());
}

TEST_F(SametimeFilesE2E, CopyNeverWritesForAFailedLookup) {
    // Sametime without a folder, Notes 8 without a program folder: the
    // lookups hand over empty folders, which must not become the drive root.
    InstallSuite();
    InstallSametime(8, L"");
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"DataPath", m_data));
    SetMachinePath(L"C:\\A");

    RunResult run = Program().Run(L"-copyfilestosametime");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_FALSE(run.crashed);
    for (const wchar_t* rel : {L"C:\\qmmrvjni.dll", L"C:\\rcp", L"C:\\shared", L"C:\\workspace"}) {
        EXPECT_FALSE(FileExists(rel) || DirExists(rel)) << Narrow(rel);
    }
    EXPECT_EQ(std::vector<std::wstring>{}, ListDir(m_data));
    EXPECT_EQ(L"C:\\A;" + m_suite, MachinePath());
}

TEST_F(SametimeFilesE2E, DelSametimeFilesClearsSametime8AndEmbeddedAndThePath) {
    InstallSuite();
    InstallSametime(8);
    InstallNotes8();
    PutInstalledFeature(In(m_sametime, L"rcp"), In(m_sametime, L"shared\\eclipse\\plugins"),
                        In(m_sametime, L"shared\\eclipse\\features"));
    Put(In(m_sametime, L"rcp\\msvcr120.dll"), "runtime");
    Put(In(m_sametime, L"shared\\eclipse\\plugins\\other.jar"), "other");
    // Embedded: the library in the program folder, the old runtime in its
    // "native" folder, the rest in the data folder.
    PutInstalledFeature(In(m_notes, L"native"),
                        In(m_data, L"workspace\\applications\\eclipse\\plugins"),
                        In(m_data, L"workspace\\applications\\eclipse\\features"));
    MoveFileW(In(m_notes, L"native\\qmmrvjni.dll").c_str(), In(m_notes, kNativeLibrary).c_str());
    SetMachinePath(L"C:\\A;" + m_suite + L"2;" + m_suite + L";%ProgramFiles%\\B");

    RunResult run = Program().Run(L"-delsametimefiles");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining("Start Delete sametime plugin Files for QM Uninstall!\n"));
    EXPECT_TRUE(run.HasTraceContaining("Delete Mirovan files from Embedded ST Path."));
    EXPECT_TRUE(run.HasTraceContaining("End Delete sametime plugin Files for QM Uninstall!\n"));
    // Only what the suite put there goes; the new runtime is shared and stays.
    EXPECT_EQ(std::vector<std::wstring>{L"msvcr120.dll"}, ListDir(In(m_sametime, L"rcp")));
    EXPECT_EQ(std::vector<std::wstring>{L"other.jar"},
              ListDir(In(m_sametime, L"shared\\eclipse\\plugins")));
    EXPECT_EQ(std::vector<std::wstring>{}, ListDir(In(m_sametime, L"shared\\eclipse\\features")));
    EXPECT_EQ((std::vector<std::wstring>{L"Data", L"native"}), ListDir(m_notes));
    EXPECT_EQ(std::vector<std::wstring>{}, ListDir(In(m_notes, L"native")));
    EXPECT_EQ(std::vector<std::wstring>{},
              ListDir(In(m_data, L"workspace\\applications\\eclipse\\plugins")));
    EXPECT_EQ(std::vector<std::wstring>{},
              ListDir(In(m_data, L"workspace\\applications\\eclipse\\features")));
    DWORD type = 0;
    EXPECT_EQ(L"C:\\A;" + m_suite + L"2;%ProgramFiles%\\B", MachinePath(&type));
    EXPECT_EQ(static_cast<DWORD>(REG_EXPAND_SZ), type);
}

TEST_F(SametimeFilesE2E, DelSametimeFilesExStopsAtALockedSametime7Library) {
    InstallSuite();
    InstallSametime(7);
    PutInstalledFeature(In(m_sametime, L"native"), In(m_sametime, L"plugins"),
                        In(m_sametime, L"features"));
    HeldOpen locked(In(m_sametime, L"native\\qmmrvjni.dll"), FILE_SHARE_READ);
    ASSERT_TRUE(locked.ok());
    SetMachinePath(m_suite);

    RunResult run = Program().Run(L"-delsametimefilesEx");

    EXPECT_EQ(0, run.exitCode);
    const std::string start =
        "For disable sametime to delete sametime plugin Files for QM Uninstall!\n";
    EXPECT_EQ(2, static_cast<int>(CountOf(run.TraceText(), start)));
    EXPECT_TRUE(
        run.HasTraceContaining("CQMCommon::RemoveSametimePluginFiles: DeleteFile Failed!\n"));
    EXPECT_EQ(4u, ListDir(In(m_sametime, L"native")).size());
    EXPECT_TRUE(FileExists(In(In(m_sametime, L"plugins"), kJar)));
    EXPECT_TRUE(FileExists(In(In(In(m_sametime, L"features"), kFeatureFolder), kFeatureXml)));
    // The path is cleaned all the same, also when the folder is its only entry.
    EXPECT_EQ(L"", MachinePath());
}

TEST_F(SametimeFilesE2E, DelSametimeFilesRebootSchedulesEveryLayout) {
    InstallSametime(8);
    InstallNotes8();
    const size_t before = PendingDeleteCount();

    RunResult run = Program().Run(L"-delsametimefilesreboot");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining(
        "For silent install Start Delete sametime files after pc restart!\n"));
    EXPECT_TRUE(
        run.HasTraceContaining("For silent install Delete sametime files after pc restart!\n"));
    const std::wstring stFeatures =
        In(In(m_sametime, L"shared\\eclipse\\features"), kFeatureFolder);
    const std::wstring dataFeatures =
        In(In(m_data, L"workspace\\applications\\eclipse\\features"), kFeatureFolder);
    for (const std::wstring& path : {
             In(m_notes, kNativeLibrary),
             In(In(m_data, L"workspace\\applications\\eclipse\\plugins"), kJar),
             In(dataFeatures, kFeatureXml),
             dataFeatures,
             In(In(m_sametime, L"rcp"), kNativeLibrary),
             In(In(m_sametime, L"shared\\eclipse\\plugins"), kJar),
             In(stFeatures, kFeatureXml),
             stFeatures,
         }) {
        EXPECT_TRUE(IsPendingDelete(path)) << Narrow(path);
    }
    EXPECT_EQ(before + 8, PendingDeleteCount());
}

TEST_F(SametimeFilesE2E, DelSametimeFilesRebootForSametime7AndNothingElse) {
    InstallSametime(7);
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNotes7Key));
    const size_t before = PendingDeleteCount();

    RunResult run = Program().Run(L"-delsametimefilesreboot");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(IsPendingDelete(In(In(m_sametime, L"native"), kNativeLibrary)));
    EXPECT_TRUE(IsPendingDelete(In(In(m_sametime, L"plugins"), kJar)));
    EXPECT_EQ(before + 2, PendingDeleteCount());
}

TEST_F(SametimeFilesE2E, StampsAreResetForSametimeAndTheNotesData) {
    InstallSuite();
    InstallSametime(8);
    InstallNotes8();
    const std::wstring stConfig = In(m_sametime, L"configuration\\org.eclipse.update");
    const std::wstring dataConfig = In(m_data, L"configuration\\org.eclipse.update");
    Put(In(stConfig, L"last.config.stamp"), "st-new");
    Put(In(stConfig, L"last.config.stamp.bak"), "st-old");
    Put(In(dataConfig, L"last.config.stamp"), "data-new");

    RunResult run = Program().Run(L"-delsametimestampfile");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining(
        "Start Delete sametime last.config.stamp file for sametime install!\n"));
    EXPECT_TRUE(run.HasTraceContaining(
        "End Delete sametime last.config.stamp file for sametime install!\n"));
    EXPECT_EQ(std::vector<std::wstring>{L"last.config.stamp.bak"}, ListDir(stConfig));
    EXPECT_EQ("st-new", ReadFileBytes(In(stConfig, L"last.config.stamp.bak")));
    EXPECT_EQ("data-new", ReadFileBytes(In(dataConfig, L"last.config.stamp.bak")));

    // The per-user install: the data folder's feature files and its stamp again.
    MakeDirs(In(m_data, L"workspace\\applications\\eclipse\\plugins"));
    MakeDirs(In(m_data, L"workspace\\applications\\eclipse\\features"));
    Put(In(dataConfig, L"last.config.stamp"), "data-newer");
    run = Program().Run(L"-smsinstallsametimeex");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(
        run.HasTraceContaining("smsinstallsametimeex, execute some operator for current user!\n"));
    EXPECT_EQ(Origin("suite", kJar),
              ReadFileBytes(In(In(m_data, L"workspace\\applications\\eclipse\\plugins"), kJar)));
    EXPECT_EQ(Origin("suite", kFeatureXml),
              ReadFileBytes(
                  In(In(In(m_data, L"workspace\\applications\\eclipse\\features"), kFeatureFolder),
                     kFeatureXml)));
    EXPECT_FALSE(FileExists(In(m_notes, kNativeLibrary)));  // the program folder is not touched
    EXPECT_EQ("data-newer", ReadFileBytes(In(dataConfig, L"last.config.stamp.bak")));
    EXPECT_EQ(std::vector<std::wstring>{L"last.config.stamp.bak"}, ListDir(dataConfig));
}

TEST_F(SametimeFilesE2E, SmsRefreshSysEnvAnnouncesAndChangesNothing) {
    SetMachinePath(L"%SystemRoot%;C:\\A;");
    SettingChangeListener listener;
    ASSERT_TRUE(listener.ready());

    RunResult run = Program().Run(L"-smsrefreshsysenv");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining("qmmirovanoni.exe: Call smsrefreshsysenv.\n"));
    EXPECT_EQ(1, listener.environmentChanges());
    EXPECT_EQ(L"%SystemRoot%;C:\\A;", MachinePath());
}

}  // namespace
