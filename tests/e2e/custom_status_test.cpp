// mocvistainstall run by the real program: the Communicator and Lync policy
// values it writes, the suite's status files, and the files an administrator
// configured, friendly or hostile.
#include <windows.h>
#include <aclapi.h>
#include <sddl.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/host_link.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kCommunicatorKey[] = L"Software\\Policies\\Microsoft\\Communicator";
const wchar_t kLyncKey[] = L"Software\\Policies\\Microsoft\\Office\\15.0\\Lync";
const wchar_t kStatusFile[] = L"Mirovan\\Quillmark Tools\\status.xml";
const char kHeader[] =
    "<?xml version=\"1.0\"?>\n"
    "<customStates xmlns=\"http://schemas.microsoft.com/09/2005/communicator/customStates\">";
const char kFooter[] = "</customStates>\n";
const char kOtherWording[] =
    "<customState ID=\"19780803\" availability=\"busy\">"
    "<activity LCID=\"1033\">In einer Mirovan-Besprechung</activity></customState>";

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
    return (static_cast<ULONGLONG>(data.ftLastWriteTime.dwHighDateTime) << 32) |
           data.ftLastWriteTime.dwLowDateTime;
}

// The machine's Communicator policy key, readable but not writable, for as
// long as the object lives.
class DeniedPolicyKey {
public:
    DeniedPolicyKey() { Apply(L"D:P(A;;KRSDWD;;;WD)"); }
    ~DeniedPolicyKey() { Apply(L"D:(A;;KA;;;WD)"); }

    bool ok() const { return m_ok; }

private:
    void Apply(const wchar_t* sddl) {
        PSECURITY_DESCRIPTOR descriptor = nullptr;
        HKEY key = nullptr;
        m_ok = ConvertStringSecurityDescriptorToSecurityDescriptorW(sddl, SDDL_REVISION_1,
                                                                    &descriptor, nullptr) &&
               RegCreateKeyExW(HKEY_LOCAL_MACHINE, kCommunicatorKey, 0, nullptr, 0, WRITE_DAC,
                               nullptr, &key, nullptr) == ERROR_SUCCESS &&
               RegSetKeySecurity(key, DACL_SECURITY_INFORMATION, descriptor) == ERROR_SUCCESS;
        RegCloseKey(key);
        LocalFree(descriptor);
    }
    bool m_ok = false;
};

class CustomStatusTest : public MachineTest {
protected:
    CustomStatusTest() {
        CopyFileW(FakePath(L"MirovanStatus.xml").c_str(),
                  JoinPath(Program().folder(), L"MirovanStatus.xml").c_str(), FALSE);
        RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path",
                     Program().folder());
    }

    RunResult Install() {
        RunResult run = Program().Run(L"-mocvistainstall");
        EXPECT_FALSE(run.crashed);
        EXPECT_EQ(0, run.exitCode);
        return run;
    }
    // Points the machine's Communicator policy at url.
    void Configure(const std::wstring& url) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kCommunicatorKey, L"CustomStateURL", url));
    }
    std::wstring Url(HKEY root, const wchar_t* key) {
        return RegGetString(root, key, L"CustomStateURL").value_or(L"(none)");
    }
    DWORD HighSecurity(HKEY root, const wchar_t* key) {
        return RegGetDword(root, key, L"EnableSIPHighSecurityMode").value_or(99);
    }

    const std::string m_template = ReadFileBytes(FakePath(L"MirovanStatus.xml"));
};

TEST_F(CustomStatusTest, WithoutPolicyTheMachinePointsAtTheAllUsersFileWhichStaysAsItIs) {
    const std::wstring status = JoinPath(CommonAppData(), kStatusFile);
    Install();
    EXPECT_EQ(L"file://" + status, Url(HKEY_LOCAL_MACHINE, kCommunicatorKey));
    EXPECT_EQ(0u, HighSecurity(HKEY_LOCAL_MACHINE, kCommunicatorKey));
    EXPECT_EQ(m_template, ReadFileBytes(status));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, kCommunicatorKey));

    // Now configured: the file holds the suite's state and is not saved again.
    const ULONGLONG written = WriteTime(status);
    Sleep(20);
    Install();
    EXPECT_EQ(m_template, ReadFileBytes(status));
    EXPECT_EQ(written, WriteTime(status));
    EXPECT_EQ(std::vector<std::wstring>{L"status.xml"}, ListDir(JoinPath(status, L"..")));
}

TEST_F(CustomStatusTest, WithoutRightsOnTheMachinePolicyTheUserGetsItsOwn) {
    DeniedPolicyKey denied;
    ASSERT_TRUE(denied.ok());
    RunResult run = Install();
    const std::wstring status = JoinPath(RoamingAppData(), kStatusFile);
    EXPECT_TRUE(
        run.HasTrace(" CMOCCustomStatusInstall::SilentInstall: write HKEY_CURRENT_USER!,\n"));
    EXPECT_EQ(L"file://" + status, Url(HKEY_CURRENT_USER, kCommunicatorKey));
    EXPECT_EQ(0u, HighSecurity(HKEY_CURRENT_USER, kCommunicatorKey));
    EXPECT_EQ(L"(none)", Url(HKEY_LOCAL_MACHINE, kCommunicatorKey));
    EXPECT_EQ(m_template, ReadFileBytes(status));
}

TEST_F(CustomStatusTest, LyncPolicyKeyGetsTheUsersFile) {
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kLyncKey));
    RunResult run = Install();
    const std::wstring status = JoinPath(RoamingAppData(), kStatusFile);
    EXPECT_TRUE(run.HasTraceContaining("can found the office2013 Lync reg key!"));
    EXPECT_EQ(L"file://" + status, Url(HKEY_LOCAL_MACHINE, kLyncKey));
    EXPECT_EQ(0u, HighSecurity(HKEY_LOCAL_MACHINE, kLyncKey));
    EXPECT_EQ(m_template, ReadFileBytes(status));
}

// A configured file gains the suite's state once, or is refused and left as
// it was (nothing it refers to is read: a loaded entity would be saved).
TEST_F(CustomStatusTest, ConfiguredFileGainsTheStateOnceOrIsLeftAlone) {
    const std::wstring secret = m_scratch.Sub(L"secret.txt");
    WriteFileBytes(secret, "SECRET");
    const std::string entity =
        "<!DOCTYPE customStates [<!ENTITY x SYSTEM \"file:///" + Narrow(secret) + "\">]>";
    const struct {
        const char* name;
        std::string content;
        const char* refusal;  // null: the state is appended
    } rows[] = {
        {"other wording", kHeader + std::string(kOtherWording) + kFooter, nullptr},
        {"external entity",
         "<?xml version=\"1.0\"?>" + entity + "<customStates><customState ID=\"1\"><activity " +
             "LCID=\"1033\">&x;</activity></customState></customStates>",
         "the file has a document type declaration"},
        {"malformed", kHeader + std::string("<customState ID=\"19780803\">"),
         "the file is not well-formed XML"},
        {"huge", "", "the file is too large"},
    };
    const std::wstring status = m_scratch.Sub(L"admin") + L"\\status.xml";
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        WriteFileBytes(status, row.content);
        if (row.content.empty()) {  // sparse, above the limit
            HANDLE file =
                CreateFileW(status.c_str(), GENERIC_WRITE, 0, nullptr, OPEN_EXISTING, 0, nullptr);
            LARGE_INTEGER size;
            size.QuadPart = 65 * 1024 * 1024;
            SetFilePointerEx(file, size, nullptr, FILE_BEGIN);
            SetEndOfFile(file);
            CloseHandle(file);
        }
        const std::string before = ReadFileBytes(status);
        Configure(L"file:///" + status);
        RunResult run = Install();
        if (row.refusal != nullptr) {
            EXPECT_TRUE(run.HasTraceContaining(row.refusal));
            EXPECT_TRUE(before == ReadFileBytes(status));
            continue;
        }
        const std::string after = ReadFileBytes(status);
        EXPECT_EQ(2u, Count(after, "ID=\"19780803\"")) << after;
        EXPECT_EQ(1u, Count(after, ">In a Mirovan meeting<"));
        Install();
        EXPECT_EQ(after, ReadFileBytes(status));
    }
}

TEST_F(CustomStatusTest, OnlyAMissingQuillmarkToolsFolderAndItsMirovanFolderAreCreated) {
    const struct {
        const wchar_t* existing;  // under the scratch folder
        const wchar_t* folder;    // of the configured file
        bool created;
    } rows[] = {
        {L"a", L"a\\Mirovan\\Quillmark Tools", true},
        {L"b\\Mirovan", L"b\\Mirovan\\Quillmark Tools", true},
        {L"c\\Mirovan", L"c\\Mirovan\\Other", false},
        {L"d", L"d\\Other\\Quillmark Tools", false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(Narrow(row.folder));
        MakeDirs(m_scratch.Sub(row.existing));
        const std::wstring status = m_scratch.Sub(row.folder) + L"\\status.xml";
        Configure(L"file://" + status);
        Install();
        EXPECT_EQ(row.created, DirExists(m_scratch.Sub(row.folder)));
        EXPECT_EQ(row.created ? m_template : "", ReadFileBytes(status));
    }
    EXPECT_FALSE(DirExists(m_scratch.Sub(L"d\\Other")));
}

TEST_F(CustomStatusTest, AnHttpUrlIsNeverTouched) {
    Configure(L"http://intranet/Mirovan/Quillmark Tools/status.xml");
    RunResult run = Install();
    EXPECT_TRUE(run.HasTraceContaining("regkey CustomStateURL is not include file"));
    EXPECT_EQ(L"http://intranet/Mirovan/Quillmark Tools/status.xml",
              Url(HKEY_LOCAL_MACHINE, kCommunicatorKey));
    EXPECT_FALSE(DirExists(JoinPath(CommonAppData(), L"Mirovan")));
    EXPECT_FALSE(DirExists(JoinPath(RoamingAppData(), L"Mirovan")));
}

// The user's "Mirovan" folder is a link: neither the missing file is made
// through it nor an existing one rewritten.
TEST_F(CustomStatusTest, NoWorkGoesThroughALinkInTheUsersFolder) {
    const std::wstring victim = m_scratch.Sub(L"victim", true);
    HostLink link(JoinPath(RoamingAppData(), L"Mirovan"), victim);
    ASSERT_TRUE(link.ok());
    Configure(L"file://" + JoinPath(RoamingAppData(), kStatusFile));
    for (bool existing : {false, true}) {
        SCOPED_TRACE(existing ? "existing" : "missing");
        const std::string content = kHeader + std::string(kOtherWording) + kFooter;
        if (existing) {
            WriteFileBytes(JoinPath(victim, L"Quillmark Tools\\status.xml"), content);
        }
        RunResult run = Install();
        EXPECT_TRUE(run.HasTraceContaining("refused to go through a reparse point"));
        EXPECT_EQ(existing ? content : "",
                  ReadFileBytes(JoinPath(victim, L"Quillmark Tools\\status.xml")));
        EXPECT_EQ(existing, DirExists(JoinPath(victim, L"Quillmark Tools")));
    }
}

}  // namespace
