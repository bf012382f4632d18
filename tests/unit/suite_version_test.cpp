// The suite's version and install folder: which source wins, and which
// registry view and key each is read from.
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

std::string VersionFile(const std::string& version) {
    return "<?xml version=\"1.0\"?><QM><VersionInfo><CurrentVersion>" + version +
           "</CurrentVersion></VersionInfo></QM>";
}

class SuiteVersionTest : public MachineTest {
protected:
    SuiteVersionTest() { CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED); }
    ~SuiteVersionTest() override { CoUninitialize(); }

    CStringEx BuildNumber(BOOL* found) {
        CStringEx version(L"stale");
        *found = GetQMBuildNumber(version);
        return version;
    }
    const std::wstring m_suite = m_scratch.Sub(L"suite", true);
};

TEST_F(SuiteVersionTest, QmXmlFirstThenTheUsersThenTheMachinesBuildNumber) {
    const struct {
        const char* name;
        std::string qmXml;  // empty: no file
        const wchar_t* user;
        const wchar_t* machine;
        const wchar_t* expected;  // null: not found
    } rows[] = {
        {"file wins", VersionFile("2.1.0.77"), L"9.9", L"8.8", L"2.1.0.77"},
        {"empty element", VersionFile(""), L"3.0.1", L"8.8", L"3.0.1"},
        {"user empty too", VersionFile(""), L"", L"4.0.2", L"4.0.2"},
        {"document type refused",
         "<?xml version=\"1.0\"?><!DOCTYPE QM [<!ENTITY v \"6.6\">]><QM><VersionInfo>"
         "<CurrentVersion>&v;</CurrentVersion></VersionInfo></QM>",
         nullptr, L"4.0.2", L"4.0.2"},
        {"nothing", "", nullptr, nullptr, nullptr},
    };
    RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", m_suite, KEY_WOW64_32KEY);
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        const std::wstring file = JoinPath(m_suite, L"QM.xml");
        DeleteFileW(file.c_str());
        if (!row.qmXml.empty()) {
            WriteFileBytes(file, row.qmXml);
        }
        RegRemoveValue(HKEY_CURRENT_USER, kSuiteKey, L"BuildNumber");
        RegRemoveValue(HKEY_LOCAL_MACHINE, kSuiteKey, L"BuildNumber");
        if (row.user != nullptr) {
            RegPutString(HKEY_CURRENT_USER, kSuiteKey, L"BuildNumber", row.user);
        }
        if (row.machine != nullptr) {
            RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"BuildNumber", row.machine,
                         KEY_WOW64_32KEY);
        }
        BOOL found = FALSE;
        CStringEx version = BuildNumber(&found);
        EXPECT_EQ(row.expected != nullptr, found != FALSE);
        EXPECT_STREQ(row.expected ? row.expected : L"", version.c_str());
    }
}

TEST_F(SuiteVersionTest, InstallFolderSources) {
    const struct {
        const char* name;
        HKEY root;
        const wchar_t* key;
        REGSAM view;
        const wchar_t* uninstallString;  // also written when not null
        bool found;
    } rows[] = {
        {"machine, 32-bit view", HKEY_LOCAL_MACHINE, kSuiteKey, 0, nullptr, true},
        {"machine, 64-bit view only", HKEY_LOCAL_MACHINE, kSuiteKey, KEY_WOW64_64KEY, nullptr,
         false},
        {"user", HKEY_CURRENT_USER, kSuiteKey, 0, nullptr, true},
        {"per-user uninstall entry", HKEY_CURRENT_USER, kUninstallKey, 0, L"x /uninstall", true},
        {"uninstall entry without command", HKEY_CURRENT_USER, kUninstallKey, 0, L"", false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        ClearProductState();
        RegPutString(row.root, row.key, L"Path", m_suite, row.view);
        if (row.uninstallString != nullptr) {
            RegPutString(row.root, row.key, L"UninstallString", row.uninstallString, row.view);
        }
        wchar_t folder[MAX_PATH] = L"stale";
        EXPECT_EQ(row.found, GetQMInstallFolder(folder, MAX_PATH) != FALSE);
        EXPECT_EQ(row.found ? m_suite : L"", std::wstring(folder));
    }
}

}  // namespace
