// The program's main body: tells an Action command from a Maintenance
// command and dispatches it.
#pragma once

#include <windows.h>

#include "actions/command_info.h"

// The exit code of the one command on the command line.
int RunCommandLine(HINSTANCE instance, HINSTANCE previousInstance, const wchar_t* commandLine,
                   int showCommand);

// Runs the handler of a parsed Action command and returns its exit code.
// commandLine is the whole command line as received (PostAttendee reads it).
int DispatchAction(CommandInfo& commandInfo, const wchar_t* commandLine);
