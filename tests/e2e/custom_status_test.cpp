// mocvistainstall end to end: the Communicator and Lync policy values, the
// suite's status files, and configured files, friendly or hostile.
#include <windows.h>
#include <sddl.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kCommunicatorKey[] = L"Software\\Policies\\Microsoft\\Communicator";
const wchar_t kLyncKey[] = L"Software\\Policies\\Microsoft\\Office\\15.0\\Lync";
const wchar_t kStatusFile[] = L"Mirovan\\Quillmark Tools\\status.xml";
const std::string kOtherWording =
    "<?xml version=\"1.0\"?>\n<customStates xmlns=\"http://schemas.microsoft.com/09/2005/"
    "communicator/customStates\"><customState ID=\"19780803\" availability=\"busy\"><activity "
    "LCID=\"1033\">In einer Mirovan-Besprechung</activity></customState></customStates>\n";

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
    void Install() { EXPECT_EQ(0, Program().Run(L"-mocvistainstall").exitCode); }
    void Configure(const std::wstring& url) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kCommunicatorKey, L"CustomStateURL", url));
    }
    const std::string m_template = ReadFileBytes(FakePath(L"MirovanStatus.xml"));
};

// Without a policy the template is installed and named; run again, it stays.
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

// A configured file gains the state once, or is refused and left as it was
// (a loaded entity would be saved); the size limit is platform.xml's reader's.
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
        // A second copy of the state, with the suite's wording.
        EXPECT_NE(after.find("ID=\"19780803\""), after.rfind("ID=\"19780803\"")) << after;
        EXPECT_NE(std::string::npos, after.find(">In a Mirovan meeting<"));
    }
}

// Only missing "Quillmark Tools" and "Mirovan" folders are made, for file URLs.
TEST_F(CustomStatusTest, OnlyTheSuitesFoldersAreCreatedForAFileUrl) {
    const struct {
        const wchar_t* scheme;
        const wchar_t* existing;  // under the scratch folder
        const wchar_t* folder;    // of the configured file
        bool created;
    } rows[] = {
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

}  // namespace
