// Links planted in the folders a user controls (the Notes data folder, a
// Sametime 8 profile, the suite's per-user folder) never carry the program's
// writes, deletes or scheduled deletes to their targets. The links are host
// symbolic links, which Windows programs under Wine see as reparse points.
#include "tests/e2e/sametime_machine.h"
#include "tests/e2e/tree_snapshot.h"

#include "base/reparse_guard.h"
#include "notes/product_locations.h"
#include "tests/support/host_link.h"

using namespace sametime_test;

namespace {

const char kRefused[] = "IsFreeOfReparsePoints: refused to go through a reparse point";

class PlantedLinksE2E : public SametimeMachine {
protected:
    const std::wstring m_victim = m_scratch.Sub(L"victim", true);
};

TEST_F(PlantedLinksE2E, NotesDataFolderOfTheUsersHive) {
    InstallSuite();
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"Path", m_notes));
    ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kNotes8Key, L"MultiUser", 1));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kNotes8Key, L"NotesIniPath",
                             JoinPath(m_data, L"notes.ini")));
    // The victim holds what the data folder's workspace and configuration would.
    const std::wstring jar = JoinPath(L"workspace\\applications\\eclipse\\plugins", kJar);
    for (const std::wstring& file :
         {jar, JoinPath(L"workspace\\applications\\eclipse\\features", kFeatureXml),
          std::wstring(L"workspace\\.config\\org.eclipse.update\\last.config.stamp"),
          std::wstring(L"configuration\\org.eclipse.update\\last.config.stamp")}) {
        Put(JoinPath(m_victim, file), "victim");
    }
    Put(JoinPath(m_victim, L"workspace\\.config\\org.eclipse.update\\platform.xml"),
        PlatformXml("platform:/config/../applications/eclipse/"));
    const auto before = TreeSnapshot(m_victim);
    HostLink workspace(JoinPath(m_data, L"workspace"), JoinPath(m_victim, L"workspace"));
    HostLink configuration(JoinPath(m_data, L"configuration"),
                           JoinPath(m_victim, L"configuration"));
    ASSERT_TRUE(workspace.ok() && configuration.ok());

    const struct {
        const wchar_t* keyword;
        const char* failure;  // the refused step's own message
    } rows[] = {
        {L"-copyfilestosametime", "NIHandle::CopyEmbeddedST8PluginFiles: CopyFile Failed!\n"},
        {L"-smsinstallsametimeex", "NIHandle::CopyEmbeddedST8PluginFiles: CopyFile Failed!\n"},
        {L"-enableSTembedded", "UpdateEmbeddedST8Config: platform.xml file can not be found!\n"},
        {L"-delsametimestampfile", ""},
        {L"-delsametimefiles", "NIHandle::RemoveSametime8PluginFiles: DeleteFile Failed!\n"},
        {L"-delsametimefilesreboot", "NIHandle::RemoveEmbedST8PluginFiles: MoveFileEx Failed!\n"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(Narrow(row.keyword));
        RunResult run = Program().Run(row.keyword);
        EXPECT_TRUE(run.HasTraceContaining(kRefused));
        EXPECT_TRUE(run.HasTraceContaining(row.failure));
        EXPECT_EQ(before, TreeSnapshot(m_victim));
        EXPECT_FALSE(IsPendingDelete(JoinPath(m_data, jar)));
    }
}

TEST_F(PlantedLinksE2E, Sametime8ProfileAndSuitePerUserFolder) {
    const std::wstring sametime = JoinPath(RoamingAppData(), L"Lotus\\Sametime");
    MakeDirs(sametime);
    Put(JoinPath(m_victim, L"org.eclipse.update\\platform.xml"),
        PlatformXml("file:../shared/eclipse/"));
    Put(JoinPath(m_victim, L"org.eclipse.update\\last.config.stamp"), "victim");
    const auto before = TreeSnapshot(m_victim);
    HostLink config(JoinPath(sametime, L".config"), m_victim);
    HostLink suite(JoinPath(RoamingAppData(), L"Mirovan"), m_victim);
    ASSERT_TRUE(config.ok() && suite.ok());

    RunResult run = Program().Run(L"-enablesametime8confige");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining(std::string(kRefused) +
                                       ",lpszReparsePoint=" + Narrow(sametime) + "\\.config,"));
    CStringEx path;
    EXPECT_FALSE(GetAppDataMrvQMPath(L"Mirovan_Trace.zip", path));  // creates no folder
    EXPECT_EQ(before, TreeSnapshot(m_victim));
}

TEST_F(PlantedLinksE2E, OnlyWhatLiesBelowTheTrustedFolderIsChecked) {
    const std::wstring real = m_scratch.Sub(L"real", true);
    const std::wstring linked = m_scratch.Sub(L"link");
    Put(JoinPath(real, L"sub\\file"), "x");
    HostLink link(linked, real);
    ASSERT_TRUE(link.ok());
    const struct {
        std::wstring root;
        std::wstring path;
        bool allowed;
    } rows[] = {
        {linked, JoinPath(linked, L"sub\\new\\file"), true},  // the root itself may be a link
        {m_scratch.path(), linked + L"\\", false},            // asked with a trailing backslash
        {real, JoinPath(linked, L"sub"), false},              // outside the trusted folder
        {real, real + L"2\\sub", false},                      // a longer name is another folder
        {real, JoinPath(real, L"..\\link\\sub"), false},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(row.allowed, IsFreeOfReparsePoints(row.root.c_str(), row.path.c_str()))
            << Narrow(row.root) << " | " << Narrow(row.path);
    }
}

}  // namespace
