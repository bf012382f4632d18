// The Notes plug-in's self-update: the installed program, its temporary copy
// and the stand-in updater and tool. SelfUpdateSlow runs as its own test.
#include <gtest/gtest.h>

#include "notes/plugin_file_lists.h"
#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/process_wait.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kNotes8Key[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
const wchar_t kNIKey[] = L"SOFTWARE\\mirovan\\NI";
const wchar_t kSiteKey[] = L"Software\\Mirovan_Notes\\General";

class SelfUpdate : public MachineTest {
protected:
    SelfUpdate() {
        RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"Path", m_notes);
        RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", m_scratch.Sub(L"NI"));
        Put(L"qmnwcfg.exe", m_plugin, L"qmnwcfg.exe");
        Put(L"qmniupd.exe", m_plugin, L"~TmpDown.exe");
        Put(L"qmnwcfg.exe", m_notes, L"qmMrvONI.exe");  // the installed program, a stand-in
    }
    static void Put(const wchar_t* fake, const std::wstring& folder, const wchar_t* name) {
        ASSERT_TRUE(CopyFileW(FakePath(fake).c_str(), JoinPath(folder, name).c_str(), FALSE));
    }
    // -nupdate with the stand-ins' scripts; waits for what it starts.
    RunResult Run(ProgramUnderTest& program, const wchar_t* updater, int configExit = 0,
                  int configDelayMs = 0, DWORD timeoutMs = 20000) {
        program.SetEnv(L"QM_FAKE_UPDATER", updater);
        program.SetEnv(L"QM_FAKE_CONFIG_EXIT", std::to_wstring(configExit));
        program.SetEnv(L"QM_FAKE_CONFIG_DELAY_MS", std::to_wstring(configDelayMs));
        RunResult run = program.Run(L"-nupdate", timeoutMs);
        EXPECT_TRUE(AwaitProcessesNamed(L"~MrvONI.exe", 60000));
        EXPECT_TRUE(AwaitProcessesNamed(L"qmMrvONI.exe", 60000));
        EXPECT_FALSE(run.timedOut || run.crashed);
        m_calls = ReadFileBytes(program.callsLogPath());
        return run;
    }
    const std::wstring m_notes = m_scratch.Sub(L"Lotus\\Notes", true);
    const std::wstring m_plugin = m_scratch.Sub(L"NI\\Notes", true);
    // The temporary copy, its name in another case.
    ProgramUnderTest m_copy{m_plugin, {TraceLibrary::kBoth, true, L"~MRVONI.EXE"}};
    std::string m_calls;
};

const int kNoConfigTool = -1;

const struct ProtocolCase {
    const char* what;
    const wchar_t* updater;  // the stand-in's script, null: no updater
    int configExit;          // or kNoConfigTool
    int configDelayMs;
    const wchar_t* siteName;  // null: no "sitename" value
    int exitCode;
    int configRuns;
    const char* updaterGot;    // null: neither commit nor rollback
    const char* finalCommand;  // null: none
} kProtocol[] = {
    {"commit", L"post-wait", 0, 0, L"acme site", 0, 1, "commit", "-nendupdate"},
    {"rollback", L"post-wait", 1, 0, nullptr, -1, 1, "rollback", "-nendupdatefail"},
    {"no tool", L"post-wait", kNoConfigTool, 0, nullptr, -1, 0, "rollback", "-nendupdatefail"},
    {"updater gone, no window", L"post-exit bogus", 0, 300, nullptr, 0, 1, nullptr, "-nendupdate"},
    {"reported twice", L"post-wait twice", 0, 0, nullptr, 0, 1, "commit", "-nendupdate"},
    {"updater ends silently", L"no-post", 0, 0, nullptr, -1, 0, nullptr, "-nendupdatefail"},
    {"1126 from outside", L"post-exit msg=1126", 0, 0, nullptr, 0, 0, nullptr, "-nendupdatefail"},
    {"1127 from outside", L"post-exit msg=1127", 0, 0, nullptr, -1, 0, nullptr, "-nendupdatefail"},
    {"no updater", nullptr, 0, 0, nullptr, 0, 0, nullptr, nullptr},
};

TEST_F(SelfUpdate, TemporaryCopyCommitsOrRollsBackAndHandsOverToTheInstalledProgram) {
    for (const ProtocolCase& c : kProtocol) {
        SCOPED_TRACE(c.what);
        RegRemoveTree(HKEY_CURRENT_USER, kSiteKey);
        if (c.siteName != nullptr) {
            RegPutString(HKEY_CURRENT_USER, kSiteKey, L"sitename", c.siteName);
        }
        DeleteFileW(JoinPath(m_plugin, L"qmnwcfg.exe").c_str());
        DeleteFileW(JoinPath(m_plugin, L"~TmpDown.exe").c_str());
        if (c.configExit != kNoConfigTool) {
            Put(L"qmnwcfg.exe", m_plugin, L"qmnwcfg.exe");
        }
        if (c.updater != nullptr) {
            Put(L"qmniupd.exe", m_plugin, L"~TmpDown.exe");
        }
        RunResult run = Run(m_copy, c.updater ? c.updater : L"", c.configExit, c.configDelayMs);
        EXPECT_EQ(c.exitCode, run.exitCode);
        // The updater's start: the window's handle, the site name, the Notes folder.
        EXPECT_EQ(c.updater ? 1 : 0,
                  CountOf(m_calls, "~TmpDown.exe started: -downstart -hParentWnd="));
        EXPECT_EQ(c.updater != nullptr,
                  m_calls.find(" -sitename=" + Narrow(c.siteName ? c.siteName : L"") + " | " +
                               Narrow(m_notes) + "\n") != std::string::npos);
        EXPECT_EQ(c.configRuns,
                  CountOf(m_calls, "qmnwcfg.exe started: -update | " + Narrow(m_notes)));
        EXPECT_EQ(c.updaterGot ? 1 : 0, CountOf(m_calls, std::string("~TmpDown.exe received: ") +
                                                             (c.updaterGot ? c.updaterGot : "")));
        const std::string final = c.finalCommand ? std::string(c.finalCommand) + " |" : "";
        EXPECT_EQ(c.finalCommand ? 1 : 0, CountOf(m_calls, "qmMrvONI.exe started: " + final));
    }
}

// The program under its own name cannot start its copy (a plug-in folder
// longer than a path): neither success, nor a write in the current folder.
TEST_F(SelfUpdate, InstalledProgramThatCannotStartItsCopyFailsAtOnce) {
    RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", m_plugin + L"\\" + std::wstring(300, L'n'));
    Program().Run(L"-nosuchkeyword");  // leaves its logs, as the next run does
    const std::vector<std::wstring> before = ListDir(Program().folder());
    RunResult run = Run(Program(), L"post-wait");
    EXPECT_EQ(-1, run.exitCode);
    EXPECT_TRUE(run.HasTrace(" \nLaunching ~MrvONI.exe process failed.\n,\n"));
    EXPECT_EQ(before, ListDir(Program().folder()));
}

TEST_F(SelfUpdate, CommittedUpdateEndsWithTheCopiesGoneAndNotesCompleted) {
    ProgramUnderTest installed(m_notes);
    Put(L"qmniupd.exe", m_notes, L"qmniupd.exe");
    for (const wchar_t* name : kPluginFiles) {
        if (!FileExists(JoinPath(m_plugin, name))) {
            WriteFileBytes(JoinPath(m_plugin, name), "new");
        }
    }
    WriteFileBytes(JoinPath(m_notes, L"qmnires.dll"), "notes' own");
    EXPECT_EQ(0, Run(installed, L"post-wait").exitCode);
    EXPECT_EQ(1, CountOf(m_calls, "~TmpDown.exe received: commit"));
    // The final run removed the copies and completed the Notes folder.
    EXPECT_FALSE(FileExists(JoinPath(m_plugin, L"~TmpDown.exe")) ||
                 FileExists(JoinPath(m_plugin, L"~MrvONI.exe")));
    EXPECT_EQ("new", ReadFileBytes(JoinPath(m_notes, kPluginFiles[kPluginFileCount - 1])));
    EXPECT_EQ("notes' own", ReadFileBytes(JoinPath(m_notes, L"qmnires.dll")));
}

class SelfUpdateSlow : public SelfUpdate {};

TEST_F(SelfUpdateSlow, UpdaterThatNeverEndsIsTerminatedAfterThirtySeconds) {
    const DWORD start = GetTickCount();
    EXPECT_EQ(0, Run(m_copy, L"ignore", 0, 0, 90000).exitCode);
    const DWORD elapsed = GetTickCount() - start;
    EXPECT_TRUE(AwaitProcessesNamed(L"~TmpDown.exe", 5000));
    EXPECT_GE(elapsed, 29000u);
    EXPECT_LT(elapsed, 60000u);
    EXPECT_EQ(1, CountOf(m_calls, "~TmpDown.exe received: commit"));
    EXPECT_EQ(1, CountOf(m_calls, "qmMrvONI.exe started: -nendupdate |"));
}

}  // namespace
