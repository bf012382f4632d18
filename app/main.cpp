// Entry point of qmMrvONI.exe: prepares the process, runs the one command of
// its command line and returns that command's exit code.
#include <windows.h>
#include <objbase.h>
#include <tchar.h>

#include "app/run_command_line.h"
#include "app/startup.h"
#include "app/ui_language.h"
#include "base/trace.h"

// Loads the trace library before the entry point and releases it afterwards.
static MIROVANLOGInitialize g_traceLifetime;

int WINAPI _tWinMain(HINSTANCE instance, HINSTANCE previousInstance, LPTSTR commandLine,
                     int showCommand) {
    if (DisableDEP() == 0) {
        TraceLevel8(TraceValue("qmMrvONI.exe: _tWinMain: Disable DEP failed!\n"));
    }
    CoInitialize(nullptr);
    int exitCode = 0;
    {
        SuiteLibraryHolder suiteLibrary(1);
        SetProgramUILanguage();
        exitCode = RunCommandLine(instance, previousInstance, commandLine, showCommand);
        CoUninitialize();
    }
    return exitCode;
}
