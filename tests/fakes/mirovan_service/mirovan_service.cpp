// Stand-in for the suite's update service "MirovanService", run by the
// service control manager. Its command line scripts how it stops:
//   mirovan_service.exe <calls log> <wait hint ms> <polls | never>
// On the stop request it reports SERVICE_STOP_PENDING with that wait hint and
// reaches SERVICE_STOPPED half a wait hint before the caller's given number of
// polls is over, or never. Setting the event "Global\QMFakeMirovanServiceRelease"
// stops it at once in either case. Each step goes to the calls log.
#include <windows.h>

#include <cstdlib>
#include <string>

#include "tests/fakes/common/fake_recorder.h"

namespace {

const wchar_t kReleaseEvent[] = L"Global\\QMFakeMirovanServiceRelease";

SERVICE_STATUS_HANDLE g_statusHandle = nullptr;
SERVICE_STATUS g_status = {};
HANDLE g_stopRequested = nullptr;
DWORD g_waitHint = 1000;
int g_polls = 3;  // negative: never stops by itself

void Report(DWORD state, DWORD waitHint) {
    g_status.dwServiceType = SERVICE_WIN32_OWN_PROCESS;
    g_status.dwCurrentState = state;
    g_status.dwControlsAccepted = state == SERVICE_RUNNING ? SERVICE_ACCEPT_STOP : 0;
    g_status.dwWaitHint = waitHint;
    g_status.dwCheckPoint = state == SERVICE_STOP_PENDING ? g_status.dwCheckPoint + 1 : 0;
    SetServiceStatus(g_statusHandle, &g_status);
}

DWORD WINAPI Handler(DWORD control, DWORD, void*, void*) {
    if (control == SERVICE_CONTROL_STOP) {
        fake::RecordCall("MirovanService stop requested");
        Report(SERVICE_STOP_PENDING, g_waitHint);
        SetEvent(g_stopRequested);
    } else if (control == SERVICE_CONTROL_INTERROGATE) {
        SetServiceStatus(g_statusHandle, &g_status);
    }
    return NO_ERROR;
}

void WINAPI ServiceMain(DWORD, wchar_t**) {
    g_statusHandle = RegisterServiceCtrlHandlerExW(L"MirovanService", Handler, nullptr);
    g_stopRequested = CreateEventW(nullptr, TRUE, FALSE, nullptr);
    HANDLE release = CreateEventW(nullptr, TRUE, FALSE, kReleaseEvent);
    if (g_statusHandle == nullptr || g_stopRequested == nullptr || release == nullptr) {
        return;
    }
    Report(SERVICE_RUNNING, 0);
    fake::RecordCall("MirovanService running");
    HANDLE waits[] = {g_stopRequested, release};
    if (WaitForMultipleObjects(2, waits, FALSE, INFINITE) == WAIT_OBJECT_0) {
        if (g_polls < 0) {
            // Keeps promising to stop until released.
            while (WaitForSingleObject(release, g_waitHint / 2) == WAIT_TIMEOUT) {
                Report(SERVICE_STOP_PENDING, g_waitHint);
            }
        } else {
            WaitForSingleObject(release, g_polls * g_waitHint - g_waitHint / 2);
        }
    }
    fake::RecordCall("MirovanService stopped");
    Report(SERVICE_STOPPED, 0);
    CloseHandle(release);
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    if (argc < 4) {
        return 2;
    }
    SetEnvironmentVariableW(L"QM_FAKE_CALLS_LOG", argv[1]);
    g_waitHint = static_cast<DWORD>(wcstoul(argv[2], nullptr, 10));
    g_polls = std::wstring(argv[3]) == L"never" ? -1 : _wtoi(argv[3]);
    SERVICE_TABLE_ENTRYW table[] = {{const_cast<wchar_t*>(L"MirovanService"), ServiceMain},
                                    {nullptr, nullptr}};
    return StartServiceCtrlDispatcherW(table) ? 0 : 1;
}
