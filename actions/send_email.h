// Composing a new Outlook item (mail, appointment...) on Outlook's command
// line, with the texts escaped for it.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

class CQMSendEmail {
public:
    // Item types and the switch each puts at the start of the command line.
    enum ItemType : int {
        kActivity = 0,
        kAppointment = 1,
        kContact = 2,
        kNote = 3,  // a mail
        kStickyNote = 4,
        kTask = 5,
    };

    // Starts "OUTLOOK.EXE" with a new item of eType; any text may be null.
    // True when the shell started it.
    static bool SendEmailByCommandLine(int eType, const wchar_t* lpszSubject,
                                       const wchar_t* lpszBody, const wchar_t* lpszAttachmentPath,
                                       const wchar_t* lpszAttendeeList);
    // Escapes strValue in place ("%" first, then " ,?.!:;&\"" as %xx in
    // lower-case hex); the number of characters replaced.
    static int ReplaceSpecialForCommandLine(CStringEx& strValue);
    // The command line SendEmailByCommandLine hands to Outlook.
    static CStringEx ComposeCommandLine(int eType, const wchar_t* lpszSubject,
                                        const wchar_t* lpszBody, const wchar_t* lpszAttachmentPath,
                                        const wchar_t* lpszAttendeeList);
};
