// The Suite service's events as the gate receives them: the two owner
// interfaces and the sinks that forward each event by its dispatch
// identifier (arguments as 32-bit values, rgvarg[0] first).
#pragma once

#include "actions/suite_service_com.h"
#include "base/dispatch_event_sink.h"

class MyIServiceMeetingEvent {
public:
    virtual ~MyIServiceMeetingEvent() = default;
    virtual HRESULT OnMeetingEvent96(long arg0) = 0;
    virtual HRESULT OnMeetingEvent80(long arg0, long arg1) = 0;
    virtual HRESULT OnMeetingEvent16(long arg0, long arg1) = 0;
};

class MyIServiceSettingEvent {
public:
    virtual ~MyIServiceSettingEvent() = default;
    // Dispatch identifiers 4 and 5.
    virtual HRESULT OnSettingEvent(long arg0, long arg1) = 0;
};

HRESULT ForwardServiceEvent(MyIServiceMeetingEvent* owner, DISPID id, const DISPPARAMS& params);
HRESULT ForwardServiceEvent(MyIServiceSettingEvent* owner, DISPID id, const DISPPARAMS& params);

// A sink on the event interface *Events that forwards to its owner.
template <class Owner, const IID* Events>
class CConnectPointSink : public DispatchEventSink {
public:
    explicit CConnectPointSink(Owner* owner) : DispatchEventSink(*Events), m_owner(owner) {}

protected:
    HRESULT OnInvoke(DISPID id, const DISPPARAMS& params) override {
        return ForwardServiceEvent(m_owner, id, params);
    }

private:
    Owner* m_owner;
};

using CServiceMeetingSink = CConnectPointSink<MyIServiceMeetingEvent, &DIID__IMeetingEvents>;
using CServiceSettingSink = CConnectPointSink<MyIServiceSettingEvent, &DIID__ISettingEvents>;
