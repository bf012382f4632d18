// The UI language the program starts in, seen as the LANGID it hands to
// SetThreadUILanguage (reported to the debugger output: Wine's
// SetThreadUILanguage changes nothing a test could observe). The user's code
// is taken as it is, the machine's only when known, else the installed
// product's language; both directions of the language table as tabled.
#include <windows.h>
#include <gtest/gtest.h>

#include <optional>
#include <string>

#include "tests/e2e/suite_install.h"
#include "tests/support/machine_fixture.h"

namespace {

using namespace suite_install;

const REGSAM k64 = KEY_WOW64_64KEY;

struct LanguageCase {
    const char* name;
    const wchar_t* userCode;     // HKCU "QMUILanguage", or null
    const wchar_t* machineCode;  // HKLM (32-bit view) "QMUILanguage", or null
    std::optional<DWORD> productLanguage;
    int expected;
};

const LanguageCase kCases[] = {
    {"user code trimmed, any case", L" jp ", nullptr, std::nullopt, 1041},
    {"unknown user code, machine not read", L"XX", L"JP", std::nullopt, 1033},
    {"machine code trimmed, any case", nullptr, L" de ", std::nullopt, 1031},
    {"unknown machine code, product's language", nullptr, L"XX", 1041, 1041},
    {"product 4105 is English", nullptr, nullptr, 4105, 1033},
    {"product 2058 is SP, which is 3082", nullptr, nullptr, 2058, 3082},
    {"product 1034 is ES, which is 2058", nullptr, nullptr, 1034, 2058},
    {"unknown product language", nullptr, nullptr, 1234, 1033},
    {"no suite at all", nullptr, nullptr, std::nullopt, 1033},
};

class UILanguageTest : public MachineTest, public ::testing::WithParamInterface<LanguageCase> {
protected:
    ~UILanguageTest() override { RemoveProducts(); }
};

TEST_P(UILanguageTest, ProgramStartsInTheChosenLanguage) {
    const LanguageCase& c = GetParam();
    SCOPED_TRACE(c.name);
    if (c.userCode != nullptr) {
        ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kSuiteKey, L"QMUILanguage", c.userCode));
    }
    if (c.machineCode != nullptr) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"QMUILanguage", c.machineCode));
    }
    // Filed under a later upgrade code: the earlier ones are tried first.
    if (c.productLanguage) {
        RegisterProduct(2, k64, 0);
        ASSERT_TRUE(
            RegPutDword(HKEY_LOCAL_MACHINE, kUninstallEntry, L"Language", *c.productLanguage));
    }
    RunResult run = Program().Run(L"-x");
    EXPECT_FALSE(run.crashed);
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasDebugOutput("qmMrvONI.exe: _tWinMain: SetThreadUILanguage " +
                                   std::to_string(c.expected) + "\n"));
}

INSTANTIATE_TEST_SUITE_P(Cases, UILanguageTest, ::testing::ValuesIn(kCases));

}  // namespace
