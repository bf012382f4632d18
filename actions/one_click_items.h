// The one-click object of the suite's one-click library qmMrvMS.DLL: a dual
// interface whose own methods begin at slot 7. Owner windows travel as 32-bit
// window handles.
#pragma once

#include <windows.h>
#include <oaidl.h>

// {2DC92A19-7C88-4B1A-9919-8E6BB3F63D8D}
extern const CLSID CLSID_OneClickItems;
// {9066038D-D902-4E44-A9AE-7B497758EC73}
extern const IID IID_IOneClickItems;

struct IOneClickItems : public IDispatch {
    virtual HRESULT STDMETHODCALLTYPE OpenAbout(long hwndOwner) = 0;  // slot 7
    virtual HRESULT STDMETHODCALLTYPE OpenHelp(long hwndOwner) = 0;   // slot 8
    virtual HRESULT STDMETHODCALLTYPE NotUsedSlot9() = 0;             // never called
    virtual HRESULT STDMETHODCALLTYPE NotUsedSlot10() = 0;            // never called
    virtual HRESULT STDMETHODCALLTYPE ShareWindow(long hwndOwner, long hwndShared) = 0;  // 11
    virtual HRESULT STDMETHODCALLTYPE StartOCMeeting(long hwndOwner) = 0;                // slot 12
    virtual HRESULT STDMETHODCALLTYPE StartAudioOnly(long hwndOwner) = 0;                // slot 13
    virtual HRESULT STDMETHODCALLTYPE StartScheduledMeeting(long hwndOwner) = 0;         // slot 14
    virtual HRESULT STDMETHODCALLTYPE JoinMeeting(long hwndOwner) = 0;                   // slot 15
    virtual HRESULT STDMETHODCALLTYPE OpenQMSetting(long hwndOwner) = 0;                 // slot 16
    virtual HRESULT STDMETHODCALLTYPE ScheduleMeeting(long hwndOwner) = 0;               // slot 17
    virtual HRESULT STDMETHODCALLTYPE SetBrowser(BSTR browserName) = 0;                  // slot 18
};
