#include "base/connection_point.h"

HRESULT FindConnectionPointOf(IUnknown* source, const IID& events,
                              ComPtr<IConnectionPoint>& point) {
    point.Reset();
    if (source == nullptr) {
        return E_POINTER;
    }
    ComPtr<IConnectionPointContainer> container;
    HRESULT hr = source->QueryInterface(IID_IConnectionPointContainer,
                                        reinterpret_cast<void**>(container.GetAddressOf()));
    if (SUCCEEDED(hr)) {
        hr = container->FindConnectionPoint(events, point.GetAddressOf());
    }
    if (SUCCEEDED(hr) && !point) {
        hr = E_FAIL;
    }
    if (FAILED(hr)) {
        point.Reset();
    }
    return hr;
}
