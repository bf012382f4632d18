// The update service's removal, a stand-in service stopping after some polls
// or never. Reports go to the event log, seen on Wine's "eventlog" channel.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "tests/support/file_util.h"
#include "tests/support/host_shell.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/test_paths.h"

namespace {

class UpdateServiceTest : public MachineTest {
protected:
    ~UpdateServiceTest() override {
        HANDLE release =
            OpenEventW(EVENT_MODIFY_STATE, FALSE, L"Global\\QMFakeMirovanServiceRelease");
        if (release != nullptr) {
            SetEvent(release);
            CloseHandle(release);
        }
        Delete();
        for (int i = 0; i < 100 && Installed(); ++i) {
            Sleep(100);
        }
        CloseServiceHandle(m_manager);
    }
    bool Installed() {
        SC_HANDLE service = OpenServiceW(m_manager, L"MirovanService", SERVICE_QUERY_STATUS);
        CloseServiceHandle(service);
        return service != nullptr;
    }
    // DeleteService's error, 0 for none.
    DWORD Delete() {
        SC_HANDLE service = OpenServiceW(m_manager, L"MirovanService", DELETE);
        DWORD error = DeleteService(service) ? 0 : GetLastError();
        CloseServiceHandle(service);
        return error;
    }
    // Registers the stand-in and has the service manager start it.
    void Install(const wchar_t* polls, const wchar_t* waitHint = L"1000") {
        std::wstring command = L"\"" + FakePath(L"mirovan_service.exe") + L"\" \"" +
                               Program().callsLogPath() + L"\" " + waitHint + L" " + polls;
        SC_HANDLE service =
            CreateServiceW(m_manager, L"MirovanService", L"MirovanService", SERVICE_ALL_ACCESS,
                           SERVICE_WIN32_OWN_PROCESS, SERVICE_DEMAND_START, SERVICE_ERROR_IGNORE,
                           command.c_str(), nullptr, nullptr, nullptr, nullptr, nullptr);
        ASSERT_TRUE(StartServiceW(service, 0, nullptr));
        CloseServiceHandle(service);
        for (int i = 0; i < 100 && ReadFileBytes(Program().callsLogPath()).empty(); ++i) {
            Sleep(100);  // until it reports running
        }
    }
    // -delallqmfiles run by the host's wine: its debug output; elapsedMs.
    std::string Run() {
        const std::wstring errors = m_scratch.Sub(L"stderr.txt");
        const DWORD start = GetTickCount();
        EXPECT_EQ(0,
                  RunHostShell("WINEDEBUG=-all,warn+eventlog wine \"$1\" -delallqmfiles 2>\"$2\"",
                               {Narrow(Program().exePath()), HostPath(errors)}));
        elapsedMs = GetTickCount() - start;
        return ReadFileBytes(errors);
    }
    SC_HANDLE m_manager = OpenSCManagerW(nullptr, nullptr, SC_MANAGER_ALL_ACCESS);
    DWORD elapsedMs = 0;
};

TEST_F(UpdateServiceTest, ServiceThatIsNotInstalledGivesOneWarning) {
    const std::string events = Run();
    EXPECT_NE(std::string::npos,
              events.find(":warn:eventlog:ReportEventW L\"SvcUninstall::OpenServiceW(1060)\"\n"))
        << events;
    EXPECT_EQ(events.find("ReportEventW"), events.rfind("ReportEventW"));  // one report
}

TEST_F(UpdateServiceTest, ServiceIsDeletedOnceItHasStopped) {
    Install(L"3");
    EXPECT_EQ(std::string::npos, Run().find("ReportEventW"));
    // Gone as the program ends: it waited three wait hints after its pause.
    EXPECT_FALSE(Installed());
    EXPECT_GE(elapsedMs, 4000u);
}

// Waits out the 60 s limit (labelled slow); the 45 s hint is cut to fit.
TEST_F(UpdateServiceTest, ServiceThatNeverStopsIsMarkedForDeletionAfterAMinute) {
    Install(L"never", L"45000");
    EXPECT_EQ(std::string::npos, Run().find("ReportEventW"));
    EXPECT_GE(elapsedMs, 61000u);
    EXPECT_LT(elapsedMs, 80000u);
    // Marked: the manager deletes it as soon as it stops.
    EXPECT_EQ(DWORD(ERROR_SERVICE_MARKED_FOR_DELETE), Delete());
}

}  // namespace
