// The platform.xml keywords run by the real program: the two per-user
// Sametime 8 profiles, Sametime 7 and the embedded Sametime, their results
// as exit codes, the configuration stamps, and files that must be refused.
#include "tests/e2e/sametime_machine.h"

using namespace sametime_test;

namespace {

const char kSharedSite[] = "file:../shared/eclipse/";
const char kNestedSharedSite[] = "file:../../shared/eclipse/";
const char kEmbeddedSite[] = "platform:/config/../applications/eclipse/";

std::string BillionLaughs(const std::string& site) {
    std::string text = "<?xml version=\"1.0\"?>\n<!DOCTYPE config [\n<!ENTITY a0 \"lol\">\n";
    for (int i = 1; i <= 9; ++i) {
        text += "<!ENTITY a" + std::to_string(i) + " \"";
        for (int j = 0; j < 10; ++j) {
            text += "&a" + std::to_string(i - 1) + ";";
        }
        text += "\">\n";
    }
    return text + "]>\n<config><site url=\"" + site + "\">&a9;</site></config>\n";
}

class SametimeConfigE2E : public SametimeMachine {
protected:
    int Run(const wchar_t* keyword) {
        m_last = Program().Run(keyword);
        EXPECT_FALSE(m_last.crashed) << Narrow(keyword);
        return m_last.exitCode;
    }
    bool Logged(const std::string& message) const { return m_last.HasTraceContaining(message); }

    // Sametime 8 profile 0 is the "Lotus" one, profile 1 the "IBM" one.
    const std::wstring m_profiles[2] = {
        JoinPath(RoamingAppData(), L"Lotus\\Sametime\\.config\\org.eclipse.update"),
        JoinPath(RoamingAppData(), L"IBM\\Sametime\\.config\\org.eclipse.update")};
    const std::wstring m_profileXml[2] = {JoinPath(m_profiles[0], L"platform.xml"),
                                          JoinPath(m_profiles[1], L"platform.xml")};
    const std::wstring m_st7Folder = JoinPath(m_sametime, L"configuration\\org.eclipse.update");
    const std::wstring m_st7Xml = JoinPath(m_st7Folder, L"platform.xml");
    const std::wstring m_embeddedFolder =
        JoinPath(m_data, L"workspace\\.config\\org.eclipse.update");
    const std::wstring m_embeddedXml = JoinPath(m_embeddedFolder, L"platform.xml");
    RunResult m_last;
};

TEST_F(SametimeConfigE2E, Sametime8ProfilesCombine) {
    // Only the IBM profile lists the feature, in another version, below the
    // nested shared site.
    Put(m_profileXml[0], PlatformXml(kSharedSite));
    Put(JoinPath(m_profiles[0], L"last.config.stamp"), "stamp");
    Put(m_profileXml[1],
        PlatformXml(kNestedSharedSite,
                    "<feature id=\"com.mrv.realtime.meeting.feature\" url=\"features/"
                    "com.mrv.realtime.meeting.feature_1.0.0/\" version=\"1.0.0\"/>"));
    EXPECT_EQ(1, Run(L"-issametime8enable"));

    EXPECT_EQ(1, Run(L"-disablesametime8confige"));
    EXPECT_EQ(std::string::npos, ReadFileBytes(m_profileXml[1]).find("com.mrv.realtime"));
    // The stamp was renamed for Eclipse to re-read its configuration.
    EXPECT_EQ((std::vector<std::wstring>{L"last.config.stamp.bak", L"platform.xml"}),
              ListDir(m_profiles[0]));
    EXPECT_EQ("stamp", ReadFileBytes(JoinPath(m_profiles[0], L"last.config.stamp.bak")));
    EXPECT_EQ(0, Run(L"-issametime8enable"));

    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    EXPECT_TRUE(Logged("strConfigFile.c_str()=" + Narrow(m_profileXml[0])));
    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    for (int profile : {0, 1}) {
        std::string text = ReadFileBytes(m_profileXml[profile]);
        EXPECT_EQ(1u, CountOf(text, kFeatureId)) << profile;
        size_t feature = text.find(kFeatureElement);
        ASSERT_NE(std::string::npos, feature) << text;
        EXPECT_LT(text.find(profile == 0 ? kSharedSite : kNestedSharedSite), feature);
        EXPECT_LT(text.find("com.example.chat"), feature);
    }
    // The last run found no stamp and cleared the old backup.
    EXPECT_EQ(std::vector<std::wstring>{L"platform.xml"}, ListDir(m_profiles[0]));
    EXPECT_EQ(1, Run(L"-issametime8enable"));
}

TEST_F(SametimeConfigE2E, Sametime8WithoutUsableProfilesGivesZero) {
    // A hostile Lotus profile, no IBM profile: refused, the file and stamp kept.
    const std::string hostile = BillionLaughs(kSharedSite);
    Put(m_profileXml[0], hostile);
    Put(JoinPath(m_profiles[0], L"last.config.stamp"), "stamp");
    EXPECT_EQ(0, Run(L"-enablesametime8confige"));
    EXPECT_TRUE(Logged("IsSametime8ConfigEnable: Load config file failed!\n"));
    EXPECT_TRUE(Logged("UpdateSametime8Config: platform.xml file can not be found!\n"));
    EXPECT_EQ(0, Run(L"-issametime8enable"));
    EXPECT_TRUE(Logged("IsSametime8ConfigEnable: platform.xml file can not be found!\n"));
    EXPECT_EQ(hostile, ReadFileBytes(m_profileXml[0]));

    const std::string siteless = PlatformXml("file:../elsewhere/");
    Put(m_profileXml[1], siteless);
    EXPECT_EQ(0, Run(L"-enablesametime8confige"));
    EXPECT_TRUE(Logged("IsSametime8ConfigEnable: get Shared Site element failed!\n"));
    EXPECT_EQ(siteless, ReadFileBytes(m_profileXml[1]));

    // A change that cannot be saved fails and keeps the stamp; with nothing
    // to change the file already says what was asked.
    const std::string usable = PlatformXml(kSharedSite);
    Put(m_profileXml[0], usable);
    HeldOpen reader(m_profileXml[0], FILE_SHARE_READ);  // unwritable even for root
    ASSERT_TRUE(reader.ok());
    EXPECT_EQ(0, Run(L"-enablesametime8confige"));
    EXPECT_EQ(usable, ReadFileBytes(m_profileXml[0]));
    EXPECT_TRUE(FileExists(JoinPath(m_profiles[0], L"last.config.stamp")));
    EXPECT_EQ(1, Run(L"-disablesametime8confige"));
}

TEST_F(SametimeConfigE2E, Sametime7EditsItsInstallationConfigurationUnlessReadOnly) {
    EXPECT_EQ(0, Run(L"-enablesametime7confige"));
    EXPECT_TRUE(Logged("UpdateSametime7Config: sametime was not installed!\n"));
    InstallSametime(7);
    EXPECT_EQ(0, Run(L"-enablesametime7confige"));
    EXPECT_TRUE(Logged("UpdateSametime7Config: platform.xml file can not be found!\n"));

    Put(m_st7Xml, PlatformXml(kSharedSite));
    Put(JoinPath(m_st7Folder, L"last.config.stamp"), "stamp");
    EXPECT_EQ(1, Run(L"-enablesametime7confige"));
    const std::string enabled = ReadFileBytes(m_st7Xml);
    EXPECT_EQ(1u, CountOf(enabled, kFeatureId));
    EXPECT_LT(enabled.find(kFeatureElement), enabled.find(kSharedSite));   // below the base site
    EXPECT_TRUE(FileExists(JoinPath(m_st7Folder, L"last.config.stamp")));  // kept by Sametime 7

    // Read-only: left alone, still 1. Wine running as root ignores the
    // attribute; a reader that shares reading only makes it unwritable there too.
    ASSERT_TRUE(SetFileAttributesW(m_st7Xml.c_str(), FILE_ATTRIBUTE_READONLY));
    {
        HeldOpen reader(m_st7Xml, FILE_SHARE_READ);
        ASSERT_TRUE(reader.ok());
        EXPECT_EQ(1, Run(L"-disablesametime7confige"));
    }
    SetFileAttributesW(m_st7Xml.c_str(), FILE_ATTRIBUTE_NORMAL);
    EXPECT_EQ(enabled, ReadFileBytes(m_st7Xml));
}

TEST_F(SametimeConfigE2E, EmbeddedEnableTestAndDisable) {
    InstallNotes8();
    EXPECT_EQ(0, Run(L"-enablesTembedded"));
    EXPECT_TRUE(Logged("UpdateEmbeddedST8Config: platform.xml file can not be found!\n"));
    EXPECT_EQ(0, Run(L"-isembedST8enable"));
    EXPECT_TRUE(Logged("isembedST8enable: platform.xml file can not be found!\n"));

    Put(m_embeddedXml, PlatformXml(kEmbeddedSite));
    Put(JoinPath(m_embeddedFolder, L"last.config.stamp"), "new");
    Put(JoinPath(m_embeddedFolder, L"last.config.stamp.bak"), "old");
    EXPECT_EQ(1, Run(L"-enableSTembedded"));
    EXPECT_EQ(1u, CountOf(ReadFileBytes(m_embeddedXml), kFeatureId));
    EXPECT_EQ((std::vector<std::wstring>{L"last.config.stamp.bak", L"platform.xml"}),
              ListDir(m_embeddedFolder));
    EXPECT_EQ("new", ReadFileBytes(JoinPath(m_embeddedFolder, L"last.config.stamp.bak")));
    EXPECT_EQ(1, Run(L"-isembedST8enable"));
    EXPECT_EQ(1, Run(L"-disableSTembedded"));
    EXPECT_EQ(std::string::npos, ReadFileBytes(m_embeddedXml).find("com.mrv.realtime"));
    EXPECT_EQ(0, Run(L"-isembedST8enable"));

    // A hostile file is refused: 0, the file and the stamp kept.
    const std::string hostile = BillionLaughs(kEmbeddedSite);
    Put(m_embeddedXml, hostile);
    Put(JoinPath(m_embeddedFolder, L"last.config.stamp"), "stamp");
    EXPECT_EQ(0, Run(L"-enableSTembedded"));
    EXPECT_TRUE(Logged("szConfigFile=" + Narrow(m_embeddedXml)));
    EXPECT_TRUE(Logged("UpdateEmbeddedST8Config: Load config file failed!\n"));
    EXPECT_EQ(0, Run(L"-isembedST8enable"));
    EXPECT_TRUE(Logged("isembedST8enable: Load config file failed!\n"));
    EXPECT_EQ(hostile, ReadFileBytes(m_embeddedXml));
    EXPECT_TRUE(FileExists(JoinPath(m_embeddedFolder, L"last.config.stamp")));
}

}  // namespace
