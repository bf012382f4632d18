// Wrapper of one Suite service object: creates it on demand, keeps its event
// sinks connected across a re-creation, and runs every call through one
// protocol:
//   - a call made while another call of the same wrapper is in progress (an
//     event arriving inside a call) is turned away at once with
//     RPC_E_CANTCALLOUT_ININPUTSYNCCALL (for VARIANT_BOOL results its low
//     16 bits, which read as true);
//   - otherwise up to two attempts; a failing HRESULT is logged ("Exception",
//     the error's text, the operation's name, "errorID=0x%08X") and answered
//     by re-creating the object (sinks re-advised) before the second attempt.
#pragma once

#include <windows.h>

#include <vector>

#include "base/com_owners.h"
#include "base/connection_point.h"
#include "base/dispatch_event_sink.h"

// The wrappers' own sink: connected while the object exists, reacts to nothing.
class CEmptyEventSink : public DispatchEventSink {
public:
    explicit CEmptyEventSink(const IID& events) : DispatchEventSink(events) {}

protected:
    HRESULT OnInvoke(DISPID, const DISPPARAMS&) override { return S_OK; }
};

class CComWrapBase {
public:
    CComWrapBase(const CLSID& objectClass, const IID& objectInterface, const IID& events);
    virtual ~CComWrapBase();
    CComWrapBase(const CComWrapBase&) = delete;
    CComWrapBase& operator=(const CComWrapBase&) = delete;

    // Connects the wrapper's own empty sink; logs "AtlAdvise fail" with "hr".
    virtual void AdviseOwnSink();

    bool HasObject() const { return m_object != nullptr; }
    IDispatch* Object() const { return m_object.Get(); }

    // Creates the object unless one is held; a failure logs "CreateInstance
    // fail" with "hr". With the auto-advise flag the own sink is connected;
    // so are the other sinks still listed.
    bool CreateInstance();
    // Connects sink to the object's events and keeps it connected across a
    // re-creation; the result of the connection.
    HRESULT Advise(DispatchEventSink* sink);
    // Disconnects sink and forgets it.
    void Unadvise(DispatchEventSink* sink);
    // Disconnects every sink and releases the object.
    void ReleaseInstance();

protected:
    // The call protocol. call(object, &value) makes the COM call and returns
    // its HRESULT; value starts at `initial`, the result when no attempt works.
    template <class Result, class Call>
    Result Protocol(const char* operation, Result initial, Call&& call) {
        if (m_busy) {
            return static_cast<Result>(RPC_E_CANTCALLOUT_ININPUTSYNCCALL);
        }
        m_busy = true;
        Result result = initial;
        try {
            for (int attempt = 0; attempt < 2; ++attempt) {
                if (!HasObject() && !CreateInstance()) {
                    break;
                }
                Result value = initial;
                HRESULT hr = call(m_object.Get(), &value);
                if (SUCCEEDED(hr)) {
                    result = value;
                    break;
                }
                ReportComError(operation, hr);
                ReCreateInstance();
            }
        } catch (...) {
            ReportOtherFailure(operation);
        }
        m_busy = false;
        return result;
    }

private:
    struct AdvisedSink {
        DispatchEventSink* sink;
        DWORD cookie;
    };

    HRESULT Connect(AdvisedSink& entry);
    void Disconnect(AdvisedSink& entry);
    void ReleaseObject();
    void ReCreateInstance();
    static void ReportComError(const char* operation, HRESULT hr);
    static void ReportOtherFailure(const char* operation);

    const CLSID m_class;
    const IID m_interface;
    const IID m_events;
    bool m_autoAdvise = true;
    std::vector<AdvisedSink> m_sinks;
    ComPtr<IDispatch> m_object;
    ComPtr<IConnectionPoint> m_point;  // of m_object, found on the first advise
    bool m_busy = false;
    CEmptyEventSink m_ownSink;
};
