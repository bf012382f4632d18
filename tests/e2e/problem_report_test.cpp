// The problem report run by the real program: trace files in the temporary
// folder the program is given, the suite's resource and UI libraries, Simple
// MAPI and Outlook as stand-ins. The zip is read back with Debian's unzip,
// started from Wine as a Unix program.
#include <windows.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kReportCommand[] = L"<CmdLine><Action>SendProblemReport</Action></CmdLine>";
const wchar_t kAppPathsKey[] =
    L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\App Paths\\OUTLOOK.EXE";
const wchar_t kProgramDllOverrides[] = L"Software\\Wine\\AppDefaults\\qmMrvONI.exe\\DllOverrides";
const std::string kSubject = "Quillmark Tools problem report ";  // no suite version yet
const std::string kBody = "Please describe the problem: what did you do, 100% sure?";
const std::string kFailureBox =
    "QclMessageBox owner=0 style=0x42030 text=No mail could be started. Please send the trace "
    "files by hand. caption=Quillmark Tools";

struct ToolRun {
    DWORD exitCode = 0xFFFFFFFF;
    std::string output;
};

// Debian's unzip with `arguments`, run in `folder`; its exit code and output.
// Wine starts a Unix program without giving a handle to wait on: a shell runs
// it and leaves its exit code in a file, which appears when it is done.
ToolRun Unzip(const std::wstring& folder, const std::wstring& arguments) {
    ToolRun run;
    std::wstring outputPath = JoinPath(folder, L"unzip.out");
    std::wstring codePath = JoinPath(folder, L"unzip.code");
    DeleteFileW(codePath.c_str());
    std::wstring line =
        L"Z:\\bin\\sh -c \"unzip " + arguments +
        L" > unzip.out 2>&1; echo $? > unzip.code.tmp; mv unzip.code.tmp unzip.code\"";
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessW(nullptr, &line[0], nullptr, nullptr, FALSE, 0, nullptr, folder.c_str(),
                        &startup, &process)) {
        return run;
    }
    for (int i = 0; i < 300 && !FileExists(codePath); ++i) {
        Sleep(100);
    }
    std::string code = ReadFileBytes(codePath);
    run.exitCode = code.empty() ? 0xFFFFFFFF : static_cast<DWORD>(atoi(code.c_str()));
    run.output = ReadFileBytes(outputPath);
    DeleteFileW(outputPath.c_str());
    DeleteFileW(codePath.c_str());
    return run;
}

std::vector<std::string> Lines(const std::string& text) {
    std::vector<std::string> lines;
    size_t start = 0;
    for (size_t end; (end = text.find('\n', start)) != std::string::npos; start = end + 1) {
        lines.push_back(text.substr(start, end - start));
    }
    return lines;
}

size_t CountContaining(const std::string& text, const std::string& part) {
    size_t count = 0;
    for (const std::string& line : Lines(text)) {
        count += line.find(part) != std::string::npos ? 1 : 0;
    }
    return count;
}

std::vector<std::string> LinesStartingWith(const std::string& text, const std::string& start) {
    std::vector<std::string> found;
    for (const std::string& line : Lines(text)) {
        if (line.compare(0, start.size(), start) == 0) {
            found.push_back(line);
        }
    }
    return found;
}

// Trace-file content: varied lines, as a trace library writes them.
std::string TraceBytes(size_t size, int seed) {
    std::string bytes;
    for (int i = 0; bytes.size() < size; ++i) {
        bytes += "[" + std::to_string(seed) + ":" + std::to_string(i * 7919 % 100003) +
                 "] QM level 2 --> CSomething::Work state=" + std::to_string(i % 13) + "\r\n";
    }
    bytes.resize(size);
    return bytes;
}

// A program the test starts and ends.
class RunningProgram {
public:
    explicit RunningProgram(const std::wstring& exe) {
        std::wstring line = L"\"" + exe + L"\" -stay";
        STARTUPINFOW startup = {};
        startup.cb = sizeof(startup);
        if (CreateProcessW(nullptr, &line[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr,
                           &startup, &m_process)) {
            CloseHandle(m_process.hThread);
        }
    }
    ~RunningProgram() {
        if (m_process.hProcess != nullptr) {
            TerminateProcess(m_process.hProcess, 0);
            WaitForSingleObject(m_process.hProcess, 5000);
            CloseHandle(m_process.hProcess);
        }
    }
    RunningProgram(const RunningProgram&) = delete;
    RunningProgram& operator=(const RunningProgram&) = delete;

private:
    PROCESS_INFORMATION m_process = {};
};

class ProblemReportTest : public MachineTest {
protected:
    ProblemReportTest() {
        ProgramUnderTest& program = Program();
        for (const wchar_t* name : {L"qmocres.dll", L"MAPI32.DLL", L"qmONIUI.dll"}) {
            CopyFileW(FakePath(name).c_str(), JoinPath(program.folder(), name).c_str(), FALSE);
        }
        UseMapi(L"native,builtin");
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", program.folder());
        UseTraceFolder(m_scratch.Sub(L"temp", true));
    }
    ~ProblemReportTest() override {
        RegRemoveTree(HKEY_LOCAL_MACHINE, kAppPathsKey);
        RegRemoveTree(HKEY_CURRENT_USER, kProgramDllOverrides);
    }

    // Which MAPI32.DLL the program loads: "native,builtin" the stand-in beside
    // it, "" none. Wine takes WINEDLLOVERRIDES from the test's own start, not
    // from the environment it gives the program: the program's own overrides
    // in the registry decide.
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
    RunResult Report() {
        RunResult run = Program().Run(kReportCommand);
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }
    std::string Calls() { return ReadFileBytes(Program().callsLogPath()); }
    std::wstring ZipPath() const { return JoinPath(m_traces, L"Mirovan_Trace.zip"); }
    // The zip's entry names, sorted, after unzip found it sound.
    std::vector<std::string> ZipEntries() {
        EXPECT_EQ(0u, Unzip(m_traces, L"-tq Mirovan_Trace.zip").exitCode);
        std::vector<std::string> names = Lines(Unzip(m_traces, L"-Z1 Mirovan_Trace.zip").output);
        std::sort(names.begin(), names.end());
        return names;
    }
    std::string ZipEntryBytes(const std::wstring& name) {
        return Unzip(m_traces, L"-p Mirovan_Trace.zip " + name).output;
    }
    // The mail's single attachment must be the zip.
    void ExpectZipMailed() {
        std::vector<std::string> attachments = LinesStartingWith(Calls(), "attachment ");
        ASSERT_EQ(1u, attachments.size());
        EXPECT_EQ(0u, attachments[0].find(
                          "attachment position=4294967295 name=Mirovan_Trace.zip opens=1 path="));
    }

    std::wstring m_traces;
};

TEST_F(ProblemReportTest, TwoTraceFilesAreZippedAndMailedAsOneAttachment) {
    std::string a = PutTrace(L"a.mvt", 300000, 1);
    std::string b = PutTrace(L"b.mvt", 5000, 2);
    RunResult run = Report();
    EXPECT_TRUE(run.HasTrace(" the compress successed,\n"));

    std::string expected = "MAPISendMail session=0 ui=0 flags=9 reserved=0\nsubject=" + kSubject +
                           "\nnote=" + kBody +
                           "\nrecipients=0 originator=none\n"
                           "attachment position=4294967295 name=Mirovan_Trace.zip opens=1 path=" +
                           Narrow(ZipPath()) + "\n";
    EXPECT_NE(std::string::npos, Calls().find(expected)) << Calls();

    EXPECT_EQ((std::vector<std::string>{"a.mvt", "b.mvt"}), ZipEntries());
    std::string listing = Unzip(m_traces, L"-v Mirovan_Trace.zip").output;
    EXPECT_EQ(2u, CountContaining(listing, " Defl:N ")) << listing;
    EXPECT_TRUE(a == ZipEntryBytes(L"a.mvt"));
    EXPECT_TRUE(b == ZipEntryBytes(L"b.mvt"));
}

// A trace file over 2 MiB is left out unless the trace library still writes
// it: then a copy of it is read and removed again.
TEST_F(ProblemReportTest, LargeTraceFileIsIncludedOnlyThroughTheCopyOfAFileInUse) {
    const size_t kThreeMiB = 3 * 1024 * 1024;
    for (bool inUse : {false, true}) {
        SCOPED_TRACE(inUse ? "in use" : "not in use");
        PutTrace(L"a.mvt", 1000);
        std::string big = PutTrace(L"big.mvt", kThreeMiB, 3);
        std::wstring bigPath = JoinPath(m_traces, L"big.mvt");
        HANDLE writer = inUse ? CreateFileW(bigPath.c_str(), GENERIC_WRITE, FILE_SHARE_READ,
                                            nullptr, OPEN_EXISTING, 0, nullptr)
                              : INVALID_HANDLE_VALUE;
        RunResult run = Report();
        if (writer != INVALID_HANDLE_VALUE) {
            CloseHandle(writer);
        }
        ExpectZipMailed();
        if (inUse) {
            EXPECT_EQ((std::vector<std::string>{"a.mvt", "big.mvt"}), ZipEntries());
            EXPECT_TRUE(big == ZipEntryBytes(L"big.mvt"));
            EXPECT_TRUE(run.HasTraceContaining(
                " CRptStream::ReadFromFile for FILE_ATTRIBUTE_ARCHIVE success,"
                "(LPCTSTR)strCopyTag=" +
                Narrow(bigPath) + ".mvt,hFile=0x"));
        } else {
            EXPECT_EQ((std::vector<std::string>{"a.mvt"}), ZipEntries());
        }
        EXPECT_EQ((std::vector<std::wstring>{L"Mirovan_Trace.zip", L"a.mvt", L"big.mvt"}),
                  ListDir(m_traces));
        RemoveTree(m_traces);
        MakeDirs(m_traces);
    }
}

TEST_F(ProblemReportTest, NoTraceFileMeansNoMail) {
    WriteFileBytes(JoinPath(m_traces, L"other.log"), "not a trace file");
    RunResult run = Report();
    EXPECT_TRUE(run.HasTrace(" IsTmpFileExist  the  file is not found! \n,\n"));
    EXPECT_EQ(std::string::npos, Calls().find("MAPISendMail"));
    EXPECT_EQ(std::string::npos, Calls().find("QclMessageBox"));
}

// A user name in another script: the zip is still made, and MAPI is given a
// path it can open.
TEST_F(ProblemReportTest, TemporaryFolderOutsideTheAnsiCodePageStillGivesTheZip) {
    UseTraceFolder(m_scratch.Sub(L"\u0418\u0432\u0430\u043d_\u0e01\u0e02"));
    std::string a = PutTrace(L"a.mvt", 4000);
    RunResult run = Report();
    EXPECT_TRUE(run.HasTrace(" the compress successed,\n"));
    ExpectZipMailed();
    EXPECT_TRUE(a == ZipEntryBytes(L"a.mvt"));
}

TEST_F(ProblemReportTest, OddEntriesOfTheTraceFolderAreLeftOutOfTheZip) {
    PutTrace(L"\u0436\u0443\u0440\u043d\u0430\u043b.mvt", 2000);
    std::wstring longName = std::wstring(180, L'n') + L".mvt";
    PutTrace(longName, 3000);
    WriteFileBytes(JoinPath(m_traces, L"empty.mvt"), "");
    MakeDirs(JoinPath(m_traces, L"x.mvt"));
    Report();
    ExpectZipMailed();
    std::vector<std::string> entries = ZipEntries();
    ASSERT_EQ(2u, entries.size());
    EXPECT_EQ(1, std::count(entries.begin(), entries.end(), Narrow(longName)));
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
    ASSERT_EQ(2u, attachments.size());
    EXPECT_EQ("attachment position=4294967295 name=a.mvt opens=1 path=" +
                  Narrow(JoinPath(m_traces, L"a.mvt")),
              attachments[0]);
    EXPECT_EQ(0u, attachments[1].find("attachment position=4294967295 name=b.mvt opens=1"));
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
        SCOPED_TRACE(Narrow(std::wstring(L"MAPI ") + c.mapiLoadOrder + L" result " + c.mapiResult));
        UseMapi(c.mapiLoadOrder);
        Program().SetEnv(L"QM_FAKE_MAPI_RESULT", c.mapiResult);
        RunResult run = Report();
        EXPECT_TRUE(run.HasTrace(c.trace));
        EXPECT_EQ(c.told ? 1u : 0u, LinesStartingWith(Calls(), kFailureBox).size()) << Calls();
    }
}

class OutlookReportTest : public ProblemReportTest {
protected:
    OutlookReportTest()
        : m_outlook(FakePath(L"OUTLOOK.EXE")), m_oneClick(FakePath(L"qmoneclk.exe")) {}

    // The command line the started Outlook recorded (waits for it to start).
    std::string OutlookCommandLine() {
        for (int i = 0; i < 100; ++i) {
            std::vector<std::string> lines = LinesStartingWith(Calls(), "OUTLOOK.EXE ");
            if (!lines.empty()) {
                return lines[0];
            }
            Sleep(100);
        }
        return std::string();
    }

    RunningProgram m_outlook;
    RunningProgram m_oneClick;
};

TEST_F(OutlookReportTest, RunningOutlookGetsTheMailOnItsCommandLine) {
    RegPutString(HKEY_LOCAL_MACHINE, kAppPathsKey, L"", FakePath(L"OUTLOOK.EXE"));
    PutTrace(L"a.mvt", 1000);
    RunResult run = Report();
    EXPECT_TRUE(
        run.HasTraceContaining(" CSendProblemReport::Send Outlook.exe is running, use new logic\n,"
                               "(LPCTSTR)strOutlookUserName="));
    EXPECT_EQ(
        "OUTLOOK.EXE /c ipm.note /m \"&subject=Quillmark%20Tools%20problem%20report%20"
        "&body=Please%20describe%20the%20problem%3a%20what%20did%20you%20do%2c%20100%25%20sure"
        "%3f\"/a \"" +
            Narrow(ZipPath()) + "\"",
        OutlookCommandLine());
    EXPECT_EQ(std::string::npos, Calls().find("MAPISendMail"));
    EXPECT_EQ((std::vector<std::string>{"a.mvt"}), ZipEntries());
}

TEST_F(OutlookReportTest, OutlookThatCannotBeStartedShowsTheSuiteMessage) {
    PutTrace(L"a.mvt", 1000);
    Report();
    EXPECT_EQ(1u, LinesStartingWith(Calls(), kFailureBox).size()) << Calls();
    EXPECT_EQ(std::string::npos, Calls().find("MAPISendMail"));
}

}  // namespace
