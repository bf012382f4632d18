// CCmdLineParser: Action names, which elements each Action reads, the
// Client/ErrorId sharing of one field, and hostile command lines of the
// longest length Windows passes.
#include <gtest/gtest.h>

#include <string>

#include "app/cmdline_parser.h"
#include "app/command_info.h"
#include "base/string_ex.h"
#include "tests/support/trace_capture.h"

namespace {

struct Parsed {
    int result = 0;   // Parse
    int hasInfo = 0;  // GetCommandInfo
    CommandInfo info;
};

Parsed ParseCommand(const std::wstring& text) {
    CCmdLineParser parser;
    Parsed parsed;
    parsed.result = parser.Parse(CStringEx(text.c_str()));
    parsed.hasInfo = parser.GetCommandInfo(parsed.info);
    return parsed;
}

// "<CmdLine><Action>action</Action>elements</CmdLine>"
std::wstring Command(const std::wstring& action, const std::wstring& elements = L"") {
    return L"<CmdLine><Action>" + action + L"</Action>" + elements + L"</CmdLine>";
}

std::wstring Text(const CStringEx& s) {
    return s.c_str();
}

std::wstring Repeat(const std::wstring& piece, int times) {
    std::wstring text;
    for (int i = 0; i < times; ++i) {
        text += piece;
    }
    return text;
}

void ExpectNoActionFields(const CommandInfo& info) {
    EXPECT_EQ(L"", Text(info.strUrl));
    EXPECT_EQ(L"", Text(info.strAttendeeFile));
    EXPECT_EQ(L"", Text(info.strSharePathFile));
    EXPECT_EQ(L"", Text(info.strShareFlag));
    EXPECT_EQ(L"", Text(info.strSiteUrl));
    EXPECT_EQ(L"", Text(info.strUsername));
    EXPECT_EQ(0, info.bUserInfoEditable);
    EXPECT_EQ(L"", Text(info.strEmail));
}

// Every element any Action reads.
const wchar_t kAllActionElements[] =
    L"<AttendeeFile>att.xml</AttendeeFile><SharePathFile>C:\\s.exe</SharePathFile>"
    L"<ShareFlag>2</ShareFlag><SiteUrl>https://site</SiteUrl><Username>bob</Username>"
    L"<Editable>1</Editable><Email>bob@example.com</Email><LogUrl>https://log</LogUrl>"
    L"<ErrorId>7</ErrorId>";

}  // namespace

// ---- Action names ----

TEST(CmdLineParser, JoinMeetingAloneGivesStartValues) {
    Parsed p = ParseCommand(Command(L"JoinMeeting"));
    EXPECT_EQ(1, p.result);
    ASSERT_EQ(1, p.hasInfo);
    EXPECT_EQ(13, p.info.nAction);
    EXPECT_EQ(0, p.info.hWnd);
    EXPECT_EQ(0, p.info.nClientOrErrorId);
    ExpectNoActionFields(p.info);
}

TEST(CmdLineParser, EveryActionNameHasItsNumber) {
    struct Case {
        const wchar_t* name;
        int number;
    };
    const Case table[] = {
        {L"PPU", 1},
        {L"UPLOAD_FILE", 2},
        {L"StartOCMeeting", 3},
        {L"OpenQMSetting", 4},
        {L"ShareWindow", 9},
        {L"StartAudioOnly", 10},
        {L"StartScheduledMeeting", 11},
        {L"ScheduleMeeting", 12},
        {L"JoinMeeting", 13},
        {L"OpenHelp", 14},
        {L"OpenAbout", 15},
        {L"PostAttendee", 5},
        {L"PostJMFLog", 16},
        {L"ShareAsApp", 6},
        {L"SendProblemReport", 17},
        {L"CommonLogin", 8},
    };
    for (const Case& c : table) {
        EXPECT_EQ(c.number, ActionNumberFromName(c.name)) << c.name;
        Parsed p = ParseCommand(Command(c.name));
        EXPECT_EQ(1, p.result) << c.name;
        EXPECT_EQ(c.number, p.info.nAction) << c.name;
    }
    for (const wchar_t* unknown : {L"", L"7", L"Action", L"CmdLine", L"PPU2", L"PP"}) {
        EXPECT_EQ(0, ActionNumberFromName(unknown)) << unknown;
    }
    EXPECT_EQ(0, ActionNumberFromName(nullptr));
}

TEST(CmdLineParser, ActionNamesAreCaseSensitiveAndExact) {
    for (const wchar_t* name :
         {L"joinmeeting", L"JOINMEETING", L"\tJoinMeeting", L"JoinMeeting\r\n", L"Join Meeting",
          L"JoinMeetin", L"JoinMeetingX"}) {
        Parsed p = ParseCommand(Command(name));
        EXPECT_EQ(0, p.result) << name;
        EXPECT_EQ(0, p.hasInfo) << name;
    }
    // Blanks around an element's text are not part of it.
    EXPECT_EQ(13, ParseCommand(Command(L"  JoinMeeting  ")).info.nAction);
    // Entities and CDATA are read as text first.
    EXPECT_EQ(14, ParseCommand(Command(L"<![CDATA[OpenHelp]]>")).info.nAction);
}

TEST(CmdLineParser, MissingOrEmptyActionFails) {
    for (const std::wstring& text :
         {std::wstring(L"<CmdLine></CmdLine>"), std::wstring(L"<CmdLine><URL>u</URL></CmdLine>"),
          Command(L""), std::wstring(L"<CmdLine><Action/></CmdLine>"),
          std::wstring(L"<CmdLine><action>JoinMeeting</action></CmdLine>")}) {
        Parsed p = ParseCommand(text);
        EXPECT_EQ(0, p.result);
        EXPECT_EQ(0, p.hasInfo);
    }
}

TEST(CmdLineParser, TheFirstActionElementCounts) {
    Parsed p = ParseCommand(Command(L"OpenHelp", L"<Action>OpenAbout</Action>"));
    EXPECT_EQ(14, p.info.nAction);
    EXPECT_EQ(0, ParseCommand(Command(L"nope", L"<Action>OpenAbout</Action>")).result);
}

TEST(CmdLineParser, TheRootMustBeCmdLine) {
    EXPECT_EQ(0, ParseCommand(L"<CommandLine><Action>JoinMeeting</Action></CommandLine>").result);
    EXPECT_EQ(0, ParseCommand(L"<cmdline><Action>JoinMeeting</Action></cmdline>").result);
    EXPECT_EQ(0, ParseCommand(L"<CmdLine v=\"1\"><Action>JoinMeeting</Action></CmdLine>").result);
    EXPECT_EQ(0, ParseCommand(L"<Action>JoinMeeting</Action>").result);
    // Text around the root does not matter.
    Parsed p = ParseCommand(L"<?xml version=\"1.0\"?>\r\n" + Command(L"OpenHelp") + L"\r\n  ");
    EXPECT_EQ(14, p.info.nAction);
}

TEST(CmdLineParser, EmptyAndTinyTextsFail) {
    for (const wchar_t* text : {L"", L"<", L">", L"</", L"<CmdLine>"}) {
        Parsed p = ParseCommand(text);
        EXPECT_EQ(0, p.result) << text;
        EXPECT_EQ(0, p.hasInfo) << text;
    }
}

// ---- elements of each Action ----

TEST(CmdLineParser, PostJMFLogReadsLogUrlAndErrorIdThenUrlAndClient) {
    Parsed p = ParseCommand(Command(L"PostJMFLog", L"<LogUrl>a</LogUrl><ErrorId>7</ErrorId>"));
    EXPECT_EQ(16, p.info.nAction);
    EXPECT_EQ(L"a", Text(p.info.strUrl));
    EXPECT_EQ(7, p.info.nClientOrErrorId);

    p = ParseCommand(Command(L"PostJMFLog", L"<LogUrl>a</LogUrl><ErrorId>7</ErrorId><URL>b</URL>"));
    EXPECT_EQ(L"b", Text(p.info.strUrl));

    p = ParseCommand(
        Command(L"PostJMFLog", L"<LogUrl>a</LogUrl><ErrorId>7</ErrorId><Client>NI</Client>"));
    EXPECT_EQ(1, p.info.nClientOrErrorId);

    // Client wins wherever it stands in the document.
    p = ParseCommand(Command(L"PostJMFLog", L"<Client>OI</Client><ErrorId>7</ErrorId>"));
    EXPECT_EQ(0, p.info.nClientOrErrorId);
    p = ParseCommand(Command(L"PostJMFLog", L"<Client>FireFox</Client><ErrorId>7</ErrorId>"));
    EXPECT_EQ(2, p.info.nClientOrErrorId);

    // Other client values leave the error number.
    for (const wchar_t* client : {L"XX", L"oi", L"Firefox", L"", L"1"}) {
        p = ParseCommand(Command(
            L"PostJMFLog", std::wstring(L"<ErrorId>7</ErrorId><Client>") + client + L"</Client>"));
        EXPECT_EQ(7, p.info.nClientOrErrorId) << client;
    }

    p = ParseCommand(Command(L"PostJMFLog", L"<ErrorId></ErrorId>"));
    EXPECT_EQ(0, p.info.nClientOrErrorId);
    p = ParseCommand(Command(L"PostJMFLog", L"<ErrorId>12abc</ErrorId>"));
    EXPECT_EQ(12, p.info.nClientOrErrorId);
    p = ParseCommand(Command(L"PostJMFLog", L"<ErrorId>-3</ErrorId>"));
    EXPECT_EQ(-3, p.info.nClientOrErrorId);
}

TEST(CmdLineParser, OpenQMSettingWithClientAndWindow) {
    Parsed p = ParseCommand(
        Command(L"OpenQMSetting",
                L"<Client>FireFox</Client><hWnd>1234</hWnd><SiteUrl>https://s</SiteUrl>"));
    EXPECT_EQ(4, p.info.nAction);
    EXPECT_EQ(2, p.info.nClientOrErrorId);
    EXPECT_EQ(1234, p.info.hWnd);
    EXPECT_EQ(L"https://s", Text(p.info.strSiteUrl));
    EXPECT_EQ(L"", Text(p.info.strUsername));
}

TEST(CmdLineParser, CommonLoginReadsItsFourElementsAndLogsThem) {
    TraceCapture traces;
    Parsed p = ParseCommand(
        Command(L"CommonLogin",
                L"<SiteUrl>https://s</SiteUrl><Username>bob</Username><Editable>1</Editable>"
                L"<Email>bob@example.com</Email><Client>NI</Client><hWnd>99</hWnd><URL>u</URL>"));
    EXPECT_EQ(8, p.info.nAction);
    EXPECT_EQ(L"https://s", Text(p.info.strSiteUrl));
    EXPECT_EQ(L"bob", Text(p.info.strUsername));
    EXPECT_EQ(1, p.info.bUserInfoEditable);
    EXPECT_EQ(L"bob@example.com", Text(p.info.strEmail));
    EXPECT_EQ(1, p.info.nClientOrErrorId);
    EXPECT_EQ(99, p.info.hWnd);
    EXPECT_EQ(L"u", Text(p.info.strUrl));
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

TEST(CmdLineParser, CommonLoginEditableEmptyOrTextIsZero) {
    EXPECT_EQ(
        0, ParseCommand(Command(L"CommonLogin", L"<Editable></Editable>")).info.bUserInfoEditable);
    EXPECT_EQ(
        0,
        ParseCommand(Command(L"CommonLogin", L"<Editable>yes</Editable>")).info.bUserInfoEditable);
    EXPECT_EQ(
        2, ParseCommand(Command(L"CommonLogin", L"<Editable>2</Editable>")).info.bUserInfoEditable);
}

TEST(CmdLineParser, PostAttendeeAndShareAsAppReadTheirFiles) {
    Parsed attendee = ParseCommand(Command(L"PostAttendee", kAllActionElements));
    EXPECT_EQ(5, attendee.info.nAction);
    EXPECT_EQ(L"att.xml", Text(attendee.info.strAttendeeFile));
    EXPECT_EQ(L"", Text(attendee.info.strSharePathFile));
    EXPECT_EQ(0, attendee.info.nClientOrErrorId);

    Parsed share = ParseCommand(Command(L"ShareAsApp", kAllActionElements));
    EXPECT_EQ(6, share.info.nAction);
    EXPECT_EQ(L"C:\\s.exe", Text(share.info.strSharePathFile));
    EXPECT_EQ(L"2", Text(share.info.strShareFlag));
    EXPECT_EQ(L"", Text(share.info.strAttendeeFile));
    EXPECT_EQ(L"", Text(share.info.strSiteUrl));
}

TEST(CmdLineParser, ElementsOfOtherActionsAreIgnored) {
    for (const wchar_t* action :
         {L"PPU", L"UPLOAD_FILE", L"StartOCMeeting", L"ShareWindow", L"StartAudioOnly",
          L"StartScheduledMeeting", L"ScheduleMeeting", L"JoinMeeting", L"OpenHelp", L"OpenAbout",
          L"SendProblemReport"}) {
        Parsed p = ParseCommand(Command(action, kAllActionElements));
        EXPECT_EQ(1, p.result) << action;
        EXPECT_EQ(0, p.info.nClientOrErrorId) << action;
        ExpectNoActionFields(p.info);
    }
    Parsed setting = ParseCommand(Command(L"OpenQMSetting", kAllActionElements));
    EXPECT_EQ(L"https://site", Text(setting.info.strSiteUrl));
    EXPECT_EQ(L"", Text(setting.info.strUsername));
    EXPECT_EQ(0, setting.info.bUserInfoEditable);
    EXPECT_EQ(L"", Text(setting.info.strEmail));
    EXPECT_EQ(L"", Text(setting.info.strUrl));

    Parsed log = ParseCommand(Command(L"PostJMFLog", kAllActionElements));
    EXPECT_EQ(L"https://log", Text(log.info.strUrl));
    EXPECT_EQ(7, log.info.nClientOrErrorId);
    EXPECT_EQ(L"", Text(log.info.strSiteUrl));
}

// ---- elements of every Action ----

TEST(CmdLineParser, ClientKinds) {
    struct Case {
        const wchar_t* client;
        int kind;
    };
    for (const Case& c : {Case{L"OI", 0}, Case{L"NI", 1}, Case{L"FireFox", 2}, Case{L"FIREFOX", 0},
                          Case{L"Chrome", 0}, Case{L" NI ", 1}}) {
        Parsed p = ParseCommand(
            Command(L"StartOCMeeting", std::wstring(L"<Client>") + c.client + L"</Client>"));
        EXPECT_EQ(c.kind, p.info.nClientOrErrorId) << c.client;
    }
}

TEST(CmdLineParser, WindowHandleIsADecimalNumber) {
    struct Case {
        const wchar_t* elements;
        int hWnd;
    };
    const Case cases[] = {
        {L"<hWnd>1234</hWnd>", 1234}, {L"", 0},
        {L"<hWnd></hWnd>", 0},        {L"<hWnd>-1</hWnd>", -1},
        {L"<hWnd>12abc</hWnd>", 12},  {L"<hWnd>0x10</hWnd>", 0},
        {L"<hWnd> 77 </hWnd>", 77},   {L"<hWnd>\t88</hWnd>", 88},
        {L"<hwnd>5</hwnd>", 0},       {L"<hWnd>3</hWnd><hWnd>4</hWnd>", 3},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(c.hWnd, ParseCommand(Command(L"OpenAbout", c.elements)).info.hWnd) << c.elements;
    }
}

TEST(CmdLineParser, UrlIsUnescapedAndUnwrapped) {
    Parsed p = ParseCommand(Command(L"JoinMeeting", L"<URL>https://x/?a=1&amp;b=2&lt;</URL>"));
    EXPECT_EQ(L"https://x/?a=1&b=2<", Text(p.info.strUrl));
    p = ParseCommand(Command(L"JoinMeeting", L"<URL>\r\n<![CDATA[https://x/?a=1&b=2]]>\r\n</URL>"));
    EXPECT_EQ(L"https://x/?a=1&b=2", Text(p.info.strUrl));
    p = ParseCommand(Command(L"JoinMeeting", L"<URL>first</URL><URL>second</URL>"));
    EXPECT_EQ(L"first", Text(p.info.strUrl));
    p = ParseCommand(Command(L"JoinMeeting", L"<URL>a<b>c > d</URL>"));
    EXPECT_EQ(L"a<b>c > d", Text(p.info.strUrl));
}

TEST(CmdLineParser, NestedElementsAreNotFound) {
    EXPECT_EQ(0, ParseCommand(L"<CmdLine><X><Action>JoinMeeting</Action></X></CmdLine>").result);
    Parsed p = ParseCommand(
        Command(L"CommonLogin", L"<X><URL>u</URL><hWnd>5</hWnd><Username>bob</Username></X>"));
    EXPECT_EQ(1, p.result);
    EXPECT_EQ(L"", Text(p.info.strUrl));
    EXPECT_EQ(0, p.info.hWnd);
    EXPECT_EQ(L"", Text(p.info.strUsername));
}

TEST(CmdLineParser, AChildWithAttributesStopsTheReadingOfTheChildrenBeforeIt) {
    // Children are read from the last; one that is not recognised ends it.
    EXPECT_EQ(0, ParseCommand(Command(L"JoinMeeting", L"<X a=\"1\">y</X>")).result);
    Parsed p = ParseCommand(
        L"<CmdLine><X a=\"1\">y</X><Action>JoinMeeting</Action><hWnd>5</hWnd></CmdLine>");
    EXPECT_EQ(13, p.info.nAction);
    EXPECT_EQ(5, p.info.hWnd);
}

// ---- the command record ----

TEST(CmdLineParser, GetCommandInfoCopiesEveryFieldOnlyAfterASuccessfulParse) {
    CCmdLineParser parser;
    CommandInfo out;
    out.hWnd = 42;
    out.strUrl = L"keep";
    EXPECT_EQ(0, parser.GetCommandInfo(out));
    EXPECT_EQ(42, out.hWnd);
    EXPECT_EQ(L"keep", Text(out.strUrl));

    EXPECT_EQ(0, parser.Parse(CStringEx(L"<CmdLine><Action>x</Action></CmdLine>")));
    EXPECT_EQ(0, parser.GetCommandInfo(out));
    EXPECT_EQ(L"keep", Text(out.strUrl));

    EXPECT_EQ(1, parser.Parse(CStringEx(Command(L"CommonLogin",
                                                L"<SiteUrl>s</SiteUrl><Username>u</Username>"
                                                L"<Editable>1</Editable><Email>e</Email>"
                                                L"<Client>FireFox</Client><hWnd>7</hWnd>"
                                                L"<URL>w</URL>")
                                            .c_str())));
    ASSERT_EQ(1, parser.GetCommandInfo(out));
    EXPECT_EQ(7, out.hWnd);
    EXPECT_EQ(8, out.nAction);
    EXPECT_EQ(L"w", Text(out.strUrl));
    EXPECT_EQ(L"", Text(out.strAttendeeFile));
    EXPECT_EQ(L"", Text(out.strSharePathFile));
    EXPECT_EQ(L"", Text(out.strShareFlag));
    EXPECT_EQ(2, out.nClientOrErrorId);
    EXPECT_EQ(L"s", Text(out.strSiteUrl));
    EXPECT_EQ(L"u", Text(out.strUsername));
    EXPECT_EQ(1, out.bUserInfoEditable);
    EXPECT_EQ(L"e", Text(out.strEmail));
}

// ---- hostile command lines ----

TEST(CmdLineParserRobustness, LongestCommandLineWithOneLongValue) {
    std::wstring head = L"<CmdLine><Action>JoinMeeting</Action><hWnd>3</hWnd><URL>";
    std::wstring tail = L"</URL></CmdLine>";
    std::wstring url = L"https://meet.example/j?" +
                       Repeat(L"u", static_cast<int>(32767 - head.size() - tail.size() - 23));
    std::wstring text = head + url + tail;
    ASSERT_EQ(32767u, text.size());
    Parsed p = ParseCommand(text);
    EXPECT_EQ(13, p.info.nAction);
    EXPECT_EQ(3, p.info.hWnd);
    EXPECT_EQ(url, Text(p.info.strUrl));
}

TEST(CmdLineParserRobustness, DeepNestingInAnotherChildDoesNotStopTheCommand) {
    const std::wstring deep = L"<X>" + Repeat(L"<a>", 5000) + Repeat(L"</a>", 5000) + L"</X>";
    const std::wstring deepDistinct = [] {
        std::wstring open;
        std::wstring close;
        for (int i = 0; i < 2000; ++i) {
            open += L"<d" + std::to_wstring(i) + L">";
            close.insert(0, L"</d" + std::to_wstring(i) + L">");
        }
        return L"<X>" + open + L"x" + close + L"</X>";
    }();
    for (const std::wstring& garbage : {deep, deepDistinct}) {
        Parsed after =
            ParseCommand(Command(L"JoinMeeting", L"<hWnd>5</hWnd>" + garbage + L"<URL>u</URL>"));
        EXPECT_EQ(13, after.info.nAction);
        EXPECT_EQ(5, after.info.hWnd);
        EXPECT_EQ(L"u", Text(after.info.strUrl));

        Parsed before = ParseCommand(L"<CmdLine>" + garbage +
                                     L"<Action>OpenHelp</Action><URL>u</URL></CmdLine>");
        EXPECT_EQ(14, before.info.nAction);
        EXPECT_EQ(L"u", Text(before.info.strUrl));
    }
}

TEST(CmdLineParserRobustness, UnbalancedElementsInAnotherChild) {
    for (const std::wstring& garbage :
         {L"<X>" + Repeat(L"<a>", 5000) + L"</X>", L"<X>" + Repeat(L"</a>", 5000) + L"</X>",
          L"<X>" + Repeat(L"<a><b></a>", 2000) + L"</X>"}) {
        Parsed p = ParseCommand(Command(L"JoinMeeting", garbage + L"<hWnd>5</hWnd>"));
        EXPECT_EQ(13, p.info.nAction);
        EXPECT_EQ(5, p.info.hWnd);
    }
}

TEST(CmdLineParserRobustness, TextsMadeOfOneRepeatedPieceFail) {
    for (const wchar_t* piece : {L"</", L">", L"<", L"<CmdLine>", L"</CmdLine>", L"</>"}) {
        std::wstring text = Repeat(piece, static_cast<int>(32767 / wcslen(piece)));
        EXPECT_EQ(0, ParseCommand(text).result) << piece;
    }
    // A valid command drowned in closing tags behind it.
    EXPECT_EQ(0, ParseCommand(Command(L"JoinMeeting") + Repeat(L"</", 16000)).result);
}

TEST(CmdLineParserRobustness, NonAsciiValuesPassUnchanged) {
    Parsed p = ParseCommand(
        Command(L"CommonLogin",
                L"<Username>\x5c71\x7530 \xd83d\xde00</Username><Email>\xd800x\xdfff</Email>"
                L"<SiteUrl>https://\x00fc.example</SiteUrl>"));
    EXPECT_EQ(8, p.info.nAction);
    EXPECT_EQ(L"\x5c71\x7530 \xd83d\xde00", Text(p.info.strUsername));
    EXPECT_EQ(L"\xd800x\xdfff", Text(p.info.strEmail));
    EXPECT_EQ(L"https://\x00fc.example", Text(p.info.strSiteUrl));
}
