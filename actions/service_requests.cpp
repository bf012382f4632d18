#include "actions/service_requests.h"

CStringEx BuildStartMeetingRequest(int parentHWnd) {
    CStringEx request(
        L"<?xml version=\"1.0\"?><Mirovan_QM><Func_Params><ParentHWnd></ParentHWnd>"
        L"<StartType>1</StartType><QM>2</QM></Func_Params></Mirovan_QM>");
    CStringEx filled;
    filled.Format(L"<ParentHWnd>%d</ParentHWnd>", parentHWnd);
    request.Replace(L"<ParentHWnd></ParentHWnd>", filled.c_str());
    return request;
}

// Built on the XML document wrapper (pending).
bool BuildShareRequest(const CStringEx&, const CStringEx&, int, UniqueBstr& xml) {
    xml.reset();
    return false;
}
bool BuildCommonLoginRequest(int, const CStringEx&, const CStringEx&, int, const CStringEx&,
                             UniqueBstr& xml) {
    xml.reset();
    return false;
}
bool BuildSwitchSiteRequest(const CStringEx&, UniqueBstr& xml) {
    xml.reset();
    return false;
}
int ReadLoginResult(BSTR) {
    return 0;
}
bool ReadAccountDocument(BSTR, CStringEx&, CStringEx&) {
    return false;
}
