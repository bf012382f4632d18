#include "actions/url_object.h"

#include "base/com_owners.h"
#include "base/path_api.h"
#include "base/proc_address.h"
#include "base/win_handles.h"

namespace {

using DllGetClassObjectFn = HRESULT(STDAPICALLTYPE*)(REFCLSID, REFIID, void**);

UniqueModule& UrlLibrary() {
    static UniqueModule library;
    return library;
}

}  // namespace

HRESULT CreateUrlObject(IMrvURL** object) {
    if (object == nullptr) {
        return E_POINTER;
    }
    *object = nullptr;
    UniqueModule& library = UrlLibrary();
    if (!library) {
        CStringEx path;
        CPathApi::GetResFilePath(nullptr, L"qmMRVURL.DLL", path);
        if (!path.IsEmpty()) {
            library.reset(LoadLibraryW(path.c_str()));
        }
    }
    auto getClassObject = GetProcAs<DllGetClassObjectFn>(library.get(), "DllGetClassObject");
    if (getClassObject == nullptr) {
        return E_NOINTERFACE;
    }
    ComPtr<IClassFactory> factory;
    HRESULT hr = getClassObject(CLSID_MrvURL, IID_IClassFactory,
                                reinterpret_cast<void**>(factory.GetAddressOf()));
    if (factory) {
        hr = factory->CreateInstance(nullptr, IID_IMrvURL, reinterpret_cast<void**>(object));
    }
    return hr;
}

void UnloadUrlLibrary() {
    UrlLibrary().reset();
}
