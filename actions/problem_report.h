// The problem report: "SendProblemReport" zips the user's trace files and
// opens a new mail with them, through Outlook's command line when Outlook is
// running, else through Simple MAPI.
#pragma once

#include <windows.h>

#include "base/string_ex.h"

class CSendProblemReport {
public:
    // The account a running program belongs to: TRUE with its name.
    using ProcessUserLookup = BOOL (*)(const wchar_t* processName, CStringEx& accountName);

    CSendProblemReport();
    // With another account lookup (the system can show only one account).
    explicit CSendProblemReport(ProcessUserLookup lookup);
    virtual ~CSendProblemReport() = default;
    CSendProblemReport(const CSendProblemReport&) = delete;
    CSendProblemReport& operator=(const CSendProblemReport&) = delete;

    void Send();

private:
    void SendReport();

    ProcessUserLookup m_lookupUser;
};

// format with its one "%s" replaced by value and "%%" read as "%"; any other
// "%" stays as it is, so a format from a resource file can never read
// arguments that are not there.
CStringEx FormatWithOneText(const wchar_t* format, const wchar_t* value);
