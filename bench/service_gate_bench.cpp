// The Suite service gate against the stand-in service (out of process):
//   - event to exit: from the service raising the ending event (DISPID 96) to
//     the end of qmMrvONI.exe (goal: median under 50 ms);
//   - start to first call: from starting qmMrvONI.exe to the first method
//     call reaching the service, with the service started by the activation
//     (cold) and already running (warm);
// each over 20 runs, against the start-to-exit time of an empty program.
#include <windows.h>

#include <cstdio>
#include <string>

#include "actions/suite_service_com.h"
#include "base/com_owners.h"
#include "bench/process_timing.h"
#include "tests/fakes/qmsrv/stand_in_control.h"

namespace {

void Measure(ServiceStandIn& service, const std::wstring& commandLine, int runs, bool cold,
             Series& firstCall, Series& eventToExit) {
    for (int i = 0; i < runs; ++i) {
        service.SetScript("Event=StartOCMeeting Meeting 96 300 1\n");
        if (cold) {
            ServiceStandIn::WaitForServersToEnd();
        }
        double start = NowMilliseconds();
        int exitCode = RunQuietly(commandLine);
        double end = NowMilliseconds();
        double call = service.TimeOf("call", "HasValidAccount");
        double event = service.TimeOf("event", "Meeting.96");
        if (exitCode != 0 || call < 0 || event < 0) {
            printf("  run %d: no call or event reached the service\n", i);
            continue;
        }
        firstCall.ms.push_back(call - start);
        eventToExit.ms.push_back(end - event);
    }
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    int runs = argc > 1 ? _wtoi(argv[1]) : 20;
    if (runs <= 0) {
        runs = 20;
    }
    std::wstring bin = BuildBinDir();
    ProgramCopy program(L"qm-service-bench");
    std::wstring commandLine =
        program.Quoted() + L" <CmdLine><Action>StartOCMeeting</Action><hWnd>1</hWnd></CmdLine>";

    double emptyMs =
        MeanProcessMilliseconds(L"\"" + bin + L"\\bench\\empty_program.exe\" -nosuchkeyword", runs);
    Series coldCall{"cold start to first call", {}}, coldExit{"cold event to exit", {}};
    Series warmCall{"warm start to first call", {}}, warmExit{"warm event to exit", {}};
    {
        ServiceStandIn service(bin + L"\\fakes\\qmSrv.exe", program.folder() + L"\\service");
        Measure(service, commandLine, runs, true, coldCall, coldExit);
        // Holding one object keeps the service running between the runs.
        CoInitialize(nullptr);
        {
            ComPtr<IUnknown> hold;
            CoCreateInstance(CLSID_Meeting, nullptr, CLSCTX_LOCAL_SERVER, IID_IUnknown,
                             reinterpret_cast<void**>(hold.GetAddressOf()));
            Measure(service, commandLine, runs, false, warmCall, warmExit);
        }
        CoUninitialize();
    }

    printf("Suite service gate, medians of %d runs (ms)\n", runs);
    printf("  empty program, start to exit (baseline)  %8.2f\n", emptyMs);
    for (Series* series : {&coldCall, &coldExit, &warmCall, &warmExit}) {
        printf("  %-40s %8.2f  (%.2f x baseline)\n", series->name, series->Median(),
               series->Median() / emptyMs);
    }
    double goal = warmExit.Median() > coldExit.Median() ? warmExit.Median() : coldExit.Median();
    printf("event to exit under 50 ms: %s\n",
           !warmExit.ms.empty() && goal < 50 ? "MET" : "NOT MET");

    RemoveDirectoryW((program.folder() + L"\\service").c_str());
    return 0;
}
