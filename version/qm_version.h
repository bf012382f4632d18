// The installed suite's version and install folder, as the problem report
// names them. Nothing here logs: a missing or unreadable source only leads to
// the next one.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

// The suite's version: "QM.xml" in the install folder, else the console
// user's "BuildNumber", else the machine's (32-bit registry view). TRUE when
// a non-empty version was found; strVersion is empty otherwise.
BOOL GetQMBuildNumber(CStringEx& strVersion);

// The text of QM/VersionInfo/CurrentVersion in the install folder's
// "QM.xml" (which the user may write when the suite was installed for one
// user, so it is read as untrusted XML).
BOOL GetQMVersionFromXml(CStringEx& strVersion);

// The suite's install folder ("Path"): the machine's (32-bit view), the
// console user's, or that of the per-user uninstall entry when it has an
// "UninstallString". A value that is not a full path counts as absent.
BOOL GetQMInstallFolder(wchar_t* lpszFolder, DWORD capacity);
