#include "actions/com_wrap_base.h"

#include <algorithm>
#include <cstdio>
#include <string>

#include "base/com_error_text.h"
#include "base/trace.h"

CComWrapBase::CComWrapBase(const CLSID& objectClass, const IID& objectInterface, const IID& events)
    : m_class(objectClass), m_interface(objectInterface), m_events(events), m_ownSink(events) {}

CComWrapBase::~CComWrapBase() {
    ReleaseInstance();
}

void CComWrapBase::AdviseOwnSink() {
    HRESULT hr = Advise(&m_ownSink);
    if (FAILED(hr)) {
        TraceLevel8(TraceValue("AtlAdvise fail"), TraceNamed("hr", static_cast<long>(hr)));
    }
}

bool CComWrapBase::CreateInstance() {
    if (HasObject()) {
        return true;
    }
    HRESULT hr = CoCreateInstance(m_class, nullptr, CLSCTX_ALL, m_interface,
                                  reinterpret_cast<void**>(m_object.GetAddressOf()));
    if (FAILED(hr) || !m_object) {
        m_object.Reset();
        TraceLevel8(TraceValue("CreateInstance fail"), TraceNamed("hr", static_cast<long>(hr)));
        return false;
    }
    if (m_autoAdvise) {
        AdviseOwnSink();
    }
    // Sinks kept from an object that could not be re-created follow this one.
    for (AdvisedSink& entry : m_sinks) {
        if (entry.sink != &m_ownSink) {
            Connect(entry);
        }
    }
    return true;
}

HRESULT CComWrapBase::Connect(AdvisedSink& entry) {
    if (entry.cookie != 0) {
        return S_OK;
    }
    if (!m_point) {
        HRESULT hr = FindConnectionPointOf(m_object.Get(), m_events, m_point);
        if (FAILED(hr)) {
            return hr;
        }
    }
    HRESULT hr = m_point->Advise(entry.sink, &entry.cookie);
    if (FAILED(hr)) {
        entry.cookie = 0;
    }
    return hr;
}

void CComWrapBase::Disconnect(AdvisedSink& entry) {
    if (entry.cookie != 0 && m_point) {
        m_point->Unadvise(entry.cookie);
    }
    entry.cookie = 0;
}

void CComWrapBase::ReleaseObject() {
    for (AdvisedSink& entry : m_sinks) {
        Disconnect(entry);
    }
    m_point.Reset();
    m_object.Reset();
}

HRESULT CComWrapBase::Advise(DispatchEventSink* sink) {
    auto found = std::find_if(m_sinks.begin(), m_sinks.end(),
                              [sink](const AdvisedSink& entry) { return entry.sink == sink; });
    if (found == m_sinks.end()) {
        m_sinks.push_back(AdvisedSink{sink, 0});
        found = m_sinks.end() - 1;
    }
    return m_object ? Connect(*found) : E_POINTER;
}

void CComWrapBase::Unadvise(DispatchEventSink* sink) {
    auto found = std::find_if(m_sinks.begin(), m_sinks.end(),
                              [sink](const AdvisedSink& entry) { return entry.sink == sink; });
    if (found != m_sinks.end()) {
        Disconnect(*found);
        m_sinks.erase(found);
    }
}

void CComWrapBase::ReleaseInstance() {
    ReleaseObject();
    m_sinks.clear();
}

void CComWrapBase::ReCreateInstance() {
    ReleaseObject();
    HRESULT hr = CoCreateInstance(m_class, nullptr, CLSCTX_ALL, m_interface,
                                  reinterpret_cast<void**>(m_object.GetAddressOf()));
    if (FAILED(hr) || !m_object) {
        m_object.Reset();
        TraceLevel8(TraceValue("ReCreateInstance Fail"));
        return;
    }
    for (AdvisedSink& entry : m_sinks) {
        if (FAILED(Connect(entry))) {
            entry.cookie = 0;
            TraceLevel8(TraceValue("AtlAdvise Fail"));
        }
    }
    TraceLevel8(TraceValue("ReCreateInstance Success, qmSrv Recover success"));
}

void CComWrapBase::ReportComError(const char* operation, HRESULT hr) {
    std::wstring message = ComErrorMessageText(hr);
    char code[16];
    snprintf(code, sizeof(code), "0x%08X", static_cast<unsigned>(hr));
    TraceLevel8(TraceValue("Exception"), TraceValue(message.c_str()), TraceValue(operation),
                TraceNamed("errorID", code));
    if (IsQMDebugMode() == 1) {
        MessageBoxW(nullptr, message.c_str(), L"qmSrv exception", MB_OK);
    }
}

void CComWrapBase::ReportOtherFailure(const char* operation) {
    TraceLevel8(TraceValue("Exception:"), TraceValue(operation));
}
