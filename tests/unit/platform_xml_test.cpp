// What the platform.xml editing refuses to read: any document type
// declaration, in whatever encoding its bytes come, and files above the size
// limit.
#include <windows.h>
#include <gtest/gtest.h>

#include <filesystem>

#include "base/untrusted_xml_bytes.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"

namespace {

TEST(UntrustedXmlBytes, FindsADoctypeInEveryEncoding) {
    using namespace std::string_literals;  // "..."s keeps inner NULs
    const std::pair<std::string, bool> cases[] = {
        {"<?xml version=\"1.0\"?><!DOCTYPE x><x/>", true},
        {"<<!<!DOCTYPE", true},
        {"<\0!\0D\0O\0C\0T\0Y\0P\0E\0"s, true},  // UTF-16LE
        {"\0<\0!\0D\0O\0C\0T\0Y\0P\0E"s, true},  // UTF-16BE
        {"\0\0\0<\0\0\0!\0\0\0DOCTYPE"s, true},  // mixed widths
        {"<?xml version=\"1.0\"?><x>DOCTYPE</x>", false},
        {"<!DOCTYP", false},
        {"<!doctype x>", false},  // not a declaration in XML; the parser refuses it
    };
    for (const auto& [bytes, found] : cases) {
        EXPECT_EQ(found,
                  HasDoctypeDeclaration(reinterpret_cast<const BYTE*>(bytes.data()), bytes.size()))
            << bytes;
    }
}

TEST(UntrustedXmlBytes, AFileAboveTheSizeLimitIsNotRead) {
    ScratchDir scratch(L"pxml");
    const std::wstring file = scratch.Sub(L"platform.xml");
    ASSERT_TRUE(WriteFileBytes(file, "<config/>"));
    std::filesystem::resize_file(file, kMaxUntrustedXmlBytes + 1);  // only its size matters
    SAFEARRAY* bytes = nullptr;
    EXPECT_EQ(UntrustedXmlRead::kTooLarge, ReadUntrustedXml(file.c_str(), &bytes));
    EXPECT_EQ(nullptr, bytes);
}

}  // namespace
