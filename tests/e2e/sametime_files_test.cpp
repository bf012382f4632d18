// The Sametime file keywords run by the real program: copying the feature
// into the three client layouts, removing it at once or at the next restart,
// the configuration stamps, and the suite folder in the machine "Path".
#include "tests/e2e/sametime_machine.h"

using namespace sametime_test;

namespace {

// Folders of the Sametime 8 layout and of the Notes data folder (embedded).
const wchar_t kST8Plugins[] = L"shared\\eclipse\\plugins";
const wchar_t kST8Features[] = L"shared\\eclipse\\features";
const wchar_t kDataPlugins[] = L"workspace\\applications\\eclipse\\plugins";
const wchar_t kDataFeatures[] = L"workspace\\applications\\eclipse\\features";

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
        EXPECT_EQ(DWORD(REG_EXPAND_SZ), type) << "Path type";
        return text;
    }
    void SetMachinePath(const std::wstring& text) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", text, 0, REG_SZ));
    }
};

TEST_F(SametimeFilesE2E, Sametime8AndEmbeddedLayoutsAreFilledAndCleared) {
    InstallSuite();
    InstallSametime(8);
    InstallNotes8();
    Put(In(m_sametime, kST8Plugins, L"other.jar"), "other");
    for (const std::wstring& folder :
         {JoinPath(m_sametime, kST8Features), JoinPath(m_data, kDataPlugins),
          JoinPath(m_data, kDataFeatures)}) {
        ASSERT_TRUE(MakeDirs(folder));
    }
    for (const wchar_t* name : {L"msvcp90.dll", L"msvcr90.dll", L"Microsoft.VC90.CRT.manifest"}) {
        Put(In(m_notes, L"native", name), "left by an older install");
    }
    SetMachinePath(L"%SystemRoot%\\system32");
    Put(In(m_sametime, L"rcp", kNativeLibrary), "running");
    {
        // A running client holds its native library: it goes aside, untouched.
        HeldOpen loaded(In(m_sametime, L"rcp", kNativeLibrary), kLikeALoadedLibrary);
        ASSERT_TRUE(loaded.ok());
        EXPECT_EQ(0, Program().Run(L"-copyfilestosametime").exitCode);
        EXPECT_EQ("running", loaded.Read());
    }
    for (const std::wstring& path :
         {In(m_sametime, L"rcp", kNativeLibrary), In(m_sametime, L"rcp", L"msvcr120.dll"),
          In(m_sametime, L"rcp", L"msvcp120.dll"), In(m_sametime, kST8Plugins, kJar),
          In(m_sametime, kST8Features, kFeatureXml),
          // Embedded: the library into the Notes program folder, the rest into the data folder.
          JoinPath(m_notes, kNativeLibrary), In(m_data, kDataPlugins, kJar),
          In(m_data, kDataFeatures, kFeatureXml)}) {
        ExpectFromSuite(path);
    }
    EXPECT_EQ(4u, ListDir(JoinPath(m_sametime, L"rcp")).size());  // three new files and it
    EXPECT_EQ(L"%SystemRoot%\\system32;" + m_suite, MachinePath());

    EXPECT_EQ(0, Program().Run(L"-delsametimefiles").exitCode);
    // Only what the suite alone put there goes: the runtime is shared and stays,
    // and so does the library set aside (it goes at the next restart).
    EXPECT_EQ(3u, ListDir(JoinPath(m_sametime, L"rcp")).size());
    ExpectFromSuite(In(m_sametime, L"rcp", L"msvcr120.dll"));
    EXPECT_EQ(std::vector<std::wstring>{L"other.jar"}, ListDir(JoinPath(m_sametime, kST8Plugins)));
    EXPECT_EQ((std::vector<std::wstring>{L"Data", L"native"}), ListDir(m_notes));
    for (const std::wstring& folder :
         {JoinPath(m_sametime, kST8Features), JoinPath(m_notes, L"native"),
          JoinPath(m_data, kDataPlugins), JoinPath(m_data, kDataFeatures)}) {
        EXPECT_EQ(std::vector<std::wstring>{}, ListDir(folder)) << Narrow(folder);
    }
    EXPECT_EQ(L"%SystemRoot%\\system32", MachinePath());
    // The suite folder as the only entry stays: an empty machine Path is never written.
    SetMachinePath(m_suite);
    RunResult run = Program().Run(L"-delsametimefiles");
    EXPECT_EQ(m_suite, RegGetString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path").value_or(L""));
    EXPECT_TRUE(run.HasTraceContaining("the Path would be empty, left as it is"));
}

TEST_F(SametimeFilesE2E, EmbeddedCopyNeedsNoNotesProgramFolderNorWritesForAFailedLookup) {
    // Sametime without a folder, Notes 8 without a program folder: the
    // lookups hand over empty folders, which must not become the drive root.
    // The data folder's files are placed all the same.
    InstallSuite();
    InstallSametime(8, L"");
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"DataPath", m_data));
    ASSERT_TRUE(MakeDirs(JoinPath(m_data, kDataPlugins)));
    ASSERT_TRUE(MakeDirs(JoinPath(m_data, kDataFeatures)));
    EXPECT_EQ(0, Program().Run(L"-copyfilestosametime").exitCode);
    for (const wchar_t* path : {L"C:\\qmmrvjni.dll", L"C:\\rcp", L"C:\\shared"}) {
        EXPECT_FALSE(FileExists(path) || DirExists(path)) << Narrow(path);
    }
    ExpectFromSuite(In(m_data, kDataPlugins, kJar));
    ExpectFromSuite(In(m_data, kDataFeatures, kFeatureXml));
}

TEST_F(SametimeFilesE2E, RestartRemovalAndStamps) {
    InstallSuite();
    InstallSametime(8);
    InstallNotes8();
    const size_t pending = PendingDeleteCount();
    EXPECT_EQ(0, Program().Run(L"-delsametimefilesreboot").exitCode);
    const std::wstring stFeature = In(m_sametime, kST8Features, kFeatureXml);
    const std::wstring dataFeature = In(m_data, kDataFeatures, kFeatureXml);
    for (const std::wstring& path :
         {JoinPath(m_notes, kNativeLibrary), In(m_data, kDataPlugins, kJar), dataFeature,
          dataFeature.substr(0, dataFeature.rfind(L'\\')), In(m_sametime, L"rcp", kNativeLibrary),
          In(m_sametime, kST8Plugins, kJar), stFeature,
          stFeature.substr(0, stFeature.rfind(L'\\'))}) {
        EXPECT_TRUE(IsPendingDelete(path)) << Narrow(path);
    }
    EXPECT_EQ(pending + 8, PendingDeleteCount());

    // The stamps of both configurations are renamed.
    for (const std::wstring& base : {m_sametime, m_data}) {
        Put(JoinPath(base, L"configuration\\org.eclipse.update\\last.config.stamp"), "stamp");
    }
    EXPECT_EQ(0, Program().Run(L"-delsametimestampfile").exitCode);
    for (const std::wstring& base : {m_sametime, m_data}) {
        EXPECT_EQ(std::vector<std::wstring>{L"last.config.stamp.bak"},
                  ListDir(JoinPath(base, L"configuration\\org.eclipse.update")));
    }
}

}  // namespace
