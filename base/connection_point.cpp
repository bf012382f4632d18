#include "base/connection_point.h"

#include <ocidl.h>

#include "base/com_owners.h"

namespace {

HRESULT FindPoint(IUnknown* source, const IID& events, ComPtr<IConnectionPoint>& point) {
    if (source == nullptr) {
        return E_POINTER;
    }
    ComPtr<IConnectionPointContainer> container;
    HRESULT hr = source->QueryInterface(IID_IConnectionPointContainer,
                                        reinterpret_cast<void**>(container.GetAddressOf()));
    if (FAILED(hr)) {
        return hr;
    }
    hr = container->FindConnectionPoint(events, point.GetAddressOf());
    if (SUCCEEDED(hr) && !point) {
        hr = E_FAIL;
    }
    return hr;
}

}  // namespace

HRESULT AdviseSink(IUnknown* source, const IID& events, IUnknown* sink, DWORD* cookie) {
    if (cookie == nullptr || sink == nullptr) {
        return E_POINTER;
    }
    *cookie = 0;
    ComPtr<IConnectionPoint> point;
    HRESULT hr = FindPoint(source, events, point);
    if (SUCCEEDED(hr)) {
        hr = point->Advise(sink, cookie);
        if (FAILED(hr)) {
            *cookie = 0;
        }
    }
    return hr;
}

HRESULT UnadviseSink(IUnknown* source, const IID& events, DWORD cookie) {
    ComPtr<IConnectionPoint> point;
    HRESULT hr = FindPoint(source, events, point);
    return SUCCEEDED(hr) ? point->Unadvise(cookie) : hr;
}
