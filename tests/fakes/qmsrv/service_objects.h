// The stand-in's Meeting and Setting objects: dual interfaces answered as the
// script says, every call recorded, and one connection point each whose
// events the script raises.
#pragma once

#include <windows.h>
#include <ocidl.h>
#include <olectl.h>

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "qmsrv.h"
#include "tests/fakes/qmsrv/fake_script.h"

namespace fake {

// Process-wide state of the server, used on its one (STA) thread only.
struct ServerState {
    Script script;
    ITypeLib* typeLib = nullptr;
    DWORD mainThread = 0;
    DWORD classCookies[2] = {0, 0};
    long liveObjects = 0;
    long locks = 0;
    std::map<std::string, int> callCounts;
    DWORD dialogOpenedAt = 0;
    bool dialogOpened = false;
};
ServerState& State();

// Ends the message loop once nothing holds the server any more.
void QuitWhenUnused();
// Runs `action` on the server thread after delayMs.
void RunLater(int delayMs, std::function<void()> action);

template <class Iface>
class ServiceObject : public Iface, public IConnectionPointContainer, public IConnectionPoint {
public:
    ServiceObject(const IID& iid, const IID& diid, const char* source)
        : m_iid(iid), m_diid(diid), m_source(source) {
        ++State().liveObjects;
    }
    virtual ~ServiceObject() {
        --State().liveObjects;
        QuitWhenUnused();
    }

    // IUnknown
    STDMETHODIMP QueryInterface(REFIID riid, void** out) override {
        if (out == nullptr) {
            return E_POINTER;
        }
        *out = nullptr;
        if (riid == IID_IUnknown || riid == IID_IDispatch || riid == m_iid) {
            *out = static_cast<Iface*>(this);
        } else if (riid == IID_IConnectionPointContainer) {
            *out = static_cast<IConnectionPointContainer*>(this);
        } else if (riid == IID_IConnectionPoint) {
            *out = static_cast<IConnectionPoint*>(this);
        } else {
            return E_NOINTERFACE;
        }
        AddRef();
        return S_OK;
    }
    STDMETHODIMP_(ULONG) AddRef() override { return ++m_refs; }
    STDMETHODIMP_(ULONG) Release() override {
        ULONG left = --m_refs;
        if (left == 0) {
            delete this;
        }
        return left;
    }

    // IDispatch, through the type library
    STDMETHODIMP GetTypeInfoCount(UINT* count) override {
        *count = 1;
        return S_OK;
    }
    STDMETHODIMP GetTypeInfo(UINT, LCID, ITypeInfo** info) override {
        return State().typeLib->GetTypeInfoOfGuid(m_iid, info);
    }
    STDMETHODIMP GetIDsOfNames(REFIID, LPOLESTR* names, UINT count, LCID, DISPID* ids) override {
        ITypeInfo* info = nullptr;
        HRESULT hr = GetTypeInfo(0, 0, &info);
        if (SUCCEEDED(hr)) {
            hr = DispGetIDsOfNames(info, names, count, ids);
            info->Release();
        }
        return hr;
    }
    STDMETHODIMP Invoke(DISPID id, REFIID, LCID, WORD flags, DISPPARAMS* params, VARIANT* result,
                        EXCEPINFO* excepInfo, UINT* argError) override {
        ITypeInfo* info = nullptr;
        HRESULT hr = GetTypeInfo(0, 0, &info);
        if (SUCCEEDED(hr)) {
            hr = DispInvoke(static_cast<Iface*>(this), info, id, flags, params, result, excepInfo,
                            argError);
            info->Release();
        }
        return hr;
    }

    // IConnectionPointContainer: one point, for the object's event interface
    STDMETHODIMP EnumConnectionPoints(IEnumConnectionPoints**) override { return E_NOTIMPL; }
    STDMETHODIMP FindConnectionPoint(REFIID riid, IConnectionPoint** point) override {
        *point = nullptr;
        if (riid != m_diid) {
            return CONNECT_E_NOCONNECTION;
        }
        *point = this;
        AddRef();
        return S_OK;
    }

    // IConnectionPoint
    STDMETHODIMP GetConnectionInterface(IID* iid) override {
        *iid = m_diid;
        return S_OK;
    }
    STDMETHODIMP GetConnectionPointContainer(IConnectionPointContainer** container) override {
        *container = this;
        AddRef();
        return S_OK;
    }
    STDMETHODIMP Advise(IUnknown* sink, DWORD* cookie) override;
    STDMETHODIMP Unadvise(DWORD cookie) override;
    STDMETHODIMP EnumConnections(IEnumConnections**) override { return E_NOTIMPL; }

    // Raises an event on every advised sink and records it.
    void Raise(DISPID dispid, const std::vector<long>& args);

protected:
    // Counts and records the call, answers a scripted failure, and starts
    // the events and the process end scripted after this method.
    HRESULT Enter(const char* method, const std::vector<LogArg>& args);

private:
    const IID m_iid;
    const IID m_diid;
    const char* m_source;
    ULONG m_refs = 0;
    DWORD m_nextCookie = 1;
    std::map<DWORD, IDispatch*> m_sinks;
};

class MeetingObject : public ServiceObject<IMeeting> {
public:
    static constexpr const char* kName = "Meeting";
    MeetingObject();
    STDMETHODIMP StartOCMeeting(BSTR param, LONG* reserved, LONG* result) override;
    STDMETHODIMP Slot8() override { return Enter("Slot8", {}); }
    STDMETHODIMP Slot9() override { return Enter("Slot9", {}); }
    STDMETHODIMP Slot10() override { return Enter("Slot10", {}); }
    STDMETHODIMP Slot11() override { return Enter("Slot11", {}); }
    STDMETHODIMP Slot12() override { return Enter("Slot12", {}); }
    STDMETHODIMP Slot13() override { return Enter("Slot13", {}); }
    STDMETHODIMP GetLastError(LONG* error) override;
    STDMETHODIMP CheckIfDisclaimerInProgress(LONG* inProgress, LONG* result) override;
};

class SettingObject : public ServiceObject<ISetting> {
public:
    static constexpr const char* kName = "Setting";
    SettingObject();
    STDMETHODIMP OpenSettingDlg(BSTR param, LONG* reserved, LONG* result) override;
    STDMETHODIMP Slot8() override { return Enter("Slot8", {}); }
    STDMETHODIMP Slot9() override { return Enter("Slot9", {}); }
    STDMETHODIMP HasValidAccount(VARIANT_BOOL* valid) override;
    STDMETHODIMP GetAccountInfo(BSTR* account, LONG* result) override;
    STDMETHODIMP IsSettingDlgOpened(VARIANT_BOOL* opened) override;
    STDMETHODIMP Slot13() override { return Enter("Slot13", {}); }
    STDMETHODIMP GeneralCall(BSTR request, BSTR* response, LONG* result) override;
};

}  // namespace fake
