// An owned module handle that may or may not be freed at its end.
#pragma once

#include <windows.h>

class CDLLHandle {
public:
    CDLLHandle(HMODULE module, BOOL owns) : m_module(module), m_owns(owns) {}
    virtual ~CDLLHandle() {
        if (m_owns && m_module != nullptr) {
            FreeLibrary(m_module);
        }
    }
    CDLLHandle(const CDLLHandle&) = delete;
    CDLLHandle& operator=(const CDLLHandle&) = delete;

    HMODULE Handle() const { return m_module; }

private:
    HMODULE m_module;
    BOOL m_owns;
};

// Process-wide handles of the two system libraries the session code uses,
// loaded on first use from the 32-bit system folder.
HMODULE Advapi32Module();
HMODULE Userenv32Module();
