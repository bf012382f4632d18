// Where the suite's trace library writes its trace files: the user's
// temporary folder, or the low-integrity one beside it.
#pragma once

#include <windows.h>

// 1 with a writable trace folder in buffer (size characters), else 0.
BOOL FindTraceFolder(wchar_t* buffer, DWORD size);

// 1 when the folder exists and this process's token may create files in it,
// as the folder's security descriptor says.
BOOL IsFolderWritable(const wchar_t* path, const OSVERSIONINFOW& versionInfo);
