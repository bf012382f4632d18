#include "actions/service_event_sinks.h"

HRESULT ForwardServiceEvent(MyIServiceMeetingEvent* owner, DISPID id, const DISPPARAMS& params) {
    long arg0 = DispatchEventSink::Argument(params, 0);
    long arg1 = DispatchEventSink::Argument(params, 1);
    switch (id) {
        case kMeetingEventEnded:
            return owner->OnMeetingEvent96(arg0);
        case kMeetingEventProgress:
            return owner->OnMeetingEvent80(arg0, arg1);
        case kMeetingEventClosed:
            return owner->OnMeetingEvent16(arg0, arg1);
        default:
            return S_OK;
    }
}

HRESULT ForwardServiceEvent(MyIServiceSettingEvent* owner, DISPID id, const DISPPARAMS& params) {
    if (id == kSettingEventFirst || id == kSettingEventSecond) {
        return owner->OnSettingEvent(DispatchEventSink::Argument(params, 0),
                                     DispatchEventSink::Argument(params, 1));
    }
    return S_OK;
}
