// The suite's companion meeting application, whose installed name decides
// the Start-menu folder of the suite's shortcuts.
#pragma once

#include "base/string_ex.h"

// The companion application's product name: the Start-menu folder when no
// installed name is found.
extern const wchar_t kCompanionProductName[];

// The display name of the installed companion application, found through the
// suite's upgrade codes (each in its registry views, the first non-empty name
// wins), else the suite's "AppName". False, with name empty, when there is
// none or it is 260 characters or longer.
bool GetCompanionAppName(CStringEx& name);
