// Where Notes, Sametime and the suite are installed. Each lookup takes a
// wide-character buffer with its capacity in characters and returns true when
// the location was found and copied; a registry value that does not fit the
// buffer counts as absent. Read-only, except that GetAppDataMrvQMPath creates
// the suite's per-user folders.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

// Default capacity of a location buffer, in characters.
constexpr DWORD kLocationCapacity = MAX_PATH;
// The larger buffers some commands use.
constexpr DWORD kLargeLocationCapacity = 2 * MAX_PATH;

bool GetQMInstallPath(wchar_t* lpszPath, DWORD capacity);
bool GetQMInstallPathFromReg(HKEY root, wchar_t* lpszPath, DWORD capacity);
bool GetNotesPath(wchar_t* lpszPath, DWORD capacity);
// Notes major version: 6, 7, 8 or 9.
DWORD GetNotesVersion();
bool GetNIPath(wchar_t* lpszPath, DWORD capacity);
bool GetNIPathAnyUser(wchar_t* lpszPath, DWORD capacity);
bool GetNotesMultiUser(DWORD* value);
bool IsCitrixServer();
// The Notes program folder when Notes is 8 or later; version gets the Notes version.
bool GetEmbeddedSTPath(wchar_t* lpszPath, DWORD capacity, DWORD* version);
// The Notes data folder of the embedded Sametime.
bool GetEmbeddedSTDataPath(wchar_t* lpszPath, DWORD capacity, DWORD* version);
// The Sametime Connect folder; either the buffer or the version may be null.
bool GetSametimePath(wchar_t* lpszPath, DWORD capacity, DWORD* version);
// Profile 0: "Lotus\Sametime", profile 1: "IBM\Sametime" under the roaming
// application data; true when that platform.xml exists.
bool GetSametimeConfigPath(int profile, CStringEx& out);
// name in the suite's per-user folder "<AppData>\Mirovan\Quillmark Tools".
bool GetAppDataMrvQMPath(const wchar_t* name, CStringEx& out);
// name in "<folder>\Mirovan\Quillmark Tools" under the shell folder csidl
// (CSIDL_APPDATA, CSIDL_COMMON_APPDATA), the two folders created, no link
// below the shell folder; the messages begin with caller.
bool GetMrvQMDataPath(int csidl, const char* caller, const wchar_t* name, CStringEx& out);
