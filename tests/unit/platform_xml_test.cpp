// The feature element in real platform.xml files, through the MSXML DOM.
#include <gtest/gtest.h>
#include <objbase.h>

#include <string>

#include "notes/platform_xml.h"
#include "base/untrusted_xml_bytes.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"

namespace {

// The nested second site is tried by the end-to-end tests.
const SiteXPaths kSametime8Sites = {L"//site[@url=\"file:../shared/eclipse/\"]"};

const char kNewFeature[] =
    "<feature id=\"com.mrv.realtime.meeting.feature\" "
    "url=\"features/com.mrv.realtime.meeting.feature_1.0.1/\" version=\"1.0.1\"";
const char kHeader[] = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";

// A base site with a feature, then the shared site with a feature and sharedFeatures.
std::string Config(const std::string& sharedSiteUrl, const std::string& sharedFeatures = "") {
    return std::string(kHeader) +
           "<config date=\"1300000000000\" transient=\"false\" version=\"3.0\">\n"
           "<site enabled=\"true\" url=\"platform:/base/\">\n"
           "<feature id=\"org.eclipse.rcp\" url=\"features/org.eclipse.rcp_3.4.0/\" "
           "version=\"3.4.0\">\n</feature>\n</site>\n"
           "<site enabled=\"true\" url=\"" +
           sharedSiteUrl +
           "\">\n<feature id=\"com.example.chat\" url=\"features/com.example.chat_8.0.0/\" "
           "version=\"8.0.0\">\n</feature>\n" +
           sharedFeatures + "</site>\n</config>\n";
}

class PlatformXml : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)));
    }
    void TearDown() override { CoUninitialize(); }

    void Write(const std::string& text) { ASSERT_TRUE(WriteFileBytes(m_file, text)); }
    std::string Read() const { return ReadFileBytes(m_file); }
    PlatformXmlEdit Edit(bool enable) {
        return EditPlatformXml(m_file.c_str(), kSametime8Sites, enable, nullptr);
    }

    ScratchDir m_scratch{L"pxml"};
    std::wstring m_file = m_scratch.Sub(L"platform.xml");
};

TEST_F(PlatformXml, EnableAppendsTheFeatureOnceAsTheSitesLastChild) {
    Write(Config("file:../shared/eclipse/"));
    PlatformXmlEdit edit = Edit(true);
    EXPECT_EQ(PlatformXmlStatus::kOk, edit.status);
    EXPECT_TRUE(edit.changed && edit.saved);
    std::string text = Read();
    size_t feature = text.find(kNewFeature);
    ASSERT_NE(std::string::npos, feature) << text;
    std::string rest = text.substr(feature + strlen(kNewFeature));
    EXPECT_TRUE(rest.rfind("/>", 0) == 0 || rest.rfind(" />", 0) == 0) << rest;  // empty
    size_t sharedSite = text.find("url=\"file:../shared/eclipse/\"");
    EXPECT_LT(sharedSite, feature);
    EXPECT_LT(text.find("com.example.chat"), feature);
    EXPECT_EQ(text.find("</site>", sharedSite), text.find("</site>", feature));

    // Again: nothing to change, nothing written, still one element.
    edit = Edit(true);
    EXPECT_EQ(PlatformXmlStatus::kOk, edit.status);
    EXPECT_TRUE(!edit.changed && !edit.saved);
    EXPECT_EQ(text, Read());
}

TEST_F(PlatformXml, AnotherVersionWithTheSameIdCountsAndIsRemoved) {
    Write(Config("file:../shared/eclipse/",
                 "<feature id=\"com.mrv.realtime.meeting.feature\" "
                 "url=\"features/com.mrv.realtime.meeting.feature_1.0.0/\" version=\"1.0.0\"/>\n"));
    bool listed = false;
    EXPECT_EQ(PlatformXmlStatus::kOk, TestPlatformXml(m_file.c_str(), kSametime8Sites, &listed));
    EXPECT_TRUE(listed);
    EXPECT_FALSE(Edit(true).changed);
    EXPECT_EQ(std::string::npos, Read().find("1.0.1"));

    PlatformXmlEdit disable = Edit(false);
    EXPECT_EQ(PlatformXmlStatus::kOk, disable.status);
    EXPECT_TRUE(disable.changed);
    std::string text = Read();
    EXPECT_EQ(std::string::npos, text.find("com.mrv.realtime")) << text;
    EXPECT_NE(std::string::npos, text.find("com.example.chat"));
    EXPECT_NE(std::string::npos, text.find("org.eclipse.rcp"));
}

TEST_F(PlatformXml, HostileAndMalformedFilesAreRefusedAndLeftAlone) {
    EXPECT_EQ(PlatformXmlStatus::kLoadFailed, Edit(true).status);  // missing
    EXPECT_FALSE(FileExists(m_file));

    // Any DTD is refused before parsing (billion laughs: see the end-to-end tests).
    const std::string site = "<config><site url=\"file:../shared/eclipse/\">";
    std::string deep = std::string(kHeader) + site;
    for (int i = 0; i < 100000; ++i) {
        deep += "<a>";
    }
    for (int i = 0; i < 100000; ++i) {
        deep += "</a>";
    }
    deep += "</site></config>";
    const std::wstring secret = m_scratch.Sub(L"secret.txt");
    ASSERT_TRUE(WriteFileBytes(secret, "secret"));
    const std::wstring utf16 =
        L"\xFEFF<?xml version=\"1.0\" encoding=\"UTF-16\"?><!DOCTYPE config [<!ENTITY a \"b\">]>"
        L"<config><site url=\"file:../shared/eclipse/\">&a;</site></config>";

    for (const std::string& text : {
             std::string(),
             std::string(kHeader) + site + "</config>",
             std::string("not xml at all"),
             Config("file:../shared/eclipse/") + "<second-root/>",
             deep,
             std::string(kHeader) + "<!DOCTYPE config [<!ENTITY x SYSTEM \"file:///" +
                 Narrow(secret) + "\">]>\n" + site + "&x;</site></config>\n",
             std::string(kHeader) + "<!DOCTYPE config>\n" + site + "</site></config>\n",
             std::string(reinterpret_cast<const char*>(utf16.data()),
                         utf16.size() * sizeof(wchar_t)),
         }) {
        SCOPED_TRACE(text.substr(0, 80));
        Write(text);
        EXPECT_EQ(PlatformXmlStatus::kLoadFailed, Edit(true).status);
        EXPECT_EQ(PlatformXmlStatus::kLoadFailed, Edit(false).status);
        bool listed = true;
        EXPECT_EQ(PlatformXmlStatus::kLoadFailed,
                  TestPlatformXml(m_file.c_str(), kSametime8Sites, &listed));
        EXPECT_FALSE(listed);
        EXPECT_EQ(text, Read());
    }
}

TEST_F(PlatformXml, AFileAboveTheSizeLimitIsNotRead) {
    Write(kHeader);
    {
        // Extended sparsely: only its size matters.
        HANDLE file = CreateFileW(m_file.c_str(), GENERIC_WRITE, 0, nullptr, OPEN_EXISTING,
                                  FILE_ATTRIBUTE_NORMAL, nullptr);
        ASSERT_NE(INVALID_HANDLE_VALUE, file);
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

TEST(UntrustedXmlBytes, FindsADoctypeInEveryEncoding) {
    auto has = [](const std::string& bytes) {
        return HasDoctypeDeclaration(reinterpret_cast<const BYTE*>(bytes.data()), bytes.size());
    };
    using namespace std::string_literals;  // "..."s keeps inner NULs
    EXPECT_TRUE(has("<?xml version=\"1.0\"?><!DOCTYPE x><x/>"));
    EXPECT_TRUE(has("<<!<!DOCTYPE"));
    EXPECT_TRUE(has("<\0!\0D\0O\0C\0T\0Y\0P\0E\0"s));  // UTF-16LE
    EXPECT_TRUE(has("\0<\0!\0D\0O\0C\0T\0Y\0P\0E"s));  // UTF-16BE
    EXPECT_TRUE(has("\0\0\0<\0\0\0!\0\0\0DOCTYPE"s));  // mixed widths
    EXPECT_FALSE(has("<?xml version=\"1.0\"?><x>DOCTYPE</x>"));
    EXPECT_FALSE(has("<!DOCTYP"));
    EXPECT_FALSE(has("<!-- -->"));
    EXPECT_FALSE(has("<!doctype x>"));  // not a declaration in XML; the parser refuses it
}

}  // namespace
