// Stand-in for the Suite service qmSrv.exe: an out-of-process COM server of
// the Meeting and Setting classes.
//   qmSrv.exe -RegServer     registers its type library (beside it) and classes
//   qmSrv.exe -UnregServer   removes them again
//   qmSrv.exe -Embedding     serves (COM starts it so)
// It ends when nothing holds one of its objects any more.
#include <windows.h>
#include <objbase.h>
#include <shlwapi.h>

#include <string>

#include "tests/fakes/qmsrv/service_objects.h"

namespace {

const wchar_t* const kClassKeys[] = {
    L"Software\\Classes\\CLSID\\{8C5A23F1-A4F2-47F0-8E95-CF33FDDFF1AA}",
    L"Software\\Classes\\CLSID\\{A12A21B3-CFDA-497E-98C0-CE60D4D108C8}",
};

std::wstring OwnPath() {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, path, MAX_PATH);
    return path;
}

std::wstring TypeLibPath() {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, path, MAX_PATH);
    PathRemoveFileSpecW(path);
    PathAppendW(path, L"qmsrv.tlb");
    return path;
}

int Register() {
    ITypeLib* typeLib = nullptr;
    HRESULT hr = LoadTypeLibEx(TypeLibPath().c_str(), REGKIND_REGISTER, &typeLib);
    if (FAILED(hr)) {
        return 1;
    }
    typeLib->Release();
    std::wstring server = L"\"" + OwnPath() + L"\"";
    for (const wchar_t* key : kClassKeys) {
        std::wstring serverKey = std::wstring(key) + L"\\LocalServer32";
        if (RegSetKeyValueW(HKEY_LOCAL_MACHINE, serverKey.c_str(), nullptr, REG_SZ, server.c_str(),
                            static_cast<DWORD>((server.size() + 1) * sizeof(wchar_t))) !=
            ERROR_SUCCESS) {
            return 2;
        }
    }
    return 0;
}

int Unregister() {
    for (const wchar_t* key : kClassKeys) {
        RegDeleteTreeW(HKEY_LOCAL_MACHINE, key);
        RegDeleteKeyW(HKEY_LOCAL_MACHINE, key);
    }
    UnRegisterTypeLib(LIBID_QMSERVICELib, 0, 0, LOCALE_NEUTRAL, SYS_WIN32);
    return 0;
}

template <class Object>
class Factory : public IClassFactory {
public:
    STDMETHODIMP QueryInterface(REFIID riid, void** out) override {
        if (riid == IID_IUnknown || riid == IID_IClassFactory) {
            *out = static_cast<IClassFactory*>(this);
            return S_OK;
        }
        *out = nullptr;
        return E_NOINTERFACE;
    }
    STDMETHODIMP_(ULONG) AddRef() override { return 2; }  // a static object
    STDMETHODIMP_(ULONG) Release() override { return 1; }
    STDMETHODIMP CreateInstance(IUnknown* outer, REFIID riid, void** out) override {
        *out = nullptr;
        if (outer != nullptr) {
            return CLASS_E_NOAGGREGATION;
        }
        Object* object = new Object();
        object->AddRef();
        HRESULT hr = object->QueryInterface(riid, out);
        object->Release();
        fake::LogEntry("create", Object::kName, {fake::CounterMsArg()});
        return hr;
    }
    STDMETHODIMP LockServer(BOOL lock) override {
        fake::State().locks += lock ? 1 : -1;
        fake::QuitWhenUnused();
        return S_OK;
    }
};

void CALLBACK EndServer(HWND, UINT, UINT_PTR, DWORD) {
    PostQuitMessage(0);
}

int Serve() {
    fake::ServerState& state = fake::State();
    state.mainThread = GetCurrentThreadId();
    state.script = fake::LoadScript();
    CoInitialize(nullptr);
    LoadTypeLibEx(TypeLibPath().c_str(), REGKIND_NONE, &state.typeLib);
    static Factory<fake::MeetingObject> meetingFactory;
    static Factory<fake::SettingObject> settingFactory;
    CoRegisterClassObject(CLSID_Meeting, &meetingFactory, CLSCTX_LOCAL_SERVER, REGCLS_MULTIPLEUSE,
                          &state.classCookies[0]);
    CoRegisterClassObject(CLSID_Setting, &settingFactory, CLSCTX_LOCAL_SERVER, REGCLS_MULTIPLEUSE,
                          &state.classCookies[1]);
    fake::LogEntry("server", "start", {{false, std::to_string(GetCurrentProcessId())}});
    // Ends a server nobody ever connects to, or whose client vanished.
    SetTimer(nullptr, 0, 10 * 60 * 1000, EndServer);
    MSG message;
    while (GetMessageW(&message, nullptr, 0, 0) > 0) {
        TranslateMessage(&message);
        DispatchMessageW(&message);
    }
    CoRevokeClassObject(state.classCookies[0]);
    CoRevokeClassObject(state.classCookies[1]);
    fake::LogEntry("server", "exit", {});
    if (state.typeLib != nullptr) {
        state.typeLib->Release();
    }
    CoUninitialize();
    return 0;
}

}  // namespace

int WINAPI wWinMain(HINSTANCE, HINSTANCE, PWSTR commandLine, int) {
    std::wstring line = commandLine ? commandLine : L"";
    if (StrStrIW(line.c_str(), L"RegServer") != nullptr &&
        StrStrIW(line.c_str(), L"UnregServer") == nullptr) {
        return Register();
    }
    if (StrStrIW(line.c_str(), L"UnregServer") != nullptr) {
        return Unregister();
    }
    return Serve();
}
