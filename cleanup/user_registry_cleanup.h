// The suite's per-user registry settings: the console user's, and every
// user profile's.
#pragma once

// Removes the suite's start-up entries and settings key of the console user.
void ClearCurUserQMReg();
// Removes subkey (or only the named values) from every loadable profile hive
// and from the calling account's own HKEY_CURRENT_USER (in
// profile_hive_cleanup.cpp).
void DeleteAllCurUserReg(const wchar_t* subkey, const wchar_t* value1, const wchar_t* value2);
