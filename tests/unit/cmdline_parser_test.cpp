// CCmdLineParser: which Actions exist (exact names), which elements each
// reads, and the one field that Client and ErrorId share.
#include <gtest/gtest.h>

#include <string>

#include "actions/command_info.h"
#include "app/cmdline_parser.h"
#include "base/string_ex.h"

namespace {

// "fails", or the fields GetCommandInfo copies that differ from their start values.
std::wstring Parsed(const std::wstring& elements) {
    CCmdLineParser parser;
    if (!parser.Parse(CStringEx((L"<CmdLine>" + elements + L"</CmdLine>").c_str()))) {
        return L"fails";
    }
    CommandInfo info;
    EXPECT_TRUE(parser.GetCommandInfo(info));
    std::wstring text = L"action=" + std::to_wstring(info.nAction);
    auto add = [&text](const wchar_t* name, const std::wstring& value) {
        text += value.empty() || value == L"0" ? L"" : L" " + std::wstring(name) + L"=" + value;
    };
    add(L"hWnd", std::to_wstring(info.hWnd));
    add(L"url", info.strUrl.c_str());
    add(L"attendees", info.strAttendeeFile.c_str());
    add(L"share", info.strSharePathFile.c_str());
    add(L"flag", info.strShareFlag.c_str());
    add(L"clientOrError", std::to_wstring(info.nClientOrErrorId));
    add(L"site", info.strSiteUrl.c_str());
    add(L"user", info.strUsername.c_str());
    add(L"editable", std::to_wstring(info.bUserInfoEditable));
    add(L"email", info.strEmail.c_str());
    return text;
}

TEST(CmdLineParser, ActionsReadTheirOwnElements) {
    const std::wstring all =
        L"<AttendeeFile>a.xml</AttendeeFile><SharePathFile>s.exe</SharePathFile>"
        L"<ShareFlag>2</ShareFlag><SiteUrl>site</SiteUrl><Username>bob</Username>"
        L"<Editable>1</Editable><Email>e</Email><LogUrl>log</LogUrl><ErrorId>7</ErrorId>";
    const struct {
        const wchar_t* elements;  // before all the others
        const wchar_t* fields;
    } cases[] = {
        {L"<Action>JoinMeeting</Action><hWnd>12</hWnd><URL>u&amp;lt;</URL>",
         L"action=13 hWnd=12 url=u&lt;"},
        {L"<Action>OpenQMSetting</Action>", L"action=4 site=site"},
        {L"<Action>PostAttendee</Action>", L"action=5 attendees=a.xml"},
        {L"<Action>ShareAsApp</Action>", L"action=6 share=s.exe flag=2"},
        {L"<Action>CommonLogin</Action>", L"action=8 site=site user=bob editable=1 email=e"},
        // Client and ErrorId share one field: a known Client wins wherever it stands.
        {L"<Action>PostJMFLog</Action><URL>b</URL>", L"action=16 url=b clientOrError=7"},
        {L"<Action>PostJMFLog</Action><Client>NI</Client>", L"action=16 url=log clientOrError=1"},
        {L"<Client>FireFox</Client><Action>PostJMFLog</Action>",
         L"action=16 url=log clientOrError=2"},
        {L"<Action>PostJMFLog</Action><Client>OI</Client>", L"action=16 url=log"},
        {L"<Action>PostJMFLog</Action><Client>Firefox</Client>",
         L"action=16 url=log clientOrError=7"},
        // Action names are whole; the Action is a direct child of the root.
        {L"<Action>JoinMeetingX</Action>", L"fails"},
        {L"<X><Action>JoinMeeting</Action></X>", L"fails"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(c.fields, Parsed(c.elements + all)) << c.elements;
    }
}

}  // namespace
