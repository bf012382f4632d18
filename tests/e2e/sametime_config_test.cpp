// The platform.xml keywords run by the real program: the two per-user
// Sametime 8 profiles, Sametime 7 and the embedded Sametime, their results
// as exit codes, the configuration stamps, and files that must be refused.
#include "tests/e2e/sametime_machine.h"

using namespace sametime_test;

namespace {

const char kSharedSite[] = "file:../shared/eclipse/";
const char kNestedSharedSite[] = "file:../../shared/eclipse/";
const char kEmbeddedSite[] = "platform:/config/../applications/eclipse/";
const char kOtherVersion[] =
    "<feature id=\"com.mrv.realtime.meeting.feature\" "
    "url=\"features/com.mrv.realtime.meeting.feature_1.0.0/\" version=\"1.0.0\"/>\n";

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
    void PutProfile(int profile, const std::string& text) { Put(ProfileConfig(profile), text); }
    std::string Profile(int profile) const { return ReadFileBytes(ProfileConfig(profile)); }
    int Run(const wchar_t* keyword) {
        RunResult run = Program().Run(keyword);
        EXPECT_FALSE(run.crashed) << Narrow(keyword);
        m_last = run;
        return run.exitCode;
    }

    std::wstring EmbeddedConfigFolder() const {
        return In(m_data, L"workspace\\.config\\org.eclipse.update");
    }
    std::wstring Sametime7Config() const {
        return In(m_sametime, L"configuration\\org.eclipse.update\\platform.xml");
    }

    RunResult m_last;
};

TEST_F(SametimeConfigE2E, Sametime8EnableTestAndDisableInTheLotusProfile) {
    PutProfile(0, PlatformXml(kSharedSite));
    Put(In(ProfileFolder(0), L"last.config.stamp"), "stamp");

    EXPECT_EQ(0, Run(L"-issametime8enable"));
    EXPECT_TRUE(m_last.HasTraceContaining("qmMirovanONI: Command is issametime8enable.\n"));
    EXPECT_TRUE(m_last.HasTraceContaining(
        "IsSametime8ConfigEnable: platform.xml file can not be found!\n"));  // the IBM profile

    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    EXPECT_TRUE(m_last.HasTraceContaining("qmMirovanONI: Command is enablesametime8confige.\n"));
    EXPECT_TRUE(m_last.HasTraceContaining("strConfigFile.c_str()=" + Narrow(ProfileConfig(0))));
    // The stamp was renamed for Eclipse to re-read its configuration.
    EXPECT_EQ("stamp", ReadFileBytes(In(ProfileFolder(0), L"last.config.stamp.bak")));
    EXPECT_FALSE(FileExists(In(ProfileFolder(0), L"last.config.stamp")));
    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    std::string text = Profile(0);
    EXPECT_EQ(1u, CountOf(text, kFeatureId)) << text;
    size_t feature = text.find(kFeatureElement);
    ASSERT_NE(std::string::npos, feature) << text;
    EXPECT_LT(text.find(kSharedSite), feature);
    EXPECT_LT(text.find("com.example.chat"), feature);
    EXPECT_FALSE(FileExists(ProfileConfig(1)));
    // The second run found no stamp and cleared the old backup.
    EXPECT_EQ(std::vector<std::wstring>{L"platform.xml"}, ListDir(ProfileFolder(0)));

    EXPECT_EQ(1, Run(L"-issametime8enable"));
    EXPECT_EQ(1, Run(L"-disablesametime8confige"));
    EXPECT_TRUE(m_last.HasTraceContaining("qmMirovanONI: Command is disablesametime8confige.\n"));
    EXPECT_EQ(std::string::npos, Profile(0).find("com.mrv.realtime"));
    EXPECT_EQ(0, Run(L"-issametime8enable"));
}

TEST_F(SametimeConfigE2E, Sametime8ProfilesCombine) {
    // Only the IBM profile lists the feature, in another version, below the
    // nested shared site.
    PutProfile(0, PlatformXml(kSharedSite));
    PutProfile(1, PlatformXml(kNestedSharedSite, kOtherVersion));
    EXPECT_EQ(1, Run(L"-issametime8enable"));

    // Disable removes the other version; the Lotus profile is processed too.
    EXPECT_EQ(1, Run(L"-disablesametime8confige"));
    EXPECT_EQ(std::string::npos, Profile(1).find("com.mrv.realtime"));
    EXPECT_EQ(0, Run(L"-issametime8enable"));

    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    for (int profile : {0, 1}) {
        std::string text = Profile(profile);
        EXPECT_EQ(1u, CountOf(text, kFeatureId)) << profile;
        EXPECT_LT(text.find(profile == 0 ? kSharedSite : kNestedSharedSite),
                  text.find(kFeatureElement));
    }
}

TEST_F(SametimeConfigE2E, Sametime8WithoutUsableProfilesGivesZero) {
    EXPECT_EQ(0, Run(L"-enablesametime8confige"));
    EXPECT_TRUE(
        m_last.HasTraceContaining("UpdateSametime8Config: platform.xml file can not be found!\n"));
    EXPECT_EQ(0, Run(L"-disablesametime8confige"));
    EXPECT_EQ(0, Run(L"-issametime8enable"));

    // A hostile profile and one without the shared site: both refused, both kept.
    const std::string hostile = BillionLaughs(kSharedSite);
    const std::string siteless = PlatformXml("file:../elsewhere/");
    PutProfile(0, hostile);
    PutProfile(1, siteless);
    Put(In(ProfileFolder(0), L"last.config.stamp"), "stamp");
    EXPECT_EQ(0, Run(L"-enablesametime8confige"));
    EXPECT_TRUE(m_last.HasTraceContaining("IsSametime8ConfigEnable: Load config file failed!\n"));
    EXPECT_TRUE(
        m_last.HasTraceContaining("IsSametime8ConfigEnable: get Shared Site element failed!\n"));
    EXPECT_EQ(0, Run(L"-issametime8enable"));
    EXPECT_EQ(hostile, Profile(0));
    EXPECT_EQ(siteless, Profile(1));
    EXPECT_TRUE(FileExists(In(ProfileFolder(0), L"last.config.stamp")));
}

TEST_F(SametimeConfigE2E, Sametime7EditsItsInstallationConfiguration) {
    EXPECT_EQ(0, Run(L"-enablesametime7confige"));
    EXPECT_TRUE(m_last.HasTraceContaining("UpdateSametime7Config: sametime was not installed!\n"));

    InstallSametime(7);
    EXPECT_EQ(0, Run(L"-enablesametime7confige"));
    EXPECT_TRUE(
        m_last.HasTraceContaining("UpdateSametime7Config: platform.xml file can not be found!\n"));

    Put(Sametime7Config(), PlatformXml(kSharedSite));
    Put(In(m_sametime, L"configuration\\org.eclipse.update\\last.config.stamp"), "stamp");
    EXPECT_EQ(1, Run(L"-enablesametime7confige"));
    EXPECT_EQ(1, Run(L"-enablesametime7confige"));
    std::string text = ReadFileBytes(Sametime7Config());
    EXPECT_EQ(1u, CountOf(text, kFeatureId));
    // Below the base site, before the shared one.
    EXPECT_LT(text.find(kFeatureElement), text.find(kSharedSite));
    // Sametime 7 keeps its stamp.
    EXPECT_TRUE(
        FileExists(In(m_sametime, L"configuration\\org.eclipse.update\\last.config.stamp")));

    EXPECT_EQ(1, Run(L"-disablesametime7confige"));
    EXPECT_EQ(std::string::npos, ReadFileBytes(Sametime7Config()).find("com.mrv.realtime"));
}

TEST_F(SametimeConfigE2E, AReadOnlySametime7ConfigurationIsLeftAloneAndStillReportsOne) {
    InstallSametime(7);
    const std::string original = PlatformXml(kSharedSite);
    Put(Sametime7Config(), original);
    ASSERT_TRUE(SetFileAttributesW(Sametime7Config().c_str(), FILE_ATTRIBUTE_READONLY));
    {
        // Wine running as root ignores the attribute; a reader that shares
        // reading only makes the file unwritable there as well.
        HeldOpen reader(Sametime7Config(), FILE_SHARE_READ);
        ASSERT_TRUE(reader.ok());
        EXPECT_EQ(1, Run(L"-enablesametime7confige"));
    }
    SetFileAttributesW(Sametime7Config().c_str(), FILE_ATTRIBUTE_NORMAL);
    EXPECT_EQ(original, ReadFileBytes(Sametime7Config()));
}

TEST_F(SametimeConfigE2E, EmbeddedEnableTestAndDisable) {
    EXPECT_EQ(0, Run(L"-enableSTembedded"));
    EXPECT_EQ(0, Run(L"-isembedST8enable"));
    InstallNotes8();
    EXPECT_EQ(0, Run(L"-enablesTembedded"));
    EXPECT_TRUE(m_last.HasTraceContaining(
        "UpdateEmbeddedST8Config: platform.xml file can not be found!\n"));
    EXPECT_EQ(0, Run(L"-isembedST8enable"));
    EXPECT_TRUE(
        m_last.HasTraceContaining("isembedST8enable: platform.xml file can not be found!\n"));

    const std::wstring config = In(EmbeddedConfigFolder(), L"platform.xml");
    Put(config, PlatformXml(kEmbeddedSite));
    Put(In(EmbeddedConfigFolder(), L"last.config.stamp"), "new");
    Put(In(EmbeddedConfigFolder(), L"last.config.stamp.bak"), "old");
    EXPECT_EQ(1, Run(L"-enableSTembedded"));
    EXPECT_EQ(1u, CountOf(ReadFileBytes(config), kFeatureId));
    EXPECT_EQ("new", ReadFileBytes(In(EmbeddedConfigFolder(), L"last.config.stamp.bak")));
    EXPECT_FALSE(FileExists(In(EmbeddedConfigFolder(), L"last.config.stamp")));
    EXPECT_EQ(1, Run(L"-isembedST8enable"));

    EXPECT_EQ(1, Run(L"-disableSTembedded"));
    EXPECT_EQ(std::string::npos, ReadFileBytes(config).find("com.mrv.realtime"));
    EXPECT_EQ(0, Run(L"-isembedST8enable"));
}

TEST_F(SametimeConfigE2E, EmbeddedRefusesDtdsAndMalformedFiles) {
    InstallNotes8();
    const std::wstring config = In(EmbeddedConfigFolder(), L"platform.xml");
    const std::wstring secret = m_scratch.Sub(L"secret.txt");
    Put(secret, "secret");
    for (const std::string& text : {
             BillionLaughs(kEmbeddedSite),
             "<?xml version=\"1.0\"?>\n<!DOCTYPE config [<!ENTITY x SYSTEM \"file:///" +
                 Narrow(secret) + "\">]>\n<config><site url=\"" + std::string(kEmbeddedSite) +
                 "\">&x;</site></config>\n",
             PlatformXml(kEmbeddedSite).substr(0, 200),
         }) {
        Put(config, text);
        Put(In(EmbeddedConfigFolder(), L"last.config.stamp"), "stamp");
        EXPECT_EQ(0, Run(L"-enableSTembedded"));
        EXPECT_TRUE(m_last.HasTraceContaining("szConfigFile=" + Narrow(config)));
        EXPECT_TRUE(
            m_last.HasTraceContaining("UpdateEmbeddedST8Config: Load config file failed!\n"));
        EXPECT_EQ(0, Run(L"-isembedST8enable"));
        EXPECT_TRUE(m_last.HasTraceContaining("isembedST8enable: Load config file failed!\n"));
        EXPECT_EQ(text, ReadFileBytes(config));
        EXPECT_TRUE(FileExists(In(EmbeddedConfigFolder(), L"last.config.stamp")));
    }
}

}  // namespace
