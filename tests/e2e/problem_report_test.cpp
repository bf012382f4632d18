// The problem report and the log and attendee posting end to end, with the
// suite's libraries, Simple MAPI and Outlook as stand-ins; Debian's unzip reads.
#include <windows.h>
#include <gtest/gtest.h>

#include <process.h>

#include <map>
#include <string>
#include <vector>

#include "tests/support/file_util.h"
#include "tests/support/host_shell.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kAppPathsKey[] =
    L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\App Paths\\OUTLOOK.EXE";
const wchar_t kProgramDllOverrides[] = L"Software\\Wine\\AppDefaults\\qmMrvONI.exe\\DllOverrides";
const char kAttachment[] = "attachment position=4294967295 name=";
const char kFailureBox[] =
    "QclMessageBox owner=0 style=0x42030 text=No mail could be started. Please send the trace "
    "files by hand. caption=Quillmark Tools";

class ProblemReportTest : public MachineTest {
protected:
    ProblemReportTest() {
        for (const wchar_t* name : {L"qmocres.dll", L"MAPI32.DLL", L"qmONIUI.dll"}) {
            Place(name);
        }
        // The stand-in MAPI32.DLL, not Wine's (WINEDLLOVERRIDES would not reach
        // the program from the environment the test gives it).
        RegPutString(HKEY_CURRENT_USER, kProgramDllOverrides, L"mapi32", L"native,builtin");
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path",
                     Program().folder());
        // A user name in another script, as on many users' machines: the zip
        // must be opened by its wide path, and MAPI given a path it can open.
        m_traces = m_scratch.Sub(L"\u0418\u0432\u0430\u043d_\u0e01\u0e02");
        MakeDirs(m_traces);
        Program().SetEnv(L"TMP", m_traces);
        Program().SetEnv(L"TEMP", m_traces);
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

    // Trace-file content that no piece of the file repeats at a piece's size.
    std::string PutTrace(const std::wstring& name, size_t size, int seed = 1) {
        std::string bytes(size, '\0');
        for (size_t i = 0; i < size; ++i) {
            bytes[i] = static_cast<char>('a' + (i * 7 + seed) % 26);
        }
        WriteFileBytes(JoinPath(m_traces, name), bytes);
        return bytes;
    }
    void Place(const wchar_t* library) {
        CopyFileW(FakePath(library).c_str(), JoinPath(Program().folder(), library).c_str(), FALSE);
    }
    RunResult Run(const std::wstring& arguments) {
        RunResult run = Program().Run(arguments);
        EXPECT_FALSE(run.crashed || run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }
    RunResult Report() { return Run(L"<CmdLine><Action>SendProblemReport</Action></CmdLine>"); }
    std::string Calls() { return ReadFileBytes(Program().callsLogPath()); }
    std::wstring ZipPath() const { return JoinPath(m_traces, L"Mirovan_Trace.zip"); }

    // The zip's entries by name, as unzip extracts them; none may be stored.
    std::map<std::string, std::string> Unzipped() {
        std::wstring out = m_scratch.Sub(L"unzipped");
        RemoveTree(out);
        EXPECT_EQ(0,
                  RunHostShell("! unzip -v \"$1\" | grep -q Stored && unzip -qo \"$1\" -d \"$2\"",
                               {HostPath(ZipPath()), HostPath(out)}));
        std::map<std::string, std::string> entries;
        for (const std::wstring& name : ListDir(out)) {
            entries[Narrow(name)] = ReadFileBytes(JoinPath(out, name));
        }
        return entries;
    }
    std::wstring m_traces;
    std::vector<HANDLE> m_started;
};

// The subject names the suite's version.
TEST_F(ProblemReportTest, TraceFilesAreZippedAndMailedAsOneAttachment) {
    RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"BuildNumber", L"2.0.1.123");
    std::string a = PutTrace(L"a.mvt", 300000, 1);
    std::string b = PutTrace(L"b.mvt", 5000, 2);
    Report();
    EXPECT_NE(std::string::npos,
              Calls().find("MAPISendMail session=0 ui=0 flags=9 reserved=0\n"
                           "subject=Quillmark Tools problem report 2.0.1.123\n"
                           "note=Please describe the problem: what did you do, 100% sure?\n"
                           "recipients=0 originator=none\n" +
                           std::string(kAttachment) + "Mirovan_Trace.zip opens=1 path="))
        << Calls();
    EXPECT_EQ(1, CountOf(Calls(), kAttachment));
    EXPECT_TRUE((std::map<std::string, std::string>{{"a.mvt", a}, {"b.mvt", b}}) == Unzipped());
}

TEST_F(ProblemReportTest, NoTraceFileMeansNoMail) {
    WriteFileBytes(JoinPath(m_traces, L"other.log"), "not a trace file");
    RunResult run = Report();
    EXPECT_TRUE(run.HasTrace(" IsTmpFileExist  the  file is not found! \n,\n"));
    EXPECT_EQ("qmusredt.dll loaded\nqmusredt.dll unloaded\n", Calls());  // nothing else
}

// The zip takes every "*.mvt" file, but one over 2 MiB only while the trace
// library still writes it: then a copy is read, and removed.
TEST_F(ProblemReportTest, ZipTakesTheTraceFilesItCanRead) {
    std::wstring longName = std::wstring(180, L'n') + L".mvt";
    PutTrace(longName, 3000);
    std::string big = PutTrace(L"big.mvt", 3 * 1024 * 1024, 3);
    for (bool inUse : {false, true}) {
        HANDLE writer = inUse ? CreateFileW(JoinPath(m_traces, L"big.mvt").c_str(), GENERIC_WRITE,
                                            FILE_SHARE_READ, nullptr, OPEN_EXISTING, 0, nullptr)
                              : INVALID_HANDLE_VALUE;
        Report();
        CloseHandle(writer);
        std::map<std::string, std::string> entries = Unzipped();
        EXPECT_EQ(inUse ? 2u : 1u, entries.size()) << inUse;
        EXPECT_EQ(1u, entries.count(Narrow(longName)));
        EXPECT_EQ(inUse, entries["big.mvt"] == big);
        EXPECT_EQ(3u, ListDir(m_traces).size());  // the zip added, no copy left
    }
}

// A zip that cannot be written leaves the single files to be mailed; a mail
// the user cancels counts as sent, one that MAPI fails is not.
TEST_F(ProblemReportTest, MailGoesOutWithoutZipOrTheUserIsTold) {
    PutTrace(L"a.mvt", 1000);
    WriteFileBytes(ZipPath(), "held");
    HANDLE held =
        CreateFileW(ZipPath().c_str(), GENERIC_READ, 0, nullptr, OPEN_EXISTING, 0, nullptr);
    for (const wchar_t* mapiResult : {L"1", L"2"}) {
        Program().SetEnv(L"QM_FAKE_MAPI_RESULT", mapiResult);
        Report();
        EXPECT_EQ(1, CountOf(Calls(), kAttachment));
        EXPECT_EQ(1, CountOf(Calls(), std::string(kAttachment) + "a.mvt opens=1 path="));
        EXPECT_EQ(mapiResult[0] == L'2' ? 1 : 0, CountOf(Calls(), kFailureBox)) << Calls();
    }
    CloseHandle(held);
}

TEST_F(ProblemReportTest, RunningOutlookGetsTheMailOnItsCommandLineOrTheUserIsTold) {
    for (const wchar_t* program : {L"OUTLOOK.EXE", L"qmoneclk.exe"}) {  // the same account
        std::wstring path = FakePath(program);
        m_started.push_back(reinterpret_cast<HANDLE>(
            _wspawnl(_P_NOWAIT, path.c_str(), path.c_str(), L"-stay", nullptr)));
    }
    PutTrace(L"a.mvt", 1000);
    Report();  // Outlook cannot be started: not registered
    EXPECT_EQ(1, CountOf(Calls(), kFailureBox)) << Calls();

    RegPutString(HKEY_LOCAL_MACHINE, kAppPathsKey, L"", FakePath(L"OUTLOOK.EXE"));
    Report();
    const std::string outlook =
        "OUTLOOK.EXE /c ipm.note /m \"&subject=Quillmark%20Tools%20problem%20report%20&body="
        "Please%20describe%20the%20problem%3a%20what%20did%20you%20do%2c%20100%25%20sure%3f\"/a "
        "\"" +
        Narrow(ZipPath()) + "\"\n";
    for (int i = 0; i < 100 && Calls().find("OUTLOOK.EXE") == std::string::npos; ++i) {
        Sleep(100);
    }
    EXPECT_EQ(1, CountOf(Calls(), outlook)) << Calls();
    EXPECT_EQ(std::string::npos, Calls().find("MAPISendMail"));
}

class PostingTest : public ProblemReportTest {};

// The log URL ends in one module and error number and is requested in slot
// order; the request's message on the program's thread ends the 10 s wait.
TEST_F(PostingTest, LogUrlGetsModuleAndErrorAndIsRequestedInSlotOrder) {
    const std::wstring post = L"<CmdLine><Action>PostJMFLog</Action><ErrorId>7</ErrorId>";
    EXPECT_TRUE(Run(post + L"</CmdLine>").HasTrace(" Can not create URL Object,\n"));
    Place(L"qmMRVURL.DLL");
    Program().SetEnv(L"QM_FAKE_URL_MODE", L"message");
    const struct {
        const wchar_t* logUrl;
        std::string url;
    } rows[] = {
        {L"<LogUrl>http://h/log?id=1&amp;&amp;</LogUrl>",
         "http://h/log?id=1&Module=24&ErrorCode=7"},
        {L"<LogUrl>http://h/log?id=1</LogUrl>", "http://h/log?id=1&Module=24&ErrorCode=7"},
        {L"", "&Module=24&ErrorCode=7"},
    };
    for (const auto& row : rows) {
        DWORD start = GetTickCount();
        Run(post + row.logUrl + L"</CmdLine>");
        EXPECT_LT(GetTickCount() - start, 8000u);
        EXPECT_EQ(1, CountOf(Calls(), "\nURL slot4 1\nURL slot6 10\nURL slot11 url=" + row.url +
                                          " data=(null) 0 0\nURL completed by a message of the "
                                          "caller's thread\nURL slot12\nURL released\n"))
            << Calls();
    }
}

// The UI library gets the command line exactly as the program received it,
// text before "<CmdLine>" included.
TEST_F(PostingTest, PostAttendeeGetsTheRawCommandLine) {
    const std::wstring arguments =
        L"lead text <CmdLine><Action>PostAttendee</Action><AttendeeFile>C:\\a b.xml"
        L"</AttendeeFile></CmdLine>";
    Run(arguments);
    EXPECT_EQ(1, CountOf(Calls(), "\nPostAttendee " + Narrow(arguments) + "\n")) << Calls();
    DeleteFileW(JoinPath(Program().folder(), L"qmONIUI.dll").c_str());
    EXPECT_TRUE(Run(arguments).HasTrace(" Load Lib failed or GetProcAddress failed.\n,\n"));
}

}  // namespace
