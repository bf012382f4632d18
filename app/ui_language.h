// UI language: the suite's chosen language as a two-letter code and its
// Windows LANGID.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

// The code chosen for the suite, upper case and trimmed.
CStringEx GetUILanguageCode();

// The LANGID of a code (case-insensitive); 1033 when unknown.
LANGID LanguageCodeToLangId(const wchar_t* code);
