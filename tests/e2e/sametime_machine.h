// A simulated machine for the Sametime keywords: a suite folder holding the
// feature's files, Sametime Connect found through an uninstall entry, Notes 8
// with its program and data folders.
#pragma once

#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"

namespace sametime_test {

const wchar_t kNotes8Key[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
const wchar_t kNativeLibrary[] = L"qmmrvjni.dll";
const wchar_t kJar[] = L"com.mrv.realtime.meeting_1.0.1.jar";
const wchar_t kFeatureXml[] = L"com.mrv.realtime.meeting.feature_1.0.1\\feature.xml";
const char kFeatureId[] = "id=\"com.mrv.realtime.meeting.feature\"";
// The feature element as the program writes it (attributes in this order).
const char kFeatureElement[] =
    "<feature id=\"com.mrv.realtime.meeting.feature\" "
    "url=\"features/com.mrv.realtime.meeting.feature_1.0.1/\" version=\"1.0.1\"";

// A platform.xml with a base site and a second site at siteUrl holding
// another feature and then `features`.
inline std::string PlatformXml(const std::string& siteUrl, const std::string& features = "") {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<config version=\"3.0\">\n"
           "<site enabled=\"true\" url=\"platform:/base/\">\n"
           "<feature id=\"org.eclipse.rcp\" url=\"features/org.eclipse.rcp_3.4.0/\" "
           "version=\"3.4.0\">\n</feature>\n</site>\n<site enabled=\"true\" url=\"" +
           siteUrl +
           "\">\n<feature id=\"com.example.chat\" url=\"features/com.example.chat_8.0.0/\" "
           "version=\"8.0.0\">\n</feature>\n" +
           features + "</site>\n</config>\n";
}

class SametimeMachine : public MachineTest {
protected:
    // The suite folder with the feature's files, each holding "suite:<name>".
    void InstallSuite() {
        for (const wchar_t* name :
             {kNativeLibrary, L"msvcr120.dll", L"msvcp120.dll", kJar, L"feature.xml"}) {
            Put(JoinPath(m_suite, name), "suite:" + Narrow(name));
        }
        ASSERT_TRUE(
            RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", m_suite));
    }
    // Sametime Connect of the given major version (0: no version value).
    void InstallSametime(DWORD version, const std::wstring& location) {
        const std::wstring entry = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\" +
                                   std::wstring(kTestUninstallPrefix) + L"SametimeConnect";
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, entry, L"DisplayName",
                                 L"IBM Lotus Sametime Connect 8.5"));
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, entry, L"InstallLocation", location));
        ASSERT_TRUE(version == 0 ||
                    RegPutDword(HKEY_LOCAL_MACHINE, entry, L"VersionMajor", version));
    }
    void InstallSametime(DWORD version) { InstallSametime(version, m_sametime); }
    void InstallNotes8() {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"Path", m_notes));
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"DataPath", m_data));
    }
    void Put(const std::wstring& path, const std::string& content) {
        ASSERT_TRUE(WriteFileBytes(path, content));
    }

    const std::wstring m_suite = m_scratch.Sub(L"Quillmark Tools", true);
    const std::wstring m_sametime = m_scratch.Sub(L"Sametime Connect", true);
    const std::wstring m_notes = m_scratch.Sub(L"Notes", true);
    const std::wstring m_data = m_scratch.Sub(L"Notes\\Data", true);
};

}  // namespace sametime_test
