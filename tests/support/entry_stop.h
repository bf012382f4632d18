// Holds a debuggee at the entry of a function of a system library (mapped at
// the same address in every 32-bit process of a prefix) while the test looks
// at the machine: an int3 there, stepped over and set again after each stop.
#pragma once

#include <windows.h>

#include <functional>

class EntryStop {
public:
    EntryStop(const void* function, std::function<void()> onStop)
        : m_address(const_cast<void*>(function)), m_onStop(std::move(onStop)) {}

    // The debugger loop hands each exception event here first; true when it
    // was this stop's own and the debuggee may go on.
    bool OnException(HANDLE process, const DEBUG_EVENT& event);
    int stops() const { return m_stops; }

private:
    bool Put(HANDLE process, BYTE byte);

    void* m_address;
    std::function<void()> m_onStop;
    BYTE m_original = 0;
    bool m_armed = false;
    bool m_stepping = false;
    int m_stops = 0;
};
