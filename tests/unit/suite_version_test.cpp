// The suite's version: which source wins, and where the install folder that
// holds QM.xml is read from.
#include <windows.h>
#include <objbase.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "version/qm_version.h"

namespace {

const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kUninstallKey[] =
    L"Software\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\QuillmarkTools";

std::string VersionFile(const std::string& version, const char* doctype = "") {
    return std::string("<?xml version=\"1.0\"?>") + doctype + "<QM><VersionInfo><CurrentVersion>" +
           version + "</CurrentVersion></VersionInfo></QM>";
}

class SuiteVersionTest : public MachineTest {
protected:
    SuiteVersionTest() { CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED); }
    ~SuiteVersionTest() override { CoUninitialize(); }
};

TEST_F(SuiteVersionTest, QmXmlFirstThenTheUsersThenTheMachinesBuildNumber) {
    const HKEY hklm = HKEY_LOCAL_MACHINE;
    const HKEY hkcu = HKEY_CURRENT_USER;
    const struct {
        const char* name;
        HKEY root;  // where the install folder's "Path" is
        const wchar_t* key;
        REGSAM view;
        const wchar_t* uninstallString;  // written beside "Path" unless null
        std::string qmXml;               // empty: no file
        const wchar_t* user;             // "BuildNumber" values, unless null
        const wchar_t* machine;
        const wchar_t* expected;  // null: not found
    } rows[] = {
        {"file wins", hklm, kSuiteKey, 0, nullptr, VersionFile("2.1.0.77"), L"9", L"8",
         L"2.1.0.77"},
        {"empty element", hklm, kSuiteKey, 0, nullptr, VersionFile(""), L"3.0.1", L"8", L"3.0.1"},
        {"user's empty", hklm, kSuiteKey, 0, nullptr, VersionFile(""), L"", L"4.0.2", L"4.0.2"},
        {"document type refused", hklm, kSuiteKey, 0, nullptr,
         VersionFile("&v;", "<!DOCTYPE QM [<!ENTITY v \"6.6\">]>"), nullptr, L"4.0.2", L"4.0.2"},
        {"user's folder", hkcu, kSuiteKey, 0, nullptr, VersionFile("2.2"), nullptr, nullptr,
         L"2.2"},
        {"per-user uninstall entry", hkcu, kUninstallKey, 0, L"x /uninstall", VersionFile("2.3"),
         nullptr, nullptr, L"2.3"},
        {"uninstall entry without command", hkcu, kUninstallKey, 0, L"", VersionFile("2.3"),
         nullptr, nullptr, nullptr},
        {"machine's 64-bit view", hklm, kSuiteKey, KEY_WOW64_64KEY, nullptr, VersionFile("2.4"),
         nullptr, nullptr, nullptr},
    };
    const std::wstring suite = m_scratch.Sub(L"suite", true);
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        ClearProductState();
        RegPutString(row.root, row.key, L"Path", suite, row.view);
        if (row.uninstallString != nullptr) {
            RegPutString(row.root, row.key, L"UninstallString", row.uninstallString);
        }
        DeleteFileW(JoinPath(suite, L"QM.xml").c_str());
        if (!row.qmXml.empty()) {
            WriteFileBytes(JoinPath(suite, L"QM.xml"), row.qmXml);
        }
        if (row.user != nullptr) {
            RegPutString(hkcu, kSuiteKey, L"BuildNumber", row.user);
        }
        if (row.machine != nullptr) {
            RegPutString(hklm, kSuiteKey, L"BuildNumber", row.machine, KEY_WOW64_32KEY);
        }
        CStringEx version(L"stale");
        EXPECT_EQ(row.expected != nullptr, GetQMBuildNumber(version) != FALSE);
        EXPECT_STREQ(row.expected ? row.expected : L"", version.c_str());
    }
}

}  // namespace
