// Outlook's command line for a new item, and the escaping of its texts.
#include <gtest/gtest.h>

#include "actions/send_email.h"
#include "tests/support/file_util.h"

namespace {

TEST(ReplaceSpecialForCommandLine, EscapesPercentFirstThenTheNineCharacters) {
    struct Case {
        const wchar_t* text;
        const wchar_t* escaped;
        int count;
    };
    const Case cases[] = {
        {L"100% done!", L"100%25%20done%21", 3},
        {L" ,?.!:;&\"", L"%20%2c%3f%2e%21%3a%3b%26%22", 9},
        {L"%%", L"%25%25", 2},
        {L"Line\r\n\u00e9\u4e2d-_/", L"Line\r\n\u00e9\u4e2d-_/", 0},
        {L"", L"", 0},
    };
    for (const Case& c : cases) {
        CStringEx value(c.text);
        EXPECT_EQ(c.count, CQMSendEmail::ReplaceSpecialForCommandLine(value)) << Narrow(c.text);
        EXPECT_STREQ(c.escaped, value.c_str());
    }
}

TEST(SendEmailByCommandLine, ComposesSwitchMailTextsAndAttachment) {
    struct Case {
        int type;
        const wchar_t* subject;
        const wchar_t* body;
        const wchar_t* attachment;
        const wchar_t* attendees;
        const wchar_t* line;
    };
    const Case cases[] = {
        {3, L"a b", L"x&y", L"C:\\t.zip", nullptr,
         L"/c ipm.note /m \"&subject=a%20b&body=x%26y\"/a \"C:\\t.zip\""},
        {3, nullptr, nullptr, nullptr, nullptr, L"/c ipm.note "},
        {3, L"", nullptr, nullptr, nullptr, L"/c ipm.note /m \"&subject=\""},
        {6, L"s", nullptr, nullptr, nullptr, L"/m \"&subject=s\""},
        {-1, nullptr, nullptr, L"C:\\a b.zip", nullptr, L"/a \"C:\\a b.zip\""},
        {1, nullptr, L"", nullptr, L"a@b.c;d@e.f", L"/c ipm.appointment /m \"a@b.c;d@e.f&body=\""},
        {0, nullptr, nullptr, nullptr, nullptr, L"/c ipm.activity "},
        {5, nullptr, nullptr, nullptr, nullptr, L"/c ipm.task "},
    };
    for (const Case& c : cases) {
        CStringEx line =
            CQMSendEmail::ComposeCommandLine(c.type, c.subject, c.body, c.attachment, c.attendees);
        EXPECT_STREQ(c.line, line.c_str()) << "type " << c.type;
    }
}

}  // namespace
