// The search of the installed-programs list for Sametime Connect, with the
// clock as a parameter so its time budget can be checked without waiting.
#pragma once

#include <windows.h>

// Milliseconds since some fixed moment, like GetTickCount.
using TickSource = DWORD (*)();

// How long the search may enumerate before Sametime counts as not installed.
constexpr DWORD kSametimeSearchBudgetMs = 20000;

// GetSametimePath with `ticks` as its clock.
bool GetSametimePathWithClock(wchar_t* lpszPath, DWORD capacity, DWORD* version, TickSource ticks);
