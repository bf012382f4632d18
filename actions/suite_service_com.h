// The COM face of the Suite service (qmSrv.exe, type library QMSERVICELib):
// class, interface and event identifiers, and the two dual interfaces in
// their vtable order. SlotN fills a slot whose method this program never calls.
#pragma once

#include <windows.h>
#include <oaidl.h>

extern const CLSID CLSID_Meeting;
extern const IID IID_IMeeting;
extern const IID DIID__IMeetingEvents;
extern const CLSID CLSID_Setting;
extern const IID IID_ISetting;
extern const IID DIID__ISettingEvents;

// Dispatch identifiers of the events this program reacts to.
enum SuiteServiceEvent : DISPID {
    kMeetingEventEnded = 96,     // one argument; ends the wait
    kMeetingEventProgress = 80,  // two arguments; ignored
    kMeetingEventClosed = 16,    // two arguments; ends the wait
    kSettingEventFirst = 4,      // two arguments; ignored
    kSettingEventSecond = 5,     // two arguments; ignored
};

struct IMeeting : public IDispatch {
    // Slot 7: result 0 when the service accepted the request document.
    virtual HRESULT STDMETHODCALLTYPE StartOCMeeting(BSTR bstrParam, long* plReserved,
                                                     long* plResult) = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot8() = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot9() = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot10() = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot11() = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot12() = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot13() = 0;
    // Slot 14.
    virtual HRESULT STDMETHODCALLTYPE GetLastError(long* plError) = 0;
    // Slot 15: *plInProgress is 1 while the service shows a disclaimer.
    virtual HRESULT STDMETHODCALLTYPE CheckIfDisclaimerInProgress(long* plInProgress,
                                                                  long* plResult) = 0;
};

struct ISetting : public IDispatch {
    // Slot 7: bstrParam may be null; result 0 when the dialog was opened.
    virtual HRESULT STDMETHODCALLTYPE OpenSettingDlg(BSTR bstrParam, long* plReserved,
                                                     long* plResult) = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot8() = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot9() = 0;
    // Slot 10.
    virtual HRESULT STDMETHODCALLTYPE HasValidAccount(VARIANT_BOOL* pbValid) = 0;
    // Slot 11: result 0 when *pbstrAccount holds the account document.
    virtual HRESULT STDMETHODCALLTYPE GetAccountInfo(BSTR* pbstrAccount, long* plResult) = 0;
    // Slot 12.
    virtual HRESULT STDMETHODCALLTYPE IsSettingDlgOpened(VARIANT_BOOL* pbOpened) = 0;
    virtual HRESULT STDMETHODCALLTYPE Slot13() = 0;
    // Slot 14.
    virtual HRESULT STDMETHODCALLTYPE GeneralCall(BSTR bstrRequest, BSTR* pbstrResponse,
                                                  long* plResult) = 0;
};
