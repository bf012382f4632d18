// An event sink for a COM object's dispatch event interface (connection
// points): answers QueryInterface for IUnknown, IDispatch and its own event
// interface, does not count references (its owner keeps it alive for as long
// as it is advised), answers E_NOTIMPL for type information and names, and
// hands each Invoke to OnInvoke by dispatch identifier.
//
//   class MySink : public DispatchEventSink {
//   public:
//       MySink() : DispatchEventSink(DIID_MyEvents) {}
//   protected:
//       HRESULT OnInvoke(DISPID id, const DISPPARAMS& params) override { ... }
//   };
//   FindConnectionPointOf(source, DIID_MyEvents, point);   // base/connection_point.h
//   point->Advise(&sink, &cookie);  ...  point->Unadvise(cookie);
#pragma once

#include <windows.h>
#include <oaidl.h>

class DispatchEventSink : public IDispatch {
public:
    explicit DispatchEventSink(const IID& events) : m_events(events) {}
    // Cuts every connection COM still keeps to this sink (a source that went
    // away without unadvising), so nothing calls it after it is gone.
    virtual ~DispatchEventSink();
    DispatchEventSink(const DispatchEventSink&) = delete;
    DispatchEventSink& operator=(const DispatchEventSink&) = delete;

    const IID& EventInterface() const { return m_events; }

    STDMETHODIMP QueryInterface(REFIID riid, void** object) override;
    STDMETHODIMP_(ULONG) AddRef() override { return 1; }
    STDMETHODIMP_(ULONG) Release() override { return 1; }
    STDMETHODIMP GetTypeInfoCount(UINT* count) override;
    STDMETHODIMP GetTypeInfo(UINT, LCID, ITypeInfo**) override { return E_NOTIMPL; }
    STDMETHODIMP GetIDsOfNames(REFIID, LPOLESTR*, UINT, LCID, DISPID*) override {
        return E_NOTIMPL;
    }
    STDMETHODIMP Invoke(DISPID id, REFIID, LCID, WORD, DISPPARAMS* params, VARIANT* result,
                        EXCEPINFO*, UINT*) override;

    // Argument `index` of an event as a 32-bit value (rgvarg[0] is index 0);
    // 0 when the event carries fewer arguments or one of another kind.
    static long Argument(const DISPPARAMS& params, UINT index);

protected:
    virtual HRESULT OnInvoke(DISPID id, const DISPPARAMS& params) = 0;

private:
    const IID m_events;
};
