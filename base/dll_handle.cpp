#include "base/dll_handle.h"

#include "base/os_version.h"

// Function-local statics: loaded on first use, freed at process exit.
HMODULE Advapi32Module() {
    static CDLLHandle advapi32(LoadSystemLibrary(L"advapi32.dll"), TRUE);
    return advapi32.Handle();
}

HMODULE Userenv32Module() {
    static CDLLHandle userenv(LoadSystemLibrary(L"userenv.dll"), TRUE);
    return userenv.Handle();
}
