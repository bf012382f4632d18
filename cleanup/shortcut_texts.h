// The texts of the suite's shortcuts, from the suite's resource libraries in
// its root folder: link names and the Start-menu folder name.
#pragma once

#include <windows.h>

#include "base/string_ex.h"
#include "base/win_handles.h"

// String ids of "qmRes.dll" and "qmOI3Res.dll".
enum ShortcutTextId : UINT {
    kOneClickNameId = 45,     // qmRes.dll
    kSettingsNameId = 384,    // qmOI3Res.dll
    kHelpNameId = 108,        // qmOI3Res.dll
    kUninstallNameId = 3144,  // qmOI3Res.dll
    kSuiteFolderNameId = 3145,
};

// One resource library, loaded from the root folder for the time of an
// operation.
class SuiteTextLibrary {
public:
    SuiteTextLibrary(const CStringEx& root, const wchar_t* fileName);

    // The string, or empty when it is missing or does not fit a path
    // element (260 characters or more).
    CStringEx Text(UINT id) const;

private:
    UniqueModule m_module;
};

// True for a name that can stand as one element of a path: not empty, not
// "." or "..", no separator, drive colon or wildcard.
bool IsPlainName(const CStringEx& name);

// folder\name.lnk, when name is plain and the result fits a path.
bool LinkPathIn(const CStringEx& folder, const CStringEx& name, CStringEx& linkPath);
