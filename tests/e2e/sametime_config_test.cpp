// The platform.xml keywords run by the real program: the two per-user
// Sametime 8 profiles, Sametime 7 and the embedded Sametime, their results as
// exit codes, the configuration stamps, and files that must be refused.
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
        RunResult run = Program().Run(keyword);
        EXPECT_FALSE(run.crashed || run.timedOut) << Narrow(keyword);
        return run.exitCode;
    }

    // Sametime 8 profile 0 is the "Lotus" one, profile 1 the "IBM" one.
    const std::wstring m_profiles[2] = {
        JoinPath(RoamingAppData(), L"Lotus\\Sametime\\.config\\org.eclipse.update"),
        JoinPath(RoamingAppData(), L"IBM\\Sametime\\.config\\org.eclipse.update")};
    const std::wstring m_profileXml[2] = {JoinPath(m_profiles[0], L"platform.xml"),
                                          JoinPath(m_profiles[1], L"platform.xml")};
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
    // The stamp was renamed for Eclipse to read its configuration again.
    EXPECT_EQ((std::vector<std::wstring>{L"last.config.stamp.bak", L"platform.xml"}),
              ListDir(m_profiles[0]));
    EXPECT_EQ(0, Run(L"-issametime8enable"));

    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    for (int profile : {0, 1}) {
        const std::string text = ReadFileBytes(m_profileXml[profile]);
        EXPECT_EQ(1u, CountOf(text, kFeatureId)) << profile;
        const size_t feature = text.find(kFeatureElement);
        ASSERT_NE(std::string::npos, feature) << text;
        EXPECT_LT(text.find(profile == 0 ? kSharedSite : kNestedSharedSite), feature);
        EXPECT_LT(text.find("com.example.chat"), feature);
    }
    EXPECT_EQ(1, Run(L"-issametime8enable"));
}

TEST_F(SametimeConfigE2E, Sametime8WithoutUsableProfilesGivesZero) {
    // A hostile Lotus profile and a siteless IBM profile: refused and kept.
    const std::string hostile = BillionLaughs(kSharedSite);
    const std::string siteless = PlatformXml("file:../elsewhere/");
    Put(m_profileXml[0], hostile);
    Put(m_profileXml[1], siteless);
    EXPECT_EQ(0, Run(L"-enablesametime8confige"));
    EXPECT_EQ(0, Run(L"-issametime8enable"));
    EXPECT_EQ(hostile, ReadFileBytes(m_profileXml[0]));
    EXPECT_EQ(siteless, ReadFileBytes(m_profileXml[1]));
}

TEST_F(SametimeConfigE2E, Sametime7EditsItsInstallationConfigurationUnlessReadOnly) {
    const std::wstring folder = JoinPath(m_sametime, L"configuration\\org.eclipse.update");
    const std::wstring xml = JoinPath(folder, L"platform.xml");
    EXPECT_EQ(0, Run(L"-enablesametime7confige"));  // not installed
    InstallSametime(7);
    Put(xml, PlatformXml(kSharedSite));
    Put(JoinPath(folder, L"last.config.stamp"), "stamp");
    EXPECT_EQ(1, Run(L"-enablesametime7confige"));
    const std::string enabled = ReadFileBytes(xml);
    EXPECT_EQ(1u, CountOf(enabled, kFeatureId));
    EXPECT_LT(enabled.find(kFeatureElement), enabled.find(kSharedSite));  // below the base site
    EXPECT_TRUE(FileExists(JoinPath(folder, L"last.config.stamp")));      // kept by Sametime 7

    // Read-only: left alone, still 1. Wine running as root ignores the
    // attribute; a reader that shares reading only makes it unwritable there too.
    ASSERT_TRUE(SetFileAttributesW(xml.c_str(), FILE_ATTRIBUTE_READONLY));
    {
        HeldOpen reader(xml, FILE_SHARE_READ);
        ASSERT_TRUE(reader.ok());
        EXPECT_EQ(1, Run(L"-disablesametime7confige"));
    }
    SetFileAttributesW(xml.c_str(), FILE_ATTRIBUTE_NORMAL);
    EXPECT_EQ(enabled, ReadFileBytes(xml));
}

TEST_F(SametimeConfigE2E, EmbeddedEnableTestAndDisable) {
    const std::wstring folder = JoinPath(m_data, L"workspace\\.config\\org.eclipse.update");
    const std::wstring xml = JoinPath(folder, L"platform.xml");
    InstallNotes8();
    Put(xml, PlatformXml(kEmbeddedSite));
    Put(JoinPath(folder, L"last.config.stamp"), "new");
    EXPECT_EQ(1, Run(L"-enablesTembedded"));
    EXPECT_EQ(1u, CountOf(ReadFileBytes(xml), kFeatureId));
    EXPECT_EQ("new", ReadFileBytes(JoinPath(folder, L"last.config.stamp.bak")));
    EXPECT_EQ(1, Run(L"-isembedST8enable"));
    EXPECT_EQ(1, Run(L"-disableSTembedded"));
    EXPECT_EQ(std::string::npos, ReadFileBytes(xml).find("com.mrv.realtime"));
    EXPECT_EQ(0, Run(L"-isembedST8enable"));

    const std::string hostile = BillionLaughs(kEmbeddedSite);
    Put(xml, hostile);
    EXPECT_EQ(0, Run(L"-enableSTembedded"));
    EXPECT_EQ(hostile, ReadFileBytes(xml));
}

}  // namespace
