// The browser stand-in in-process: registered as the InprocServer32 of
// Internet Explorer's class, it reads the page script named by
// QM_FAKE_PAGE_SCRIPT when the program asks for the class object.
#include "tests/fakes/browser/browser_standin.h"

#include <exdisp.h>

#include "tests/fakes/common/fake_recorder.h"

extern "C" HRESULT STDAPICALLTYPE DllGetClassObject(REFCLSID classId, REFIID iid, void** out) {
    *out = nullptr;
    if (classId != CLSID_InternetExplorer) {
        return CLASS_E_CLASSNOTAVAILABLE;
    }
    static bool started = false;
    if (!started) {
        started = true;
        StartBrowserStandIn(fake::EnvironmentValue(L"QM_FAKE_PAGE_SCRIPT"), false);
    }
    IClassFactory* factory = BrowserClassFactory();
    return factory->lpVtbl->QueryInterface(factory, iid, out);
}

// The page's window runs code of this library until the process ends.
extern "C" HRESULT STDAPICALLTYPE DllCanUnloadNow() {
    return S_FALSE;
}
