// The trace log: every record goes to the suite's trace library beside the
// program, or to the debugger output when that library is missing. Logging
// never fails the caller.
//
//   TraceLevel8(TraceValue("Parse cmdline Error"));          // " Parse cmdline Error,\n"
//   TraceLevel1(TraceNamed("szNotesPath", notesPath));
//
// Levels: 8 failures, 4 conditions and outcomes of system calls, 2 detail and
// function entry/exit, 1 progress and parameter dumps.
#pragma once

#include <windows.h>

#include "base/trace_value.h"

enum TraceLevelCode : DWORD {
    kTraceLevel1 = 1,
    kTraceLevel2 = 2,
    kTraceLevel4 = 4,
    kTraceLevel8 = 8,
};

// The core writer: prefix (or null) and up to eleven parameters, the list
// ending at the first null pointer. Not guarded; use the level wrappers.
void TraceOut(DWORD level, const char* prefix, const TraceParam* const* params);

namespace trace_detail {
// TraceOut under the access-violation guard.
void GuardedTraceOut(DWORD level, const char* prefix, const TraceParam* const* params) noexcept;

template <typename... Params>
void Out(DWORD level, const char* prefix, const Params&... params) {
    static_assert(sizeof...(Params) <= 10, "a record takes at most ten parameters");
    const TraceParam* list[] = {static_cast<const TraceParam*>(&params)..., nullptr};
    GuardedTraceOut(level, prefix, list);
}
}  // namespace trace_detail

template <typename... Params>
void TraceLevel1(const Params&... params) {
    trace_detail::Out(kTraceLevel1, "", params...);
}
template <typename... Params>
void TraceLevel2(const Params&... params) {
    trace_detail::Out(kTraceLevel2, "", params...);
}
template <typename... Params>
void TraceLevel4(const Params&... params) {
    trace_detail::Out(kTraceLevel4, "", params...);
}
template <typename... Params>
void TraceLevel8(const Params&... params) {
    trace_detail::Out(kTraceLevel8, "", params...);
}
template <typename... Params>
void TraceLevel2Named(const char* prefix, const Params&... params) {
    trace_detail::Out(kTraceLevel2, prefix, params...);
}

// Entry and exit records of a scope: "--> name ..." now, "<-- name" at the end.
class CAutoFunTrace {
public:
    template <typename... Params>
    explicit CAutoFunTrace(const char* functionName, const Params&... params)
        : m_name(functionName ? functionName : "") {
        TraceLevel2Named(("--> " + m_name).c_str(), params...);
    }
    explicit CAutoFunTrace(const wchar_t* functionName);
    ~CAutoFunTrace();
    CAutoFunTrace(const CAutoFunTrace&) = delete;
    CAutoFunTrace& operator=(const CAutoFunTrace&) = delete;

private:
    std::string m_name;
};

// 1 when the environment variable "QMDebugMode" begins with "1".
int IsQMDebugMode();

// Load and release the trace library beside the program's executable.
void InitMRVTRACER();
void UninitMRVTRACER();

// The program holds one static instance: the trace library is loaded before
// the entry point runs and released after it returns.
class MIROVANLOGInitialize {
public:
    MIROVANLOGInitialize();
    ~MIROVANLOGInitialize();
    MIROVANLOGInitialize(const MIROVANLOGInitialize&) = delete;
    MIROVANLOGInitialize& operator=(const MIROVANLOGInitialize&) = delete;
};
