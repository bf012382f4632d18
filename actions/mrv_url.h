// The URL object of the suite's URL library qmMRVURL.DLL: requests a URL for
// the program. Only the slots the program calls have a known meaning.
#pragma once

#include <windows.h>
#include <unknwn.h>

// {922B3BB3-0B03-4FF3-9782-C0636460F5E1}
const CLSID CLSID_MrvURL = {
    0x922B3BB3, 0x0B03, 0x4FF3, {0x97, 0x82, 0xC0, 0x63, 0x64, 0x60, 0xF5, 0xE1}};
// {015C29FF-62AD-4B96-82B1-D3360855EEBA}
const IID IID_IMrvURL = {
    0x015C29FF, 0x62AD, 0x4B96, {0x82, 0xB1, 0xD3, 0x36, 0x08, 0x55, 0xEE, 0xBA}};

// Slots counted from 3, after IUnknown's three.
struct IMrvURL : public IUnknown {
    virtual HRESULT STDMETHODCALLTYPE Reserved3() = 0;
    virtual HRESULT STDMETHODCALLTYPE Begin(LONG value) = 0;  // slot 4: 1 after creation
    virtual HRESULT STDMETHODCALLTYPE Reserved5() = 0;
    virtual HRESULT STDMETHODCALLTYPE SetWaitSeconds(LONG seconds) = 0;  // slot 6
    virtual HRESULT STDMETHODCALLTYPE Reserved7() = 0;
    virtual HRESULT STDMETHODCALLTYPE Reserved8() = 0;
    virtual HRESULT STDMETHODCALLTYPE Reserved9() = 0;
    virtual HRESULT STDMETHODCALLTYPE Reserved10() = 0;
    // Slot 11: the request.
    virtual HRESULT STDMETHODCALLTYPE Request(BSTR url, BSTR data, LONG flags, LONG reserved) = 0;
    virtual HRESULT STDMETHODCALLTYPE End() = 0;  // slot 12: after the wait
};
