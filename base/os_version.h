// Facts about the running Windows: version class, 64-bit, system folders.
#pragma once

#include <windows.h>

// Operating-system classes of GetOSVersionClass.
enum OSVersionClass : int {
    kOSUnknown = 0,
    kOSWin95 = 1,
    kOSWin98 = 2,
    kOSWinNT4 = 3,
    kOSWinMe = 4,
    kOSWin2000 = 5,
    kOSWinXP = 6,
    kOSVistaOrLater = 8,
};

// Classifies a GetVersionExW answer (platform id, major, minor).
int ClassifyOSVersion(DWORD platformId, DWORD major, DWORD minor);
// The class of this system, computed once (0 is not cached).
int GetOSVersionClass();

// 1 on 64-bit Windows, else 0 (cached).
BOOL Is64BitSystem();
// The 64-bit decision from the WOW64-folder lookup's result and error.
BOOL Is64BitFromWow64Lookup(BOOL found, DWORD error);

// The WOW64 system folder ("C:\Windows\SysWOW64"); 0 on 32-bit Windows.
UINT MrvGetSystemWow64Directory(wchar_t* buffer, UINT sizeChars);

// Loads fileName from the 32-bit system folder.
HMODULE LoadSystemLibrary(const wchar_t* fileName);
