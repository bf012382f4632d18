// CCmdLineParser: Action names, which elements each Action reads, the
// Client/ErrorId sharing of one field, and hostile command lines of the
// longest length Windows passes.
#include <gtest/gtest.h>

#include <string>

#include "app/cmdline_parser.h"
#include "actions/command_info.h"
#include "base/string_ex.h"
#include "tests/support/trace_capture.h"

namespace {

// The record's fields that differ from their start values, in field order.
std::wstring Describe(const CommandInfo& info) {
    std::wstring text;
    auto number = [&text](const wchar_t* name, int value) {
        text += value == 0 ? L"" : L" " + std::wstring(name) + L"=" + std::to_wstring(value);
    };
    auto string = [&text](const wchar_t* name, const CStringEx& value) {
        text += value.IsEmpty() ? L"" : L" " + std::wstring(name) + L"=" + value.c_str();
    };
    number(L"hWnd", info.hWnd);
    number(L"nAction", info.nAction);
    string(L"strUrl", info.strUrl);
    string(L"strAttendeeFile", info.strAttendeeFile);
    string(L"strSharePathFile", info.strSharePathFile);
    string(L"strShareFlag", info.strShareFlag);
    number(L"nClientOrErrorId", info.nClientOrErrorId);
    string(L"strSiteUrl", info.strSiteUrl);
    string(L"strUsername", info.strUsername);
    number(L"bUserInfoEditable", info.bUserInfoEditable);
    string(L"strEmail", info.strEmail);
    return text.empty() ? text : text.substr(1);
}

// "fails", or the record GetCommandInfo copies after a successful parse.
std::wstring Parsed(const std::wstring& text) {
    CCmdLineParser parser;
    CommandInfo info;
    int parsed = parser.Parse(CStringEx(text.c_str()));
    if (parser.GetCommandInfo(info) != parsed) {
        return L"Parse and GetCommandInfo disagree";
    }
    return parsed ? Describe(info) : L"fails";
}

std::wstring Command(const std::wstring& action, const std::wstring& elements = L"") {
    return L"<CmdLine><Action>" + action + L"</Action>" + elements + L"</CmdLine>";
}

std::wstring Repeat(const std::wstring& piece, int times) {
    std::wstring text;
    for (int i = 0; i < times; ++i) {
        text += piece;
    }
    return text;
}

}  // namespace

TEST(CmdLineParser, EveryActionHasItsNumberAndReadsOnlyItsOwnElements) {
    const std::wstring allElements =
        L"<AttendeeFile>att.xml</AttendeeFile><SharePathFile>C:\\s.exe</SharePathFile>"
        L"<ShareFlag>2</ShareFlag><SiteUrl>https://site</SiteUrl><Username>bob</Username>"
        L"<Editable>1</Editable><Email>bob@example.com</Email><LogUrl>https://log</LogUrl>"
        L"<ErrorId>7</ErrorId>";
    const struct {
        const wchar_t* name;
        int number;
        const wchar_t* ownFields;  // read from allElements
    } actions[] = {
        {L"PPU", 1, L""},
        {L"UPLOAD_FILE", 2, L""},
        {L"StartOCMeeting", 3, L""},
        {L"OpenQMSetting", 4, L" strSiteUrl=https://site"},
        {L"ShareWindow", 9, L""},
        {L"StartAudioOnly", 10, L""},
        {L"StartScheduledMeeting", 11, L""},
        {L"ScheduleMeeting", 12, L""},
        {L"JoinMeeting", 13, L""},
        {L"OpenHelp", 14, L""},
        {L"OpenAbout", 15, L""},
        {L"PostAttendee", 5, L" strAttendeeFile=att.xml"},
        {L"PostJMFLog", 16, L" strUrl=https://log nClientOrErrorId=7"},
        {L"ShareAsApp", 6, L" strSharePathFile=C:\\s.exe strShareFlag=2"},
        {L"SendProblemReport", 17, L""},
        {L"CommonLogin", 8,
         L" strSiteUrl=https://site strUsername=bob bUserInfoEditable=1 strEmail=bob@example.com"},
    };
    for (const auto& a : actions) {
        std::wstring number = L"nAction=" + std::to_wstring(a.number);
        EXPECT_EQ(number, Parsed(Command(a.name))) << a.name;
        EXPECT_EQ(number + a.ownFields, Parsed(Command(a.name, allElements))) << a.name;
    }
}

TEST(CmdLineParser, CommandsThatFail) {
    std::wstring cases[] = {
        // Action names are exact and case-sensitive.
        Command(L"joinmeeting"),
        Command(L"JoinMeetingX"),
        Command(L""),
        L"<CmdLine></CmdLine>",
        L"<CmdLine><action>JoinMeeting</action></CmdLine>",
        L"<CmdLine><X><Action>JoinMeeting</Action></X></CmdLine>",  // nested deeper
        // The root must be exactly "CmdLine", without attributes.
        L"<CommandLine><Action>JoinMeeting</Action></CommandLine>",
        L"<cmdline><Action>JoinMeeting</Action></cmdline>",
        L"<CmdLine v=\"1\"><Action>JoinMeeting</Action></CmdLine>",
        L"<Action>JoinMeeting</Action>",
        // A child with an attribute ends the reading of the children before it.
        Command(L"JoinMeeting", L"<X a=\"1\">y</X>"),
        L"",
        L"<CmdLine>",
        Command(L"JoinMeeting") + Repeat(L"</", 16000),
    };
    for (const std::wstring& text : cases) {
        EXPECT_EQ(L"fails", Parsed(text)) << text.substr(0, 80);
    }
    for (const wchar_t* piece : {L"</", L">", L"<", L"<CmdLine>", L"</CmdLine>", L"</>"}) {
        EXPECT_EQ(L"fails", Parsed(Repeat(piece, static_cast<int>(32767 / wcslen(piece)))))
            << piece;
    }
}

TEST(CmdLineParser, ElementsReadIntoTheRecord) {
    const struct {
        std::wstring text;
        const wchar_t* fields;
    } cases[] = {
        {Command(L"JoinMeeting"), L"nAction=13"},
        {Command(L"OpenHelp", L"<Action>OpenAbout</Action>"), L"nAction=14"},
        // ErrorId and Client share one field; Client wins wherever it stands.
        {Command(L"PostJMFLog", L"<LogUrl>a</LogUrl><ErrorId>7</ErrorId>"),
         L"nAction=16 strUrl=a nClientOrErrorId=7"},
        {Command(L"PostJMFLog", L"<LogUrl>a</LogUrl><ErrorId>7</ErrorId><URL>b</URL>"),
         L"nAction=16 strUrl=b nClientOrErrorId=7"},
        {Command(L"PostJMFLog", L"<LogUrl>a</LogUrl><ErrorId>7</ErrorId><Client>NI</Client>"),
         L"nAction=16 strUrl=a nClientOrErrorId=1"},
        {Command(L"PostJMFLog", L"<Client>FireFox</Client><ErrorId>7</ErrorId>"),
         L"nAction=16 nClientOrErrorId=2"},
        {Command(L"PostJMFLog", L"<Client>OI</Client><ErrorId>7</ErrorId>"), L"nAction=16"},
        {Command(L"PostJMFLog", L"<ErrorId>7</ErrorId><Client>Firefox</Client>"),
         L"nAction=16 nClientOrErrorId=7"},
        {Command(L"OpenQMSetting", L"<Client>FireFox</Client><hWnd>1234</hWnd>"),
         L"hWnd=1234 nAction=4 nClientOrErrorId=2"},
        {Command(L"CommonLogin", L"<Editable></Editable>"), L"nAction=8"},
        {Command(L"CommonLogin", L"<Editable>2</Editable>"), L"nAction=8 bUserInfoEditable=2"},
        {Command(L"OpenAbout", L"<hWnd></hWnd>"), L"nAction=15"},
        {Command(L"JoinMeeting", L"<URL>https://x/?a=1&amp;b=2&lt;</URL>"),
         L"nAction=13 strUrl=https://x/?a=1&b=2<"},
        // Only the root's direct children count; an attribute stops the reading
        // of the children before it, not after.
        {Command(L"CommonLogin", L"<X><URL>u</URL><hWnd>5</hWnd><Username>bob</Username></X>"),
         L"nAction=8"},
        {L"<CmdLine><X a=\"1\">y</X><Action>JoinMeeting</Action><hWnd>5</hWnd></CmdLine>",
         L"hWnd=5 nAction=13"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(c.fields, Parsed(c.text)) << c.text;
    }
}

TEST(CmdLineParser, CommonLoginIsLogged) {
    TraceCapture traces;
    EXPECT_EQ(
        L"hWnd=99 nAction=8 strUrl=u nClientOrErrorId=1 strSiteUrl=https://s "
        L"strUsername=bob bUserInfoEditable=1",
        Parsed(Command(L"CommonLogin",
                       L"<SiteUrl>https://s</SiteUrl><Username>bob</Username>"
                       L"<Editable>1</Editable><Client>NI</Client><hWnd>99</hWnd><URL>u</URL>")));
    int found = 0;
    for (const TraceRecord& record : traces.Records()) {
        if (record.text ==
            " CommonLogin,m_sCommandInfo.strSiteUrl.c_str()=https://s,"
            "m_sCommandInfo.strUsername.c_str()=bob,m_sCommandInfo.bUserInfoEditable=1,\n") {
            EXPECT_EQ(1u, record.level);
            ++found;
        }
    }
    EXPECT_EQ(1, found);
}

TEST(CmdLineParser, AFailedParseCopiesNothing) {
    CCmdLineParser parser;
    CommandInfo out;
    out.strUrl = L"keep";
    EXPECT_EQ(0, parser.GetCommandInfo(out));
    EXPECT_EQ(0, parser.Parse(CStringEx(Command(L"x", L"<URL>u</URL>").c_str())));
    EXPECT_EQ(0, parser.GetCommandInfo(out));
    EXPECT_STREQ(L"keep", out.strUrl.c_str());
}

TEST(CmdLineParserRobustness, LongestCommandLineAndGarbageInAnotherChild) {
    std::wstring head = L"<CmdLine><Action>JoinMeeting</Action><hWnd>3</hWnd><URL>";
    std::wstring tail = L"</URL></CmdLine>";
    std::wstring url(32767 - head.size() - tail.size(), L'u');
    EXPECT_EQ(L"hWnd=3 nAction=13 strUrl=" + url, Parsed(head + url + tail));

    std::wstring distinctOpen;
    std::wstring distinctClose;
    for (int i = 0; i < 2000; ++i) {
        distinctOpen += L"<d" + std::to_wstring(i) + L">";
        distinctClose.insert(0, L"</d" + std::to_wstring(i) + L">");
    }
    for (const std::wstring& garbage :
         {Repeat(L"<a>", 5000) + Repeat(L"</a>", 5000), distinctOpen + L"x" + distinctClose,
          Repeat(L"<a>", 5000), Repeat(L"</a>", 5000), Repeat(L"<a><b></a>", 2000)}) {
        std::wstring x = L"<X>" + garbage + L"</X>";
        EXPECT_EQ(L"hWnd=5 nAction=13 strUrl=u",
                  Parsed(Command(L"JoinMeeting", L"<hWnd>5</hWnd>" + x + L"<URL>u</URL>")))
            << garbage.substr(0, 40);
        EXPECT_EQ(L"nAction=14 strUrl=u",
                  Parsed(L"<CmdLine>" + x + L"<Action>OpenHelp</Action><URL>u</URL></CmdLine>"))
            << garbage.substr(0, 40);
    }
}
