// Message boxes in the suite's own look, shown by its UI library.
#pragma once

#include <windows.h>

// Shows text and caption through "QclMessageBox" of the suite's qmONIUI.dll
// (arguments as MessageBoxW); its result, 0 when it could not be shown.
int ShowSuiteMessage(HWND owner, const wchar_t* text, const wchar_t* caption, UINT style);
