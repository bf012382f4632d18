// The Notes plug-in's self-update run by the real program: the installed
// program hands over to its temporary copy, the copy's hidden window speaks
// with the stand-in updater and configuration tool, and the installed program
// removes the copies at the end.
#include <gtest/gtest.h>

#include "notes/plugin_file_lists.h"
#include "tests/e2e/self_update_machine.h"

namespace self_update_test {
namespace {

class SelfUpdateE2E : public SelfUpdateMachine {
protected:
    // The updater's start as recorded: arguments after the window handle,
    // and the working folder; empty when it was not started.
    std::string UpdaterStartAfterHandle(const std::vector<std::string>& calls) {
        const std::string start = "~TmpDown.exe started: -downstart -hParentWnd=";
        for (const std::string& line : calls) {
            if (line.compare(0, start.size(), start) == 0) {
                size_t digits = line.find_first_not_of("0123456789", start.size());
                EXPECT_GT(digits, start.size()) << line;
                return line.substr(digits);
            }
        }
        return std::string();
    }

    // The program's own folder, without the logs of its runs.
    std::vector<std::wstring> ProgramFolderFiles() {
        std::vector<std::wstring> files;
        for (const std::wstring& name : ListDir(Program().folder())) {
            if (name != L"trace.log" && name != L"calls.log") {
                files.push_back(name);
            }
        }
        return files;
    }
};

// No configuration tool in the plug-in folder.
const int kNoConfigTool = -1;

struct ProtocolCase {
    const char* what;
    const wchar_t* updater;  // the stand-in's script
    int configExit;          // or kNoConfigTool
    int configDelayMs;
    const wchar_t* siteName;  // null: no "sitename" value
    int exitCode;
    int configRuns;
    const char* updaterReceived;  // null: neither commit nor rollback
    const char* finalCommand;
    DWORD traceLevel;  // a record that shows the way taken (null: none)
    const char* trace;
};

const ProtocolCase kProtocol[] = {
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

TEST_F(SelfUpdateE2E, TemporaryCopyCommitsOrRollsBackAndHandsOverToTheInstalledProgram) {
    for (const ProtocolCase& c : kProtocol) {
        SCOPED_TRACE(c.what);
        RegRemoveTree(HKEY_CURRENT_USER, kSiteKey);
        if (c.siteName != nullptr) {
            ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kSiteKey, L"sitename", c.siteName));
        }
        Script(TemporaryCopy(), c.updater, c.configExit, c.configDelayMs);
        DeleteFileW(JoinPath(m_plugin, L"qmnwcfg.exe").c_str());
        if (c.configExit != kNoConfigTool) {
            PutFake(L"qmnwcfg.exe", m_plugin, L"qmnwcfg.exe");
        }
        RunResult run = RunTemporaryCopy();
        std::vector<std::string> calls = Calls(TemporaryCopy());

        EXPECT_FALSE(run.timedOut || run.crashed);
        EXPECT_EQ(c.exitCode, run.exitCode);
        std::string site = c.siteName ? Narrow(c.siteName) : "";
        EXPECT_EQ(" -sitename=" + site + " | " + Narrow(m_notes), UpdaterStartAfterHandle(calls));
        EXPECT_EQ(c.configRuns,
                  CountStartingWith(calls, "qmnwcfg.exe started: -update | " + Narrow(m_notes)));
        EXPECT_EQ(c.configRuns, CountStartingWith(calls, "qmnwcfg.exe started:"));
        EXPECT_EQ(c.updaterReceived ? 1 : 0, CountStartingWith(calls, "~TmpDown.exe received:"));
        if (c.updaterReceived != nullptr) {
            EXPECT_EQ(1, CountStartingWith(
                             calls, std::string("~TmpDown.exe received: ") + c.updaterReceived));
        }
        EXPECT_EQ(1, CountStartingWith(calls, "qmMrvONI.exe started:"));
        EXPECT_EQ(1, CountStartingWith(
                         calls, std::string("qmMrvONI.exe started: ") + c.finalCommand + " |"));
        bool found = c.trace == nullptr;
        for (const TraceRecord& record : run.traces) {
            found = found || (record.level == c.traceLevel && record.text == c.trace);
        }
        EXPECT_TRUE(found) << run.TraceText();
    }
}

TEST_F(SelfUpdateE2E, UpdaterThatCannotStartEndsTheCopyAtOnceWithoutFinalCommand) {
    for (bool notesKnown : {true, false}) {
        SCOPED_TRACE(notesKnown ? "no updater in the plug-in folder" : "no Notes folder");
        Script(TemporaryCopy(), L"post-wait", 0);
        DeleteFileW(JoinPath(m_plugin, L"~TmpDown.exe").c_str());
        if (!notesKnown) {
            PutFake(L"qmniupd.exe", m_plugin, L"~TmpDown.exe");
            RegRemoveTree(HKEY_LOCAL_MACHINE, kNotes8Key);
        }
        RunResult run = RunTemporaryCopy();

        EXPECT_FALSE(run.timedOut || run.crashed);
        EXPECT_EQ(0, run.exitCode);
        EXPECT_EQ(1, run.CountTraces(" \nLaunching download process failed.\n,\n"));
        std::vector<std::string> calls = Calls(TemporaryCopy());
        EXPECT_EQ(0, CountStartingWith(calls, "~TmpDown.exe"));
        EXPECT_EQ(0, CountStartingWith(calls, "qmMrvONI.exe"));
    }
}

TEST_F(SelfUpdateE2E, InstalledProgramThatCannotStartItsCopyFailsAtOnce) {
    // A start that fails must neither be reported as success nor wait behind
    // an error box that nobody closes, nor write in the current folder.
    const std::wstring longFolder = m_plugin + L"\\" + std::wstring(300, L'n');
    const struct {
        const char* what;
        const wchar_t* program;      // the installed program in the Notes folder
        const std::wstring* plugin;  // null: not registered
    } cases[] = {
        {"no installed program in the Notes folder", nullptr, &m_plugin},
        {"no plug-in folder registered", L"qmMrvONI.exe", nullptr},
        {"plug-in folder longer than a path", L"qmMrvONI.exe", &longFolder},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        RegRemoveTree(HKEY_LOCAL_MACHINE, kNIKey);
        if (c.plugin != nullptr) {
            ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", *c.plugin));
        }
        DeleteFileW(JoinPath(m_notes, L"qmMrvONI.exe").c_str());
        DeleteFileW(JoinPath(m_plugin, L"~TmpDown.exe").c_str());
        PutFake(L"qmniupd.exe", m_notes, L"qmniupd.exe");
        if (c.program != nullptr) {
            PutFake(L"qmnwcfg.exe", m_notes, c.program);
        }
        std::vector<std::wstring> before = ProgramFolderFiles();
        RunResult run = Program().Run(L"-nupdate", 20000);

        EXPECT_FALSE(run.timedOut || run.crashed);
        EXPECT_EQ(-1, run.exitCode);
        EXPECT_EQ(1, run.CountTraces(" \nLaunching ~MrvONI.exe process failed.\n,\n"));
        EXPECT_EQ(before, ProgramFolderFiles());
    }
}

TEST_F(SelfUpdateE2E, CommittedUpdateEndsWithTheCopiesGoneAndNotesCompleted) {
    ProgramUnderTest installed(m_notes);
    PutFake(L"qmniupd.exe", m_notes, L"qmniupd.exe");
    for (const wchar_t* name : kPluginFiles) {
        if (!FileExists(JoinPath(m_plugin, name))) {
            ASSERT_TRUE(WriteFileBytes(JoinPath(m_plugin, name), "new:" + Narrow(name)));
        }
    }
    ASSERT_TRUE(WriteFileBytes(JoinPath(m_notes, L"qmnires.dll"), "notes' own"));
    Script(installed, L"post-wait", 0);
    RunResult run = installed.Run(L"-nupdate", 20000);
    EXPECT_TRUE(AwaitProcessesNamed(L"~MrvONI.exe", 60000));
    EXPECT_TRUE(AwaitProcessesNamed(L"qmMrvONI.exe", 60000));
    std::vector<std::string> calls = Calls(installed);

    EXPECT_FALSE(run.timedOut || run.crashed);
    EXPECT_EQ(0, run.exitCode);
    EXPECT_EQ(1, CountStartingWith(calls, "~TmpDown.exe received: commit"));
    EXPECT_EQ(1, CountStartingWith(calls, "qmnwcfg.exe started: -update | " + Narrow(m_notes)));
    std::vector<TraceRecord> traces = ParseTraceLog(ReadFileBytes(installed.traceLogPath()));
    int finalRuns = 0;
    for (const TraceRecord& record : traces) {
        finalRuns += record.text == "NIHandle lpCmdLine=-nendupdate,\n" ? 1 : 0;
    }
    EXPECT_EQ(1, finalRuns);
    EXPECT_FALSE(FileExists(JoinPath(m_plugin, L"~TmpDown.exe")));
    EXPECT_FALSE(FileExists(JoinPath(m_plugin, L"~MrvONI.exe")));
    for (const wchar_t* name : kPluginFiles) {
        EXPECT_TRUE(FileExists(JoinPath(m_notes, name))) << Narrow(name);
    }
    EXPECT_EQ("notes' own", ReadFileBytes(JoinPath(m_notes, L"qmnires.dll")));
    EXPECT_EQ("new:qmMRVURL.DLL", ReadFileBytes(JoinPath(m_notes, L"qmMRVURL.DLL")));
}

TEST_F(SelfUpdateE2E, FailedUpdateRemovesTheCopiesAndCompletesNothing) {
    ProgramUnderTest installed(m_notes);
    for (const wchar_t* name : {L"~TmpDown.exe", L"~MrvONI.exe", L"qmMRVURL.DLL"}) {
        ASSERT_TRUE(WriteFileBytes(JoinPath(m_plugin, name), "x"));
    }
    RunResult run = installed.Run(L"-nendupdatefail");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_FALSE(FileExists(JoinPath(m_plugin, L"~TmpDown.exe")));
    EXPECT_FALSE(FileExists(JoinPath(m_plugin, L"~MrvONI.exe")));
    EXPECT_FALSE(FileExists(JoinPath(m_notes, L"qmMRVURL.DLL")));
}

}  // namespace
}  // namespace self_update_test
