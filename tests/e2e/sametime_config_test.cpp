// The platform.xml keywords run by the real program: the two per-user
// Sametime 8 profiles, Sametime 7 and the embedded Sametime, their results as
// exit codes, the configuration stamps, files that must be refused, and
// rewrites that never lose the user's file.
#include <memory>

#include "tests/e2e/sametime_machine.h"

using namespace sametime_test;

namespace {

const char kSharedSite[] = "file:../shared/eclipse/";
const char kNestedSharedSite[] = "file:../../shared/eclipse/";
const char kEmbeddedSite[] = "platform:/config/../applications/eclipse/";
const char kSaveFailed[] = " UpdateSametime8Config: Save config file failed!\n,\n";
const std::vector<std::wstring> kStampKept = {L"last.config.stamp", L"last.config.stamp.bak",
                                              L"platform.xml"};
const std::vector<std::wstring> kStampRenamed = {L"last.config.stamp.bak", L"platform.xml"};

class SametimeConfigE2E : public SametimeMachine {
protected:
    int Run(const wchar_t* keyword) {
        RunResult run = Program().Run(keyword);
        EXPECT_FALSE(run.crashed || run.timedOut) << Narrow(keyword);
        return run.exitCode;
    }
    void PutConfig(const std::wstring& folder, const std::string& xml) {
        Put(JoinPath(folder, L"platform.xml"), xml);
        Put(JoinPath(folder, L"last.config.stamp"), "stamp");
        Put(JoinPath(folder, L"last.config.stamp.bak"), "an older stamp");  // to be replaced
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
    PutConfig(m_profiles[0], PlatformXml(kSharedSite));
    Put(m_profileXml[1],
        PlatformXml(kNestedSharedSite,
                    "<feature id=\"com.mrv.realtime.meeting.feature\" url=\"features/"
                    "com.mrv.realtime.meeting.feature_1.0.0/\" version=\"1.0.0\"/>"));
    EXPECT_EQ(1, Run(L"-issametime8enable"));

    EXPECT_EQ(1, Run(L"-disablesametime8confige"));
    EXPECT_EQ(std::string::npos, ReadFileBytes(m_profileXml[1]).find("com.mrv.realtime"));
    // The stamp was renamed for Eclipse to read its configuration again, and
    // no staging file is left beside the document.
    EXPECT_EQ(kStampRenamed, ListDir(m_profiles[0]));
    EXPECT_EQ(0, Run(L"-issametime8enable"));

    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    EXPECT_EQ(1, Run(L"-enablesametime8confige"));
    for (int profile : {0, 1}) {
        const std::string text = ReadFileBytes(m_profileXml[profile]);
        EXPECT_EQ(text.find(kFeatureId), text.rfind(kFeatureId)) << profile;  // listed once
        const size_t feature = text.find(kFeatureElement);
        ASSERT_NE(std::string::npos, feature) << text;
        EXPECT_LT(text.find(profile == 0 ? kSharedSite : kNestedSharedSite), feature);
        EXPECT_LT(text.find("com.example.chat"), feature);
    }
    EXPECT_EQ(1, Run(L"-issametime8enable"));
}

TEST_F(SametimeConfigE2E, Sametime8WithoutUsableProfilesGivesZero) {
    // A Lotus profile with a DTD (its entities could expand without end) and
    // a siteless IBM profile: refused and kept.
    const std::string hostile =
        "<?xml version=\"1.0\"?>\n<!DOCTYPE config [<!ENTITY a \"x\">]>\n"
        "<config><site url=\"file:../shared/eclipse/\">&a;</site></config>\n";
    const std::string siteless = PlatformXml("file:../elsewhere/");
    Put(m_profileXml[0], hostile);
    Put(m_profileXml[1], siteless);
    EXPECT_EQ(0, Run(L"-enablesametime8confige"));
    EXPECT_EQ(0, Run(L"-issametime8enable"));
    EXPECT_EQ(hostile, ReadFileBytes(m_profileXml[0]));
    EXPECT_EQ(siteless, ReadFileBytes(m_profileXml[1]));
}

TEST_F(SametimeConfigE2E, AFailedSaveLosesNothingAndAnUnchangedDocumentIsNotWritten) {
    // Laid out as no DOM would write it, and listing the feature already.
    const std::string unchanged =
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\r\n<config\tversion=\"3.0\">\r\n"
        "  <site   url=\"file:../shared/eclipse/\"   enabled=\"true\">\r\n"
        "    <feature  version=\"1.0.1\" id=\"com.mrv.realtime.meeting.feature\"/>\r\n"
        "  </site>\r\n</config>\r\n";
    const struct {
        const char* name;
        DWORD attributes;
        bool locked;  // held by a reader that lets nobody write, rename or delete it
        std::string original;
        int result;
        bool written;
    } rows[] = {
        {"locked", FILE_ATTRIBUTE_NORMAL, true, PlatformXml(kSharedSite), 0, false},
        {"read-only", FILE_ATTRIBUTE_READONLY, false, PlatformXml(kSharedSite), 0, false},
        {"hidden", FILE_ATTRIBUTE_HIDDEN, false, PlatformXml(kSharedSite), 1, true},
        {"unchanged, read-only", FILE_ATTRIBUTE_READONLY, false, unchanged, 1, false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        RemoveTree(m_profiles[0]);
        PutConfig(m_profiles[0], row.original);
        ASSERT_TRUE(SetFileAttributesW(m_profileXml[0].c_str(), row.attributes));
        auto reader =
            row.locked ? std::make_unique<HeldOpen>(m_profileXml[0], FILE_SHARE_READ) : nullptr;
        RunResult run = Program().Run(L"-enablesametime8confige");
        reader.reset();
        EXPECT_EQ(row.result, run.exitCode);
        const DWORD kept = FILE_ATTRIBUTE_READONLY | FILE_ATTRIBUTE_HIDDEN;
        EXPECT_EQ(row.attributes & kept, GetFileAttributesW(m_profileXml[0].c_str()) & kept);
        SetFileAttributesW(m_profileXml[0].c_str(), FILE_ATTRIBUTE_NORMAL);
        EXPECT_EQ(!row.written, ReadFileBytes(m_profileXml[0]) == row.original);
        EXPECT_EQ(row.result == 0, run.HasTrace(kSaveFailed));
        // The stamp goes aside after every processed edit, and only then.
        EXPECT_EQ(row.result == 0 ? kStampKept : kStampRenamed, ListDir(m_profiles[0]));
    }
}

TEST_F(SametimeConfigE2E, Sametime7EditsItsInstallationConfigurationUnlessReadOnly) {
    const std::wstring folder = JoinPath(m_sametime, L"configuration\\org.eclipse.update");
    const std::wstring xml = JoinPath(folder, L"platform.xml");
    EXPECT_EQ(0, Run(L"-enablesametime7confige"));  // not installed
    InstallSametime(7);
    PutConfig(folder, PlatformXml(kSharedSite));
    EXPECT_EQ(1, Run(L"-enablesametime7confige"));
    const std::string enabled = ReadFileBytes(xml);
    EXPECT_EQ(enabled.find(kFeatureId), enabled.rfind(kFeatureId));
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
    PutConfig(folder, PlatformXml(kEmbeddedSite));
    EXPECT_EQ(1, Run(L"-enablesTembedded"));
    EXPECT_NE(std::string::npos, ReadFileBytes(xml).find(kFeatureElement));
    EXPECT_EQ("stamp", ReadFileBytes(JoinPath(folder, L"last.config.stamp.bak")));  // replaced
    EXPECT_EQ(1, Run(L"-isembedST8enable"));
    EXPECT_EQ(1, Run(L"-disableSTembedded"));
    EXPECT_EQ(std::string::npos, ReadFileBytes(xml).find("com.mrv.realtime"));
    EXPECT_EQ(0, Run(L"-isembedST8enable"));
}

}  // namespace
