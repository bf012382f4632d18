// The wrappers of the Suite service's Meeting and Setting objects: one call
// per service method, each through the wrappers' call protocol (see
// com_wrap_base.h), answering -1 (VARIANT_BOOL methods: false) when no
// attempt worked.
#pragma once

#include "actions/com_wrap_base.h"
#include "actions/suite_service_com.h"
#include "base/com_owners.h"

class CIMeetingWrapper : public CComWrapBase {
public:
    CIMeetingWrapper();
    long StartOCMeeting(BSTR param);
    long GetLastError();
    long CheckIfDisclaimerInProgress(long* inProgress);
};

class CISettingWrapper : public CComWrapBase {
public:
    CISettingWrapper();
    long OpenSettingDlg(BSTR param);  // param may be null
    VARIANT_BOOL HasValidAccount();
    long GetAccountInfo(UniqueBstr& account);
    VARIANT_BOOL IsSettingDlgOpened();
    long GeneralCall(BSTR request, UniqueBstr& response);
};
