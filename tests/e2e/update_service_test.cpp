// The update service's removal against the prefix's own service manager, with
// a stand-in service that stops after a scripted number of polls or never.
// Its problems go to the event log, which Wine shows on its "eventlog" debug
// channel: the program is run by the host's wine to read that channel.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "cleanup/update_service.h"
#include "tests/support/file_util.h"
#include "tests/support/host_shell.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/test_paths.h"

namespace {

const wchar_t kService[] = L"MirovanService";

struct ServiceRun {
    DWORD elapsedMs = 0;
    std::vector<std::string> events;  // the texts the program reported
};

class UpdateServiceTest : public MachineTest {
protected:
    UpdateServiceTest() : m_manager(OpenSCManagerW(nullptr, nullptr, SC_MANAGER_ALL_ACCESS)) {}
    ~UpdateServiceTest() override {
        HANDLE release =
            OpenEventW(EVENT_MODIFY_STATE, FALSE, L"Global\\QMFakeMirovanServiceRelease");
        if (release != nullptr) {
            SetEvent(release);
            CloseHandle(release);
        }
        SC_HANDLE service = OpenServiceW(m_manager, kService, SERVICE_ALL_ACCESS);
        if (service != nullptr) {
            DeleteService(service);
            CloseServiceHandle(service);
        }
        WaitUntilGone();
        CloseServiceHandle(m_manager);
    }

    // Registers the stand-in and has the service manager start it.
    void Install(const wchar_t* polls) {
        std::wstring command = L"\"" + FakePath(L"mirovan_service.exe") + L"\" \"" +
                               Program().callsLogPath() + L"\" 1000 " + polls;
        SC_HANDLE service =
            CreateServiceW(m_manager, kService, kService, SERVICE_ALL_ACCESS,
                           SERVICE_WIN32_OWN_PROCESS, SERVICE_DEMAND_START, SERVICE_ERROR_IGNORE,
                           command.c_str(), nullptr, nullptr, nullptr, nullptr, nullptr);
        ASSERT_NE(nullptr, service);
        ASSERT_TRUE(StartServiceW(service, 0, nullptr));
        SERVICE_STATUS status = {};
        for (int i = 0; i < 100 && QueryServiceStatus(service, &status) &&
                        status.dwCurrentState != SERVICE_RUNNING;
             ++i) {
            Sleep(100);
        }
        EXPECT_EQ(DWORD(SERVICE_RUNNING), status.dwCurrentState);
        CloseServiceHandle(service);
    }
    bool Installed() {
        SC_HANDLE service = OpenServiceW(m_manager, kService, SERVICE_QUERY_STATUS);
        CloseServiceHandle(service);
        return service != nullptr;
    }
    void WaitUntilGone() {
        for (int i = 0; i < 100 && Installed(); ++i) {
            Sleep(100);
        }
    }

    // -delallqmfiles on a machine without the suite: only the service's part works.
    ServiceRun Run() {
        std::wstring errors = m_scratch.Sub(L"stderr.txt");
        DWORD start = GetTickCount();
        EXPECT_EQ(0,
                  RunHostShell("WINEDEBUG=-all,warn+eventlog wine \"$1\" -delallqmfiles 2>\"$2\"",
                               {Narrow(Program().exePath()), HostPath(errors)}));
        ServiceRun run;
        run.elapsedMs = GetTickCount() - start;
        const std::string marker = ":warn:eventlog:ReportEventW ";
        std::string text = ReadFileBytes(errors);
        for (size_t at = text.find(marker); at != std::string::npos; at = text.find(marker, at)) {
            at += marker.size();
            run.events.push_back(text.substr(at, text.find('\n', at) - at));
        }
        return run;
    }
    std::string Calls() { return ReadFileBytes(Program().callsLogPath()); }

    SC_HANDLE m_manager;
};

TEST_F(UpdateServiceTest, ServiceThatIsNotInstalledGivesOneWarning) {
    ServiceRun run = Run();
    EXPECT_EQ(std::vector<std::string>{"L\"SvcUninstall::OpenServiceW(1060)\""}, run.events);
}

TEST_F(UpdateServiceTest, ServiceIsDeletedOnceItHasStopped) {
    Install(L"3");
    ServiceRun run = Run();
    EXPECT_TRUE(run.events.empty());
    // Gone as the program ends: it waited three wait hints after its pause.
    EXPECT_FALSE(Installed());
    EXPECT_GE(run.elapsedMs, 4000u);
    EXPECT_EQ("MirovanService running\nMirovanService stop requested\nMirovanService stopped\n",
              Calls());
}

TEST_F(UpdateServiceTest, ServiceMarkedForDeletionCountsAsRemoved) {
    Install(L"1");
    SC_HANDLE service = OpenServiceW(m_manager, kService, SERVICE_ALL_ACCESS);
    ASSERT_TRUE(DeleteService(service));
    CloseServiceHandle(service);
    EXPECT_TRUE(SvcUninstall());
    WaitUntilGone();
    EXPECT_FALSE(Installed());
}

// Waits out the 60 s limit: run on its own, labelled slow.
TEST_F(UpdateServiceTest, ServiceThatNeverStopsIsMarkedForDeletionAfterAMinute) {
    Install(L"never");
    ServiceRun run = Run();
    EXPECT_TRUE(run.events.empty());
    EXPECT_GE(run.elapsedMs, 61000u);
    // Marked: the manager deletes it as soon as it stops.
    SC_HANDLE service = OpenServiceW(m_manager, kService, SERVICE_ALL_ACCESS);
    EXPECT_FALSE(DeleteService(service));
    EXPECT_EQ(DWORD(ERROR_SERVICE_MARKED_FOR_DELETE), GetLastError());
    CloseServiceHandle(service);
}

}  // namespace
