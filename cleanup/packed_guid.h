// Windows Installer files product and upgrade codes in the registry as
// "packed" GUIDs: 32 hex digits, the first three groups reversed and the
// rest swapped in pairs. These turn them into the braced form.
#pragma once

#include <stddef.h>

// Braced form of the first 32 characters of packed, into out (capacity in
// characters, at least 39). The input is not checked: a short input gives a
// braced string of what is there. False only when out is null or too small.
bool PackedGuidToGuid(const wchar_t* packed, wchar_t* out, size_t outChars);

// The checked form: false (out emptied) unless packed is exactly 32 characters.
bool PackedGuidStringToGuid(const wchar_t* packed, wchar_t* out, size_t outChars);
