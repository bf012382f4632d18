#include "actions/service_wrappers.h"

namespace {

IMeeting* AsMeeting(IDispatch* object) {
    return static_cast<IMeeting*>(object);
}

ISetting* AsSetting(IDispatch* object) {
    return static_cast<ISetting*>(object);
}

}  // namespace

CIMeetingWrapper::CIMeetingWrapper()
    : CComWrapBase(CLSID_Meeting, IID_IMeeting, DIID__IMeetingEvents) {}

long CIMeetingWrapper::StartOCMeeting(BSTR param) {
    return Protocol("CIMeetingWrapper::StartOCMeeting", -1L,
                    [param](IDispatch* object, long* value) {
                        long reserved = 0;
                        return AsMeeting(object)->StartOCMeeting(param, &reserved, value);
                    });
}

long CIMeetingWrapper::GetLastError() {
    return Protocol("CIMeetingWrapper::GetLastError", -1L, [](IDispatch* object, long* value) {
        return AsMeeting(object)->GetLastError(value);
    });
}

long CIMeetingWrapper::CheckIfDisclaimerInProgress(long* inProgress) {
    return Protocol("CIMeetingWrapper::CheckIfDisclaimerInProgress", -1L,
                    [inProgress](IDispatch* object, long* value) {
                        long answer = 0;
                        HRESULT hr = AsMeeting(object)->CheckIfDisclaimerInProgress(&answer, value);
                        if (SUCCEEDED(hr)) {
                            *inProgress = answer;
                        }
                        return hr;
                    });
}

CISettingWrapper::CISettingWrapper()
    : CComWrapBase(CLSID_Setting, IID_ISetting, DIID__ISettingEvents) {}

long CISettingWrapper::OpenSettingDlg(BSTR param) {
    return Protocol("CISettingWrapper::OpenSettingDlg", -1L,
                    [param](IDispatch* object, long* value) {
                        long reserved = 0;
                        return AsSetting(object)->OpenSettingDlg(param, &reserved, value);
                    });
}

VARIANT_BOOL CISettingWrapper::HasValidAccount() {
    return Protocol("CISettingWrapper::HasValidAccount", VARIANT_BOOL(VARIANT_FALSE),
                    [](IDispatch* object, VARIANT_BOOL* value) {
                        return AsSetting(object)->HasValidAccount(value);
                    });
}

long CISettingWrapper::GetAccountInfo(UniqueBstr& account) {
    return Protocol("CISettingWrapper::GetAccountInfo", -1L,
                    [&account](IDispatch* object, long* value) {
                        UniqueBstr answer;
                        HRESULT hr = AsSetting(object)->GetAccountInfo(answer.put(), value);
                        if (SUCCEEDED(hr)) {
                            account = std::move(answer);
                        }
                        return hr;
                    });
}

VARIANT_BOOL CISettingWrapper::IsSettingDlgOpened() {
    return Protocol("CISettingWrapper::IsSettingDlgOpened", VARIANT_BOOL(VARIANT_FALSE),
                    [](IDispatch* object, VARIANT_BOOL* value) {
                        return AsSetting(object)->IsSettingDlgOpened(value);
                    });
}

long CISettingWrapper::GeneralCall(BSTR request, UniqueBstr& response) {
    return Protocol("CISettingWrapper::GeneralCall", -1L,
                    [request, &response](IDispatch* object, long* value) {
                        UniqueBstr answer;
                        HRESULT hr = AsSetting(object)->GeneralCall(request, answer.put(), value);
                        if (SUCCEEDED(hr)) {
                            response = std::move(answer);
                        }
                        return hr;
                    });
}
