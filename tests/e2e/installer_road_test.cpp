// The road users take: the suite's Windows Installer package installs the
// program and runs it as deferred custom actions in the installer's order, is
// installed a second time (a repair) and removed again, on a machine with
// Notes 8, Sametime Connect 8 and two Sametime profiles. The machine before
// the install and after the uninstall is compared file by file and value by
// value: every difference must be one this test names as intended.
#include <windows.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <algorithm>
#include <functional>
#include <map>
#include <memory>
#include <regex>
#include <string>
#include <vector>

#include "tests/e2e/sametime_machine.h"
#include "tests/e2e/tree_snapshot.h"
#include "tests/support/test_paths.h"

namespace {

using namespace sametime_test;

const wchar_t kProductCode[] = L"{5C0F3A1E-7B2D-4E69-9A41-2D8E6B7C1F30}";

const std::vector<std::string> kInstallRoad = {
    "-copyfilestonotes",     "-copyfilestosametime", "-enablesametime8confige", "-enableSTembedded",
    "-delsametimestampfile", "-smsinstallsmarttag",  "-mocvistainstall",        "-addshortcuts",
    "-uninstalloldoini",     "-delupdtemp"};
const std::vector<std::string> kUninstallRoad = {
    "-disablesametime8confige", "-disableSTembedded", "-delnifiles",   "-delsametimefiles",
    "-smsuninstallsmarttag",    "-delunuseddata",     "-delallqmfiles"};

// A difference between two states of the machine that the road makes on
// purpose: "added", "removed" or "changed" and the item ("*" stands for any
// run of characters, "?" for one).
struct Intended {
    const char* pattern;
    const char* why;
};

const std::vector<Intended> kUninstallLeftovers = {
    {"added HKCU*\\SmartTagActions\\", "Office's key of smart-tag actions, left empty"},
    {"added HKCU\\Mirovan\\", "the vendor key above the suite's removed settings"},
    {"added HKLM*\\Policies\\", "the machine's policy key, above Communicator's"},
    {"added HKLM*\\Policies\\Communicator\\*",
     "the presence state: no keyword removes Communicator's custom-state policy"},
    {"added ProgramData\\Quillmark Tools\\", "the folder of the status file the policy names"},
    {"added ProgramData\\Quillmark Tools\\status.xml", "the status file the policy names"},
    {"removed *\\last.config.stamp", "each stamp reset makes Eclipse re-read its configuration"},
    {"added *\\last.config.stamp.bak", "the reset stamp's backup"},
    {"added Sametime\\rcp\\msvc?120.dll",
     "the C runtime stays beside Sametime: the removal deletes only the older runtime's names"},
};
const std::vector<Intended> kRepairChanges = {
    {"changed *.lnk", "a shortcut saved again records the file times of its target's path anew"},
    {"removed *\\last.config.stamp.bak",
     "a second stamp reset finds no stamp and drops the first one's backup"},
};

bool Matches(const char* pattern, const std::string& text) {
    return PathMatchSpecA(text.c_str(), pattern);
}

// Item -> content, over the files and registry keys of the products concerned.
using Snapshot = std::map<std::string, std::string>;

// An Eclipse configuration as its elements and attributes: the DOM that
// rewrites it drops the white space between elements and closes empty ones.
std::string XmlContent(const std::string& xml) {
    std::string compact = std::regex_replace(xml, std::regex(">\\s+<"), "><");
    return std::regex_replace(compact, std::regex("<([\\w.]+)([^<>]*[^/<>])></\\1>"), "<$1$2/>");
}

void AddFiles(Snapshot& snapshot, const std::string& label, const std::wstring& root) {
    for (const auto& item : TreeSnapshot(root)) {
        std::string name = Narrow(item.first);
        std::string bytes = ReadFileBytes(JoinPath(root, item.first));
        snapshot[label + "\\" + name] = Matches("*platform.xml", name) ? XmlContent(bytes) : bytes;
    }
}

void AddKey(Snapshot& snapshot, const std::string& label, HKEY root, const std::wstring& key,
            REGSAM view = 0) {
    HKEY opened = nullptr;
    if (RegOpenKeyExW(root, key.c_str(), 0, KEY_READ | view, &opened) != ERROR_SUCCESS) {
        return;
    }
    snapshot[label + "\\"] = "";
    static wchar_t name[16384];
    static BYTE data[65536];
    DWORD nameChars = 16384, size = sizeof(data), type = 0;
    for (DWORD i = 0;
         RegEnumValueW(opened, i, name, &nameChars, nullptr, &type, data, &size) == ERROR_SUCCESS;
         ++i, nameChars = 16384, size = sizeof(data)) {
        snapshot[label + "\\" + Narrow(name) + "="] =
            std::to_string(type) + ":" + std::string(reinterpret_cast<char*>(data), size);
    }
    std::vector<std::wstring> subkeys;
    for (DWORD i = 0; nameChars = 16384, RegEnumKeyExW(opened, i, name, &nameChars, nullptr,
                                                       nullptr, nullptr, nullptr) == ERROR_SUCCESS;
         ++i) {
        subkeys.push_back(name);
    }
    RegCloseKey(opened);
    for (const std::wstring& subkey : subkeys) {
        AddKey(snapshot, label + "\\" + Narrow(subkey), root, key + L"\\" + subkey, view);
    }
}

// The differences between two snapshots that none of the intended ones explains.
std::vector<std::string> Unexplained(const Snapshot& before, const Snapshot& after,
                                     const std::vector<Intended>& intended) {
    std::vector<std::string> left;
    auto note = [&](const std::string& line) {
        if (std::none_of(intended.begin(), intended.end(),
                         [&](const Intended& item) { return Matches(item.pattern, line); })) {
            left.push_back(line);
        }
    };
    for (const auto& item : before) {
        auto now = after.find(item.first);
        if (now == after.end()) {
            note("removed " + item.first);
        } else if (now->second != item.second) {
            note("changed " + item.first);
        }
    }
    for (const auto& item : after) {
        if (before.count(item.first) == 0) {
            note("added " + item.first);
        }
    }
    return left;
}

std::wstring ShellFolder(int csidl) {
    wchar_t path[MAX_PATH] = {};
    SHGetFolderPathW(nullptr, csidl, nullptr, SHGFP_TYPE_CURRENT, path);
    return path;
}

std::wstring SuiteFolder() {
    return JoinPath(ShellFolder(CSIDL_PROGRAM_FILES), L"Quillmark Tools");
}

class InstallerRoad : public SametimeMachine {
public:
    using SametimeMachine::m_notes;
    using SametimeMachine::Put;

    InstallerRoad() {
        InstallNotes8();
        InstallSametime(8);
        Put(JoinPath(m_notes, L"notes.exe"), "Notes' own program");
        Put(JoinPath(m_notes, L"NIURL.dll"), "Notes' own URL handler");
        Put(JoinPath(m_data, L"notes.ini"), "[Notes]");
        PutEclipseConfig(JoinPath(m_data, L"workspace\\.config\\org.eclipse.update"),
                         "platform:/config/../applications/eclipse/");
        for (const wchar_t* folder :
             {L"Notes\\Data\\workspace\\applications\\eclipse\\plugins",
              L"Notes\\Data\\workspace\\applications\\eclipse\\features", L"Sametime Connect\\rcp",
              L"Sametime Connect\\shared\\eclipse\\plugins",
              L"Sametime Connect\\shared\\eclipse\\features"}) {
            MakeDirs(m_scratch.Sub(folder));
        }
        Put(JoinPath(m_sametime, L"configuration\\org.eclipse.update\\last.config.stamp"), "");
        for (const wchar_t* profile : {L"Lotus", L"IBM"}) {
            PutEclipseConfig(ProfileConfig(profile), "file:../shared/eclipse/");
        }
    }
    ~InstallerRoad() override { Msiexec(std::wstring(L"/x ") + kProductCode); }

    std::wstring ProfileConfig(const wchar_t* profile) const {
        return JoinPath(RoamingAppData(),
                        std::wstring(profile) + L"\\Sametime\\.config\\org.eclipse.update");
    }

    Snapshot TakeSnapshot() const {
        Snapshot snapshot;
        AddFiles(snapshot, "Notes", m_notes);
        AddFiles(snapshot, "Sametime", m_sametime);
        AddFiles(snapshot, "Suite", SuiteFolder());
        for (const wchar_t* folder : {L"Lotus", L"IBM", L"Mirovan"}) {
            AddFiles(snapshot, "AppData\\" + Narrow(folder), JoinPath(RoamingAppData(), folder));
        }
        AddFiles(snapshot, "ProgramData", JoinPath(CommonAppData(), L"Mirovan"));
        AddFiles(snapshot, "Programs", ShellFolder(CSIDL_PROGRAMS));
        AddFiles(snapshot, "CommonPrograms", ShellFolder(CSIDL_COMMON_PROGRAMS));
        AddFiles(snapshot, "Desktop", ShellFolder(CSIDL_DESKTOPDIRECTORY));
        AddFiles(snapshot, "CommonDesktop", ShellFolder(CSIDL_COMMON_DESKTOPDIRECTORY));
        for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
            std::string bits = view == 0 ? "" : "64";
            AddKey(snapshot, "HKLM" + bits + "\\Mirovan", HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan",
                   view);
            AddKey(snapshot, "HKLM" + bits + "\\Policies", HKEY_LOCAL_MACHINE,
                   L"SOFTWARE\\Policies\\Microsoft", view);
            AddKey(snapshot, "HKLM" + bits + "\\Uninstall", HKEY_LOCAL_MACHINE,
                   L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall", view);
            AddKey(snapshot, "HKCU" + bits + "\\SmartTagActions", HKEY_CURRENT_USER,
                   L"Software\\Microsoft\\Office\\Common\\Smart Tag\\Actions", view);
        }
        AddKey(snapshot, "HKCU\\Mirovan", HKEY_CURRENT_USER, L"Software\\Mirovan");
        AddKey(snapshot, "HKCU\\Policies", HKEY_CURRENT_USER, L"Software\\Policies\\Microsoft");
        AddKey(snapshot, "Environment", HKEY_LOCAL_MACHINE, kEnvironmentKey);
        snapshot["PendingFileRenameOperations"] = Narrow(
            RegGetString(HKEY_LOCAL_MACHINE, kSessionManagerKey, L"PendingFileRenameOperations")
                .value_or(L""));
        return snapshot;
    }

    // msiexec's exit code; the program's trace records go to the trace log.
    int Msiexec(const std::wstring& arguments) {
        DeleteFileW(m_trace.c_str());
        SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", m_trace.c_str());  // for the custom actions
        return RunDebuggee(L"msiexec.exe " + arguments + L" /qn", m_logs.path(), 300000).exitCode;
    }
    // Installs (or repairs) and uninstalls; the custom actions run in order.
    void Install() {
        ASSERT_EQ(0, Msiexec(L"/i \"" + TestBinDir() + L"\\installer\\QuillmarkTools.msi\""));
        EXPECT_EQ(kInstallRoad, CommandLines());
    }
    void Uninstall() {
        ASSERT_EQ(0, Msiexec(std::wstring(L"/x ") + kProductCode));
        EXPECT_EQ(kUninstallRoad, CommandLines());
    }
    std::string Trace() const { return ReadFileBytes(m_trace); }
    // The command line of each run of the program, in order.
    std::vector<std::string> CommandLines() const {
        const std::string kEntry = "NIHandle lpCmdLine=";
        std::vector<std::string> lines;
        for (const TraceRecord& record : ReadTraceLog(m_trace)) {
            if (record.text.compare(0, kEntry.size(), kEntry) == 0) {
                lines.push_back(
                    record.text.substr(kEntry.size(), record.text.find(',') - kEntry.size()));
            }
        }
        return lines;
    }

    // A file a bad road holds open, as a running Notes client does.
    std::unique_ptr<HeldOpen> m_held;

private:
    void PutEclipseConfig(const std::wstring& folder, const std::string& siteUrl) {
        Put(JoinPath(folder, L"platform.xml"), PlatformXml(siteUrl));
        Put(JoinPath(folder, L"last.config.stamp"), "");
    }

    ScratchDir m_logs{L"log"};
    std::wstring m_trace = m_logs.Sub(L"trace.log");
};

TEST_F(InstallerRoad, InstallRepairUninstallLeavesOnlyWhatIsIntended) {
    Snapshot before = TakeSnapshot();
    Install();
    EXPECT_NE(
        std::string::npos,
        ReadFileBytes(JoinPath(ProfileConfig(L"IBM"), L"platform.xml")).find(kFeatureElement));
    // The suite's own programs keep the user's settings here while in use.
    RegPutString(HKEY_CURRENT_USER, L"Software\\Mirovan\\QmkTools", L"LastSite",
                 L"meet.mirovan.example");
    Snapshot installed = TakeSnapshot();
    EXPECT_EQ(1u, installed.count("ProgramData\\Quillmark Tools\\status.xml"));
    // The one-click, settings, help and uninstall shortcuts in the Start menu.
    EXPECT_EQ(4, std::count_if(installed.begin(), installed.end(), [](const auto& item) {
                  return Matches("Programs\\Mirovan Meetings\\*.lnk", item.first);
              }));

    Install();
    EXPECT_EQ(std::vector<std::string>(), Unexplained(installed, TakeSnapshot(), kRepairChanges));

    Uninstall();
    EXPECT_EQ(std::vector<std::string>(), Unexplained(before, TakeSnapshot(), kUninstallLeftovers));
}

// A machine where something goes wrong on the way.
struct BadRoad {
    const char* name;
    std::function<void(InstallerRoad&)> arrange;         // before the install
    std::function<void(InstallerRoad&)> whileInstalled;  // checks, then the user's doing
    std::vector<Intended> intended;  // intended differences besides the common ones
};

void PrintTo(const BadRoad& road, std::ostream* out) {
    *out << road.name;
}

class InstallerBadRoad : public InstallerRoad, public ::testing::WithParamInterface<BadRoad> {};

TEST_P(InstallerBadRoad, InstallsAndUninstallsKeepingTheUsersFiles) {
    const BadRoad& road = GetParam();
    road.arrange(*this);
    Snapshot before = TakeSnapshot();
    Install();
    road.whileInstalled(*this);
    Uninstall();
    std::vector<Intended> intended = kUninstallLeftovers;
    intended.insert(intended.end(), road.intended.begin(), road.intended.end());
    EXPECT_EQ(std::vector<std::string>(), Unexplained(before, TakeSnapshot(), intended));
}

const BadRoad kBadRoads[] = {
    {"NotesHoldsAPluginFile",
     [](InstallerRoad& road) {
         road.Put(JoinPath(road.m_notes, L"qmnires.dll"), "an earlier release's copy");
         road.m_held = std::make_unique<HeldOpen>(JoinPath(road.m_notes, L"qmnires.dll"),
                                                  kLikeALoadedLibrary);
     },
     [](InstallerRoad& road) {
         EXPECT_EQ("Quillmark Tools 2.0: qmnires.dll\n",
                   ReadFileBytes(JoinPath(road.m_notes, L"qmnires.dll")));
         EXPECT_EQ("an earlier release's copy", road.m_held->Read());
     },
     {{"removed Notes\\qmnires.dll", "the earlier release's copy goes with the plug-in"},
      {"added Notes\\qmnires.dll.*.bak", "the copy Notes held, deleted at the next restart"},
      {"changed PendingFileRenameOperations", "that deletion"}}},
    {"ReadOnlyProfileConfig",
     [](InstallerRoad& road) {
         SetFileAttributesW(JoinPath(road.ProfileConfig(L"Lotus"), L"platform.xml").c_str(),
                            FILE_ATTRIBUTE_READONLY);
     },
     [](InstallerRoad& road) {
         std::wstring config = JoinPath(road.ProfileConfig(L"Lotus"), L"platform.xml");
         EXPECT_EQ(PlatformXml("file:../shared/eclipse/"), ReadFileBytes(config));
         EXPECT_EQ(DWORD(FILE_ATTRIBUTE_READONLY),
                   GetFileAttributesW(config.c_str()) & FILE_ATTRIBUTE_READONLY);
         EXPECT_EQ(1, CountOf(road.Trace(), "UpdateSametime8Config: Save config file failed!"));
     },
     {}},
    {"SuiteFolderDeletedByHand",
     [](InstallerRoad&) {},
     [](InstallerRoad&) { RemoveTree(SuiteFolder()); },
     {}},
};

INSTANTIATE_TEST_SUITE_P(Roads, InstallerBadRoad, ::testing::ValuesIn(kBadRoads),
                         [](const ::testing::TestParamInfo<BadRoad>& info) {
                             return std::string(info.param.name);
                         });

}  // namespace
