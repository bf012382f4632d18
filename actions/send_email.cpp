#include "actions/send_email.h"

#include <shellapi.h>

#include "base/trace.h"

namespace {

// The switch of each item type; any other type has none.
const wchar_t* ItemSwitch(int eType) {
    static const wchar_t* const kSwitches[] = {
        L"/c ipm.activity ", L"/c ipm.appointment ", L"/c ipm.contact ",
        L"/c ipm.note ",     L"/c ipm.stickynote ",  L"/c ipm.task ",
    };
    if (eType < 0 || eType >= static_cast<int>(sizeof(kSwitches) / sizeof(kSwitches[0]))) {
        return L"";
    }
    return kSwitches[eType];
}

// Inserts "25" behind every "%" so it reads as the escape of itself.
int EscapePercentSigns(CStringEx& value) {
    int count = 0;
    for (int at = value.Find(L'%'); at >= 0; at = value.Find(L'%', at + 3)) {
        value.Insert(at + 1, L"25");
        ++count;
    }
    return count;
}

}  // namespace

int CQMSendEmail::ReplaceSpecialForCommandLine(CStringEx& strValue) {
    int iCount = EscapePercentSigns(strValue);
    static const wchar_t kSpecial[] = L" ,?.!:;&\"";
    for (const wchar_t* ch = kSpecial; *ch != L'\0'; ++ch) {
        CStringEx escape;
        escape.Format(L"%%%x", static_cast<unsigned>(*ch));
        iCount += strValue.Replace(*ch, escape.c_str());
    }
    TraceLevel2Named("CQMSendEmail::ReplaceSpecialForCommandLine",
                     TraceNamed("(LPCTSTR)strValue", strValue), TraceNamed("iCount", iCount));
    return iCount;
}

CStringEx CQMSendEmail::ComposeCommandLine(int eType, const wchar_t* lpszSubject,
                                           const wchar_t* lpszBody,
                                           const wchar_t* lpszAttachmentPath,
                                           const wchar_t* lpszAttendeeList) {
    CStringEx subject(lpszSubject);
    CStringEx body(lpszBody);
    ReplaceSpecialForCommandLine(subject);
    ReplaceSpecialForCommandLine(body);

    CStringEx line(ItemSwitch(eType));
    if (lpszSubject != nullptr || lpszBody != nullptr || lpszAttendeeList != nullptr) {
        line += L"/m \"";
        if (lpszAttendeeList != nullptr) {
            line += lpszAttendeeList;
        }
        if (lpszSubject != nullptr) {
            line += L"&subject=";
            line += subject;
        }
        if (lpszBody != nullptr) {
            line += L"&body=";
            line += body;
        }
        line += L'"';
    }
    if (lpszAttachmentPath != nullptr) {
        line += L"/a \"";
        line += lpszAttachmentPath;
        line += L'"';
    }
    return line;
}

bool CQMSendEmail::SendEmailByCommandLine(int eType, const wchar_t* lpszSubject,
                                          const wchar_t* lpszBody,
                                          const wchar_t* lpszAttachmentPath,
                                          const wchar_t* lpszAttendeeList) {
    TraceLevel2Named("CQMSendEmail::SendEmailByCommandLine", TraceNamed("eType", eType),
                     TraceNamed("lpszSubject", lpszSubject), TraceNamed("lpszBody", lpszBody),
                     TraceNamed("lpszAttachmentPath", lpszAttachmentPath),
                     TraceNamed("lpszAttendeeList", lpszAttendeeList));
    CStringEx line =
        ComposeCommandLine(eType, lpszSubject, lpszBody, lpszAttachmentPath, lpszAttendeeList);
    // The shell's own error box is suppressed: without anyone to close it the
    // program would never end; failure is reported by the result alone.
    SHELLEXECUTEINFOW launch = {};
    launch.cbSize = sizeof(launch);
    launch.fMask = SEE_MASK_FLAG_NO_UI;
    launch.lpVerb = L"open";
    launch.lpFile = L"OUTLOOK.EXE";
    launch.lpParameters = line.c_str();
    launch.nShow = SW_SHOWNORMAL;
    ShellExecuteExW(&launch);
    return reinterpret_cast<INT_PTR>(launch.hInstApp) > 32;
}
