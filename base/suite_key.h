// The suite's own settings key, under HKEY_LOCAL_MACHINE (32-bit view) and
// under each user's HKEY_CURRENT_USER.
#pragma once

constexpr wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
