// Stand-in for the suite's one-click library qmMrvMS.DLL. Its class factory
// makes the one-click object; every call is recorded in the calls log as
// "<method> <arguments>". The object's table is laid out here from the slot
// numbers the library documents, apart from the program's own declaration,
// so a call through a wrong slot shows as the wrong method.
//   QM_FAKE_ONECLICK_FAIL=DllGetClassObject|CreateInstance  that step fails
// StartScheduledMeeting opens a hidden window "QmFakeOneClickMeeting" on the
// caller's thread that records each message 0x8001 it is handed.
#include <windows.h>
#include <oaidl.h>

#include <string>

#include "tests/fakes/common/fake_recorder.h"

namespace {

const CLSID kClassId = {
    0x2DC92A19, 0x7C88, 0x4B1A, {0x99, 0x19, 0x8E, 0x6B, 0xB3, 0xF6, 0x3D, 0x8D}};
const IID kInterfaceId = {
    0x9066038D, 0xD902, 0x4E44, {0xA9, 0xAE, 0x7B, 0x49, 0x77, 0x58, 0xEC, 0x73}};
const wchar_t kMeetingWindowClass[] = L"QmFakeOneClickMeeting";
const UINT kProbeMessage = 0x8001;

HINSTANCE g_module = nullptr;

bool FailureRequested(const wchar_t* step) {
    return fake::EnvironmentValue(L"QM_FAKE_ONECLICK_FAIL") == step;
}

void RecordWindowCall(const char* method, long window) {
    fake::RecordCall(std::string(method) + " " + std::to_string(window));
}

LRESULT CALLBACK MeetingWindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == kProbeMessage) {
        fake::RecordCall("meeting window got message " + std::to_string(wParam));
        return 0;
    }
    return DefWindowProcW(window, message, wParam, lParam);
}

// Methods in the order of their slots: IUnknown 0-2, IDispatch 3-6, then ours.
class OneClickItems {
public:
    virtual HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** out) {
        if (iid == IID_IUnknown || iid == IID_IDispatch || iid == kInterfaceId) {
            *out = this;
            AddRef();
            return S_OK;
        }
        *out = nullptr;
        return E_NOINTERFACE;
    }
    virtual ULONG STDMETHODCALLTYPE AddRef() { return ++m_refs; }
    virtual ULONG STDMETHODCALLTYPE Release() {
        ULONG left = --m_refs;
        if (left == 0) {
            fake::RecordCall("Released");
            delete this;
        }
        return left;
    }
    virtual HRESULT STDMETHODCALLTYPE GetTypeInfoCount(UINT* count) {
        *count = 0;
        return S_OK;
    }
    virtual HRESULT STDMETHODCALLTYPE GetTypeInfo(UINT, LCID, ITypeInfo**) { return E_NOTIMPL; }
    virtual HRESULT STDMETHODCALLTYPE GetIDsOfNames(REFIID, LPOLESTR*, UINT, LCID, DISPID*) {
        return E_NOTIMPL;
    }
    virtual HRESULT STDMETHODCALLTYPE Invoke(DISPID, REFIID, LCID, WORD, DISPPARAMS*, VARIANT*,
                                             EXCEPINFO*, UINT*) {
        return E_NOTIMPL;
    }
    // Slot 7.
    virtual HRESULT STDMETHODCALLTYPE OpenAbout(long owner) { return Record("OpenAbout", owner); }
    virtual HRESULT STDMETHODCALLTYPE OpenHelp(long owner) { return Record("OpenHelp", owner); }
    virtual HRESULT STDMETHODCALLTYPE Slot9() { return Record("slot 9", 0); }
    virtual HRESULT STDMETHODCALLTYPE Slot10() { return Record("slot 10", 0); }
    virtual HRESULT STDMETHODCALLTYPE ShareWindow(long owner, long shared) {
        fake::RecordCall("ShareWindow " + std::to_string(owner) + " " + std::to_string(shared));
        return S_OK;
    }
    virtual HRESULT STDMETHODCALLTYPE StartOCMeeting(long owner) {
        return Record("StartOCMeeting", owner);
    }
    virtual HRESULT STDMETHODCALLTYPE StartAudioOnly(long owner) {
        return Record("StartAudioOnly", owner);
    }
    virtual HRESULT STDMETHODCALLTYPE StartScheduledMeeting(long owner) {
        WNDCLASSW windowClass = {};
        windowClass.lpfnWndProc = MeetingWindowProc;
        windowClass.hInstance = g_module;
        windowClass.lpszClassName = kMeetingWindowClass;
        RegisterClassW(&windowClass);
        m_meetingWindow = CreateWindowW(kMeetingWindowClass, L"", WS_POPUP, 0, 0, 1, 1, nullptr,
                                        nullptr, g_module, nullptr);
        return Record("StartScheduledMeeting", owner);
    }
    virtual HRESULT STDMETHODCALLTYPE JoinMeeting(long owner) {
        return Record("JoinMeeting", owner);
    }
    virtual HRESULT STDMETHODCALLTYPE OpenQMSetting(long owner) {
        return Record("OpenQMSetting", owner);
    }
    virtual HRESULT STDMETHODCALLTYPE ScheduleMeeting(long owner) {
        return Record("ScheduleMeeting", owner);
    }
    // Slot 18.
    virtual HRESULT STDMETHODCALLTYPE SetBrowser(BSTR name) {
        std::string narrow;
        for (const wchar_t* p = name; p && *p; ++p) {
            narrow += static_cast<char>(*p);
        }
        fake::RecordCall("SetBrowser " + narrow);
        return S_OK;
    }

private:
    virtual ~OneClickItems() {
        if (m_meetingWindow != nullptr) {
            DestroyWindow(m_meetingWindow);
            UnregisterClassW(kMeetingWindowClass, g_module);
        }
    }
    HRESULT Record(const char* method, long owner) {
        RecordWindowCall(method, owner);
        return S_OK;
    }

    ULONG m_refs = 1;
    HWND m_meetingWindow = nullptr;
};

class Factory : public IClassFactory {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** out) override {
        if (iid == IID_IUnknown || iid == IID_IClassFactory) {
            *out = this;
            AddRef();
            return S_OK;
        }
        *out = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++m_refs; }
    ULONG STDMETHODCALLTYPE Release() override {
        ULONG left = --m_refs;
        if (left == 0) {
            delete this;
        }
        return left;
    }
    HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID iid, void** out) override {
        fake::RecordCall("CreateInstance");
        *out = nullptr;
        if (outer != nullptr) {
            return CLASS_E_NOAGGREGATION;
        }
        if (FailureRequested(L"CreateInstance")) {
            return E_FAIL;
        }
        OneClickItems* items = new OneClickItems();
        HRESULT hr = items->QueryInterface(iid, out);
        items->Release();
        return hr;
    }
    HRESULT STDMETHODCALLTYPE LockServer(BOOL) override { return S_OK; }

private:
    virtual ~Factory() = default;
    ULONG m_refs = 1;
};

}  // namespace

extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
    if (reason == DLL_PROCESS_ATTACH) {
        g_module = instance;
        fake::RecordCall("qmMrvMS.DLL loaded");
    } else if (reason == DLL_PROCESS_DETACH) {
        fake::RecordCall("qmMrvMS.DLL unloaded");
    }
    return TRUE;
}

extern "C" HRESULT STDAPICALLTYPE DllGetClassObject(REFCLSID classId, REFIID iid, void** out) {
    fake::RecordCall("DllGetClassObject");
    *out = nullptr;
    if (classId != kClassId || FailureRequested(L"DllGetClassObject")) {
        return CLASS_E_CLASSNOTAVAILABLE;
    }
    Factory* factory = new Factory();
    HRESULT hr = factory->QueryInterface(iid, out);
    factory->Release();
    return hr;
}

extern "C" HRESULT STDAPICALLTYPE DllCanUnloadNow() {
    return S_FALSE;
}
