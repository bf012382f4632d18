// Path operations of the program: module-relative paths, removing the last
// path element, and the suite's root folder.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

class CPathApi {
public:
    // out = folder of `module`'s executable file joined with fileName.
    static void GetResFilePath(HMODULE module, const wchar_t* fileName, CStringEx& out);
    // Removes the last path element in place; an empty path stays empty.
    static void RemoveFileSpec(CStringEx& path);
    // The suite's root folder (may be empty); always true.
    static bool GetQMRootPath(CStringEx& out);
};
