#include "tests/support/entry_stop.h"

namespace {
const BYTE kInt3 = 0xCC;
const DWORD kTrapFlag = 0x100;
}  // namespace

bool EntryStop::Put(HANDLE process, BYTE byte) {
    SIZE_T written = 0;
    return WriteProcessMemory(process, m_address, &byte, 1, &written) && written == 1 &&
           FlushInstructionCache(process, m_address, 1);
}

bool EntryStop::OnException(HANDLE process, const DEBUG_EVENT& event) {
    const EXCEPTION_RECORD& record = event.u.Exception.ExceptionRecord;
    if (record.ExceptionCode == EXCEPTION_SINGLE_STEP && m_stepping) {
        m_stepping = false;
        Put(process, kInt3);
        return true;
    }
    if (record.ExceptionCode != EXCEPTION_BREAKPOINT) {
        return false;
    }
    if (!m_armed) {
        // The loader's breakpoint: the system libraries are mapped by now.
        SIZE_T read = 0;
        m_armed = ReadProcessMemory(process, m_address, &m_original, 1, &read) && read == 1 &&
                  m_original == *static_cast<const BYTE*>(m_address) && Put(process, kInt3);
        return false;
    }
    if (record.ExceptionAddress != m_address) {
        return false;
    }
    ++m_stops;
    m_onStop();
    HANDLE thread = OpenThread(THREAD_GET_CONTEXT | THREAD_SET_CONTEXT, FALSE, event.dwThreadId);
    CONTEXT context = {};
    context.ContextFlags = CONTEXT_CONTROL;
    if (thread != nullptr && GetThreadContext(thread, &context)) {
        // Run the original instruction once, then set the stop again.
        context.Eip = reinterpret_cast<DWORD>(m_address);
        context.EFlags |= kTrapFlag;
        SetThreadContext(thread, &context);
        Put(process, m_original);
        m_stepping = true;
    }
    if (thread != nullptr) {
        CloseHandle(thread);
    }
    return true;
}
