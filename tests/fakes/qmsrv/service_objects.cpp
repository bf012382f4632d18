#include "tests/fakes/qmsrv/service_objects.h"

#include <cstdio>

#include "tests/support/file_util.h"

namespace fake {

namespace {

std::map<UINT_PTR, std::function<void()>>& PendingActions() {
    static std::map<UINT_PTR, std::function<void()>> actions;
    return actions;
}

void CALLBACK RunPending(HWND, UINT, UINT_PTR id, DWORD) {
    KillTimer(nullptr, id);
    auto found = PendingActions().find(id);
    if (found == PendingActions().end()) {
        return;
    }
    std::function<void()> action = found->second;
    PendingActions().erase(found);
    action();
    QuitWhenUnused();
}

std::string HexCode(HRESULT hr) {
    char text[16];
    snprintf(text, sizeof(text), "0x%08lX", static_cast<unsigned long>(hr));
    return text;
}

BSTR ScriptText(const char* key) {
    return SysAllocString(::Widen(State().script.Value(key)).c_str());
}

}  // namespace

ServerState& State() {
    static ServerState state;
    return state;
}

void QuitWhenUnused() {
    if (State().liveObjects == 0 && State().locks == 0 && PendingActions().empty()) {
        PostThreadMessageW(State().mainThread, WM_QUIT, 0, 0);
    }
}

void RunLater(int delayMs, std::function<void()> action) {
    UINT_PTR id = SetTimer(nullptr, 0, delayMs > 0 ? delayMs : 1, RunPending);
    if (id != 0) {
        PendingActions()[id] = action;
    }
}

template <class Iface>
HRESULT ServiceObject<Iface>::Advise(IUnknown* sink, DWORD* cookie) {
    if (sink == nullptr || cookie == nullptr) {
        return E_POINTER;
    }
    IDispatch* dispatch = nullptr;
    HRESULT hr = sink->QueryInterface(m_diid, reinterpret_cast<void**>(&dispatch));
    LogEntry("advise", m_source, {{false, HexCode(hr)}});
    if (FAILED(hr)) {
        return CONNECT_E_CANNOTCONNECT;
    }
    *cookie = m_nextCookie++;
    m_sinks[*cookie] = dispatch;
    return S_OK;
}

template <class Iface>
HRESULT ServiceObject<Iface>::Unadvise(DWORD cookie) {
    auto found = m_sinks.find(cookie);
    LogEntry("unadvise", m_source, {{false, std::to_string(cookie)}});
    if (found == m_sinks.end()) {
        return CONNECT_E_NOCONNECTION;
    }
    found->second->Release();
    m_sinks.erase(found);
    return S_OK;
}

template <class Iface>
void ServiceObject<Iface>::Raise(DISPID dispid, const std::vector<long>& args) {
    std::vector<VARIANTARG> variants(args.size());
    for (size_t i = 0; i < args.size(); ++i) {  // the last argument comes first
        VariantInit(&variants[i]);
        variants[i].vt = VT_I4;
        variants[i].lVal = args[args.size() - 1 - i];
    }
    DISPPARAMS params = {variants.empty() ? nullptr : variants.data(), nullptr,
                         static_cast<UINT>(variants.size()), 0};
    std::map<DWORD, IDispatch*> sinks = m_sinks;  // a sink may unadvise meanwhile
    for (auto& sink : sinks) {
        sink.second->AddRef();
        LogArg at = CounterMsArg();
        HRESULT hr = sink.second->Invoke(dispid, IID_NULL, 0, DISPATCH_METHOD, &params, nullptr,
                                         nullptr, nullptr);
        LogEntry("event", std::string(m_source) + "." + std::to_string(dispid),
                 {at, {false, HexCode(hr)}});
        sink.second->Release();
    }
}

template <class Iface>
HRESULT ServiceObject<Iface>::Enter(const char* method, const std::vector<LogArg>& args) {
    ServerState& state = State();
    int nth = ++state.callCounts[method];
    std::vector<LogArg> logged = args;
    logged.push_back(CounterMsArg());
    LogEntry("call", method, logged);
    for (const ScriptedFailure& failure : state.script.failures) {
        if (failure.method == method && failure.nthCall == nth) {
            return failure.hr;
        }
    }
    for (const ScriptedEvent& event : state.script.events) {
        if (event.afterMethod != method || event.source != m_source) {
            continue;
        }
        if (event.delayMs < 0) {
            Raise(event.dispid, event.args);
        } else {
            Iface* self = this;
            self->AddRef();
            RunLater(event.delayMs, [this, self, event] {
                Raise(event.dispid, event.args);
                self->Release();
            });
        }
    }
    auto exit = state.script.exitAfter.find(method);
    if (exit != state.script.exitAfter.end()) {
        RunLater(exit->second, [] {
            // Wine's rpcss keeps the classes of a process that ends without
            // revoking them and turns every later activation away.
            for (DWORD cookie : State().classCookies) {
                CoRevokeClassObject(cookie);
            }
            LogEntry("server", "killed", {});
            TerminateProcess(GetCurrentProcess(), 0);
        });
    }
    return S_OK;
}

template class ServiceObject<IMeeting>;
template class ServiceObject<ISetting>;

MeetingObject::MeetingObject() : ServiceObject(IID_IMeeting, DIID__IMeetingEvents, "Meeting") {}

HRESULT MeetingObject::StartOCMeeting(BSTR param, LONG* reserved, LONG* result) {
    *reserved = 0;
    *result = 0;
    HRESULT hr = Enter("StartOCMeeting", {Utf8Arg(param)});
    if (SUCCEEDED(hr)) {
        *result = State().script.Number("StartOCMeetingResult");
    }
    return hr;
}

HRESULT MeetingObject::GetLastError(LONG* error) {
    *error = State().script.Number("LastError");
    return Enter("GetLastError", {});
}

HRESULT MeetingObject::CheckIfDisclaimerInProgress(LONG* inProgress, LONG* result) {
    *inProgress = 0;
    *result = 0;
    HRESULT hr = Enter("CheckIfDisclaimerInProgress", {});
    if (SUCCEEDED(hr) && State().callCounts["CheckIfDisclaimerInProgress"] <=
                             State().script.Number("DisclaimerCount")) {
        *inProgress = 1;
    }
    return hr;
}

SettingObject::SettingObject() : ServiceObject(IID_ISetting, DIID__ISettingEvents, "Setting") {}

HRESULT SettingObject::OpenSettingDlg(BSTR param, LONG* reserved, LONG* result) {
    *reserved = 0;
    *result = 0;
    HRESULT hr = Enter("OpenSettingDlg", {Utf8Arg(param)});
    if (SUCCEEDED(hr)) {
        *result = State().script.Number("OpenSettingDlgResult");
        State().dialogOpened = *result == 0;
        State().dialogOpenedAt = GetTickCount();
    }
    return hr;
}

HRESULT SettingObject::HasValidAccount(VARIANT_BOOL* valid) {
    *valid = State().script.Number("HasValidAccount", 1) ? VARIANT_TRUE : VARIANT_FALSE;
    return Enter("HasValidAccount", {});
}

HRESULT SettingObject::GetAccountInfo(BSTR* account, LONG* result) {
    *account = nullptr;
    *result = 0;
    HRESULT hr = Enter("GetAccountInfo", {});
    if (SUCCEEDED(hr)) {
        *account = ScriptText("AccountInfo");
        *result = State().script.Number("AccountInfoResult");
    }
    return hr;
}

HRESULT SettingObject::IsSettingDlgOpened(VARIANT_BOOL* opened) {
    const ServerState& state = State();
    bool open =
        state.dialogOpened && GetTickCount() - state.dialogOpenedAt <
                                  static_cast<DWORD>(state.script.Number("SettingDlgOpenMs"));
    *opened = open ? VARIANT_TRUE : VARIANT_FALSE;
    return Enter("IsSettingDlgOpened", {});
}

HRESULT SettingObject::GeneralCall(BSTR request, BSTR* response, LONG* result) {
    *response = nullptr;
    *result = 0;
    HRESULT hr = Enter("GeneralCall", {Utf8Arg(request)});
    if (SUCCEEDED(hr)) {
        *response = ScriptText("LoginResponse");
        *result = State().script.Number("GeneralCallResult");
    }
    return hr;
}

}  // namespace fake
