// Start-up steps of the entry point: the DEP switch and the suite library
// held for the program's lifetime.
#pragma once

#include <windows.h>

// Turns data execution prevention off for this process; 1 when the switch was
// made, 0 otherwise.
int DisableDEP();

// Loads qmusredt.dll from the folder of the module that holds this code and
// resolves exportName; the module handle goes to moduleHandle.
FARPROC LoadSuiteLibraryExport(const char* exportName, HMODULE* moduleHandle);

// Holds qmusredt.dll from construction (with the flag 1) to its end.
class SuiteLibraryHolder {
public:
    explicit SuiteLibraryHolder(int load);
    ~SuiteLibraryHolder();
    SuiteLibraryHolder(const SuiteLibraryHolder&) = delete;
    SuiteLibraryHolder& operator=(const SuiteLibraryHolder&) = delete;

    HMODULE Module() const { return m_module; }
    void End();

private:
    HMODULE m_module = nullptr;
};
