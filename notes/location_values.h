// Registry reading shared by the product location lookups. Every reader
// opens its key, reads and closes it; a value that does not fit the caller's
// buffer counts as absent, and a failed read leaves the buffer all zeros so a
// caller that ignores the result still sees an empty location.
#pragma once

#include <windows.h>

// The Notes keys under HKEY_LOCAL_MACHINE, in the order they are tried.
constexpr int kNotesKeyCount = 4;
extern const wchar_t* const kNotesKeys[kNotesKeyCount];

// Zeroes capacity characters of buffer (a null buffer is left alone).
void ClearLocation(wchar_t* buffer, DWORD capacity);

// Reads value `name` of an open key, whatever its registry type, when its
// stored size (terminator included) is at most capacity characters; the text
// is always terminated. False leaves the buffer zeroed.
bool ReadFittingValue(HKEY key, const wchar_t* name, wchar_t* buffer, DWORD capacity);
// The same after opening root\subkey with `access`.
bool ReadFittingValue(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM access,
                      wchar_t* buffer, DWORD capacity);
// Reads a 4-byte value of root\subkey (opened with KEY_QUERY_VALUE).
bool ReadFourByteValue(HKEY root, const wchar_t* subkey, const wchar_t* name, DWORD* out);
// Reads a 4-byte value of an open key.
bool ReadFourByteValue(HKEY key, const wchar_t* name, DWORD* out);
// True when root\subkey opens with KEY_QUERY_VALUE.
bool CanOpenKey(HKEY root, const wchar_t* subkey);
