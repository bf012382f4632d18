#include "base/dispatch_event_sink.h"

#include <objbase.h>
#include <oleauto.h>

DispatchEventSink::~DispatchEventSink() {
    CoDisconnectObject(static_cast<IDispatch*>(this), 0);
}

HRESULT DispatchEventSink::QueryInterface(REFIID riid, void** object) {
    if (object == nullptr) {
        return E_POINTER;
    }
    if (riid == IID_IUnknown || riid == IID_IDispatch || riid == m_events) {
        *object = static_cast<IDispatch*>(this);
        return S_OK;
    }
    *object = nullptr;
    return E_NOINTERFACE;
}

HRESULT DispatchEventSink::GetTypeInfoCount(UINT* count) {
    if (count == nullptr) {
        return E_POINTER;
    }
    *count = 0;
    return S_OK;
}

HRESULT DispatchEventSink::Invoke(DISPID id, REFIID, LCID, WORD, DISPPARAMS* params,
                                  VARIANT* result, EXCEPINFO*, UINT*) {
    if (result != nullptr) {
        VariantInit(result);
    }
    DISPPARAMS none = {nullptr, nullptr, 0, 0};
    return OnInvoke(id, params != nullptr ? *params : none);
}

long DispatchEventSink::Argument(const DISPPARAMS& params, UINT index) {
    if (params.rgvarg == nullptr || index >= params.cArgs) {
        return 0;
    }
    VARIANT value;
    VariantInit(&value);
    long number = 0;
    if (SUCCEEDED(VariantChangeType(&value, &params.rgvarg[index], 0, VT_I4))) {
        number = value.lVal;
    }
    VariantClear(&value);
    return number;
}
