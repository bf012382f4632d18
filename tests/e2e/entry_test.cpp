// The program as installers start it: mode selection, exit codes, the trace
// records it writes (byte for byte), its debugger output, the suite library
// it holds, and its behaviour on hostile command lines.
#include <windows.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <string>

#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"
#include "tests/support/test_paths.h"

namespace {

class EntryTest : public ::testing::Test {
protected:
    ProgramUnderTest& Program(const ProgramOptions& options = {}) {
        if (!m_program) {
            m_program = std::make_unique<ProgramUnderTest>(m_scratch.Sub(L"bin"), options);
        }
        return *m_program;
    }

    static void ExpectCleanExit(const RunResult& run, int exitCode) {
        EXPECT_FALSE(run.crashed);
        EXPECT_FALSE(run.timedOut);
        EXPECT_EQ(exitCode, run.exitCode);
    }

    ScratchDir m_scratch{L"entry"};
    std::unique_ptr<ProgramUnderTest> m_program;
};

TEST_F(EntryTest, UnknownKeywordLogsTheEntryRecordOnlyAndGivesZero) {
    RunResult run = Program().Run(L"-nosuchkeyword");
    ExpectCleanExit(run, 0);
    ASSERT_EQ(1u, run.traces.size());
    EXPECT_EQ("RESIDENT", run.traces[0].entry);
    EXPECT_EQ("QM", run.traces[0].tag);
    EXPECT_EQ(2u, run.traces[0].level);
    EXPECT_EQ("NIHandle lpCmdLine=-nosuchkeyword,\n", run.traces[0].text);
    // The dispatcher also sends the command line to the debugger output.
    auto at = std::find(run.debugOutput.begin(), run.debugOutput.end(), "NIHandle:");
    ASSERT_NE(run.debugOutput.end(), at);
    ASSERT_NE(run.debugOutput.end(), at + 1);
    EXPECT_EQ("-nosuchkeyword", *(at + 1));
}

TEST_F(EntryTest, EmptyCommandLineGoesToTheDispatcherAndGivesZero) {
    RunResult run = Program().Run(L"");
    ExpectCleanExit(run, 0);
    ASSERT_EQ(1u, run.traces.size());
    EXPECT_EQ("NIHandle lpCmdLine=,\n", run.traces[0].text);
}

TEST_F(EntryTest, StartUpLoadsTheTraceLibraryAndTheSuiteLibrary) {
    RunResult run = Program().Run(L"-x");
    ExpectCleanExit(run, 0);
    EXPECT_TRUE(run.HasDebugOutput("MIROVANLOGInitialize\n"));
    EXPECT_TRUE(run.HasDebugOutput("~MIROVANLOGInitialize\n"));
    int initLines = 0;
    for (const std::string& line : run.debugOutput) {
        if (line.rfind("InitMRVTRACER:", 0) == 0) {
            ++initLines;
            EXPECT_NE(std::string::npos, line.find("hModule=0x"));
            EXPECT_EQ("\r\n", line.substr(line.size() - 2));
        }
    }
    EXPECT_EQ(1, initLines);  // found at once: no retry
    EXPECT_FALSE(run.HasTraceContaining("Disable DEP failed"));

    std::string calls = ReadFileBytes(Program().callsLogPath());
    EXPECT_EQ("qmusredt.dll loaded\nqmusredt.dll unloaded\n", calls);  // never called
}

TEST_F(EntryTest, MissingSuiteLibraryIsSilent) {
    ProgramOptions options;
    options.withSuiteLibrary = false;
    RunResult run = Program(options).Run(L"-x");
    ExpectCleanExit(run, 0);
    EXPECT_EQ(1u, run.traces.size());
}

TEST_F(EntryTest, ActionCommandsAreParsedFromTheirCmdLineElement) {
    // Text before "<CmdLine>" is ignored.
    RunResult run = Program().Run(L"xyz <CmdLine><Action>OpenHelp</Action></CmdLine>");
    ExpectCleanExit(run, 0);
    EXPECT_TRUE(run.HasTrace("--> CCmdLineParser::Parse \n"));
    EXPECT_TRUE(run.HasTrace("<-- CCmdLineParser::Parse \n"));
    EXPECT_FALSE(run.HasTraceContaining("Parse cmdline Error"));
    EXPECT_FALSE(run.HasTraceContaining("NIHandle"));

    // Another letter case is not an Action command.
    run = Program().Run(L"<cmdline><Action>OpenHelp</Action></cmdline>");
    ExpectCleanExit(run, 0);
    EXPECT_TRUE(run.HasTrace("NIHandle lpCmdLine=<cmdline><Action>OpenHelp</Action></cmdline>,\n"));
    EXPECT_FALSE(run.HasTraceContaining("CCmdLineParser"));
}

TEST_F(EntryTest, UnknownActionLogsTheParseErrorAndGivesZero) {
    for (const wchar_t* line :
         {L"<CmdLine><Action>joinmeeting</Action></CmdLine>",
          L"<CmdLine><Action></Action></CmdLine>", L"<CmdLine></CmdLine>", L"<CmdLine>"}) {
        RunResult run = Program().Run(line);
        ExpectCleanExit(run, 0);
        ASSERT_EQ(3u, run.traces.size()) << Narrow(line);
        EXPECT_EQ("--> CCmdLineParser::Parse \n", run.traces[0].text);
        EXPECT_EQ("<-- CCmdLineParser::Parse \n", run.traces[1].text);
        EXPECT_EQ(8u, run.traces[2].level);
        EXPECT_EQ(" Parse cmdline Error,\n", run.traces[2].text);
    }
}

TEST_F(EntryTest, KeywordsMatchAfterEitherDelimiterInAnyLetterCase) {
    const std::string start = " qmmirovanoni: For silent install deleteregfeaturecontrol!\n,\n";
    for (const wchar_t* line :
         {L"-deleteregfeaturecontrol", L"/DELETEREGFEATURECONTROL", L"x-DeleteRegFeatureControl"}) {
        RunResult run = Program().Run(line);
        ExpectCleanExit(run, 0);
        ASSERT_EQ(2u, run.traces.size()) << Narrow(line);
        EXPECT_EQ(1u, run.traces[1].level);
        EXPECT_EQ(start, run.traces[1].text);
    }
    // Nothing is trimmed, and a keyword needs its delimiter.
    for (const wchar_t* line : {L"deleteregfeaturecontrol", L"-deleteregfeaturecontrol x",
                                L"-deleteregfeaturecontrol ", L"- deleteregfeaturecontrol"}) {
        RunResult run = Program().Run(line);
        ExpectCleanExit(run, 0);
        EXPECT_EQ(1u, run.traces.size()) << Narrow(line);
    }
}

TEST_F(EntryTest, KeywordWithItsOwnResultBecomesTheExitCode) {
    // Neither Sametime 8 profile exists here, so both edits fail: 0. The
    // keyword is recognised in another letter case too.
    RunResult run = Program().Run(L"/ENABLESAMETIME8CONFIGE");
    ExpectCleanExit(run, 0);
    EXPECT_TRUE(run.HasTrace(" qmMirovanONI: Command is enablesametime8confige.\n,\n"));
}

TEST_F(EntryTest, RecordsAreCutInto2047CharacterPieces) {
    // The entry record is "NIHandle lpCmdLine=" + command line + ",\n".
    const size_t overhead = std::string("NIHandle lpCmdLine=,\n").size();
    struct Case {
        size_t recordLength;
        std::vector<size_t> pieces;
    };
    for (const Case& c :
         {Case{2047, {2047}}, Case{2048, {2047, 1}}, Case{5000, {2047, 2047, 906}}}) {
        std::wstring line = L"-" + std::wstring(c.recordLength - overhead - 1, L'k');
        RunResult run = Program().Run(line);
        ExpectCleanExit(run, 0);
        ASSERT_EQ(c.pieces.size(), run.traces.size()) << c.recordLength;
        std::string joined;
        for (size_t i = 0; i < c.pieces.size(); ++i) {
            EXPECT_EQ(c.pieces[i], run.traces[i].text.size());
            EXPECT_EQ(2u, run.traces[i].level);
            joined += run.traces[i].text;
        }
        EXPECT_EQ("NIHandle lpCmdLine=" + Narrow(line) + ",\n", joined);
    }
}

TEST_F(EntryTest, LibraryWithOnlyTheRawEntryGetsANullModuleTag) {
    ProgramOptions options;
    options.traceLibrary = TraceLibrary::kRawOnly;
    RunResult run = Program(options).Run(L"-x");
    ExpectCleanExit(run, 0);
    ASSERT_EQ(1u, run.traces.size());
    EXPECT_EQ("RAWA", run.traces[0].entry);
    EXPECT_EQ("(null)", run.traces[0].tag);
    EXPECT_EQ("NIHandle lpCmdLine=-x,\n", run.traces[0].text);
}

TEST_F(EntryTest, WithoutTraceLibraryRecordsGoToTheDebuggerOutput) {
    ProgramOptions options;
    options.traceLibrary = TraceLibrary::kNone;
    std::wstring line = L"-" + std::wstring(3000, L'k');  // a record of two pieces
    RunResult run = Program(options).Run(line);
    ExpectCleanExit(run, 0);
    EXPECT_TRUE(run.traces.empty());

    std::string record = "NIHandle lpCmdLine=" + Narrow(line) + ",\n";
    std::vector<std::string> expected = {"Trace lib invalid\n", record.substr(0, 2047),
                                         "Trace lib invalid\n", record.substr(2047)};
    auto at = std::search(run.debugOutput.begin(), run.debugOutput.end(), expected.begin(),
                          expected.end());
    EXPECT_NE(run.debugOutput.end(), at);

    // One more load attempt on the first record, none later.
    int initLines = 0;
    for (const std::string& text : run.debugOutput) {
        initLines += text.rfind("InitMRVTRACER:", 0) == 0 ? 1 : 0;
    }
    EXPECT_EQ(2, initLines);
}

TEST_F(EntryTest, FaultInTheTraceLibraryDropsTheRecordAndTheJobGoesOn) {
    Program().SetEnv(L"QM_FAKE_TRACE_FAULT", L"lpCmdLine=-deleteregfeaturecontrol");
    RunResult run = Program().Run(L"-deleteregfeaturecontrol");
    ExpectCleanExit(run, 0);
    EXPECT_TRUE(run.HasDebugOutput("caught AV as expected."));
    ASSERT_EQ(1u, run.traces.size());  // the entry record was dropped
    EXPECT_EQ(" qmmirovanoni: For silent install deleteregfeaturecontrol!\n,\n",
              run.traces[0].text);
}

// Hostile command lines never crash or hang the program.
TEST_F(EntryTest, LongestCommandLineIsHandled) {
    // CreateProcess takes at most 32,767 characters with the terminator.
    std::wstring prefix = L"\"" + Program().exePath() + L"\" ";
    std::wstring keywordLine = prefix + L"-" + std::wstring(32766 - prefix.size() - 1, L'z');
    ASSERT_EQ(32766u, keywordLine.size());
    RunResult run = Program().RunRaw(keywordLine);
    ExpectCleanExit(run, 0);
    EXPECT_EQ(keywordLine.substr(prefix.size()),
              Widen(run.TraceText().substr(19, run.TraceText().size() - 21)));

    std::wstring action = L"<CmdLine><Action>JoinMeeting</Action><URL>";
    std::wstring actionLine = prefix + action;
    actionLine += std::wstring(32766 - actionLine.size() - 16, L'u') + L"</URL></CmdLine>";
    ASSERT_EQ(32766u, actionLine.size());
    run = Program().RunRaw(actionLine);
    ExpectCleanExit(run, 0);
    EXPECT_FALSE(run.HasTraceContaining("Parse cmdline Error"));
}

TEST_F(EntryTest, MalformedActionCommandsAreRejectedOrParsedWithoutHarm) {
    std::wstring deep = L"<CmdLine><Action>JoinMeeting</Action><X>";
    for (int i = 0; i < 4000; ++i) {
        deep += L"<a>";
    }
    for (int i = 0; i < 4000; ++i) {
        deep += L"</a>";
    }
    deep += L"</X></CmdLine>";
    std::wstring unbalanced = L"<CmdLine>";
    for (int i = 0; i < 3000; ++i) {
        unbalanced += L"<a><b></a>";
    }
    const std::vector<std::wstring> lines = {
        deep,
        unbalanced,
        L"<CmdLine><<<>>></<>></CmdLine>",
        L"<CmdLine><Action a=\"1\">JoinMeeting</Action></CmdLine>",
        L"<CmdLine><Action>JoinMeeting</Action><URL>\u00e9\u4e2d\U0001F600</URL></CmdLine>",
        L"<CmdLine>\U0001F600</\U0001F600></CmdLine>",
        L"<CmdLine></",
        L"<CmdLine>>>>>>>>>",
        std::wstring(L"<CmdLine>") + std::wstring(20000, L'<'),
        std::wstring(L"<CmdLine>") + std::wstring(20000, L'>'),
    };
    for (const std::wstring& line : lines) {
        RunResult run = Program().Run(line);
        ExpectCleanExit(run, 0);
    }
}

TEST_F(EntryTest, StrayCharactersInKeywordCommandsAreHandled) {
    for (const wchar_t* line : {L"-", L"/", L"--", L"-\u00e9\U0001F600", L"\U0001F600-x", L"<",
                                L">", L"<CmdLine", L"\"quoted\" -x"}) {
        RunResult run = Program().Run(line);
        ExpectCleanExit(run, 0);
        ASSERT_EQ(1u, run.traces.size()) << Narrow(line);
    }
}

}  // namespace

namespace {

std::string ManifestOf(const std::wstring& exe) {
    HMODULE module = LoadLibraryExW(exe.c_str(), nullptr, LOAD_LIBRARY_AS_DATAFILE);
    if (module == nullptr) {
        return std::string();
    }
    std::string text;
    HRSRC found = FindResourceW(module, MAKEINTRESOURCEW(1), MAKEINTRESOURCEW(24));
    if (found != nullptr) {
        const char* data = static_cast<const char*>(LockResource(LoadResource(module, found)));
        text.assign(data, SizeofResource(module, found));
    }
    FreeLibrary(module);
    return text;
}

TEST(ProgramImage, CarriesItsManifestAndVersion) {
    std::wstring exe = BuiltProgramPath();
    std::string manifest = ManifestOf(exe);
    EXPECT_NE(std::string::npos, manifest.find("level=\"asInvoker\""));
    EXPECT_NE(std::string::npos, manifest.find("{35138b9a-5d96-4fbd-8e2d-a2440225f93a}"));  // 7
    EXPECT_NE(std::string::npos, manifest.find("{8e0f7a12-bfb3-4fe8-b9a5-48fd50a15a9a}"));  // 10

    DWORD ignored = 0;
    DWORD size = GetFileVersionInfoSizeW(exe.c_str(), &ignored);
    ASSERT_GT(size, 0u);
    std::vector<BYTE> info(size);
    ASSERT_TRUE(GetFileVersionInfoW(exe.c_str(), 0, size, info.data()));
    wchar_t* name = nullptr;
    UINT length = 0;
    ASSERT_TRUE(VerQueryValueW(info.data(), L"\\StringFileInfo\\040904B0\\OriginalFilename",
                               reinterpret_cast<void**>(&name), &length));
    EXPECT_STREQ(L"qmMrvONI.exe", name);
}

}  // namespace
