// The problem report run by the real program: trace files in the temporary
// folder the program is given, the suite's resource and UI libraries, Simple
// MAPI and Outlook as stand-ins. The zip is read back with Debian's unzip.
#include <windows.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <string>
#include <vector>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kAppPathsKey[] =
    L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\App Paths\\OUTLOOK.EXE";
const wchar_t kProgramDllOverrides[] = L"Software\\Wine\\AppDefaults\\qmMrvONI.exe\\DllOverrides";
const char kZipAttachment[] = "attachment position=4294967295 name=Mirovan_Trace.zip opens=1 path=";
const char kFailureBox[] =
    "QclMessageBox owner=0 style=0x42030 text=No mail could be started. Please send the trace "
    "files by hand. caption=Quillmark Tools";

std::vector<std::string> LinesStartingWith(const std::string& text, const std::string& start) {
    std::vector<std::string> found;
    for (size_t at = 0, end; (end = text.find('\n', at)) != std::string::npos; at = end + 1) {
        if (text.compare(at, start.size(), start) == 0) {
            found.push_back(text.substr(at, end - at));
        }
    }
    return found;
}

// Starts commandLine in folder; its process handle (null for a Unix program).
HANDLE Start(std::wstring commandLine, const wchar_t* folder = nullptr) {
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessW(nullptr, &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr, folder,
                        &startup, &process)) {
        return nullptr;
    }
    CloseHandle(process.hThread);
    return process.hProcess;
}

// Trace-file content: varied lines, as a trace library writes them.
std::string TraceBytes(size_t size, int seed) {
    std::string bytes;
    for (int i = 0; bytes.size() < size; ++i) {
        bytes += "[" + std::to_string(seed) + ":" + std::to_string(i * 7919 % 100003) + "] QM\r\n";
    }
    bytes.resize(size);
    return bytes;
}

class ProblemReportTest : public MachineTest {
protected:
    ProblemReportTest() {
        for (const wchar_t* name : {L"qmocres.dll", L"MAPI32.DLL", L"qmONIUI.dll"}) {
            CopyFileW(FakePath(name).c_str(), JoinPath(Program().folder(), name).c_str(), FALSE);
        }
        UseMapi(L"native,builtin");
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path",
                     Program().folder());
        UseTraceFolder(m_scratch.Sub(L"temp"));
    }
    ~ProblemReportTest() override {
        for (HANDLE process : m_started) {
            TerminateProcess(process, 0);
            WaitForSingleObject(process, 5000);
            CloseHandle(process);
        }
        RegRemoveTree(HKEY_LOCAL_MACHINE, kAppPathsKey);
        RegRemoveTree(HKEY_CURRENT_USER, kProgramDllOverrides);
    }

    // Which MAPI32.DLL the program loads: "native,builtin" the stand-in beside
    // it, "" none. Wine takes WINEDLLOVERRIDES from the test's own start, not
    // from the environment the test gives the program.
    void UseMapi(const wchar_t* loadOrder) {
        RegPutString(HKEY_CURRENT_USER, kProgramDllOverrides, L"mapi32", loadOrder);
    }
    void UseTraceFolder(const std::wstring& folder) {
        MakeDirs(folder);
        m_traces = folder;
        Program().SetEnv(L"TMP", folder);
        Program().SetEnv(L"TEMP", folder);
    }
    std::string PutTrace(const std::wstring& name, size_t size, int seed = 1) {
        std::string bytes = TraceBytes(size, seed);
        WriteFileBytes(JoinPath(m_traces, name), bytes);
        return bytes;
    }
    // Starts a stand-in that runs until the test ends.
    void StartRunning(const wchar_t* program) {
        if (HANDLE process = Start(L"\"" + FakePath(program) + L"\" -stay")) {
            m_started.push_back(process);
        }
    }
    RunResult Report() {
        RunResult run = Program().Run(L"<CmdLine><Action>SendProblemReport</Action></CmdLine>");
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }
    std::string Calls() { return ReadFileBytes(Program().callsLogPath()); }
    std::wstring ZipPath() const { return JoinPath(m_traces, L"Mirovan_Trace.zip"); }

    // Debian's unzip lists the zip (into m_listing) and extracts it; the
    // entries it extracted, by name. Wine gives no handle to wait on a Unix
    // program: the shell leaves unzip's exit code in a file when it is done.
    std::map<std::string, std::string> Unzipped() {
        std::wstring out = m_scratch.Sub(L"unzipped");
        RemoveTree(out);
        std::wstring code = m_scratch.Sub(L"code");
        DeleteFileW(code.c_str());
        Start(
            L"Z:\\bin\\sh -c \"unzip -v Mirovan_Trace.zip > ../listing && "
            L"unzip -qo Mirovan_Trace.zip -d ../unzipped; echo $? > ../code\"",
            m_traces.c_str());
        for (int i = 0; i < 300 && ReadFileBytes(code).empty(); ++i) {
            Sleep(100);
        }
        EXPECT_EQ("0\n", ReadFileBytes(code));
        m_listing = ReadFileBytes(m_scratch.Sub(L"listing"));
        std::map<std::string, std::string> entries;
        for (const std::wstring& name : ListDir(out)) {
            entries[Narrow(name)] = ReadFileBytes(JoinPath(out, name));
        }
        return entries;
    }
    std::wstring m_traces;
    std::string m_listing;
    std::vector<HANDLE> m_started;
};

// A user name in another script: the zip is opened by its wide path and MAPI
// gets a path it can open. The subject names the suite's version.
TEST_F(ProblemReportTest, TraceFilesAreZippedAndMailedAsOneAttachment) {
    RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"BuildNumber", L"2.0.1.123");
    for (const wchar_t* folder : {L"temp", L"\u0418\u0432\u0430\u043d_\u0e01\u0e02"}) {
        SCOPED_TRACE(Narrow(folder));
        UseTraceFolder(m_scratch.Sub(folder));
        std::string a = PutTrace(L"a.mvt", 300000, 1);
        std::string b = PutTrace(L"b.mvt", 5000, 2);
        RunResult run = Report();
        EXPECT_TRUE(run.HasTrace(" the compress successed,\n"));
        std::string mail =
            "MAPISendMail session=0 ui=0 flags=9 reserved=0\n"
            "subject=Quillmark Tools problem report 2.0.1.123\n"
            "note=Please describe the problem: what did you do, 100% sure?\n"
            "recipients=0 originator=none\n" +
            std::string(kZipAttachment);
        EXPECT_NE(std::string::npos, Calls().find(mail)) << Calls();
        EXPECT_EQ(1u, LinesStartingWith(Calls(), "attachment ").size());
        EXPECT_TRUE((std::map<std::string, std::string>{{"a.mvt", a}, {"b.mvt", b}}) == Unzipped());
        EXPECT_EQ(2u, LinesStartingWith(m_listing, "  300000  Defl:N").size() +
                          LinesStartingWith(m_listing, "    5000  Defl:N").size())
            << m_listing;
    }
}

// Over 2 MiB a trace file is left out, unless the trace library still writes
// it: then a copy is read, and removed again.
TEST_F(ProblemReportTest, LargeTraceFileIsIncludedOnlyThroughTheCopyOfAFileInUse) {
    for (bool inUse : {false, true}) {
        SCOPED_TRACE(inUse ? "in use" : "not in use");
        std::wstring bigPath = JoinPath(m_traces, L"big.mvt");
        PutTrace(L"a.mvt", 1000);
        std::string big = PutTrace(L"big.mvt", 3 * 1024 * 1024, 3);
        HANDLE writer = inUse ? CreateFileW(bigPath.c_str(), GENERIC_WRITE, FILE_SHARE_READ,
                                            nullptr, OPEN_EXISTING, 0, nullptr)
                              : INVALID_HANDLE_VALUE;
        Report();
        CloseHandle(writer);
        std::map<std::string, std::string> entries = Unzipped();
        EXPECT_EQ(inUse ? 2u : 1u, entries.size());
        EXPECT_EQ(inUse, entries["big.mvt"] == big);
        EXPECT_EQ((std::vector<std::wstring>{L"Mirovan_Trace.zip", L"a.mvt", L"big.mvt"}),
                  ListDir(m_traces));
    }
}

TEST_F(ProblemReportTest, NoTraceFileMeansNoMail) {
    WriteFileBytes(JoinPath(m_traces, L"other.log"), "not a trace file");
    RunResult run = Report();
    EXPECT_TRUE(run.HasTrace(" IsTmpFileExist  the  file is not found! \n,\n"));
    EXPECT_EQ("qmusredt.dll loaded\nqmusredt.dll unloaded\n", Calls());  // nothing else
}

TEST_F(ProblemReportTest, OddEntriesOfTheTraceFolderAreLeftOutOfTheZip) {
    PutTrace(L"\u0436\u0443\u0440\u043d\u0430\u043b.mvt", 2000);
    std::wstring longName = std::wstring(180, L'n') + L".mvt";
    PutTrace(longName, 3000);
    WriteFileBytes(JoinPath(m_traces, L"empty.mvt"), "");
    MakeDirs(JoinPath(m_traces, L"x.mvt"));
    Report();
    EXPECT_EQ(1u, LinesStartingWith(Calls(), kZipAttachment).size());
    std::map<std::string, std::string> entries = Unzipped();
    EXPECT_EQ(2u, entries.size());
    EXPECT_EQ(1u, entries.count(Narrow(longName)));
}

TEST_F(ProblemReportTest, ZipThatCannotBeWrittenGivesTheSingleFiles) {
    PutTrace(L"a.mvt", 1000);
    PutTrace(L"b.mvt", 1000);
    WriteFileBytes(ZipPath(), "held");
    HANDLE held =
        CreateFileW(ZipPath().c_str(), GENERIC_READ, 0, nullptr, OPEN_EXISTING, 0, nullptr);
    RunResult run = Report();
    CloseHandle(held);
    EXPECT_FALSE(run.HasTrace(" the compress successed,\n"));
    std::vector<std::string> attachments = LinesStartingWith(Calls(), "attachment ");
    std::sort(attachments.begin(), attachments.end());
    EXPECT_EQ((std::vector<std::string>{"attachment position=4294967295 name=a.mvt opens=1 path=" +
                                            Narrow(JoinPath(m_traces, L"a.mvt")),
                                        "attachment position=4294967295 name=b.mvt opens=1 path=" +
                                            Narrow(JoinPath(m_traces, L"b.mvt"))}),
              attachments);
}

// The user is told when no mail could be started; a mail the user cancels
// counts as sent.
TEST_F(ProblemReportTest, FailedMapiMailShowsTheSuiteMessage) {
    struct Case {
        const wchar_t* mapiLoadOrder;
        const wchar_t* mapiResult;
        bool told;
        const char* trace;
    };
    const Case cases[] = {
        {L"native,builtin", L"0", false, " send mail success,\n"},
        {L"native,builtin", L"1", false, " send mail success,\n"},
        {L"native,builtin", L"2", true, " the send a email failed the error number ,nError=2,\n"},
        {L"", L"0", true, " CSimpleMapi::Init() There is the no MPAI Enviroment,\n"},
    };
    PutTrace(L"a.mvt", 1000);
    for (const Case& c : cases) {
        SCOPED_TRACE(Narrow(std::wstring(L"MAPI ") + c.mapiLoadOrder + L" gives " + c.mapiResult));
        UseMapi(c.mapiLoadOrder);
        Program().SetEnv(L"QM_FAKE_MAPI_RESULT", c.mapiResult);
        RunResult run = Report();
        EXPECT_TRUE(run.HasTrace(c.trace));
        EXPECT_EQ(c.told ? 1u : 0u, LinesStartingWith(Calls(), kFailureBox).size()) << Calls();
    }
}

TEST_F(ProblemReportTest, RunningOutlookGetsTheMailOnItsCommandLineOrTheUserIsTold) {
    StartRunning(L"OUTLOOK.EXE");
    StartRunning(L"qmoneclk.exe");  // the same account: no objection
    PutTrace(L"a.mvt", 1000);
    Report();  // Outlook cannot be started: not registered
    EXPECT_EQ(1u, LinesStartingWith(Calls(), kFailureBox).size()) << Calls();

    RegPutString(HKEY_LOCAL_MACHINE, kAppPathsKey, L"", FakePath(L"OUTLOOK.EXE"));
    RunResult run = Report();
    EXPECT_TRUE(
        run.HasTraceContaining(" CSendProblemReport::Send Outlook.exe is running, use new logic\n,"
                               "(LPCTSTR)strOutlookUserName="));
    std::vector<std::string> started;
    for (int i = 0; i < 100 && started.empty(); ++i, Sleep(100)) {
        started = LinesStartingWith(Calls(), "OUTLOOK.EXE ");
    }
    EXPECT_EQ(std::vector<std::string>{"OUTLOOK.EXE /c ipm.note /m \"&subject=Quillmark%20Tools%"
                                       "20problem%20report%20&body=Please%20describe%20the%"
                                       "20problem%3a%20what%20did%20you%20do%2c%20100%25%20sure%"
                                       "3f\"/a \"" +
                                       Narrow(ZipPath()) + "\""},
              started);
    EXPECT_EQ(std::string::npos, Calls().find("MAPISendMail"));
    EXPECT_EQ(1u, Unzipped().count("a.mvt"));
}

}  // namespace
