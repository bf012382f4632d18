#include "actions/one_click_item_handler.h"

#include "base/message_pump.h"
#include "base/path_api.h"
#include "base/proc_address.h"
#include "base/trace.h"

const CLSID CLSID_OneClickItems = {
    0x2DC92A19, 0x7C88, 0x4B1A, {0x99, 0x19, 0x8E, 0x6B, 0xB3, 0xF6, 0x3D, 0x8D}};
const IID IID_IOneClickItems = {
    0x9066038D, 0xD902, 0x4E44, {0xA9, 0xAE, 0x7B, 0x49, 0x77, 0x58, 0xEC, 0x73}};

namespace {

const wchar_t kOneClickLibrary[] = L"qmMrvMS.DLL";
// How long the process stays responsive after a scheduled meeting starts, so
// the library's windows on this thread keep working.
const DWORD kScheduledMeetingWaitMs = 60000;
// A window chain longer than this is taken to end here.
const int kMaxParentWalk = 256;

using DllGetClassObjectFn = HRESULT(STDAPICALLTYPE*)(REFCLSID, REFIID, void**);

// The methods that take the owner window alone, by Action.
struct OwnerMethod {
    int nAction;
    HRESULT (STDMETHODCALLTYPE IOneClickItems::*method)(long hwndOwner);
};
const OwnerMethod kOwnerMethods[] = {
    {kActionOpenAbout, &IOneClickItems::OpenAbout},
    {kActionOpenHelp, &IOneClickItems::OpenHelp},
    {kActionStartOCMeeting, &IOneClickItems::StartOCMeeting},
    {kActionStartAudioOnly, &IOneClickItems::StartAudioOnly},
    {kActionStartScheduledMeeting, &IOneClickItems::StartScheduledMeeting},
    {kActionJoinMeeting, &IOneClickItems::JoinMeeting},
    {kActionOpenQMSetting, &IOneClickItems::OpenQMSetting},
    {kActionScheduleMeeting, &IOneClickItems::ScheduleMeeting},
};

long WindowArgument(HWND window) {
    return HandleToLong(window);
}

}  // namespace

HWND OwnerWindowUnderCursor() {
    POINT cursor = {};
    if (!GetCursorPos(&cursor)) {
        return nullptr;
    }
    HWND owner = WindowFromPoint(cursor);
    for (int i = 0; owner != nullptr && i < kMaxParentWalk; ++i) {
        HWND parent = GetParent(owner);
        if (parent == nullptr) {
            break;
        }
        owner = parent;
    }
    return owner;
}

COneClickItemHandler::COneClickItemHandler(const wchar_t* browserName)
    : m_browserName(browserName) {}

COneClickItemHandler::~COneClickItemHandler() = default;

int COneClickItemHandler::CreateOneClickObject() {
    if (!m_spOneClickItems) {
        if (!m_module) {
            CStringEx path;
            CPathApi::GetResFilePath(nullptr, kOneClickLibrary, path);
            if (!path.IsEmpty()) {
                m_module.reset(LoadLibraryW(path.c_str()));
            }
        }
        auto getClassObject = GetProcAs<DllGetClassObjectFn>(m_module.get(), "DllGetClassObject");
        if (getClassObject != nullptr) {
            ComPtr<IClassFactory> factory;
            if (SUCCEEDED(getClassObject(CLSID_OneClickItems, IID_IClassFactory,
                                         reinterpret_cast<void**>(factory.GetAddressOf()))) &&
                factory) {
                factory->CreateInstance(
                    nullptr, IID_IOneClickItems,
                    reinterpret_cast<void**>(m_spOneClickItems.ReleaseAndGetAddressOf()));
            }
        }
        if (m_spOneClickItems && !m_browserName.IsEmpty()) {
            UniqueBstr browser(SysAllocString(m_browserName.c_str()));
            m_spOneClickItems->SetBrowser(browser.get());
        }
    }
    if (!m_spOneClickItems) {
        TraceLevel8(TraceValue("Failed CoCreateInstance\n"));
        return 0;
    }
    return 1;
}

void COneClickItemHandler::FreeOneClickObject() {
    CAutoFunTrace trace("COneClickItemHandler::FreeOneClickObject");
    m_spOneClickItems.Reset();
    m_module.reset();
}

bool COneClickItemHandler::CallActionMethod(int nAction) {
    IOneClickItems* items = m_spOneClickItems.Get();
    if (nAction == kActionShareWindow) {
        // The owner is looked up anew for each argument.
        long owner = WindowArgument(OwnerWindowUnderCursor());
        long shared = WindowArgument(OwnerWindowUnderCursor());
        items->ShareWindow(owner, shared);
        return true;
    }
    for (const OwnerMethod& entry : kOwnerMethods) {
        if (entry.nAction == nAction) {
            (items->*entry.method)(WindowArgument(OwnerWindowUnderCursor()));
            if (nAction == kActionStartScheduledMeeting) {
                DispatchMessagesFor(kScheduledMeetingWaitMs);
            }
            return true;
        }
    }
    return false;
}

int COneClickItemHandler::Handle(CommandInfo& commandInfo) {
    if (!CreateOneClickObject()) {
        TraceLevel8(TraceValue("m_spOneClickItems == NULL"));
        // Left loaded until the process ends: a library whose object could
        // not be made may still run code of its own.
        m_module.release();
        return 0;
    }
    int result = CallActionMethod(commandInfo.nAction) ? 1 : 0;
    FreeOneClickObject();
    return result;
}
