// The Notes plug-in's self-update run by the real program: the installed
// program hands over to its temporary copy, the copy's hidden window speaks
// with the stand-in updater and configuration tool, and the installed program
// removes the copies at the end. SelfUpdateSlow runs as a test of its own.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <sstream>

#include "notes/plugin_file_lists.h"
#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/process_wait.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kNotes8Key[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
const wchar_t kNIKey[] = L"SOFTWARE\\mirovan\\NI";
const wchar_t kSiteKey[] = L"Software\\Mirovan_Notes\\General";

// How many of the lines start with `start`.
int Count(const std::string& lines, const std::string& start) {
    std::istringstream stream(lines);
    int count = 0;
    for (std::string line; std::getline(stream, line);) {
        count += line.compare(0, start.size(), start) == 0 ? 1 : 0;
    }
    return count;
}

bool HasRecord(const RunResult& run, DWORD level, const std::string& text) {
    return std::any_of(run.traces.begin(), run.traces.end(), [&](const TraceRecord& record) {
        return record.level == level && record.text == text;
    });
}

class SelfUpdate : public MachineTest {
protected:
    SelfUpdate()
        : m_notes(m_scratch.Sub(L"Lotus\\Notes", true)),
          m_plugin(m_scratch.Sub(L"NI\\Notes", true)) {
        RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"Path", m_notes);
        RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", m_scratch.Sub(L"NI"));
        Put(L"qmnwcfg.exe", m_plugin, L"qmnwcfg.exe");
    }

    static void Put(const wchar_t* fake, const std::wstring& folder, const wchar_t* name) {
        ASSERT_TRUE(CopyFileW(FakePath(fake).c_str(), JoinPath(folder, name).c_str(), FALSE));
    }

    static void Script(ProgramUnderTest& program, const wchar_t* updater, int configExit,
                       int configDelayMs = 0) {
        program.SetEnv(L"QM_FAKE_UPDATER", updater);
        program.SetEnv(L"QM_FAKE_CONFIG_EXIT", std::to_wstring(configExit));
        program.SetEnv(L"QM_FAKE_CONFIG_DELAY_MS", std::to_wstring(configDelayMs));
    }

    // The temporary copy (its name compared in any case) beside the stand-in
    // updater; the installed program is a stand-in that records its start.
    ProgramUnderTest& Copy() {
        if (!m_copy) {
            ProgramOptions options;
            options.exeName = L"~MRVONI.EXE";
            m_copy = std::make_unique<ProgramUnderTest>(m_plugin, options);
            Put(L"qmniupd.exe", m_plugin, L"~TmpDown.exe");
            Put(L"qmnwcfg.exe", m_notes, L"qmMrvONI.exe");
        }
        return *m_copy;
    }

    // Runs the copy and waits for the installed program it starts last.
    RunResult RunCopy(DWORD timeoutMs = 20000) {
        RunResult run = Copy().Run(L"-nupdate", timeoutMs);
        EXPECT_TRUE(AwaitProcessesNamed(L"qmMrvONI.exe", 60000));
        EXPECT_FALSE(run.timedOut || run.crashed);
        return run;
    }

    std::wstring m_notes;
    std::wstring m_plugin;
    std::unique_ptr<ProgramUnderTest> m_copy;
};

const int kNoConfigTool = -1;

const struct ProtocolCase {
    const char* what;
    const wchar_t* updater;  // the stand-in's script
    int configExit;          // or kNoConfigTool
    int configDelayMs;
    const wchar_t* siteName;  // null: no "sitename" value
    int exitCode;
    int configRuns;
    const char* updaterGot;  // null: neither commit nor rollback
    const char* finalCommand;
    DWORD traceLevel;   // a record that shows the way taken
    const char* trace;  // (null: none)
} kProtocol[] = {
    {"commit", L"post-wait", 0, 0, L"acme site", 0, 1, "commit", "-nendupdate", 1,
     " Config process exit with success, send out WM_DOWN_COMMIT to qmniupd.exe.,\n"},
    {"rollback", L"post-wait", 1, 0, nullptr, -1, 1, "rollback", "-nendupdatefail", 8,
     " qmniupd.exe exit with error, send out WM_DOWN_ROLLBACK to qmniupd.exe.,\n"},
    {"configuration tool missing", L"post-wait", kNoConfigTool, 0, nullptr, -1, 0, "rollback",
     "-nendupdatefail", 8, " Launching config process failed.,\n"},
    {"updater gone before the tool ends, naming no window", L"post-exit bogus", 0, 300, nullptr, 0,
     1, nullptr, "-nendupdate", 1, " Set g_bUpdateSuccess\n,\n"},
    {"download reported twice", L"post-wait twice", 0, 0, nullptr, 0, 1, "commit", "-nendupdate", 1,
     " \nDownload process exit with success.\n,\n"},
    {"updater ends without reporting", L"no-post", 0, 0, nullptr, -1, 0, nullptr, "-nendupdatefail",
     0, nullptr},
    {"end with success from outside", L"post-exit msg=1126", 0, 0, nullptr, 0, 0, nullptr,
     "-nendupdatefail", 0, nullptr},
    {"end with failure from outside", L"post-exit msg=1127", 0, 0, nullptr, -1, 0, nullptr,
     "-nendupdatefail", 0, nullptr},
};

TEST_F(SelfUpdate, TemporaryCopyCommitsOrRollsBackAndHandsOverToTheInstalledProgram) {
    for (const ProtocolCase& c : kProtocol) {
        SCOPED_TRACE(c.what);
        RegRemoveTree(HKEY_CURRENT_USER, kSiteKey);
        if (c.siteName != nullptr) {
            RegPutString(HKEY_CURRENT_USER, kSiteKey, L"sitename", c.siteName);
        }
        Script(Copy(), c.updater, c.configExit, c.configDelayMs);
        DeleteFileW(JoinPath(m_plugin, L"qmnwcfg.exe").c_str());
        if (c.configExit != kNoConfigTool) {
            Put(L"qmnwcfg.exe", m_plugin, L"qmnwcfg.exe");
        }
        RunResult run = RunCopy();
        std::string calls = ReadFileBytes(Copy().callsLogPath());

        EXPECT_EQ(c.exitCode, run.exitCode);
        // The updater's start: the window's handle, the site name, the Notes folder.
        const std::string updater = "~TmpDown.exe started: -downstart -hParentWnd=";
        size_t handle = calls.find(updater);
        ASSERT_NE(std::string::npos, handle) << calls;
        handle += updater.size();
        std::string rest =
            " -sitename=" + Narrow(c.siteName ? c.siteName : L"") + " | " + Narrow(m_notes);
        EXPECT_EQ(handle + strspn(calls.c_str() + handle, "0123456789"), calls.find(rest + "\n"));
        EXPECT_EQ(c.configRuns, Count(calls, "qmnwcfg.exe started: -update | " + Narrow(m_notes)));
        EXPECT_EQ(c.updaterGot ? 1 : 0, Count(calls, std::string("~TmpDown.exe received: ") +
                                                         (c.updaterGot ? c.updaterGot : "")));
        EXPECT_EQ(1, Count(calls, std::string("qmMrvONI.exe started: ") + c.finalCommand + " |"));
        EXPECT_TRUE(c.trace == nullptr || HasRecord(run, c.traceLevel, c.trace)) << run.TraceText();
    }
}

TEST_F(SelfUpdate, UpdaterThatCannotStartEndsTheCopyAtOnceWithoutFinalCommand) {
    for (bool notesKnown : {true, false}) {
        SCOPED_TRACE(notesKnown ? "no updater in the plug-in folder" : "no Notes folder");
        Script(Copy(), L"post-wait", 0);
        DeleteFileW(JoinPath(m_plugin, L"~TmpDown.exe").c_str());
        if (!notesKnown) {
            Put(L"qmniupd.exe", m_plugin, L"~TmpDown.exe");
            RegRemoveTree(HKEY_LOCAL_MACHINE, kNotes8Key);
        }
        RunResult run = RunCopy();
        std::string calls = ReadFileBytes(Copy().callsLogPath());

        EXPECT_EQ(0, run.exitCode);
        EXPECT_TRUE(HasRecord(run, 8, " \nLaunching download process failed.\n,\n"));
        EXPECT_EQ(0, Count(calls, "~TmpDown.exe") + Count(calls, "qmMrvONI.exe"));
    }
}

TEST_F(SelfUpdate, InstalledProgramThatCannotStartItsCopyFailsAtOnce) {
    // Neither success, nor a wait behind an error box nobody closes, nor a
    // write in the current folder.
    const std::wstring tooLong = m_plugin + L"\\" + std::wstring(300, L'n');
    const struct {
        const char* what;
        const wchar_t* program;      // the installed program in the Notes folder
        const std::wstring* plugin;  // null: not registered
    } cases[] = {
        {"no installed program in the Notes folder", nullptr, &m_plugin},
        {"no plug-in folder registered", L"qmMrvONI.exe", nullptr},
        {"plug-in folder longer than a path", L"qmMrvONI.exe", &tooLong},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        RegRemoveTree(HKEY_LOCAL_MACHINE, kNIKey);
        if (c.plugin != nullptr) {
            RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", *c.plugin);
        }
        DeleteFileW(JoinPath(m_notes, L"qmMrvONI.exe").c_str());
        Put(L"qmniupd.exe", m_notes, L"qmniupd.exe");
        if (c.program != nullptr) {
            Put(L"qmnwcfg.exe", m_notes, c.program);
        }
        Program().Run(L"-nosuchkeyword");  // leaves its logs, as the next run does
        std::vector<std::wstring> before = ListDir(Program().folder());
        RunResult run = Program().Run(L"-nupdate", 20000);

        EXPECT_FALSE(run.timedOut || run.crashed);
        EXPECT_EQ(-1, run.exitCode);
        EXPECT_TRUE(HasRecord(run, 1, " \nLaunching ~MrvONI.exe process failed.\n,\n"));
        EXPECT_EQ(before, ListDir(Program().folder()));
    }
}

TEST_F(SelfUpdate, CommittedUpdateEndsWithTheCopiesGoneAndNotesCompleted) {
    ProgramUnderTest installed(m_notes);
    Put(L"qmniupd.exe", m_notes, L"qmniupd.exe");
    for (const wchar_t* name : kPluginFiles) {
        if (!FileExists(JoinPath(m_plugin, name))) {
            WriteFileBytes(JoinPath(m_plugin, name), "new:" + Narrow(name));
        }
    }
    WriteFileBytes(JoinPath(m_notes, L"qmnires.dll"), "notes' own");
    Script(installed, L"post-wait", 0);
    RunResult run = installed.Run(L"-nupdate", 20000);
    EXPECT_TRUE(AwaitProcessesNamed(L"~MrvONI.exe", 60000));
    EXPECT_TRUE(AwaitProcessesNamed(L"qmMrvONI.exe", 60000));
    std::string calls = ReadFileBytes(installed.callsLogPath());

    EXPECT_EQ(0, run.exitCode);
    EXPECT_EQ(1, Count(calls, "~TmpDown.exe received: commit"));
    EXPECT_EQ(1, Count(calls, "qmnwcfg.exe started: -update | " + Narrow(m_notes)));
    // The final run removed the copies and completed the Notes folder.
    EXPECT_FALSE(FileExists(JoinPath(m_plugin, L"~TmpDown.exe")) ||
                 FileExists(JoinPath(m_plugin, L"~MrvONI.exe")));
    for (const wchar_t* name : kPluginFiles) {
        EXPECT_TRUE(FileExists(JoinPath(m_notes, name))) << Narrow(name);
    }
    EXPECT_EQ("notes' own", ReadFileBytes(JoinPath(m_notes, L"qmnires.dll")));
    EXPECT_EQ("new:qmMRVURL.DLL", ReadFileBytes(JoinPath(m_notes, L"qmMRVURL.DLL")));
}

class SelfUpdateSlow : public SelfUpdate {};

TEST_F(SelfUpdateSlow, UpdaterThatNeverEndsIsTerminatedAfterThirtySeconds) {
    Script(Copy(), L"ignore", 0);
    DWORD start = GetTickCount();
    RunResult run = RunCopy(90000);
    DWORD elapsed = GetTickCount() - start;
    std::string calls = ReadFileBytes(Copy().callsLogPath());

    EXPECT_TRUE(AwaitProcessesNamed(L"~TmpDown.exe", 5000));
    EXPECT_EQ(0, run.exitCode);
    EXPECT_GE(elapsed, 29000u);
    EXPECT_LT(elapsed, 60000u);
    EXPECT_EQ(1, Count(calls, "~TmpDown.exe received: commit"));
    EXPECT_EQ(1, Count(calls, "qmMrvONI.exe started: -nendupdate |"));
}

}  // namespace
