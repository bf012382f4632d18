// Where the built program and its test stand-ins are, seen from a test
// executable in build/bin/tests.
#pragma once

#include <string>

std::wstring TestBinDir();                  // build/bin
std::wstring BuiltProgramPath();            // build/bin/qmMrvONI.exe
std::wstring FakePath(const wchar_t* rel);  // build/bin/fakes/<rel>
