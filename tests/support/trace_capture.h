// Collects the trace records that code called in this test process writes.
// The trace stand-in lies beside the test programs and appends to the file
// named by QM_FAKE_TRACE_LOG, which this object points at a scratch file.
#pragma once

#include <windows.h>

#include <algorithm>
#include <string>
#include <vector>

#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"

class TraceCapture {
public:
    TraceCapture() { SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", m_file.c_str()); }
    ~TraceCapture() { SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", nullptr); }
    TraceCapture(const TraceCapture&) = delete;
    TraceCapture& operator=(const TraceCapture&) = delete;

    std::vector<TraceRecord> Records() const { return ReadTraceLog(m_file); }
    bool Has(const std::string& text) const {
        std::vector<TraceRecord> records = Records();
        return std::any_of(records.begin(), records.end(),
                           [&](const TraceRecord& r) { return r.text == text; });
    }

private:
    ScratchDir m_dir{L"trace"};
    std::wstring m_file = m_dir.Sub(L"trace.log");
};
