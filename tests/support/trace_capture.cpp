#include "tests/support/trace_capture.h"

#include <windows.h>

#include <algorithm>

#include "tests/support/file_util.h"

TraceCapture::TraceCapture() : m_dir(L"trace"), m_file(m_dir.Sub(L"trace.log")) {
    SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", m_file.c_str());
}

TraceCapture::~TraceCapture() {
    SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", nullptr);
}

std::vector<TraceRecord> TraceCapture::Records() const {
    return ParseTraceLog(ReadFileBytes(m_file));
}

std::vector<std::string> TraceCapture::Texts() const {
    std::vector<std::string> texts;
    for (const TraceRecord& record : Records()) {
        texts.push_back(record.text);
    }
    return texts;
}

bool TraceCapture::Has(const std::string& text) const {
    std::vector<std::string> texts = Texts();
    return std::find(texts.begin(), texts.end(), text) != texts.end();
}

void TraceCapture::Clear() {
    DeleteFileW(m_file.c_str());
}
