#include "actions/problem_report.h"

#include <shlwapi.h>

#include <vector>

#include "actions/report_info.h"
#include "actions/send_email.h"
#include "actions/simple_mapi.h"
#include "actions/suite_message.h"
#include "actions/suite_version.h"
#include "actions/trace_folder.h"
#include "actions/zip_mvt.h"
#include "base/call_process.h"
#include "base/dll_handle.h"
#include "base/path_api.h"
#include "base/trace.h"
#include "base/win_handles.h"

namespace {

const UINT kSubjectFormatId = 368;
const UINT kBodyId = 369;
const UINT kFailureTextId = 370;
const UINT kFailureCaptionId = 59396;
const UINT kFailureStyle = MB_ICONEXCLAMATION | MB_TASKMODAL | MB_TOPMOST;
const wchar_t kZipName[] = L"Mirovan_Trace.zip";
const char kLoadStringFailed[] = "CMainUI::OnReportProbelm LoadString failed!";

// The trace folder without trailing "\" and then "/" characters.
CStringEx FolderWithoutSeparator(const wchar_t* folder) {
    CStringEx trimmed(folder);
    trimmed.TrimRight(L'\\');
    trimmed.TrimRight(L'/');
    return trimmed;
}

// Every "*.mvt" entry of folder, as attachment paths and titles; false when
// the search finds nothing.
bool GatherTraceFiles(const CStringEx& folder, CRptInfo& report) {
    CStringEx pattern(folder);
    pattern += L"\\*.mvt";
    WIN32_FIND_DATAW found = {};
    UniqueFindHandle search(FindFirstFileW(pattern.c_str(), &found));
    if (!search) {
        return false;
    }
    do {
        if (wcscmp(found.cFileName, L".") == 0 || wcscmp(found.cFileName, L"..") == 0) {
            continue;
        }
        CStringEx path(folder);
        path += L'\\';
        path += found.cFileName;
        report.attachmentPaths.push_back(path);
        report.attachmentTitles.push_back(CStringEx(found.cFileName));
    } while (FindNextFileW(search.get(), &found));
    return true;
}

void ShowFailure(HMODULE resources) {
    CStringEx caption;
    CStringEx text;
    if (!caption.LoadString(resources, kFailureCaptionId)) {
        TraceLevel1(TraceValue(kLoadStringFailed));
    }
    if (!text.LoadString(resources, kFailureTextId)) {
        TraceLevel1(TraceValue(kLoadStringFailed));
    }
    ShowSuiteMessage(nullptr, text.c_str(), caption.c_str(), kFailureStyle);
}

}  // namespace

CStringEx FormatWithOneText(const wchar_t* format, const wchar_t* value) {
    CStringEx result;
    bool substituted = false;
    for (const wchar_t* p = format; p != nullptr && *p != L'\0'; ++p) {
        if (p[0] == L'%' && p[1] == L'%') {
            result += L'%';
            ++p;
        } else if (p[0] == L'%' && p[1] == L's' && !substituted) {
            result += value;
            substituted = true;
            ++p;
        } else {
            result += *p;
        }
    }
    return result;
}

CSendProblemReport::CSendProblemReport() : m_lookupUser(&CQMCallProcess::GetProcessUserName) {}

CSendProblemReport::CSendProblemReport(ProcessUserLookup lookup) : m_lookupUser(lookup) {}

void CSendProblemReport::Send() {
    try {
        SendReport();
    } catch (...) {
        // Out of memory while gathering: the report is dropped.
    }
}

void CSendProblemReport::SendReport() {
    CAutoFunTrace trace("CSendProblemReport::Send");
    bool outlookRunning = false;
    CStringEx strOutlookUserName;
    if (m_lookupUser(L"OUTLOOK.EXE", strOutlookUserName)) {
        outlookRunning = true;
        CStringEx strQMOneClkUserName;
        if (m_lookupUser(L"qmoneclk.exe", strQMOneClkUserName) &&
            strQMOneClkUserName.CompareNoCase(strOutlookUserName.c_str()) != 0) {
            TraceLevel8(TraceValue("CSendProblemReport::Send Outlook.exe and qmoneclk.exe are "
                                   "running at different user level\n"),
                        TraceNamed("(LPCTSTR)strQMOneClkUserName", strQMOneClkUserName),
                        TraceNamed("(LPCTSTR)strOutlookUserName", strOutlookUserName));
            return;
        }
    }

    CStringEx resourcePath;
    CPathApi::GetResFilePath(nullptr, L"qmocres.dll", resourcePath);
    CDLLHandle resources(resourcePath.IsEmpty() ? nullptr : LoadLibraryW(resourcePath.c_str()),
                         TRUE);
    if (resources.Handle() == nullptr) {
        TraceLevel1(
            TraceValue("COneClickItemHandler::SendReportProblem() load qmocres.dll failed!\n"));
        return;
    }
    CStringEx subjectFormat;
    if (!subjectFormat.LoadString(resources.Handle(), kSubjectFormatId)) {
        TraceLevel1(TraceValue(kLoadStringFailed));
        return;
    }
    CRptInfo report;
    report.strSubject = FormatWithOneText(subjectFormat.c_str(), ReportSuiteVersion().c_str());
    if (!report.strBody.LoadString(resources.Handle(), kBodyId)) {
        TraceLevel2(TraceValue(kLoadStringFailed));
    }

    wchar_t traceFolder[MAX_PATH] = {};
    FindTraceFolder(traceFolder, MAX_PATH);
    CStringEx folder = FolderWithoutSeparator(traceFolder);
    // No folder at all must not turn into a search of the drive's root.
    if (folder.IsEmpty() || !GatherTraceFiles(folder, report)) {
        TraceLevel2(TraceValue("IsTmpFileExist  the  file is not found! \n"));
        return;
    }

    // The zip lies in the trace folder; it replaces the single files.
    wchar_t zipPath[MAX_PATH] = {};
    lstrcpynW(zipPath, traceFolder, MAX_PATH);
    if (!report.attachmentPaths.empty() && PathAppendW(zipPath, kZipName)) {
        CZipMvt zip;
        if (zip.CompressFile(report.attachmentPaths, zipPath)) {
            TraceLevel2(TraceValue("the compress successed"));
            report.attachmentPaths.assign(1, CStringEx(zipPath));
            report.attachmentTitles.assign(1, CStringEx(kZipName));
        }
    }

    BOOL sent = FALSE;
    if (!outlookRunning) {
        CSimpleMapi mapi;
        mapi.Init();
        sent = mapi.Send(report);
        mapi.DeInit();
    } else {
        TraceLevel2(TraceValue("CSendProblemReport::Send Outlook.exe is running, use new logic\n"),
                    TraceNamed("(LPCTSTR)strOutlookUserName", strOutlookUserName));
        sent = CQMSendEmail::SendEmailByCommandLine(CQMSendEmail::kNote, report.strSubject.c_str(),
                                                    report.strBody.c_str(), zipPath, nullptr)
                   ? TRUE
                   : FALSE;
    }
    if (!sent) {
        ShowFailure(resources.Handle());
    }
}
