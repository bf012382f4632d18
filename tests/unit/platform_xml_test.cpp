// The feature element in real platform.xml files, through the MSXML DOM.
#include <gtest/gtest.h>
#include <objbase.h>

#include <string>

#include "notes/platform_xml.h"
#include "notes/untrusted_xml_bytes.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"

namespace {

const wchar_t kST8Site[] = L"//site[@url=\"file:../shared/eclipse/\"]";
const wchar_t kST8NestedSite[] = L"//site[@url=\"file:../../shared/eclipse/\"]";
const wchar_t kST7Site[] = L"//site[@url=\"platform:/base/\"]";
const SiteXPaths kSametime8Sites = {kST8Site, kST8NestedSite};

const char kNewFeature[] =
    "<feature id=\"com.mrv.realtime.meeting.feature\" "
    "url=\"features/com.mrv.realtime.meeting.feature_1.0.1/\" version=\"1.0.1\"";

const char kHeader[] = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";

std::string Sametime8Config(const std::string& sharedSiteUrl, const std::string& sharedFeatures) {
    return std::string(kHeader) +
           "<config date=\"1300000000000\" transient=\"false\" version=\"3.0\">\n"
           "<site enabled=\"true\" policy=\"USER-EXCLUDE\" updateable=\"true\" "
           "url=\"platform:/base/\">\n"
           "<feature id=\"org.eclipse.rcp\" url=\"features/org.eclipse.rcp_3.4.0/\" "
           "version=\"3.4.0\">\n</feature>\n</site>\n"
           "<site enabled=\"true\" policy=\"USER-EXCLUDE\" updateable=\"true\" url=\"" +
           sharedSiteUrl +
           "\">\n"
           "<feature id=\"com.example.chat\" url=\"features/com.example.chat_8.0.0/\" "
           "version=\"8.0.0\">\n</feature>\n" +
           sharedFeatures + "</site>\n</config>\n";
}

size_t Count(const std::string& text, const std::string& part) {
    size_t count = 0;
    for (size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) {
        ++count;
    }
    return count;
}

bool Writable(const wchar_t*) {
    return true;
}
bool ReadOnly(const wchar_t*) {
    return false;
}

class PlatformXml : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)));
    }
    void TearDown() override { CoUninitialize(); }

    void Write(const std::string& text) { ASSERT_TRUE(WriteFileBytes(m_file, text)); }
    std::string Read() const { return ReadFileBytes(m_file); }

    PlatformXmlEdit Edit(bool enable, const SiteXPaths& sites = kSametime8Sites,
                         SaveGate gate = nullptr) {
        return EditPlatformXml(m_file.c_str(), sites, enable, gate);
    }
    bool Listed(const SiteXPaths& sites = kSametime8Sites) {
        bool listed = false;
        EXPECT_EQ(PlatformXmlStatus::kOk, TestPlatformXml(m_file.c_str(), sites, &listed));
        return listed;
    }
    // Loading must fail, the file stay byte for byte and the test say "not listed".
    void ExpectRefused(const std::string& text) {
        Write(text);
        EXPECT_EQ(PlatformXmlStatus::kLoadFailed, Edit(true).status);
        EXPECT_EQ(PlatformXmlStatus::kLoadFailed, Edit(false).status);
        bool listed = true;
        EXPECT_EQ(PlatformXmlStatus::kLoadFailed,
                  TestPlatformXml(m_file.c_str(), kSametime8Sites, &listed));
        EXPECT_FALSE(listed);
        EXPECT_EQ(text, Read());
    }

    ScratchDir m_scratch{L"pxml"};
    std::wstring m_file = m_scratch.Sub(L"platform.xml");
};

TEST_F(PlatformXml, EnableAppendsTheFeatureWithItsAttributesInOrder) {
    Write(Sametime8Config("file:../shared/eclipse/", ""));
    PlatformXmlEdit edit = Edit(true);
    EXPECT_EQ(PlatformXmlStatus::kOk, edit.status);
    EXPECT_TRUE(edit.changed);
    EXPECT_TRUE(edit.saved);

    std::string text = Read();
    size_t feature = text.find(kNewFeature);
    ASSERT_NE(std::string::npos, feature) << text;
    // Empty, and the last child of the shared site.
    std::string rest = text.substr(feature + strlen(kNewFeature));
    EXPECT_TRUE(rest.rfind("/>", 0) == 0 || rest.rfind(" />", 0) == 0) << rest;
    size_t sharedSite = text.find("url=\"file:../shared/eclipse/\"");
    EXPECT_LT(sharedSite, feature);
    EXPECT_LT(text.find("com.example.chat"), feature);
    EXPECT_EQ(text.find("</site>", sharedSite), text.find("</site>", feature));
    EXPECT_TRUE(Listed());
}

TEST_F(PlatformXml, EnablingTwiceAddsTheElementOnce) {
    Write(Sametime8Config("file:../shared/eclipse/", ""));
    EXPECT_EQ(PlatformXmlStatus::kOk, Edit(true).status);
    PlatformXmlEdit again = Edit(true);
    EXPECT_EQ(PlatformXmlStatus::kOk, again.status);
    EXPECT_FALSE(again.changed);
    EXPECT_TRUE(again.saved);  // written back unchanged
    EXPECT_EQ(1u, Count(Read(), "com.mrv.realtime.meeting.feature\""));
}

TEST_F(PlatformXml, AnotherVersionWithTheSameIdCountsAndIsRemoved) {
    Write(Sametime8Config("file:../shared/eclipse/",
                          "<feature id=\"com.mrv.realtime.meeting.feature\" "
                          "url=\"features/com.mrv.realtime.meeting.feature_1.0.0/\" "
                          "version=\"1.0.0\"/>\n"));
    EXPECT_TRUE(Listed());
    PlatformXmlEdit enable = Edit(true);
    EXPECT_FALSE(enable.changed);
    EXPECT_EQ(std::string::npos, Read().find("1.0.1"));

    PlatformXmlEdit disable = Edit(false);
    EXPECT_EQ(PlatformXmlStatus::kOk, disable.status);
    EXPECT_TRUE(disable.changed);
    std::string text = Read();
    EXPECT_EQ(std::string::npos, text.find("com.mrv.realtime")) << text;
    EXPECT_NE(std::string::npos, text.find("com.example.chat"));
    EXPECT_NE(std::string::npos, text.find("org.eclipse.rcp"));
    EXPECT_FALSE(Listed());
}

TEST_F(PlatformXml, DisablingWhatIsAbsentRewritesAndSucceeds) {
    Write(Sametime8Config("file:../shared/eclipse/", ""));
    PlatformXmlEdit edit = Edit(false);
    EXPECT_EQ(PlatformXmlStatus::kOk, edit.status);
    EXPECT_FALSE(edit.changed);
    EXPECT_TRUE(edit.saved);
}

TEST_F(PlatformXml, TheNestedSharedSiteIsTheSecondChoice) {
    Write(Sametime8Config("file:../../shared/eclipse/", ""));
    EXPECT_FALSE(Listed());
    EXPECT_EQ(PlatformXmlStatus::kOk, Edit(true).status);
    std::string text = Read();
    EXPECT_LT(text.find("file:../../shared/eclipse/"), text.find(kNewFeature));
    EXPECT_TRUE(Listed());
    // The first expression alone does not find this site.
    EXPECT_EQ(PlatformXmlStatus::kNoSite, Edit(false, SiteXPaths{kST8Site}).status);
}

TEST_F(PlatformXml, AMissingSiteLeavesTheFileAlone) {
    std::string text = Sametime8Config("file:../shared/eclipse/", "");
    Write(text);
    EXPECT_EQ(PlatformXmlStatus::kNoSite,
              Edit(true, SiteXPaths{L"//site[@url=\"platform:/config/../applications/eclipse/\"]"})
                  .status);
    EXPECT_EQ(text, Read());
    // The Sametime 7 site of the same file is there.
    EXPECT_EQ(PlatformXmlStatus::kOk, Edit(true, SiteXPaths{kST7Site}).status);
    EXPECT_LT(Read().find(kNewFeature), Read().find("file:../shared/eclipse/"));
}

TEST_F(PlatformXml, AClosedGateLeavesTheFileUnchangedAndSucceeds) {
    std::string text = Sametime8Config("file:../shared/eclipse/", "");
    Write(text);
    PlatformXmlEdit edit = Edit(true, kSametime8Sites, ReadOnly);
    EXPECT_EQ(PlatformXmlStatus::kOk, edit.status);
    EXPECT_TRUE(edit.changed);
    EXPECT_FALSE(edit.saved);
    EXPECT_EQ(text, Read());
    EXPECT_TRUE(Edit(true, kSametime8Sites, Writable).saved);
    EXPECT_NE(std::string::npos, Read().find(kNewFeature));
}

TEST_F(PlatformXml, AChangeThatCannotBeWrittenFails) {
    std::string text = Sametime8Config("file:../shared/eclipse/", "");
    Write(text);
    // Another reader that shares reading only: no one can write meanwhile
    // (the read-only attribute alone does not stop Wine running as root).
    HANDLE reader = CreateFileW(m_file.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr,
                                OPEN_EXISTING, FILE_ATTRIBUTE_NORMAL, nullptr);
    ASSERT_NE(INVALID_HANDLE_VALUE, reader);
    EXPECT_EQ(PlatformXmlStatus::kSaveFailed, Edit(true).status);
    // Nothing to change: the file already says what was asked.
    EXPECT_EQ(PlatformXmlStatus::kOk, Edit(false).status);
    CloseHandle(reader);
    EXPECT_EQ(text, Read());
}

TEST_F(PlatformXml, MissingAndEmptyFilesFail) {
    EXPECT_EQ(PlatformXmlStatus::kLoadFailed, Edit(true).status);
    EXPECT_FALSE(FileExists(m_file));
    ExpectRefused("");
}

TEST_F(PlatformXml, MalformedFilesAreLeftAlone) {
    ExpectRefused(std::string(kHeader) + "<config><site url=\"file:../shared/eclipse/\"></config>");
    ExpectRefused("not xml at all");
    ExpectRefused(Sametime8Config("file:../shared/eclipse/", "") + "<second-root/>");
}

TEST_F(PlatformXml, EntityExpansionIsRefusedBeforeParsing) {
    std::string doctype = "<!DOCTYPE config [\n<!ENTITY a0 \"lol\">\n";
    for (int i = 1; i <= 10; ++i) {
        doctype += "<!ENTITY a" + std::to_string(i) + " \"";
        for (int j = 0; j < 10; ++j) {
            doctype += "&a" + std::to_string(i - 1) + ";";
        }
        doctype += "\">\n";
    }
    doctype += "]>\n";
    ExpectRefused(std::string(kHeader) + doctype +
                  "<config><site url=\"file:../shared/eclipse/\">&a10;</site></config>\n");
}

TEST_F(PlatformXml, ExternalEntitiesAndDtdsAreRefused) {
    std::wstring secret = m_scratch.Sub(L"secret.txt");
    ASSERT_TRUE(WriteFileBytes(secret, "secret"));
    ExpectRefused(std::string(kHeader) + "<!DOCTYPE config [<!ENTITY x SYSTEM \"file:///" +
                  Narrow(secret) +
                  "\">]>\n<config><site url=\"file:../shared/eclipse/\">&x;</site></config>\n");
    std::wstring dtd = m_scratch.Sub(L"config.dtd");
    ASSERT_TRUE(WriteFileBytes(dtd, "<!ENTITY y \"expanded\">"));
    ExpectRefused(std::string(kHeader) + "<!DOCTYPE config SYSTEM \"" + Narrow(dtd) +
                  "\">\n<config><site url=\"file:../shared/eclipse/\"/></config>\n");
    ExpectRefused(std::string(kHeader) +
                  "<!DOCTYPE config>\n<config><site url=\"file:../shared/eclipse/\"/></config>\n");
}

TEST_F(PlatformXml, ADoctypeInUtf16IsRefusedToo) {
    std::wstring wide =
        L"\xFEFF<?xml version=\"1.0\" encoding=\"UTF-16\"?>"
        L"<!DOCTYPE config [<!ENTITY a \"b\">]>"
        L"<config><site url=\"file:../shared/eclipse/\">&a;</site></config>";
    ExpectRefused(
        std::string(reinterpret_cast<const char*>(wide.data()), wide.size() * sizeof(wchar_t)));
}

TEST_F(PlatformXml, DeepNestingFails) {
    std::string text = std::string(kHeader) + "<config><site url=\"file:../shared/eclipse/\">";
    const int depth = 100000;
    for (int i = 0; i < depth; ++i) {
        text += "<a>";
    }
    for (int i = 0; i < depth; ++i) {
        text += "</a>";
    }
    text += "</site></config>";
    ExpectRefused(text);
}

TEST_F(PlatformXml, AFileAboveTheSizeLimitIsNotRead) {
    // A sparse file: only its size matters.
    {
        HANDLE file = CreateFileW(m_file.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS,
                                  FILE_ATTRIBUTE_NORMAL, nullptr);
        ASSERT_NE(INVALID_HANDLE_VALUE, file);
        DWORD written = 0;
        WriteFile(file, kHeader, static_cast<DWORD>(strlen(kHeader)), &written, nullptr);
        LARGE_INTEGER size;
        size.QuadPart = static_cast<LONGLONG>(kMaxUntrustedXmlBytes) + 1;
        SetFilePointerEx(file, size, nullptr, FILE_BEGIN);
        SetEndOfFile(file);
        CloseHandle(file);
    }
    EXPECT_EQ(PlatformXmlStatus::kLoadFailed, Edit(true).status);
    WIN32_FILE_ATTRIBUTE_DATA data = {};
    ASSERT_TRUE(GetFileAttributesExW(m_file.c_str(), GetFileExInfoStandard, &data));
    EXPECT_EQ(kMaxUntrustedXmlBytes + 1,
              (static_cast<ULONGLONG>(data.nFileSizeHigh) << 32) | data.nFileSizeLow);
    SAFEARRAY* bytes = nullptr;
    EXPECT_EQ(UntrustedXmlRead::kTooLarge, ReadUntrustedXml(m_file.c_str(), &bytes));
    EXPECT_EQ(nullptr, bytes);
}

// All bytes of a literal, inner NULs included.
template <size_t N>
std::string Bytes(const char (&literal)[N]) {
    return std::string(literal, N - 1);
}

TEST(UntrustedXmlBytes, FindsADoctypeInEveryEncoding) {
    auto has = [](const std::string& bytes) {
        return HasDoctypeDeclaration(reinterpret_cast<const BYTE*>(bytes.data()), bytes.size());
    };
    EXPECT_TRUE(has("<?xml version=\"1.0\"?><!DOCTYPE x><x/>"));
    EXPECT_TRUE(has("<<!<!DOCTYPE"));
    EXPECT_TRUE(has(Bytes("<\0!\0D\0O\0C\0T\0Y\0P\0E\0")));  // UTF-16LE
    EXPECT_TRUE(has(Bytes("\0<\0!\0D\0O\0C\0T\0Y\0P\0E")));  // UTF-16BE
    EXPECT_TRUE(has(Bytes("\0\0\0<\0\0\0!\0\0\0DOCTYPE")));  // mixed widths
    EXPECT_FALSE(has("<?xml version=\"1.0\"?><x>DOCTYPE</x>"));
    EXPECT_FALSE(has("<!DOCTYP"));
    EXPECT_FALSE(has("<!-- -->"));
    EXPECT_FALSE(has("<!doctype x>"));  // not a declaration in XML; the parser refuses it
}

}  // namespace
