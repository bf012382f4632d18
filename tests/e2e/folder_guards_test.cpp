// Folders the program must not be led through: links (host symbolic links, seen
// as reparse points under Wine) planted in the folders a user controls, and
// relative product folders in the registry, which count as not found.
#include "notes/product_locations.h"
#include "tests/e2e/sametime_machine.h"
#include "tests/e2e/tree_snapshot.h"
#include "tests/support/host_link.h"

using namespace sametime_test;

namespace {

const char kRefused[] = "IsFreeOfReparsePoints: refused to go through a reparse point";

class FolderGuardsE2E : public SametimeMachine {
protected:
    // Every file the Notes and Sametime keywords copy, delete, edit or
    // schedule, as they would find it with folder as each product's folder.
    void PlantLayouts(const std::wstring& folder, bool featureListed) {
        Put(JoinPath(folder, L"qmnires.dll"), "planted");     // a Notes plug-in file
        Put(JoinPath(folder, L"x_upd_temp.exe"), "planted");  // an update leftover
        for (const wchar_t* native : {L"", L"rcp", L"native"}) {
            Put(JoinPath(JoinPath(folder, native), kNativeLibrary), "planted");
        }
        for (const wchar_t* eclipse :
             {L"", L"shared\\eclipse", L"workspace\\applications\\eclipse"}) {
            Put(JoinPath(JoinPath(folder, eclipse), L"plugins\\") + kJar, "planted");
            Put(JoinPath(JoinPath(folder, eclipse), L"features\\") + kFeatureXml, "planted");
        }
        const std::string features = featureListed ? std::string(kFeatureElement) + "/>" : "";
        for (const auto& [config, site] :
             {std::pair<const wchar_t*, const char*>{L"configuration", "platform:/base/"},
              {L"workspace\\.config", "platform:/config/../applications/eclipse/"}}) {
            const std::wstring update = JoinPath(JoinPath(folder, config), L"org.eclipse.update");
            Put(JoinPath(update, L"last.config.stamp"), "planted");
            Put(JoinPath(update, L"platform.xml"), PlatformXml(site, features));
        }
    }

    const std::wstring m_victim = m_scratch.Sub(L"victim", true);
};

TEST_F(FolderGuardsE2E, LinksInTheNotesDataFolderOfTheUsersHive) {
    InstallSuite();
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"Path", m_notes));
    ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kNotes8Key, L"MultiUser", 1));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kNotes8Key, L"NotesIniPath",
                             JoinPath(m_data, L"notes.ini")));
    PlantLayouts(m_victim, false);
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
        {L"-enableSTembedded", "UpdateEmbeddedST8Config: platform.xml file can not be found!\n"},
        {L"-delsametimestampfile", ""},
        {L"-delsametimefiles", "NIHandle::RemoveSametime8PluginFiles: DeleteFile Failed!\n"},
        {L"-delsametimefilesreboot", "NIHandle::RemoveEmbedST8PluginFiles: MoveFileEx Failed!\n"},
    };
    const std::wstring jar =
        JoinPath(m_data, L"workspace\\applications\\eclipse\\plugins\\") + kJar;
    for (const auto& row : rows) {
        SCOPED_TRACE(Narrow(row.keyword));
        RunResult run = Program().Run(row.keyword);
        EXPECT_TRUE(run.HasTraceContaining(kRefused));
        EXPECT_TRUE(run.HasTraceContaining(row.failure));
        EXPECT_EQ(before, TreeSnapshot(m_victim));
        EXPECT_FALSE(IsPendingDelete(jar));
    }
}

TEST_F(FolderGuardsE2E, LinksInTheSametime8ProfileAndTheSuitePerUserFolder) {
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

TEST_F(FolderGuardsE2E, RelativeProductFoldersCountAsNotFound) {
    // The program's own folder is its working folder; it, its "rel" subfolder
    // and its parent hold every layout: a keyword that acted there shows.
    const struct {
        const wchar_t* keyword;
        const wchar_t* notesPath;        // Notes "Path"
        const wchar_t* dataPath;         // Notes "DataPath"
        const wchar_t* installLocation;  // Sametime Connect "InstallLocation"
        const wchar_t* notesIniPath;     // multi-user Notes: the user's "NotesIniPath"
        const wchar_t* suitePath;        // the suite's "Path", if not the installed one
    } rows[] = {
        {L"copyfilestonotes", L".", L"rel", L".", nullptr, nullptr},
        {L"delnifiles", L".", L"rel", L".", nullptr, L"."},
        {L"copyfilestosametime", L".", L"rel", L"C:rel", nullptr, nullptr},
        {L"delsametimefilesreboot", L"..", L"rel", L".", nullptr, nullptr},
        {L"delsametimefilesEx", L".", L"C:rel", L".", nullptr, nullptr},
        {L"smsinstallsametimeex", L".", L".", L".", L"rel\\notes.ini", nullptr},
        {L"disablesametime7confige", L".", L".", L"rel", nullptr, nullptr},
    };
    InstallSuite();
    Put(JoinPath(m_suite, L"qmnires.dll"), "suite");
    const std::wstring working = Program().folder();
    PlantLayouts(working, false);
    PlantLayouts(JoinPath(working, L"rel"), true);
    PlantLayouts(m_scratch.path(), false);  // ".."
    for (const auto& row : rows) {
        SCOPED_TRACE(Narrow(row.keyword) + (row.notesIniPath ? " multi-user" : ""));
        const auto before = TreeSnapshot(m_scratch.path());
        const size_t pending = PendingDeleteCount();
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"Path", row.notesPath));
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"DataPath", row.dataPath));
        InstallSametime(8, row.installLocation);
        if (row.notesIniPath != nullptr) {
            ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kNotes8Key, L"MultiUser", 1));
            ASSERT_TRUE(
                RegPutString(HKEY_CURRENT_USER, kNotes8Key, L"NotesIniPath", row.notesIniPath));
        }
        if (row.suitePath != nullptr) {
            ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path",
                                     row.suitePath));
        }
        RunResult run = Program().Run(std::wstring(L"-") + row.keyword);
        EXPECT_EQ(0, run.exitCode);
        EXPECT_EQ(before, TreeSnapshot(m_scratch.path()));
        EXPECT_EQ(pending, PendingDeleteCount());
        ClearProductState();
        InstallSuite();
    }
}

}  // namespace
