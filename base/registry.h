// Registry values: each function opens the key, does one thing and closes it.
// view is 0 (the process's own, 32-bit view) or KEY_WOW64_64KEY, or-ed into
// the access mask. A null root, subkey or value name fails without touching
// the registry. Value readers accept only the exact type asked for.
//
// HKCU redirection: the functions marked below replace HKEY_CURRENT_USER by
// the console user's registry root (GetUserRegRoot) on Windows Vista and later
// (operating-system class 8), so a process running as the system account
// reads and writes the logged-on user's settings.
#pragma once

#include <windows.h>

#include <vector>

#include "base/string_ex.h"
#include "base/win_handles.h"

// The root the redirected functions use for root: the console user's root
// for HKEY_CURRENT_USER on Vista and later, else root itself. For the
// functions that do not redirect, when they must reach the same key.
HKEY RedirectedRoot(HKEY root);

// Creates (or opens) root\subkey with KEY_ALL_ACCESS | view. Not redirected.
UniqueHKey CreateRegKey(HKEY root, const wchar_t* subkey, REGSAM view);
// 1 when root\subkey opens with KEY_QUERY_VALUE | view. Not redirected.
BOOL IsRegKeyExist(HKEY root, const wchar_t* subkey, REGSAM view);
// The value's registry type, 0 on failure. Redirected.
DWORD GetRegValueType(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM view);
// The value's data size in bytes, -1 on failure. Redirected.
LONG GetRegValueSize(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM view);
// Reads a REG_DWORD. Redirected.
BOOL GetRegDWORD(HKEY root, const wchar_t* subkey, const wchar_t* name, DWORD* out, REGSAM view);
// Reads a REG_SZ (not REG_EXPAND_SZ) into buffer (zeroed first); sizeChars is
// the buffer's capacity in characters. Redirected.
BOOL GetRegString(HKEY root, const wchar_t* subkey, const wchar_t* name, wchar_t* buffer,
                  DWORD sizeChars, REGSAM view);
// The same into a string sized from the value. Redirected.
BOOL GetRegString(HKEY root, const wchar_t* subkey, const wchar_t* name, CStringEx& out,
                  REGSAM view);
// Writes text with its terminator as type (REG_SZ or REG_EXPAND_SZ), creating
// the key when missing. Redirected.
BOOL SetRegString(HKEY root, const wchar_t* subkey, const wchar_t* name, const wchar_t* text,
                  REGSAM view, DWORD type = REG_SZ);
// Writes a REG_DWORD, creating the key when missing. Redirected.
BOOL SetRegDWORD(HKEY root, const wchar_t* subkey, const wchar_t* name, DWORD value, REGSAM view);
// Deletes one value. Not redirected.
BOOL DeleteRegValue(HKEY root, const wchar_t* subkey, const wchar_t* name, REGSAM view);
// The value names of root\subkey, appended to names; 0 when a name could not
// be read (longer than 2047 characters): the others are listed all the same.
// Not redirected.
BOOL EnumRegValueNames(HKEY root, const wchar_t* subkey, std::vector<CStringEx>& names,
                       REGSAM view);
