#include "cleanup/update_service.h"

#include <stdarg.h>
#include <stdio.h>

#include <algorithm>

#include "base/win_handles.h"

namespace {

const wchar_t kServiceName[] = L"MirovanService";
const DWORD kStopBudgetMs = 60000;
// Added to each wait hint for the time a poll itself takes.
const DWORD kPollCostMs = 10;

// Asks a running service to stop and waits while it says it is stopping:
// each wait hint plus the poll's cost counts against a minute in all. No
// single wait outlasts what is left of that minute, whatever hint (up to
// INFINITE) the service gives.
void StopAndWait(SC_HANDLE service) {
    SERVICE_STATUS status = {};
    BOOL answered = ControlService(service, SERVICE_CONTROL_STOP, &status);
    ULONGLONG waited = 0;
    while (answered) {
        const ULONGLONG left = kStopBudgetMs - waited + 1;
        Sleep(static_cast<DWORD>(std::min<ULONGLONG>(status.dwWaitHint, left)));
        waited += static_cast<ULONGLONG>(status.dwWaitHint) + kPollCostMs;
        answered = QueryServiceStatus(service, &status);
        if (status.dwCurrentState == SERVICE_STOPPED || waited > kStopBudgetMs) {
            break;
        }
    }
}

}  // namespace

void SvcReportEvent(WORD type, const wchar_t* format, ...) {
    wchar_t message[512] = {};
    va_list arguments;
    va_start(arguments, format);
    _vsnwprintf_s(message, 512, _TRUNCATE, format, arguments);
    va_end(arguments);
    HANDLE source = RegisterEventSourceW(nullptr, kServiceName);
    if (source == nullptr) {
        return;
    }
    const wchar_t* strings[] = {message};
    ReportEventW(source, type, 0, 0, nullptr, 1, 0, strings, nullptr);
    DeregisterEventSource(source);
}

BOOL SvcUninstall() {
    UniqueServiceHandle manager(OpenSCManagerW(nullptr, nullptr, SC_MANAGER_ALL_ACCESS));
    if (!manager) {
        SvcReportEvent(EVENTLOG_WARNING_TYPE, L"%s::OpenSCManager(%d)", L"SvcUninstall",
                       static_cast<int>(GetLastError()));
        return FALSE;
    }
    UniqueServiceHandle service(OpenServiceW(manager.get(), kServiceName, SERVICE_ALL_ACCESS));
    if (!service) {
        SvcReportEvent(EVENTLOG_WARNING_TYPE, L"%s::OpenServiceW(%d)", L"SvcUninstall",
                       static_cast<int>(GetLastError()));
        return FALSE;
    }
    // A service that is not running refuses the stop and is deleted at once.
    StopAndWait(service.get());
    // Marked already: the manager deletes it once it has stopped.
    return DeleteService(service.get()) || GetLastError() == ERROR_SERVICE_MARKED_FOR_DELETE;
}
