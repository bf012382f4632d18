// Collects the trace records that code called in this test process writes.
// The trace stand-in lies beside the test programs and appends to the file
// named by QM_FAKE_TRACE_LOG, which this object points at a scratch file.
#pragma once

#include <string>
#include <vector>

#include "tests/support/program_run.h"
#include "tests/support/scratch_dir.h"

class TraceCapture {
public:
    TraceCapture();
    ~TraceCapture();
    TraceCapture(const TraceCapture&) = delete;
    TraceCapture& operator=(const TraceCapture&) = delete;

    std::vector<TraceRecord> Records() const;
    // Texts of all records so far, in order.
    std::vector<std::string> Texts() const;
    bool Has(const std::string& text) const;
    void Clear();

private:
    ScratchDir m_dir;
    std::wstring m_file;
};
