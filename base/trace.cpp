#include "base/trace.h"

#include <shlwapi.h>

#include <cstdio>
#include <string>
#include <vector>

#include "base/ansi_text.h"
#include "base/av_guard.h"
#include "base/proc_address.h"
#include "base/trace_text.h"

namespace {

using MrvTraceFn = void(__cdecl*)(DWORD level, const char* moduleTag, DWORD reserved,
                                  const char* text);

// Process-wide trace state. Plain zero-initialised data, so records logged
// before or after the static initialiser find a consistent state.
HMODULE g_hMrvTracer = nullptr;
MrvTraceFn g_pfnMRVTRACEA = nullptr;
MrvTraceFn g_pfnMrvTraceResident = nullptr;
int g_retryCount = 0;

const int kMaxTraceParams = 11;

std::string HexPointer(const void* pointer) {
    char buffer[16];
    _snprintf(buffer, sizeof(buffer), "0x%08X",
              static_cast<unsigned>(reinterpret_cast<UINT_PTR>(pointer)));
    buffer[sizeof(buffer) - 1] = '\0';
    return buffer;
}

std::string TraceStateLine(const char* function) {
    return std::string(function) +
           ": MRVTRACERAWA=" + HexPointer(reinterpret_cast<const void*>(g_pfnMRVTRACEA)) +
           " MRVTRACERAWA_RESIDENT=" +
           HexPointer(reinterpret_cast<const void*>(g_pfnMrvTraceResident)) +
           " hModule=" + HexPointer(g_hMrvTracer);
}

void DeliverPiece(DWORD level, const std::string& piece) {
    if (g_pfnMrvTraceResident != nullptr) {
        g_pfnMrvTraceResident(level, "QM", 0, piece.c_str());
    } else if (g_pfnMRVTRACEA != nullptr) {
        g_pfnMRVTRACEA(level, nullptr, 0, piece.c_str());
    } else {
        OutputDebugStringA("Trace lib invalid\n");
        OutputDebugStringA(piece.c_str());
    }
}

// Everything that runs foreign code: the lazy second load of the library
// and the deliveries themselves.
struct Delivery {
    DWORD level;
    const std::vector<std::string>* pieces;
};

void Deliver(void* context) {
    const Delivery* delivery = static_cast<const Delivery*>(context);
    if (g_pfnMRVTRACEA == nullptr && g_pfnMrvTraceResident == nullptr && g_retryCount == 0) {
        ++g_retryCount;
        InitMRVTRACER();
    }
    for (const std::string& piece : *delivery->pieces) {
        DeliverPiece(delivery->level, piece);
    }
}

}  // namespace

void TraceOut(DWORD level, const char* prefix, const TraceParam* const* params) {
    std::vector<std::string> pieces =
        SplitTracePieces(BuildTraceText(prefix, params, kMaxTraceParams));
    Delivery delivery{level, &pieces};
    Deliver(&delivery);
}

void trace_detail::GuardedTraceOut(DWORD level, const char* prefix,
                                   const TraceParam* const* params) noexcept {
    // The text is owned here, outside the guard: a fault in the library
    // abandons only the delivery, and the pieces are still freed.
    std::vector<std::string> pieces;
    try {
        pieces = SplitTracePieces(BuildTraceText(prefix, params, kMaxTraceParams));
    } catch (...) {
        return;  // out of memory: the record is dropped
    }
    Delivery delivery{level, &pieces};
    if (RunWithAccessViolationGuard(&Deliver, &delivery)) {
        return;
    }
    if (IsQMDebugMode() == 1) {
        wchar_t caption[MAX_PATH] = {};
        GetModuleFileNameW(nullptr, caption, MAX_PATH);
        MessageBoxW(nullptr, L"AV exception occured!", caption, MB_OK);
    }
}

CAutoFunTrace::CAutoFunTrace(const wchar_t* functionName) : m_name(WideToAnsi(functionName)) {
    TraceLevel2Named(("--> " + m_name).c_str());
}

CAutoFunTrace::~CAutoFunTrace() {
    TraceLevel2Named(("<-- " + m_name).c_str());
}

int IsQMDebugMode() {
    wchar_t value[MAX_PATH] = {};
    DWORD length = GetEnvironmentVariableW(L"QMDebugMode", value, MAX_PATH);
    if (length == 0 || length >= MAX_PATH) {
        return 0;
    }
    return value[0] == L'1' ? 1 : 0;
}

void InitMRVTRACER() {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(GetModuleHandleW(nullptr), path, MAX_PATH);
    if (g_hMrvTracer == nullptr) {
        wchar_t library[MAX_PATH] = {};
        lstrcpynW(library, path, MAX_PATH);
        if (PathRemoveFileSpecW(library) && PathAppendW(library, L"mrvtrace.dll")) {
            g_hMrvTracer = LoadLibraryW(library);
        }
        if (g_hMrvTracer != nullptr) {
            g_pfnMRVTRACEA = GetProcAs<MrvTraceFn>(g_hMrvTracer, "MRVTRACERAWA");
            g_pfnMrvTraceResident = GetProcAs<MrvTraceFn>(g_hMrvTracer, "MRVTRACERAWA_RESIDENT");
        }
    }
    std::string line = TraceStateLine("InitMRVTRACER") + " path=" + WideToAnsi(path) + "\r\n";
    OutputDebugStringA(line.c_str());
}

void UninitMRVTRACER() {
    std::string line = TraceStateLine("UninitMRVTRACER") + "\r\n";
    OutputDebugStringA(line.c_str());
    g_pfnMRVTRACEA = nullptr;
    g_pfnMrvTraceResident = nullptr;
    if (g_hMrvTracer != nullptr) {
        FreeLibrary(g_hMrvTracer);
        g_hMrvTracer = nullptr;
    }
}

MIROVANLOGInitialize::MIROVANLOGInitialize() {
    InitMRVTRACER();
    OutputDebugStringW(L"MIROVANLOGInitialize\n");
}

MIROVANLOGInitialize::~MIROVANLOGInitialize() {
    UninitMRVTRACER();
    OutputDebugStringW(L"~MIROVANLOGInitialize\n");
}
