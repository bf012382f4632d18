// One-click Actions end to end: the program loads the one-click library
// stand-in from its folder, calls the Action's method with the top-level
// window under the mouse cursor, then releases and unloads it.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

class OneClickTest : public ::testing::Test {
protected:
    static ProgramOptions WithoutSuiteLibrary() {
        ProgramOptions options;
        options.withSuiteLibrary = false;  // its records would mix with the library's
        return options;
    }
    void InstallLibrary(const wchar_t* built) {
        CopyFileW(FakePath(built).c_str(), JoinPath(m_program.folder(), L"qmMrvMS.DLL").c_str(),
                  FALSE);
    }
    std::string Calls() { return ReadFileBytes(m_program.callsLogPath()); }

    ScratchDir m_scratch{L"oneclick"};
    ProgramUnderTest m_program{m_scratch.Sub(L"bin"), WithoutSuiteLibrary()};
};

TEST_F(OneClickTest, EachActionCallsItsMethodWithTheTopLevelWindowUnderTheCursor) {
    InstallLibrary(L"qmMrvMS.DLL");
    // Another program's window over the screen, the cursor on a button
    // inside a panel of it.
    HWND client = CreateWindowW(L"STATIC", L"Meeting client", WS_POPUP | WS_VISIBLE, 0, 0,
                                GetSystemMetrics(SM_CXSCREEN), GetSystemMetrics(SM_CYSCREEN),
                                nullptr, nullptr, nullptr, nullptr);
    HWND panel = CreateWindowW(L"STATIC", L"", WS_CHILD | WS_VISIBLE, 50, 50, 400, 300, client,
                               nullptr, nullptr, nullptr);
    CreateWindowW(L"BUTTON", L"Join", WS_CHILD | WS_VISIBLE, 100, 100, 200, 40, panel, nullptr,
                  nullptr, nullptr);
    SetCursorPos(250, 170);  // on the button
    const std::string owner = std::to_string(HandleToLong(client));
    struct Row {
        const wchar_t* command;
        std::string calls;
    } rows[] = {
        {L"<Action>ShareWindow</Action>", "ShareWindow " + owner + " " + owner},
        {L"<Action>StartAudioOnly</Action>", "StartAudioOnly " + owner},
        {L"<Action>ScheduleMeeting</Action>", "ScheduleMeeting " + owner},
        {L"<Action>JoinMeeting</Action><hWnd>77</hWnd>", "JoinMeeting " + owner},
        {L"<Action>OpenHelp</Action>", "OpenHelp " + owner},
        {L"<Action>OpenAbout</Action>", "OpenAbout " + owner},
        {L"<Action>StartOCMeeting</Action><Client>FireFox</Client>",
         "SetBrowser Firefox\nStartOCMeeting " + owner},
        {L"<Action>OpenQMSetting</Action><Client>FireFox</Client>",
         "SetBrowser Firefox\nOpenQMSetting " + owner},
    };
    for (const Row& row : rows) {
        RunResult run = m_program.Run(std::wstring(L"<CmdLine>") + row.command + L"</CmdLine>");
        EXPECT_FALSE(run.crashed);
        EXPECT_EQ(1, run.exitCode) << Narrow(row.command);
        EXPECT_EQ("qmMrvMS.DLL loaded\nDllGetClassObject\nCreateInstance\n" + row.calls +
                      "\nReleased\nqmMrvMS.DLL unloaded\n",
                  Calls());
        EXPECT_EQ(1, run.CountTraces("--> COneClickItemHandler::FreeOneClickObject \n"));
        EXPECT_EQ(1, run.CountTraces("<-- COneClickItemHandler::FreeOneClickObject \n"));
    }
    DestroyWindow(client);
}

TEST_F(OneClickTest, WithoutTheOneClickObjectNothingIsCalledAndTheResultIsZero) {
    struct Row {
        const wchar_t* library;  // null: none in the program's folder
        const wchar_t* failure;  // QM_FAKE_ONECLICK_FAIL
    } rows[] = {
        {nullptr, L""},
        {L"noexport\\qmMrvMS.DLL", L""},
        {L"qmMrvMS.DLL", L"DllGetClassObject"},
        {L"qmMrvMS.DLL", L"CreateInstance"},
    };
    for (const Row& row : rows) {
        DeleteFileW(JoinPath(m_program.folder(), L"qmMrvMS.DLL").c_str());
        if (row.library != nullptr) {
            InstallLibrary(row.library);
        }
        m_program.SetEnv(L"QM_FAKE_ONECLICK_FAIL", row.failure);
        RunResult run = m_program.Run(L"<CmdLine><Action>JoinMeeting</Action></CmdLine>");
        EXPECT_FALSE(run.crashed);
        EXPECT_EQ(0, run.exitCode);
        ASSERT_EQ(4u, run.traces.size()) << run.TraceText();
        EXPECT_EQ(8u, run.traces[2].level);
        EXPECT_EQ(" Failed CoCreateInstance\n,\n", run.traces[2].text);
        EXPECT_EQ(8u, run.traces[3].level);
        EXPECT_EQ(" m_spOneClickItems == NULL,\n", run.traces[3].text);
        EXPECT_EQ(std::string::npos, Calls().find("JoinMeeting"));
    }
}

}  // namespace
