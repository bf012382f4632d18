// The program as installers start it: mode selection, the trace records it
// writes (byte for byte) and where they go, and the suite library it holds.
#include <gtest/gtest.h>

#include <algorithm>

#include "tests/support/file_util.h"
#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"

namespace {

const char kDeleteRegStart[] = " qmmirovanoni: For silent install deleteregfeaturecontrol!\n,\n";

class EntryTest : public ::testing::Test {
protected:
    // A clean end with the exit code 0 and the texts of its records.
    std::vector<std::string> Texts(const RunResult& run) {
        EXPECT_FALSE(run.crashed || run.timedOut);
        EXPECT_EQ(0, run.exitCode);
        std::vector<std::string> texts;
        for (const TraceRecord& record : run.traces) {
            texts.push_back(record.text);
        }
        return texts;
    }
    std::vector<std::string> Texts(const std::wstring& line) { return Texts(m_program.Run(line)); }

    ScratchDir m_scratch{L"entry"};
    ProgramUnderTest m_program{m_scratch.Sub(L"bin")};
};

TEST_F(EntryTest, EntryRecordGoesToTheResidentEntryAndTheDebuggerOutput) {
    RunResult run = m_program.Run(L"-nosuchkeyword");
    ASSERT_EQ(std::vector<std::string>{"NIHandle lpCmdLine=-nosuchkeyword,\n"}, Texts(run));
    EXPECT_EQ("RESIDENT", run.traces[0].entry);
    EXPECT_EQ("QM", run.traces[0].tag);
    EXPECT_EQ(2u, run.traces[0].level);
    auto at = std::find(run.debugOutput.begin(), run.debugOutput.end(), "NIHandle:");
    ASSERT_LT(at + 1, run.debugOutput.end());
    EXPECT_EQ("-nosuchkeyword", at[1]);
    // The suite library is held for the run and never called.
    EXPECT_EQ("qmusredt.dll loaded\nqmusredt.dll unloaded\n",
              ReadFileBytes(m_program.callsLogPath()));
}

TEST_F(EntryTest, CommandLinesChooseTheirMode) {
    const std::string entry = "NIHandle lpCmdLine=";
    const std::string parse = "--> CCmdLineParser::Parse \n";
    const std::string parsed = "<-- CCmdLineParser::Parse \n";
    const struct {
        const wchar_t* line;
        std::vector<std::string> texts;
    } cases[] = {
        // A keyword follows the first '-' or '/' in any letter case; nothing is trimmed.
        {L"-deleteregfeaturecontrol", {entry + "-deleteregfeaturecontrol,\n", kDeleteRegStart}},
        {L"x/DeleteRegFEATURECONTROL", {entry + "x/DeleteRegFEATURECONTROL,\n", kDeleteRegStart}},
        {L"deleteregfeaturecontrol", {entry + "deleteregfeaturecontrol,\n"}},
        {L"-deleteregfeaturecontrol ", {entry + "-deleteregfeaturecontrol ,\n"}},
        {L"", {entry + ",\n"}},
        // An Action command starts at "<CmdLine>"; its names are case-sensitive.
        {L"xyz <CmdLine><Action>openhelp</Action></CmdLine>",
         {parse, parsed, " Parse cmdline Error,\n"}},
        {L"<cmdline><Action>OpenHelp</Action></cmdline>",
         {entry + "<cmdline><Action>OpenHelp</Action></cmdline>,\n"}},
        {L"<CmdLine>", {parse, parsed, " Parse cmdline Error,\n"}},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(c.texts, Texts(c.line)) << Narrow(c.line);
    }
}

TEST_F(EntryTest, RecordsAreCutInto2047CharacterPieces) {
    const size_t overhead = std::string("NIHandle lpCmdLine=,\n").size();
    for (const auto& [length, pieces] : {std::pair<size_t, std::vector<size_t>>{2047, {2047}},
                                         {2048, {2047, 1}},
                                         {5000, {2047, 2047, 906}}}) {
        const std::wstring line = L"-" + std::wstring(length - overhead - 1, L'k');
        std::vector<std::string> texts = Texts(line);
        std::vector<size_t> sizes;
        std::string joined;
        for (const std::string& text : texts) {
            sizes.push_back(text.size());
            joined += text;
        }
        EXPECT_EQ(pieces, sizes);
        EXPECT_EQ("NIHandle lpCmdLine=" + Narrow(line) + ",\n", joined);
    }
}

TEST(EntryTraceLibrary, WithoutItEachPieceGoesToTheDebuggerOutput) {
    ScratchDir scratch(L"none");
    const std::wstring line = L"-" + std::wstring(3000, L'k');  // a record of two pieces
    RunResult run = ProgramUnderTest(scratch.path(), {TraceLibrary::kNone, false}).Run(line);
    const std::string record = "NIHandle lpCmdLine=" + Narrow(line) + ",\n";
    const std::vector<std::string> expected = {"Trace lib invalid\n", record.substr(0, 2047),
                                               "Trace lib invalid\n", record.substr(2047)};
    EXPECT_NE(run.debugOutput.end(), std::search(run.debugOutput.begin(), run.debugOutput.end(),
                                                 expected.begin(), expected.end()));
    // One more load attempt at the first record, none later.
    EXPECT_EQ(
        2, std::count_if(run.debugOutput.begin(), run.debugOutput.end(),
                         [](const std::string& s) { return s.rfind("InitMRVTRACER:", 0) == 0; }));
}

TEST_F(EntryTest, FaultInTheTraceLibraryDropsTheRecordAndTheJobGoesOn) {
    m_program.SetEnv(L"QM_FAKE_TRACE_FAULT", L"lpCmdLine=-deleteregfeaturecontrol");
    RunResult run = m_program.Run(L"-deleteregfeaturecontrol");
    EXPECT_EQ(std::vector<std::string>{kDeleteRegStart}, Texts(run));
    EXPECT_TRUE(run.HasDebugOutput("caught AV as expected."));
}

}  // namespace
