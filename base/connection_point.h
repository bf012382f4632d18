// The connection point through which a COM object raises one event
// interface. Find it once per object, then Advise a sink (which hands out the
// connection's cookie) and Unadvise that cookie on the same point.
#pragma once

#include <windows.h>
#include <ocidl.h>

#include "base/com_owners.h"

// source's connection point for the event interface `events`; point stays
// empty on failure.
HRESULT FindConnectionPointOf(IUnknown* source, const IID& events, ComPtr<IConnectionPoint>& point);
