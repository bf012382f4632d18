// mocvistainstall run by the real program: the Communicator and Lync policy
// values it writes, the suite's status files, and the files an administrator
// configured, friendly or hostile. And the suite's version.
#include <windows.h>
#include <objbase.h>
#include <sddl.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"
#include "version/qm_version.h"

namespace {

const wchar_t kCommunicatorKey[] = L"Software\\Policies\\Microsoft\\Communicator";
const wchar_t kLyncKey[] = L"Software\\Policies\\Microsoft\\Office\\15.0\\Lync";
const wchar_t kStatusFile[] = L"Mirovan\\Quillmark Tools\\status.xml";
const std::string kOtherWording =
    "<?xml version=\"1.0\"?>\n<customStates xmlns=\"http://schemas.microsoft.com/09/2005/"
    "communicator/customStates\"><customState ID=\"19780803\" availability=\"busy\"><activity "
    "LCID=\"1033\">In einer Mirovan-Besprechung</activity></customState></customStates>\n";

size_t Count(const std::string& text, const std::string& part) {
    size_t count = 0;
    for (size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) {
        ++count;
    }
    return count;
}

ULONGLONG WriteTime(const std::wstring& path) {
    WIN32_FILE_ATTRIBUTE_DATA data = {};
    GetFileAttributesExW(path.c_str(), GetFileExInfoStandard, &data);
    return (ULONGLONG(data.ftLastWriteTime.dwHighDateTime) << 32) |
           data.ftLastWriteTime.dwLowDateTime;
}

// Gives the machine's Communicator policy key the access rules sddl.
bool SetPolicyKeyRules(const wchar_t* sddl) {
    PSECURITY_DESCRIPTOR descriptor = nullptr;
    HKEY key = nullptr;
    bool ok = ConvertStringSecurityDescriptorToSecurityDescriptorW(sddl, SDDL_REVISION_1,
                                                                   &descriptor, nullptr) &&
              RegCreateKeyExW(HKEY_LOCAL_MACHINE, kCommunicatorKey, 0, nullptr, 0, WRITE_DAC,
                              nullptr, &key, nullptr) == ERROR_SUCCESS &&
              RegSetKeySecurity(key, DACL_SECURITY_INFORMATION, descriptor) == ERROR_SUCCESS;
    RegCloseKey(key);
    LocalFree(descriptor);
    return ok;
}

class CustomStatusTest : public MachineTest {
protected:
    CustomStatusTest() {
        CopyFileW(FakePath(L"MirovanStatus.xml").c_str(),
                  JoinPath(Program().folder(), L"MirovanStatus.xml").c_str(), FALSE);
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path",
                     Program().folder());
    }
    void Install() {
        RunResult run = Program().Run(L"-mocvistainstall");
        EXPECT_FALSE(run.crashed);
        EXPECT_EQ(0, run.exitCode);
    }
    void Configure(const std::wstring& url) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kCommunicatorKey, L"CustomStateURL", url));
    }
    const std::string m_template = ReadFileBytes(FakePath(L"MirovanStatus.xml"));
};

// Without a policy the template is installed and the policy pointed at it;
// run again, the file is configured, holds the suite's state, and stays as it is.
TEST_F(CustomStatusTest, WithoutPolicyTheStatusFileIsInstalledOnce) {
    const struct {
        const char* name;
        HKEY root;  // of the policy written
        const wchar_t* key;
        std::wstring status;
    } rows[] = {
        {"rights on the machine", HKEY_LOCAL_MACHINE, kCommunicatorKey,
         JoinPath(CommonAppData(), kStatusFile)},
        {"machine key denied", HKEY_CURRENT_USER, kCommunicatorKey,
         JoinPath(RoamingAppData(), kStatusFile)},
        {"Lync key", HKEY_LOCAL_MACHINE, kLyncKey, JoinPath(RoamingAppData(), kStatusFile)},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        ClearProductState();
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path",
                     Program().folder());
        if (row.root == HKEY_CURRENT_USER) {
            ASSERT_TRUE(SetPolicyKeyRules(L"D:P(A;;KRSDWD;;;WD)"));  // read only
        } else if (row.key == kLyncKey) {
            RegMakeKey(HKEY_LOCAL_MACHINE, kLyncKey);
        }
        Install();
        EXPECT_EQ(L"file://" + row.status, RegGetString(row.root, row.key, L"CustomStateURL"));
        EXPECT_EQ(0u, RegGetDword(row.root, row.key, L"EnableSIPHighSecurityMode"));
        EXPECT_EQ(m_template, ReadFileBytes(row.status));
        const ULONGLONG written = WriteTime(row.status);
        Sleep(20);
        Install();
        EXPECT_EQ(m_template, ReadFileBytes(row.status));
        EXPECT_EQ(written, WriteTime(row.status));
        SetPolicyKeyRules(L"D:(A;;KA;;;WD)");
    }
}

// A configured file gains the suite's state once, or is refused and left as
// it was (nothing it refers to is read: a loaded entity would be saved). The
// size limit is the same reader's as platform.xml's, tested there.
TEST_F(CustomStatusTest, ConfiguredFileGainsTheStateOnceOrIsLeftAlone) {
    const std::wstring secret = m_scratch.Sub(L"secret.txt");
    WriteFileBytes(secret, "SECRET");
    const std::string entity =
        "<!DOCTYPE customStates [<!ENTITY x SYSTEM \"file:///" + Narrow(secret) +
        "\">]><customStates><customState ID=\"1\"><activity>&x;</activity></customState>"
        "</customStates>";
    const std::wstring status = m_scratch.Sub(L"admin") + L"\\status.xml";
    for (const std::string& content : {kOtherWording, entity, kOtherWording.substr(0, 200)}) {
        SCOPED_TRACE(content);
        WriteFileBytes(status, content);
        Configure(L"file:///" + status);
        Install();
        const std::string after = ReadFileBytes(status);
        if (content != kOtherWording) {
            EXPECT_EQ(content, after);
            continue;
        }
        EXPECT_EQ(2u, Count(after, "ID=\"19780803\"")) << after;
        EXPECT_EQ(1u, Count(after, ">In a Mirovan meeting<"));
        Install();
        EXPECT_EQ(after, ReadFileBytes(status));
    }
}

// Only a missing "Quillmark Tools" folder and its "Mirovan" folder are made,
// and only for a file URL.
TEST_F(CustomStatusTest, OnlyTheSuitesFoldersAreCreatedForAFileUrl) {
    const struct {
        const wchar_t* scheme;
        const wchar_t* existing;  // under the scratch folder
        const wchar_t* folder;    // of the configured file
        bool created;
    } rows[] = {
        {L"file://", L"a", L"a\\Mirovan\\Quillmark Tools", true},
        {L"file://", L"b\\Mirovan", L"b\\Mirovan\\Quillmark Tools", true},
        {L"file://", L"c\\Mirovan", L"c\\Mirovan\\Other", false},
        {L"file://", L"d", L"d\\Other\\Quillmark Tools", false},
        {L"http://", L"e\\Mirovan", L"e\\Mirovan\\Quillmark Tools", false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(Narrow(row.folder));
        MakeDirs(m_scratch.Sub(row.existing));
        const std::wstring status = m_scratch.Sub(row.folder) + L"\\status.xml";
        Configure(row.scheme + status);
        Install();
        EXPECT_EQ(row.created, DirExists(m_scratch.Sub(row.folder)));
        EXPECT_EQ(row.created ? m_template : "", ReadFileBytes(status));
    }
    EXPECT_FALSE(DirExists(m_scratch.Sub(L"d\\Other")));
}

// The suite's version: QM.xml in the install folder first, then the user's
// and the machine's "BuildNumber"; the install folder's "Path" from the
// machine's 32-bit view, the user's key or the per-user uninstall entry.
TEST_F(CustomStatusTest, SuiteVersionComesFromQmXmlThenTheUsersThenTheMachinesBuildNumber) {
    const HKEY hklm = HKEY_LOCAL_MACHINE;
    const HKEY hkcu = HKEY_CURRENT_USER;
    const wchar_t* suiteKey = L"SOFTWARE\\Mirovan\\QmkTools";
    const wchar_t* uninstallKey =
        L"Software\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\QuillmarkTools";
    const struct {
        HKEY root;  // where the install folder's "Path" is
        const wchar_t* key;
        REGSAM view;
        const wchar_t* uninstallString;  // written beside "Path" unless null
        const char* version;             // in QM.xml, null: no file
        const wchar_t* user;             // "BuildNumber" values, unless null
        const wchar_t* machine;
        const wchar_t* expected;  // null: not found
    } rows[] = {
        {hklm, suiteKey, 0, nullptr, "2.1.0.77", L"9", L"8", L"2.1.0.77"},
        {hklm, suiteKey, 0, nullptr, "", L"3.0.1", L"8", L"3.0.1"},
        {hklm, suiteKey, 0, nullptr, "", L"", L"4.0.2", L"4.0.2"},
        {hklm, suiteKey, 0, nullptr, "&v;", nullptr, L"4.0.2", L"4.0.2"},  // a DTD defines v
        {hkcu, suiteKey, 0, nullptr, "2.2", nullptr, nullptr, L"2.2"},
        {hkcu, uninstallKey, 0, L"x /uninstall", "2.3", nullptr, nullptr, L"2.3"},
        {hkcu, uninstallKey, 0, L"", "2.3", nullptr, nullptr, nullptr},
        {hklm, suiteKey, KEY_WOW64_64KEY, nullptr, "2.4", nullptr, nullptr, nullptr},
    };
    CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
    const std::wstring suite = m_scratch.Sub(L"suite", true);
    for (const auto& row : rows) {
        SCOPED_TRACE(Narrow(row.key) + " " + row.version);
        ClearProductState();
        RegPutString(row.root, row.key, L"Path", suite, row.view);
        if (row.uninstallString != nullptr) {
            RegPutString(row.root, row.key, L"UninstallString", row.uninstallString);
        }
        const std::string doctype =
            std::string(row.version) == "&v;" ? "<!DOCTYPE QM [<!ENTITY v \"6.6\">]>" : "";
        WriteFileBytes(JoinPath(suite, L"QM.xml"),
                       "<?xml version=\"1.0\"?>" + doctype + "<QM><VersionInfo><CurrentVersion>" +
                           row.version + "</CurrentVersion></VersionInfo></QM>");
        if (row.user != nullptr) {
            RegPutString(hkcu, suiteKey, L"BuildNumber", row.user);
        }
        if (row.machine != nullptr) {
            RegPutString(hklm, suiteKey, L"BuildNumber", row.machine, KEY_WOW64_32KEY);
        }
        CStringEx version(L"stale");
        EXPECT_EQ(row.expected != nullptr, GetQMBuildNumber(version) != FALSE);
        EXPECT_STREQ(row.expected ? row.expected : L"", version.c_str());
    }
    CoUninitialize();
}

}  // namespace
