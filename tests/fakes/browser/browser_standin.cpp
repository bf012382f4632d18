// The objects are laid out as C tables from the system headers: each slot the
// program uses is filled, the others stay empty and are never reached.
#include "tests/fakes/browser/browser_standin.h"

#include <exdisp.h>
#include <mshtml.h>

#include "tests/fakes/browser/page_script.h"
#include "tests/fakes/common/fake_recorder.h"

namespace {

const UINT kShowMessage = WM_APP + 1;
const UINT kScheduleMessage = WM_APP + 2;  // to the window's thread
// The page's answer once the browser has gone: what a proxy answers when the
// process behind it has ended.
const HRESULT kGone = RPC_E_DISCONNECTED;

PageScript g_page;
bool g_ownProcess = false;
HWND g_window = nullptr;
DWORD g_windowThread = 0;
volatile bool g_gone = false;

std::string Narrow(const wchar_t* text) {
    std::string narrow;
    for (const wchar_t* p = text; p && *p; ++p) {
        narrow += static_cast<char>(*p);
    }
    return narrow;
}

void Record(const std::string& line) {
    if (g_page.logPath().empty()) {
        fake::RecordCall(line);
    } else {
        fake::AppendToFile(g_page.logPath(), (g_page.stamp() ? fake::Stamped(line) : line) + "\n");
    }
}

// The result of a page call: failing as the script says, or once gone.
bool Refuses(const char* method, HRESULT* hr) {
    if (g_gone) {
        *hr = kGone;
        return true;
    }
    if (g_page.Fails(method)) {
        *hr = E_FAIL;
        return true;
    }
    return false;
}

// IUnknown and IDispatch of an object whose interface is its first member.
template <typename Object, typename Interface>
struct Common {
    static Object* From(Interface* self) { return reinterpret_cast<Object*>(self); }
    static HRESULT STDMETHODCALLTYPE QueryInterface(Interface* self, REFIID iid, void** out) {
        if (iid == IID_IUnknown || iid == IID_IDispatch || Object::Answers(iid)) {
            *out = self;
            AddRef(self);
            return S_OK;
        }
        *out = nullptr;
        return E_NOINTERFACE;
    }
    static ULONG STDMETHODCALLTYPE AddRef(Interface* self) {
        return InterlockedIncrement(&From(self)->refs);
    }
    static ULONG STDMETHODCALLTYPE Release(Interface* self) {
        Object* object = From(self);
        LONG left = InterlockedDecrement(&object->refs);
        if (left == 0) {
            Object::Destroy(object);
        }
        return left;
    }
    static HRESULT STDMETHODCALLTYPE GetTypeInfoCount(Interface*, UINT* count) {
        *count = 0;
        return S_OK;
    }
    static HRESULT STDMETHODCALLTYPE GetTypeInfo(Interface*, UINT, LCID, ITypeInfo**) {
        return E_NOTIMPL;
    }
    static HRESULT STDMETHODCALLTYPE GetIDsOfNames(Interface*, REFIID, LPOLESTR*, UINT, LCID,
                                                   DISPID*) {
        return E_NOTIMPL;
    }
    static HRESULT STDMETHODCALLTYPE Invoke(Interface*, DISPID, REFIID, LCID, WORD, DISPPARAMS*,
                                            VARIANT*, EXCEPINFO*, UINT*) {
        return E_NOTIMPL;
    }
    template <typename Table>
    static void Fill(Table& table) {
        table.QueryInterface = QueryInterface;
        table.AddRef = AddRef;
        table.Release = Release;
        table.GetTypeInfoCount = GetTypeInfoCount;
        table.GetTypeInfo = GetTypeInfo;
        table.GetIDsOfNames = GetIDsOfNames;
        table.Invoke = Invoke;
    }
};

// ---- elements and their children

struct Element {
    IHTMLElement iface;
    LONG refs;
    const PageNode* node;
    static bool Answers(REFIID iid) { return iid == IID_IHTMLElement; }
    static void Destroy(Element* element) { delete element; }
};
using ElementCommon = Common<Element, IHTMLElement>;
IHTMLElement* NewElement(const PageNode* node);

struct Collection {
    IHTMLElementCollection iface;
    LONG refs;
    const PageNode* node;
    static bool Answers(REFIID iid) { return iid == IID_IHTMLElementCollection; }
    static void Destroy(Collection* collection) { delete collection; }
};
using CollectionCommon = Common<Collection, IHTMLElementCollection>;

HRESULT STDMETHODCALLTYPE ElementTagName(IHTMLElement* self, BSTR* tag) {
    *tag = nullptr;
    HRESULT hr;
    if (Refuses("get_tagName", &hr)) {
        return hr;
    }
    *tag = SysAllocString(ElementCommon::From(self)->node->tag.c_str());
    return S_OK;
}

HRESULT STDMETHODCALLTYPE ElementInnerHtml(IHTMLElement* self, BSTR* html) {
    *html = nullptr;
    HRESULT hr;
    if (Refuses("get_innerHTML", &hr)) {
        return hr;
    }
    std::wstring text;
    g_page.IslandText(ElementCommon::From(self)->node->island, text);
    *html = SysAllocStringLen(text.data(), static_cast<UINT>(text.size()));
    return S_OK;
}

HRESULT STDMETHODCALLTYPE CollectionLength(IHTMLElementCollection* self, LONG* length) {
    *length = 0;
    HRESULT hr;
    if (Refuses("get_length", &hr)) {
        return hr;
    }
    *length = static_cast<LONG>(g_page.VisibleChildren(CollectionCommon::From(self)->node).size());
    return S_OK;
}

HRESULT STDMETHODCALLTYPE CollectionItem(IHTMLElementCollection* self, VARIANT name, VARIANT index,
                                         IDispatch** item) {
    *item = nullptr;
    HRESULT hr;
    if (Refuses("item", &hr)) {
        return hr;
    }
    VARIANT number;
    VariantInit(&number);
    if (FAILED(VariantChangeType(&number, &name, 0, VT_I4)) &&
        FAILED(VariantChangeType(&number, &index, 0, VT_I4))) {
        return E_INVALIDARG;
    }
    auto shown = g_page.VisibleChildren(CollectionCommon::From(self)->node);
    if (number.lVal < 0 || static_cast<size_t>(number.lVal) >= shown.size()) {
        return S_OK;
    }
    *item = reinterpret_cast<IDispatch*>(NewElement(shown[number.lVal]));
    return S_OK;
}

HRESULT STDMETHODCALLTYPE ElementChildren(IHTMLElement* self, IDispatch** children) {
    *children = nullptr;
    HRESULT hr;
    if (Refuses("get_children", &hr)) {
        return hr;
    }
    static IHTMLElementCollectionVtbl table = [] {
        IHTMLElementCollectionVtbl t = {};
        CollectionCommon::Fill(t);
        t.get_length = CollectionLength;
        t.item = CollectionItem;
        return t;
    }();
    Collection* collection = new Collection{{&table}, 1, ElementCommon::From(self)->node};
    *children = reinterpret_cast<IDispatch*>(&collection->iface);
    return S_OK;
}

IHTMLElement* NewElement(const PageNode* node) {
    static IHTMLElementVtbl table = [] {
        IHTMLElementVtbl t = {};
        ElementCommon::Fill(t);
        t.get_tagName = ElementTagName;
        t.get_innerHTML = ElementInnerHtml;
        t.get_children = ElementChildren;
        return t;
    }();
    Element* element = new Element{{&table}, 1, node};
    return &element->iface;
}

// ---- the document

struct Document {
    IHTMLDocument3 iface;
    LONG refs;
    static bool Answers(REFIID iid) { return iid == IID_IHTMLDocument3; }
    static void Destroy(Document* document) { delete document; }
};

HRESULT STDMETHODCALLTYPE DocumentElement(IHTMLDocument3*, IHTMLElement** root) {
    *root = nullptr;
    HRESULT hr;
    if (Refuses("get_documentElement", &hr)) {
        return hr;
    }
    if (g_page.Root() != nullptr) {
        *root = NewElement(g_page.Root());
    }
    return S_OK;
}

IDispatch* NewDocument() {
    static IHTMLDocument3Vtbl table = [] {
        IHTMLDocument3Vtbl t = {};
        Common<Document, IHTMLDocument3>::Fill(t);
        t.get_documentElement = DocumentElement;
        return t;
    }();
    Document* document = new Document{{&table}, 1};
    return reinterpret_cast<IDispatch*>(&document->iface);
}

// ---- the page's window, on a thread of its own

void CALLBACK UserCloses(HWND, UINT, UINT_PTR timer, DWORD) {
    KillTimer(nullptr, timer);
    Record("Closed by the user");
    DestroyWindow(g_window);
}

void CALLBACK BrowserGoes(HWND, UINT, UINT_PTR timer, DWORD) {
    KillTimer(nullptr, timer);
    Record("Gone");
    if (g_ownProcess) {
        TerminateProcess(GetCurrentProcess(), 3);
    }
    g_gone = true;
    DestroyWindow(g_window);
}

LRESULT CALLBACK FrameProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == kShowMessage) {
        ShowWindow(window, wParam ? SW_SHOW : SW_HIDE);
        return 0;
    }
    return DefWindowProcW(window, message, wParam, lParam);
}

// Runs on the window's thread: the page's scheduled events are timers there.
void ScheduleEvents() {
    if (g_page.closeMs() >= 0) {
        SetTimer(nullptr, 0, static_cast<UINT>(g_page.closeMs()), UserCloses);
    }
    if (g_page.goneMs() >= 0) {
        SetTimer(nullptr, 0, static_cast<UINT>(g_page.goneMs()), BrowserGoes);
    }
}

DWORD WINAPI WindowThread(void* ready) {
    WNDCLASSW frameClass = {};
    frameClass.lpfnWndProc = FrameProc;
    frameClass.hInstance = GetModuleHandleW(nullptr);
    frameClass.lpszClassName = L"QmFakeIEFrame";
    RegisterClassW(&frameClass);
    g_window = CreateWindowW(L"QmFakeIEFrame", L"Mirovan upload page", WS_OVERLAPPEDWINDOW, 40, 40,
                             640, 480, nullptr, nullptr, frameClass.hInstance, nullptr);
    SetEvent(static_cast<HANDLE>(ready));
    MSG message;
    while (GetMessageW(&message, nullptr, 0, 0) > 0) {
        if (message.hwnd == nullptr && message.message == kScheduleMessage) {
            ScheduleEvents();
            continue;
        }
        TranslateMessage(&message);
        DispatchMessageW(&message);
    }
    return 0;
}

// ---- the browser

struct Browser {
    IWebBrowserApp iface;
    LONG refs;
    static bool Answers(REFIID iid) { return iid == IID_IWebBrowserApp || iid == IID_IWebBrowser; }
    static void Destroy(Browser* browser) {
        Record("Released");
        delete browser;
        SendMessageW(g_window, WM_CLOSE, 0, 0);
        PostThreadMessageW(g_windowThread, WM_QUIT, 0, 0);
        if (g_ownProcess) {
            PostQuitMessage(0);
        }
    }
};

HRESULT STDMETHODCALLTYPE BrowserNavigate(IWebBrowserApp*, BSTR url, VARIANT* flags, VARIANT* frame,
                                          VARIANT* postData, VARIANT* headers) {
    std::string line = "Navigate " + Narrow(url);
    for (VARIANT* argument : {flags, frame, postData, headers}) {
        line += " " + (argument ? std::to_string(argument->vt) : std::string("null"));
    }
    Record(line);
    HRESULT hr;
    if (Refuses("Navigate", &hr)) {
        return hr;
    }
    g_page.StartClock();
    PostThreadMessageW(g_windowThread, kScheduleMessage, 0, 0);
    return S_OK;
}

HRESULT STDMETHODCALLTYPE BrowserBusy(IWebBrowserApp*, VARIANT_BOOL* busy) {
    *busy = VARIANT_FALSE;
    HRESULT hr;
    if (Refuses("get_Busy", &hr)) {
        return hr;
    }
    *busy = g_page.Busy() ? VARIANT_TRUE : VARIANT_FALSE;
    return S_OK;
}

HRESULT STDMETHODCALLTYPE BrowserDocument(IWebBrowserApp*, IDispatch** document) {
    *document = nullptr;
    HRESULT hr;
    if (Refuses("get_Document", &hr)) {
        return hr;
    }
    if (g_page.Navigated()) {
        *document = NewDocument();
    }
    return S_OK;
}

HRESULT STDMETHODCALLTYPE BrowserWindow(IWebBrowserApp*, SHANDLE_PTR* window) {
    *window = 0;
    HRESULT hr;
    if (Refuses("get_HWND", &hr)) {
        return hr;
    }
    *window = reinterpret_cast<SHANDLE_PTR>(g_window);
    return S_OK;
}

HRESULT STDMETHODCALLTYPE BrowserShow(IWebBrowserApp*, VARIANT_BOOL visible) {
    Record("Visible " + std::to_string(visible));
    SendMessageW(g_window, kShowMessage, visible ? 1 : 0, 0);
    return g_gone ? kGone : S_OK;
}

HRESULT STDMETHODCALLTYPE BrowserShown(IWebBrowserApp*, VARIANT_BOOL* visible) {
    *visible = IsWindowVisible(g_window) ? VARIANT_TRUE : VARIANT_FALSE;
    return g_gone ? kGone : S_OK;
}

HRESULT STDMETHODCALLTYPE BrowserQuit(IWebBrowserApp*) {
    Record("Quit");
    SendMessageW(g_window, WM_CLOSE, 0, 0);
    return g_gone ? kGone : S_OK;
}

IWebBrowserApp* NewBrowser() {
    static IWebBrowserAppVtbl table = [] {
        IWebBrowserAppVtbl t = {};
        Common<Browser, IWebBrowserApp>::Fill(t);
        t.Navigate = BrowserNavigate;
        t.get_Busy = BrowserBusy;
        t.get_Document = BrowserDocument;
        t.get_HWND = BrowserWindow;
        t.put_Visible = BrowserShow;
        t.get_Visible = BrowserShown;
        t.Quit = BrowserQuit;
        return t;
    }();
    Browser* browser = new Browser{{&table}, 1};
    return &browser->iface;
}

// ---- the class object

HRESULT STDMETHODCALLTYPE FactoryQueryInterface(IClassFactory* self, REFIID iid, void** out) {
    if (iid == IID_IUnknown || iid == IID_IClassFactory) {
        *out = self;
        return S_OK;
    }
    *out = nullptr;
    return E_NOINTERFACE;
}

ULONG STDMETHODCALLTYPE FactoryRefs(IClassFactory*) {
    return 1;
}

HRESULT STDMETHODCALLTYPE FactoryCreate(IClassFactory*, IUnknown* outer, REFIID iid, void** out) {
    *out = nullptr;
    if (outer != nullptr) {
        return CLASS_E_NOAGGREGATION;
    }
    Record("Created");
    IWebBrowserApp* browser = NewBrowser();
    HRESULT hr = browser->lpVtbl->QueryInterface(browser, iid, out);
    browser->lpVtbl->Release(browser);
    return hr;
}

HRESULT STDMETHODCALLTYPE FactoryLock(IClassFactory*, BOOL) {
    return S_OK;
}

IClassFactoryVtbl g_factoryTable = {FactoryQueryInterface, FactoryRefs, FactoryRefs, FactoryCreate,
                                    FactoryLock};
IClassFactory g_factory = {&g_factoryTable};

}  // namespace

void StartBrowserStandIn(const std::wstring& scriptPath, bool ownProcess) {
    g_ownProcess = ownProcess;
    g_page.Load(scriptPath);
    HANDLE ready = CreateEventW(nullptr, TRUE, FALSE, nullptr);
    HANDLE thread = CreateThread(nullptr, 0, WindowThread, ready, 0, &g_windowThread);
    WaitForSingleObject(ready, 10000);
    CloseHandle(ready);
    CloseHandle(thread);
}

IClassFactory* BrowserClassFactory() {
    return &g_factory;
}
