#include "actions/service_requests.h"

#include <cwchar>

#include "base/ms_dom.h"

namespace {

const wchar_t kStartMeetingTemplate[] =
    L"<?xml version=\"1.0\"?><Mirovan_QM><Func_Params><ParentHWnd></ParentHWnd>"
    L"<StartType>1</StartType><QM>2</QM></Func_Params></Mirovan_QM>";
const wchar_t kShareTemplate[] =
    L"<?xml version=\"1.0\"?><Mirovan_QM><Func_Params><StartType>1</StartType><QM>2</QM>"
    L"</Func_Params></Mirovan_QM>";
const wchar_t kCommonLoginTemplate[] =
    L"<?xml version = \"1.0\"?><Mirovan_QM><Func_Params><CommonLogin></CommonLogin>"
    L"</Func_Params></Mirovan_QM>";
const wchar_t kSwitchSiteTemplate[] =
    L"<?xml version=\"1.0\" encoding=\"UTF-8\"?><Mirovan_QM><Func_Params><SwitchSite/>"
    L"</Func_Params></Mirovan_QM>";

UniqueBstr Bstr(const wchar_t* text) {
    return UniqueBstr(SysAllocString(text));
}

// Loads the template and selects the element that takes the parameters.
bool OpenTemplate(const wchar_t* text, const wchar_t* parentPath, ComPtr<IUnknown>& doc,
                  ComPtr<IUnknown>& parent) {
    if (FAILED(CMSDom::CreateFromString(Bstr(text).get(), doc.ReleaseAndGetAddressOf()))) {
        return false;
    }
    return SUCCEEDED(CMSDom::SelectSingleChild(doc.Get(), Bstr(parentPath).get(),
                                               parent.ReleaseAndGetAddressOf()));
}

void AddText(IUnknown* parent, const wchar_t* name, const CStringEx& text) {
    CMSDom::CreateNode(parent, Bstr(name).get(), Bstr(text.c_str()).get());
}

void AddNumber(IUnknown* parent, const wchar_t* name, int number) {
    CMSDom::CreateNode(parent, Bstr(name).get(), number);
}

bool TextOf(IUnknown* doc, UniqueBstr& xml) {
    return SUCCEEDED(CMSDom::GetXML(doc, xml.put()));
}

}  // namespace

CStringEx BuildStartMeetingRequest(int parentHWnd) {
    CStringEx request(kStartMeetingTemplate);
    CStringEx filled;
    filled.Format(L"<ParentHWnd>%d</ParentHWnd>", parentHWnd);
    request.Replace(L"<ParentHWnd></ParentHWnd>", filled.c_str());
    return request;
}

bool BuildShareRequest(const CStringEx& sharePathFile, const CStringEx& shareFlag, int parentHWnd,
                       UniqueBstr& xml) {
    xml.reset();
    ComPtr<IUnknown> doc, root, params;
    if (FAILED(
            CMSDom::CreateFromString(Bstr(kShareTemplate).get(), doc.ReleaseAndGetAddressOf())) ||
        FAILED(CMSDom::GetRootNode(doc.Get(), root.ReleaseAndGetAddressOf())) ||
        FAILED(CMSDom::SelectSingleChild(root.Get(), Bstr(L"Func_Params").get(),
                                         params.ReleaseAndGetAddressOf()))) {
        return false;
    }
    AddText(params.Get(), L"ShareFlag", shareFlag);
    AddText(params.Get(), L"SharePathFile", sharePathFile);
    AddNumber(params.Get(), L"ParentHWnd", parentHWnd);
    return TextOf(doc.Get(), xml);
}

bool BuildCommonLoginRequest(int parentHWnd, const CStringEx& siteUrl, const CStringEx& userName,
                             int editable, const CStringEx& email, UniqueBstr& xml) {
    xml.reset();
    ComPtr<IUnknown> doc, login;
    if (!OpenTemplate(kCommonLoginTemplate, L"//Func_Params/CommonLogin", doc, login)) {
        return false;
    }
    AddNumber(login.Get(), L"ParentHWnd", parentHWnd);
    AddText(login.Get(), L"SiteUrl", siteUrl);
    AddText(login.Get(), L"UserName", userName);
    AddNumber(login.Get(), L"Editable", editable);
    AddText(login.Get(), L"Email", email);
    return TextOf(doc.Get(), xml);
}

bool BuildSwitchSiteRequest(const CStringEx& siteUrl, UniqueBstr& xml) {
    xml.reset();
    ComPtr<IUnknown> doc, switchSite;
    if (!OpenTemplate(kSwitchSiteTemplate, L"//Func_Params/SwitchSite", doc, switchSite)) {
        return false;
    }
    AddText(switchSite.Get(), L"SiteUrl", siteUrl);
    return TextOf(doc.Get(), xml);
}

int ReadLoginResult(BSTR response) {
    ComPtr<IUnknown> doc;
    if (FAILED(CMSDom::CreateFromString(response, doc.ReleaseAndGetAddressOf()))) {
        return 0;
    }
    CStringEx result;
    if (FAILED(CMSDom::GetChildNodeValue(doc.Get(), Bstr(L"//Func_Params/LoginResult").get(),
                                         result))) {
        return 0;
    }
    return _wcsnicmp(result.c_str(), L"success", 7) == 0 ? 1 : 0;
}

bool ReadAccountDocument(BSTR account, CStringEx& siteUrl, CStringEx& userName) {
    ComPtr<IUnknown> doc;
    if (FAILED(CMSDom::CreateFromString(account, doc.ReleaseAndGetAddressOf()))) {
        return false;
    }
    CMSDom::GetChildNodeValue(doc.Get(), Bstr(L"//Func_Params/SiteUrl").get(), siteUrl);
    CMSDom::GetChildNodeValue(doc.Get(), Bstr(L"//Func_Params/UserName").get(), userName);
    return true;
}
