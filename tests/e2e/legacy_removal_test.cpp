// What older releases left behind: the old Outlook integration's files (at the
// next restart), update leftovers, a retired COM registration, and the 64-bit
// add-ins, unregistered for real by the 64-bit regsvr32.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/test_paths.h"

namespace {

const HKEY kMachine = HKEY_LOCAL_MACHINE;
const std::wstring kOldServer = L"CLSID\\{061E7FF2-9750-46FB-AFD6-245CE0AB8549}";
const std::wstring kToolbarClass = L"{90E2BA2E-DD1B-4cde-9134-7A8B86D33CA7}";
const std::wstring kToolbar = L"SOFTWARE\\Microsoft\\Internet Explorer\\Toolbar";
const std::wstring kToolbarKey = L"SOFTWARE\\Classes\\CLSID\\" + kToolbarClass;

class LegacyRemovalTest : public MachineTest {
protected:
    LegacyRemovalTest() : m_suite(m_scratch.Sub(L"suite", true)) {
        RegPutString(kMachine, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", m_suite);
    }
    ~LegacyRemovalTest() override {
        RegRemoveTree(HKEY_CLASSES_ROOT, kOldServer);
        RegRemoveTree(kMachine, kToolbarKey);
        RegRemoveValue(kMachine, kToolbar, kToolbarClass.c_str());
        RegRemoveValue(kMachine, kToolbar, L"QMTest-Neighbour");
    }
    void AddAddin(const wchar_t* name) {
        CopyFileW(FakePath(L"addin64.dll").c_str(), JoinPath(m_suite, name).c_str(), FALSE);
    }

    const std::wstring m_suite;
};

TEST_F(LegacyRemovalTest, OldOutlookFilesAndTheFolderAbove327GoAtRestart) {
    for (const wchar_t* row : {L"Mirovan\\327\\OI", L"Other\\3270\\OI"}) {
        const std::wstring folder = m_scratch.Sub(row, true);
        for (const wchar_t* name : {L"OI3Main.dll", L"mirovanoi.chm", L"notes.txt"}) {
            WriteFileBytes(JoinPath(folder, name), "old");
        }
        RegPutString(HKEY_CLASSES_ROOT, kOldServer + L"\\InprocServer32", L"",
                     folder + L"\\OI3Main.dll");
        const size_t before = PendingDeleteCount();
        Program().Run(L"-uninstalloldoi");
        EXPECT_TRUE(IsPendingDelete(folder + L"\\OI3Main.dll"));
        EXPECT_TRUE(IsPendingDelete(folder + L"\\mirovanoi.chm"));
        EXPECT_TRUE(IsPendingDelete(folder));
        // A folder named 327 above it goes too; one named 3270 is another folder.
        const std::wstring top = row;
        const bool above = IsPendingDelete(m_scratch.Sub(top.substr(0, top.find(L'\\'))));
        EXPECT_EQ(row[0] == L'M', above);
        EXPECT_EQ(before + 3 + above, PendingDeleteCount()) << Narrow(row);
    }
}

TEST_F(LegacyRemovalTest, UpdateLeftoversRetiredClassesAndAddinsGo) {
    const std::wstring updTemp = m_suite + L"\\upd_temp";
    for (const wchar_t* file : {L"a_upd_temp", L"components\\a_upd_temp", L"components\\b.txt",
                                L"chrome\\c_upd_temp", L"..\\x_upd_temp.dat"}) {
        WriteFileBytes(JoinPath(updTemp, file), "left over");
    }
    RegPutString(kMachine, kToolbarKey + L"\\InprocServer32", L"", L"x");
    RegPutString(kMachine, kToolbar, kToolbarClass.c_str(), L"");
    RegPutString(kMachine, kToolbar, L"QMTest-Neighbour", L"");
    AddAddin(L"qmolkadd64.dll");
    AddAddin(L"qmMrvst64.dll");

    // This one changes nothing at all.
    Program().Run(L"-deleteregfeaturecontrol");
    EXPECT_TRUE(FileExists(updTemp + L"\\a_upd_temp"));
    EXPECT_TRUE(RegHasKey(kMachine, kToolbarKey));
    EXPECT_EQ(std::string::npos, ReadFileBytes(Program().callsLogPath()).find("Dll"));

    Program().Run(L"-delupdtemp");
    EXPECT_EQ(std::vector<std::wstring>{L"components"}, ListDir(updTemp));
    EXPECT_EQ(std::vector<std::wstring>{L"b.txt"}, ListDir(updTemp + L"\\components"));
    EXPECT_FALSE(FileExists(m_suite + L"\\x_upd_temp.dat"));
    EXPECT_FALSE(RegHasKey(kMachine, kToolbarKey));
    EXPECT_FALSE(RegHasValue(kMachine, kToolbar, kToolbarClass.c_str()));
    EXPECT_TRUE(RegHasValue(kMachine, kToolbar, L"QMTest-Neighbour"));
    // Each add-in there through the 64-bit regsvr32, working in its folder.
    const std::string calls = ReadFileBytes(Program().callsLogPath());
    for (const wchar_t* addin : {L"qmolkadd64.dll", L"qmMrvst64.dll"}) {
        const std::string path = Narrow(JoinPath(m_suite, addin));
        EXPECT_NE(std::string::npos,
                  calls.find(path + " DllUnregisterServer in " + Narrow(m_suite) +
                             " by C:\\windows\\system32\\regsvr32.exe /s /u \"" + path + "\""))
            << calls;
    }
}

TEST_F(LegacyRemovalTest, Regsvr32ThatCannotStartIsLoggedAndNoErrorBoxWaits) {
    wchar_t system[MAX_PATH] = {};
    ASSERT_NE(0u, GetSystemWow64DirectoryW(system, MAX_PATH));
    const std::wstring regsvr32 = JoinPath(system, L"regsvr32.exe");
    const std::wstring saved = regsvr32 + L".qmsaved";
    AddAddin(L"qmolkadd64.dll");
    // Renamed, not rewritten: the prefix shares that file with its template.
    ASSERT_TRUE(MoveFileW(regsvr32.c_str(), saved.c_str()));
    WriteFileBytes(regsvr32, "not a program");
    RunResult run = Program().Run(L"-delupdtemp", 30000);
    DeleteFileW(regsvr32.c_str());
    MoveFileW(saved.c_str(), regsvr32.c_str());
    EXPECT_FALSE(run.timedOut);
    EXPECT_TRUE(run.HasTraceContaining("Reg64BitDLL: ShellExecuteEx failed, error="));
}

}  // namespace
