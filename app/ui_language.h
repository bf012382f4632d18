// UI language: the suite's chosen language as a two-letter code and its
// Windows LANGID, set as the main thread's UI language at start-up.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

// The code chosen for the suite, upper case and trimmed: the user's
// "QMUILanguage", else the machine's (only a known code), else the code of
// the installed product's language.
CStringEx GetUILanguageCode();

// The machine's "QMUILanguage" (32-bit view), upper case and trimmed, when
// it is one of the known codes; else empty.
CStringEx FindUILanguageInMachineKey();

// The code of the installed product's "Language"; "EN" when there is no
// product, no value or no known LANGID.
void LangIdToLanguageCode(CStringEx& code);

// The code of a LANGID; "EN" when unknown.
const wchar_t* LanguageCodeOfLangId(LANGID langId);

// The uninstall key (below HKEY_LOCAL_MACHINE, 32-bit view) of the first
// installed product of the suite's upgrade codes, or empty.
CStringEx FindSuiteUninstallKey();

// The LANGID of a code (case-insensitive); 1033 when unknown.
LANGID LanguageCodeToLangId(const wchar_t* code);

// Sets the main thread's UI language to the suite's chosen one and reports
// the LANGID to the debugger output; returns it.
LANGID SetProgramUILanguage();
