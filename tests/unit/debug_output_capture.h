// Collects what this process sends to the debugger output while the object
// lives. OutputDebugString raises a first-chance exception that carries the
// text; a vectored handler sees it before anything else, records it and lets
// the call return.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

class DebugOutputCapture {
public:
    DebugOutputCapture() : m_handler(AddVectoredExceptionHandler(1, &Handler)) { Current() = this; }
    ~DebugOutputCapture() {
        Current() = nullptr;
        RemoveVectoredExceptionHandler(m_handler);
    }
    DebugOutputCapture(const DebugOutputCapture&) = delete;
    DebugOutputCapture& operator=(const DebugOutputCapture&) = delete;

    const std::vector<std::wstring>& lines() const { return m_lines; }
    bool Has(const std::wstring& text) const {
        for (const std::wstring& line : m_lines) {
            if (line == text) {
                return true;
            }
        }
        return false;
    }

private:
    // Newer systems raise the wide form first and fall back to the narrow one.
    static constexpr DWORD kWidePrintException = 0x4001000A;

    static DebugOutputCapture*& Current() {
        static DebugOutputCapture* current = nullptr;
        return current;
    }

    static LONG CALLBACK Handler(EXCEPTION_POINTERS* pointers) {
        const EXCEPTION_RECORD* record = pointers->ExceptionRecord;
        DebugOutputCapture* capture = Current();
        if (capture == nullptr || record->NumberParameters < 2) {
            return EXCEPTION_CONTINUE_SEARCH;
        }
        if (record->ExceptionCode == kWidePrintException) {
            capture->m_lines.push_back(
                reinterpret_cast<const wchar_t*>(record->ExceptionInformation[1]));
            return EXCEPTION_CONTINUE_EXECUTION;
        }
        if (record->ExceptionCode == DBG_PRINTEXCEPTION_C) {
            const char* text = reinterpret_cast<const char*>(record->ExceptionInformation[1]);
            std::wstring wide;
            for (; *text != '\0'; ++text) {
                wide += static_cast<wchar_t>(static_cast<unsigned char>(*text));
            }
            capture->m_lines.push_back(wide);
            return EXCEPTION_CONTINUE_EXECUTION;
        }
        return EXCEPTION_CONTINUE_SEARCH;
    }

    PVOID m_handler;
    std::vector<std::wstring> m_lines;
};
