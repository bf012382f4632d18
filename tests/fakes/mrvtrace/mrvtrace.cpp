// Stand-in for the suite's trace library. Every call is appended to the file
// named by QM_FAKE_TRACE_LOG as
//   "<entry> <level> <module tag or (null)> <length>\n<text>\n"
// where entry is RESIDENT or RAWA. When QM_FAKE_TRACE_FAULT names a text that
// occurs in a record, the call faults with an access violation instead.
#include <windows.h>

#include <cstdio>
#include <cstring>
#include <string>

#include "tests/fakes/common/fake_recorder.h"

namespace {

void Record(const char* entry, DWORD level, const char* moduleTag, const char* text) {
    std::string fault;
    for (wchar_t ch : fake::EnvironmentValue(L"QM_FAKE_TRACE_FAULT")) {
        fault += static_cast<char>(ch);  // an ASCII marker
    }
    std::string body = text ? text : "";
    if (!fault.empty() && body.find(fault) != std::string::npos) {
        volatile int* nowhere = nullptr;
        *nowhere = 1;
    }
    char header[128];
    snprintf(header, sizeof(header), "%s %lu %s %u\n", entry, static_cast<unsigned long>(level),
             moduleTag ? moduleTag : "(null)", static_cast<unsigned>(body.size()));
    fake::AppendToFileNamedBy(L"QM_FAKE_TRACE_LOG", header + body + "\n");
}

}  // namespace

extern "C" {

void __cdecl MRVTRACERAWA(DWORD level, const char* moduleTag, DWORD /*reserved*/,
                          const char* text) {
    Record("RAWA", level, moduleTag, text);
}

void __cdecl MRVTRACERAWA_RESIDENT(DWORD level, const char* moduleTag, DWORD /*reserved*/,
                                   const char* text) {
    Record("RESIDENT", level, moduleTag, text);
}

}  // extern "C"
