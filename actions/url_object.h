// Creating the URL object of qmMRVURL.DLL from the program's folder. The
// library stays loaded, once loaded, until UnloadUrlLibrary.
#pragma once

#include <windows.h>

#include "actions/mrv_url.h"

// A new URL object in *object; E_NOINTERFACE when the library or its
// "DllGetClassObject" is missing.
HRESULT CreateUrlObject(IMrvURL** object);
void UnloadUrlLibrary();
