// Relative product folders in the registry count as not found. The program
// runs from its own folder, which (with its "rel" subfolder and its parent)
// holds every file the Sametime keywords copy, delete, edit or schedule: a
// keyword that acted on a relative folder would change them.
#include "tests/e2e/sametime_machine.h"
#include "tests/e2e/tree_snapshot.h"

using namespace sametime_test;

namespace {

class RelativeFoldersE2E : public SametimeMachine {
protected:
    // The files of all three layouts, as the program would find them in folder.
    void PlantLayouts(const std::wstring& folder, bool featureListed) {
        for (const wchar_t* native : {L"", L"rcp", L"native"}) {
            Put(JoinPath(JoinPath(folder, native), kNativeLibrary), "planted");
        }
        for (const wchar_t* eclipse :
             {L"", L"shared\\eclipse", L"workspace\\applications\\eclipse"}) {
            Put(JoinPath(JoinPath(folder, eclipse), L"plugins\\") + kJar, "planted");
            Put(JoinPath(JoinPath(folder, eclipse), L"features\\") + kFeatureXml, "planted");
        }
        const std::wstring config = JoinPath(folder, L"configuration\\org.eclipse.update");
        Put(JoinPath(config, L"last.config.stamp"), "planted");
        Put(JoinPath(config, L"platform.xml"),
            PlatformXml("platform:/base/",
                        featureListed ? std::string(kFeatureElement) + "/>" : std::string()));
    }
};

TEST_F(RelativeFoldersE2E, NoKeywordActsInTheWorkingFolder) {
    const struct {
        const wchar_t* keyword;
        const wchar_t* notesPath;        // Notes "Path"
        const wchar_t* dataPath;         // Notes "DataPath"
        const wchar_t* installLocation;  // Sametime Connect "InstallLocation"
        const wchar_t* notesIniPath;     // multi-user Notes: the user's "NotesIniPath"
    } rows[] = {
        {L"copyfilestosametime", L".", L"rel", L"C:rel", nullptr},
        {L"delsametimefilesreboot", L"..", L"rel", L".", nullptr},
        {L"delsametimefiles", L".", L"..", L"rel", nullptr},
        {L"delsametimefilesEx", L".", L"C:rel", L".", nullptr},
        {L"smsinstallsametimeex", L".", L".", L".", nullptr},
        {L"smsinstallsametimeex", L".", L".", L".", L"rel\\notes.ini"},
        {L"enablesametime7confige", L".", L".", L".", nullptr},
        {L"disablesametime7confige", L".", L".", L"rel", nullptr},
    };
    InstallSuite();
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
        RunResult run = Program().Run(std::wstring(L"-") + row.keyword);
        EXPECT_EQ(0, run.exitCode);
        EXPECT_FALSE(run.crashed);
        EXPECT_EQ(before, TreeSnapshot(m_scratch.path()));
        EXPECT_EQ(pending, PendingDeleteCount());
        ClearProductState();
        InstallSuite();
    }
}

}  // namespace
