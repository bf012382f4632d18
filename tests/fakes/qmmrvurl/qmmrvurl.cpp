// Stand-in for the suite's URL library: its URL object records the slots
// called, in order. With QM_FAKE_URL_MODE=message the request completes
// through a timer message of the caller's thread, which then posts WM_QUIT.
#include <windows.h>

#include <string>

#include "actions/mrv_url.h"
#include "tests/fakes/common/fake_recorder.h"
#include "tests/fakes/common/fake_text.h"

namespace {

void Record(const std::string& line) {
    fake::RecordCall("URL " + line);
}

void CALLBACK CompleteRequest(HWND, UINT, UINT_PTR timer, DWORD) {
    KillTimer(nullptr, timer);
    Record("completed by a message of the caller's thread");
    PostQuitMessage(0);
}

class UrlObject final : public IMrvURL {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** out) override {
        if (iid == IID_IUnknown || iid == IID_IMrvURL) {
            *out = this;
            AddRef();
            return S_OK;
        }
        *out = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++m_refs; }
    ULONG STDMETHODCALLTYPE Release() override {
        if (--m_refs == 0) {
            Record("released");
            delete this;
            return 0;
        }
        return m_refs;
    }
    HRESULT STDMETHODCALLTYPE Reserved3() override { return Unexpected(3); }
    HRESULT STDMETHODCALLTYPE Begin(LONG value) override {
        Record("slot4 " + std::to_string(value));
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE Reserved5() override { return Unexpected(5); }
    HRESULT STDMETHODCALLTYPE SetWaitSeconds(LONG seconds) override {
        Record("slot6 " + std::to_string(seconds));
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE Reserved7() override { return Unexpected(7); }
    HRESULT STDMETHODCALLTYPE Reserved8() override { return Unexpected(8); }
    HRESULT STDMETHODCALLTYPE Reserved9() override { return Unexpected(9); }
    HRESULT STDMETHODCALLTYPE Reserved10() override { return Unexpected(10); }
    HRESULT STDMETHODCALLTYPE Request(BSTR url, BSTR data, LONG flags, LONG reserved) override {
        Record("slot11 url=" + fake::Utf8(url) + " data=" + fake::Utf8(data) + " " +
               std::to_string(flags) + " " + std::to_string(reserved));
        if (fake::EnvironmentValue(L"QM_FAKE_URL_MODE") == L"message") {
            SetTimer(nullptr, 0, 100, CompleteRequest);
        }
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE End() override {
        Record("slot12");
        return S_OK;
    }

private:
    HRESULT Unexpected(int slot) {
        Record("slot" + std::to_string(slot));
        return E_NOTIMPL;
    }
    ULONG m_refs = 1;
};

class Factory : public IClassFactory {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** out) override {
        if (iid == IID_IUnknown || iid == IID_IClassFactory) {
            *out = this;
            return S_OK;
        }
        *out = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return 2; }
    ULONG STDMETHODCALLTYPE Release() override { return 1; }
    HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID iid, void** out) override {
        if (outer != nullptr) {
            return CLASS_E_NOAGGREGATION;
        }
        UrlObject* object = new UrlObject();
        HRESULT hr = object->QueryInterface(iid, out);
        object->Release();
        return hr;
    }
    HRESULT STDMETHODCALLTYPE LockServer(BOOL) override { return S_OK; }
};

Factory g_factory;

}  // namespace

extern "C" HRESULT WINAPI DllGetClassObject(REFCLSID clsid, REFIID iid, void** out) {
    if (clsid != CLSID_MrvURL) {
        *out = nullptr;
        return CLASS_E_CLASSNOTAVAILABLE;
    }
    return g_factory.QueryInterface(iid, out);
}
