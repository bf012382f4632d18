// Rewriting the user's platform.xml without ever losing it: a write that
// fails leaves the file byte for byte, with no staging file beside it and
// the stamp in place; an unchanged document is not written at all. And the
// embedded Sametime's data-folder copy, which needs no Notes program folder.
#include "tests/e2e/sametime_machine.h"

#include <memory>

using namespace sametime_test;

namespace {

class SafeWritesE2E : public SametimeMachine {
protected:
    // The "Lotus" profile of Sametime 8, the only one present.
    const std::wstring m_profile =
        JoinPath(RoamingAppData(), L"Lotus\\Sametime\\.config\\org.eclipse.update");
    const std::wstring m_xml = JoinPath(m_profile, L"platform.xml");
};

TEST_F(SafeWritesE2E, AFailedWriteLosesNothingAndASuccessfulOneLeavesNoStagingFile) {
    const struct {
        const char* name;
        DWORD attributes;
        bool locked;  // held by a reader that lets nobody write, rename or delete it
        int result;
    } rows[] = {
        {"plain", FILE_ATTRIBUTE_NORMAL, false, 1},
        {"locked", FILE_ATTRIBUTE_NORMAL, true, 0},
        {"read-only", FILE_ATTRIBUTE_READONLY, false, 0},
        {"hidden", FILE_ATTRIBUTE_HIDDEN, false, 1},
    };
    const std::string original = PlatformXml("file:../shared/eclipse/");
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        RemoveTree(m_profile);
        Put(m_xml, original);
        Put(JoinPath(m_profile, L"last.config.stamp"), "stamp");
        ASSERT_TRUE(SetFileAttributesW(m_xml.c_str(), row.attributes));
        auto reader = row.locked ? std::make_unique<HeldOpen>(m_xml, FILE_SHARE_READ) : nullptr;
        RunResult run = Program().Run(L"-enablesametime8confige");
        reader.reset();
        EXPECT_EQ(row.result, run.exitCode);
        const DWORD kept = FILE_ATTRIBUTE_READONLY | FILE_ATTRIBUTE_HIDDEN;
        EXPECT_EQ(row.attributes & kept, GetFileAttributesW(m_xml.c_str()) & kept);
        SetFileAttributesW(m_xml.c_str(), FILE_ATTRIBUTE_NORMAL);
        if (row.result == 1) {
            EXPECT_EQ(1u, CountOf(ReadFileBytes(m_xml), kFeatureId));
            EXPECT_EQ((std::vector<std::wstring>{L"last.config.stamp.bak", L"platform.xml"}),
                      ListDir(m_profile));
        } else {
            EXPECT_EQ(original, ReadFileBytes(m_xml));
            EXPECT_TRUE(
                run.HasTraceContaining("UpdateSametime8Config: Save config file failed!\n"));
            EXPECT_EQ((std::vector<std::wstring>{L"last.config.stamp", L"platform.xml"}),
                      ListDir(m_profile));
        }
    }
}

TEST_F(SafeWritesE2E, AnUnchangedDocumentIsNotWritten) {
    // Laid out as no DOM would write it, and read-only: any rewrite shows.
    const std::string original =
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\r\n<config\tversion=\"3.0\">\r\n"
        "  <site   url=\"file:../shared/eclipse/\"   enabled=\"true\">\r\n"
        "    <feature  version=\"1.0.1\" id=\"com.mrv.realtime.meeting.feature\"/>\r\n"
        "  </site>\r\n</config>\r\n";
    Put(m_xml, original);
    Put(JoinPath(m_profile, L"last.config.stamp"), "stamp");
    ASSERT_TRUE(SetFileAttributesW(m_xml.c_str(), FILE_ATTRIBUTE_READONLY));
    EXPECT_EQ(1, Program().Run(L"-enablesametime8confige").exitCode);
    SetFileAttributesW(m_xml.c_str(), FILE_ATTRIBUTE_NORMAL);
    EXPECT_EQ(original, ReadFileBytes(m_xml));
    // The stamp is renamed as after every processed edit.
    EXPECT_EQ((std::vector<std::wstring>{L"last.config.stamp.bak", L"platform.xml"}),
              ListDir(m_profile));
}

TEST_F(SafeWritesE2E, EmbeddedDataFilesArePlacedWithoutANotesProgramFolder) {
    InstallSuite();
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"DataPath", m_data));
    const std::wstring eclipse = JoinPath(m_data, L"workspace\\applications\\eclipse");
    MakeDirs(JoinPath(eclipse, L"plugins"));
    MakeDirs(JoinPath(eclipse, L"features"));
    EXPECT_EQ(0, Program().Run(L"-copyfilestosametime").exitCode);
    EXPECT_EQ("suite:" + Narrow(kJar), ReadFileBytes(JoinPath(eclipse, L"plugins\\") + kJar));
    EXPECT_EQ("suite:feature.xml", ReadFileBytes(JoinPath(eclipse, L"features\\") + kFeatureXml));
}

}  // namespace
