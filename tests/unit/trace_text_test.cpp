// The trace log inside one process: record text, pieces, value forms, the
// level wrappers against the trace stand-in, and the access-violation guard.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "app/run_command_line.h"
#include "base/av_guard.h"
#include "base/string_ex.h"
#include "base/trace.h"
#include "base/trace_text.h"
#include "tests/support/trace_capture.h"

namespace {

std::string Build(const char* prefix, std::initializer_list<TraceParam> params) {
    std::vector<const TraceParam*> list;
    for (const TraceParam& p : params) {
        list.push_back(&p);
    }
    list.push_back(nullptr);
    return BuildTraceText(prefix, list.data(), 11);
}

TEST(TraceText, RecordShapes) {
    EXPECT_EQ(" Parse cmdline Error,\n", Build("", {TraceValue("Parse cmdline Error")}));
    EXPECT_EQ("--> CCmdLineParser::Parse \n", Build("--> CCmdLineParser::Parse", {}));
    EXPECT_EQ(" lpCmdLine=abc,\n", Build("", {TraceNamed("lpCmdLine", "abc")}));
    EXPECT_EQ(" name=,\n", Build("", {TraceNameOnly("name")}));
    EXPECT_EQ(" ,\n", Build("", {TraceParam{nullptr, nullptr}}));
    EXPECT_EQ("\n", Build(nullptr, {}));
    EXPECT_EQ("p a=1,2,\n", Build("p", {TraceNamed("a", 1), TraceValue(2)}));
}

TEST(TraceText, ParameterListEndsAtFirstNullAndAtEleven) {
    CVarAdapter one(1);
    TraceParam p{nullptr, &one};
    const TraceParam* withGap[] = {&p, nullptr, &p, nullptr};
    EXPECT_EQ(" 1,\n", BuildTraceText("", withGap, 11));

    const TraceParam* twelve[] = {&p, &p, &p, &p, &p, &p, &p, &p, &p, &p, &p, &p, nullptr};
    EXPECT_EQ(" 1,1,1,1,1,1,1,1,1,1,1,\n", BuildTraceText("", twelve, 11));
}

TEST(TraceText, PiecesAreAtMost2047Characters) {
    struct Case {
        size_t length;
        std::vector<size_t> pieces;
    };
    for (const Case& c :
         {Case{1, {1}}, Case{2047, {2047}}, Case{2048, {2047, 1}}, Case{4094, {2047, 2047}},
          Case{4095, {2047, 2047, 1}}, Case{5000, {2047, 2047, 906}}}) {
        std::string text(c.length, 'x');
        std::vector<std::string> pieces = SplitTracePieces(text);
        ASSERT_EQ(c.pieces.size(), pieces.size()) << c.length;
        std::string joined;
        for (size_t i = 0; i < pieces.size(); ++i) {
            EXPECT_EQ(c.pieces[i], pieces[i].size()) << c.length;
            joined += pieces[i];
        }
        EXPECT_EQ(text, joined);
    }
    ASSERT_EQ(1u, SplitTracePieces("").size());
}

TEST(TraceValueText, EveryValueForm) {
    EXPECT_EQ("TRUE", CVarAdapter(true).Text());
    EXPECT_EQ("FALSE", CVarAdapter(false).Text());
    EXPECT_EQ("x", CVarAdapter('x').Text());
    EXPECT_EQ("-42", CVarAdapter(-42).Text());
    EXPECT_EQ("4294967295", CVarAdapter(0xFFFFFFFFu).Text());
    EXPECT_EQ("-2147483648", CVarAdapter(static_cast<long>(-2147483647L - 1)).Text());
    EXPECT_EQ("4294967295", CVarAdapter(0xFFFFFFFFul).Text());
    EXPECT_EQ("-9223372036854775807", CVarAdapter(-9223372036854775807LL).Text());
    EXPECT_EQ("18446744073709551615", CVarAdapter(18446744073709551615ULL).Text());
    EXPECT_EQ("3.14159", CVarAdapter(3.14159265).Text());
    EXPECT_EQ("1e+010", CVarAdapter(1e10).Text());  // the C runtime's exponent form
    EXPECT_EQ("0x0000ABCD", CVarAdapter(reinterpret_cast<const void*>(0xABCD)).Text());
    EXPECT_EQ("0x00000000", CVarAdapter(static_cast<const void*>(nullptr)).Text());
    const GUID guid = {
        0x0A4C50AC, 0xAD3F, 0x4245, {0xB3, 0x24, 0x3C, 0x86, 0x96, 0xA3, 0x40, 0x8A}};
    EXPECT_EQ("0A4C50AC-AD3F-4245-B324-3C8696A3408A", CVarAdapter(guid).Text());
    const GUID small = {0x1, 0x2, 0x3, {0, 1, 2, 3, 4, 5, 6, 7}};
    EXPECT_EQ("00000001-0002-0003-0001-020304050607", CVarAdapter(small).Text());
}

TEST(TraceValueText, NullAndEmptyStringsGiveEmptyText) {
    EXPECT_EQ("", CVarAdapter(static_cast<const char*>(nullptr)).Text());
    EXPECT_EQ("", CVarAdapter(static_cast<const wchar_t*>(nullptr)).Text());
    EXPECT_EQ("", CVarAdapter(L"").Text());
    EXPECT_EQ("", CVarAdapter(CStringEx()).Text());
    EXPECT_EQ("C:\\Notes", CVarAdapter(L"C:\\Notes").Text());
    EXPECT_EQ("abc", CVarAdapter(CStringEx(L"abc")).Text());
}

// The wrappers deliver to the stand-in beside this test program.
TEST(TraceDelivery, LevelWrappersGoToTheResidentEntry) {
    TraceCapture capture;
    TraceLevel8(TraceValue("Parse cmdline Error"));
    TraceLevel4(TraceNamed("hr", -2147467259L));
    TraceLevel1(TraceValue("a"), TraceNamed("b", L"c"));
    TraceLevel2Named("NIHandle", TraceNamed("lpCmdLine", L"-x"));
    std::vector<TraceRecord> records = capture.Records();
    ASSERT_EQ(4u, records.size());
    EXPECT_EQ("RESIDENT", records[0].entry);
    EXPECT_EQ("QM", records[0].tag);
    EXPECT_EQ(8u, records[0].level);
    EXPECT_EQ(" Parse cmdline Error,\n", records[0].text);
    EXPECT_EQ(4u, records[1].level);
    EXPECT_EQ(" hr=-2147467259,\n", records[1].text);
    EXPECT_EQ(1u, records[2].level);
    EXPECT_EQ(" a,b=c,\n", records[2].text);
    EXPECT_EQ(2u, records[3].level);
    EXPECT_EQ("NIHandle lpCmdLine=-x,\n", records[3].text);
}

TEST(TraceDelivery, FunctionTraceWritesEntryAndExit) {
    TraceCapture capture;
    {
        CAutoFunTrace trace("CCmdLineParser::Parse");
        TraceLevel1(TraceValue("inside"));
    }
    { CAutoFunTrace wide(L"QMServiceHandle"); }
    std::vector<std::string> texts = capture.Texts();
    ASSERT_EQ(5u, texts.size());
    EXPECT_EQ("--> CCmdLineParser::Parse \n", texts[0]);
    EXPECT_EQ(" inside,\n", texts[1]);
    EXPECT_EQ("<-- CCmdLineParser::Parse \n", texts[2]);
    EXPECT_EQ("--> QMServiceHandle \n", texts[3]);
    EXPECT_EQ("<-- QMServiceHandle \n", texts[4]);
}

TEST(TraceDelivery, NullCommandLineIsLoggedAndGivesZero) {
    TraceCapture capture;
    EXPECT_EQ(0, RunCommandLine(GetModuleHandleW(nullptr), nullptr, nullptr, SW_HIDE));
    ASSERT_EQ(1u, capture.Records().size());
    EXPECT_EQ(8u, capture.Records()[0].level);
    EXPECT_EQ(" lpCmdLine == NULL,\n", capture.Records()[0].text);
}

void Fault(void* context) {
    *static_cast<int*>(context) += 1;
    volatile int* nowhere = nullptr;
    *nowhere = 1;
    *static_cast<int*>(context) += 100;  // never reached
}

void NoFault(void* context) {
    *static_cast<int*>(context) += 1;
}

TEST(AccessViolationGuard, FaultIsCaughtAndTheCallerContinues) {
    int calls = 0;
    EXPECT_FALSE(RunWithAccessViolationGuard(&Fault, &calls));
    EXPECT_EQ(1, calls);
    // The guard leaves the exception chain as it found it: it works again,
    // and a normal call still returns normally.
    EXPECT_FALSE(RunWithAccessViolationGuard(&Fault, &calls));
    EXPECT_TRUE(RunWithAccessViolationGuard(&NoFault, &calls));
    EXPECT_EQ(3, calls);
}

struct Nested {
    int innerResult = -1;
};

void FaultInsideNestedGuard(void* context) {
    int calls = 0;
    static_cast<Nested*>(context)->innerResult = RunWithAccessViolationGuard(&Fault, &calls);
}

TEST(AccessViolationGuard, InnerGuardHandlesItsOwnFault) {
    Nested nested;
    EXPECT_TRUE(RunWithAccessViolationGuard(&FaultInsideNestedGuard, &nested));
    EXPECT_EQ(0, nested.innerResult);
}

TEST(DebugMode, OnlyTheFirstCharacterCounts) {
    struct Case {
        const wchar_t* value;
        int expected;
    };
    for (const Case& c : {Case{L"1", 1}, Case{L"10", 1}, Case{L"1abc", 1}, Case{L"0", 0},
                          Case{L"", 0}, Case{L" 1", 0}, Case{nullptr, 0}}) {
        SetEnvironmentVariableW(L"QMDebugMode", c.value);
        EXPECT_EQ(c.expected, IsQMDebugMode()) << (c.value ? "set" : "unset");
    }
    SetEnvironmentVariableW(L"QMDebugMode", nullptr);
}

}  // namespace
