// Advising and unadvising an event sink on a COM object's connection point,
// the connection named by the cookie that Advise hands out.
#pragma once

#include <windows.h>
#include <objbase.h>

// Connects sink to source's connection point for the event interface
// `events`; *cookie receives the connection's cookie (0 on failure).
HRESULT AdviseSink(IUnknown* source, const IID& events, IUnknown* sink, DWORD* cookie);

// Ends the connection `cookie` of source's connection point for `events`.
HRESULT UnadviseSink(IUnknown* source, const IID& events, DWORD cookie);
