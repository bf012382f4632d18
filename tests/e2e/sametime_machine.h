// A simulated machine for the Sametime keywords: a suite folder holding the
// feature's files, Sametime Connect found through an uninstall entry, Notes 8
// with its program and data folders, and the two per-user Sametime 8
// configuration profiles.
#pragma once

#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"

namespace sametime_test {

const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kNotes7Key[] = L"SOFTWARE\\Lotus\\Notes\\7.0";
const wchar_t kNotes8Key[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
const wchar_t kUninstallEntry[] =
    L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\QMTestSametimeConnect";

const wchar_t kNativeLibrary[] = L"qmmrvjni.dll";
const wchar_t kRuntimeC[] = L"msvcr120.dll";
const wchar_t kRuntimeCpp[] = L"msvcp120.dll";
const wchar_t kJar[] = L"com.mrv.realtime.meeting_1.0.1.jar";
const wchar_t kFeatureXml[] = L"feature.xml";
const wchar_t kFeatureFolder[] = L"com.mrv.realtime.meeting.feature_1.0.1";
const wchar_t* const kSuiteFiles[] = {kNativeLibrary, kRuntimeC, kRuntimeCpp, kJar, kFeatureXml};

// The feature element as the program writes it (attributes in this order).
const char kFeatureElement[] =
    "<feature id=\"com.mrv.realtime.meeting.feature\" "
    "url=\"features/com.mrv.realtime.meeting.feature_1.0.1/\" version=\"1.0.1\"";
const char kFeatureId[] = "id=\"com.mrv.realtime.meeting.feature\"";

// A platform.xml with a base site and a second site at siteUrl holding
// another feature and then `features`.
inline std::string PlatformXml(const std::string& siteUrl, const std::string& features = "") {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
           "<config date=\"1300000000000\" transient=\"false\" version=\"3.0\">\n"
           "<site enabled=\"true\" policy=\"USER-EXCLUDE\" updateable=\"true\" "
           "url=\"platform:/base/\">\n"
           "<feature id=\"org.eclipse.rcp\" url=\"features/org.eclipse.rcp_3.4.0/\" "
           "version=\"3.4.0\">\n</feature>\n</site>\n"
           "<site enabled=\"true\" policy=\"USER-EXCLUDE\" updateable=\"true\" url=\"" +
           siteUrl +
           "\">\n<feature id=\"com.example.chat\" url=\"features/com.example.chat_8.0.0/\" "
           "version=\"8.0.0\">\n</feature>\n" +
           features + "</site>\n</config>\n";
}

inline size_t CountOf(const std::string& text, const std::string& part) {
    size_t count = 0;
    for (size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) {
        ++count;
    }
    return count;
}

inline std::string Origin(const char* place, const wchar_t* name) {
    return std::string(place) + ":" + Narrow(name);
}

class SametimeMachine : public MachineTest {
protected:
    SametimeMachine()
        : m_suite(m_scratch.Sub(L"Quillmark Tools", true)),
          m_sametime(m_scratch.Sub(L"Sametime Connect", true)),
          m_notes(m_scratch.Sub(L"Notes", true)),
          m_data(m_scratch.Sub(L"Notes\\Data", true)) {}

    // The suite folder with the feature's files, each naming its origin.
    void InstallSuite() {
        for (const wchar_t* name : kSuiteFiles) {
            ASSERT_TRUE(WriteFileBytes(JoinPath(m_suite, name), Origin("suite", name)));
        }
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", m_suite));
    }
    // Sametime Connect of the given major version (0: no version value).
    void InstallSametime(DWORD version, const std::wstring& location) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kUninstallEntry, L"DisplayName",
                                 L"IBM Lotus Sametime Connect 8.5"));
        ASSERT_TRUE(
            RegPutString(HKEY_LOCAL_MACHINE, kUninstallEntry, L"InstallLocation", location));
        if (version != 0) {
            ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kUninstallEntry, L"VersionMajor", version));
        }
    }
    void InstallSametime(DWORD version) { InstallSametime(version, m_sametime); }
    // Notes 8 with its program and data folders.
    void InstallNotes8() {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"Path", m_notes));
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"DataPath", m_data));
    }

    void Put(const std::wstring& path, const std::string& content) {
        ASSERT_TRUE(WriteFileBytes(path, content));
    }
    std::wstring In(const std::wstring& folder, const std::wstring& rel) const {
        return JoinPath(folder, rel);
    }

    // The per-user Sametime 8 configuration files: profile 0 under "Lotus",
    // profile 1 under "IBM".
    static std::wstring ProfileFolder(int profile) {
        return JoinPath(RoamingAppData(), profile == 0
                                              ? L"Lotus\\Sametime\\.config\\org.eclipse.update"
                                              : L"IBM\\Sametime\\.config\\org.eclipse.update");
    }
    static std::wstring ProfileConfig(int profile) {
        return JoinPath(ProfileFolder(profile), L"platform.xml");
    }

    std::wstring MachinePath(DWORD* type = nullptr) const {
        return RegGetString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", 0, type)
            .value_or(L"<missing>");
    }
    void SetMachinePath(const std::wstring& text) {
        ASSERT_TRUE(
            RegPutString(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path", text, 0, REG_EXPAND_SZ));
    }

    std::wstring m_suite;
    std::wstring m_sametime;
    std::wstring m_notes;
    std::wstring m_data;
};

}  // namespace sametime_test
