// The parameter documents exchanged with the Suite service (root
// "Mirovan_QM", parameters under "Func_Params"): the four requests built
// from their fixed templates, and the two answers read.
#pragma once

#include "base/com_owners.h"
#include "base/string_ex.h"

// "<ParentHWnd></ParentHWnd>" of the template filled with parentHWnd.
CStringEx BuildStartMeetingRequest(int parentHWnd);

// Each fills xml with the document's text; false (xml empty) when the
// template could not be loaded.
bool BuildShareRequest(const CStringEx& sharePathFile, const CStringEx& shareFlag, int parentHWnd,
                       UniqueBstr& xml);
bool BuildCommonLoginRequest(int parentHWnd, const CStringEx& siteUrl, const CStringEx& userName,
                             int editable, const CStringEx& email, UniqueBstr& xml);
bool BuildSwitchSiteRequest(const CStringEx& siteUrl, UniqueBstr& xml);

// 1 when "//Func_Params/LoginResult" begins with "success" in any letter
// case, else 0 (also for a response that is not XML).
int ReadLoginResult(BSTR response);

// The account document's "//Func_Params/SiteUrl" and "//Func_Params/UserName"
// (each empty when missing); false, leaving both as they were, when the
// document does not load.
bool ReadAccountDocument(BSTR account, CStringEx& siteUrl, CStringEx& userName);
