// The Maintenance command dispatcher: finds the keyword after "-" or "/",
// runs the one job it names and returns that keyword's result.
#pragma once

#include <windows.h>

int NIHandle(HINSTANCE instance, const wchar_t* commandLine, int showCommand);

// The rest of the command line after its first "-" or "/" (scanned with
// CharNextW); null when there is no delimiter.
const wchar_t* FindMaintenanceKeyword(const wchar_t* commandLine);
