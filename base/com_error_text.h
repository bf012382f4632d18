// The message text of a COM error code, as COM error objects give it: the
// system's text without its closing line break, else "IDispatch error #n"
// for the interface-defined codes from 0x80040200, else "Unknown error 0x...".
#pragma once

#include <windows.h>

#include <string>

std::wstring ComErrorMessageText(HRESULT hr);
