#include "actions/simple_mapi.h"

#include <vector>

#include "base/ansi_text.h"
#include "base/proc_address.h"
#include "base/trace.h"

namespace {

const ULONG kAttachmentPositionNone = 0xFFFFFFFF;

// The text in the ANSI code page, and whether every character had a place in it.
std::string ToAnsi(const wchar_t* text, bool* exact) {
    BOOL usedDefault = FALSE;
    int needed = WideCharToMultiByte(CP_ACP, 0, text, -1, nullptr, 0, nullptr, &usedDefault);
    std::string result;
    if (needed > 1) {
        result.assign(static_cast<size_t>(needed), '\0');
        WideCharToMultiByte(CP_ACP, 0, text, -1, &result[0], needed, nullptr, &usedDefault);
        result.resize(static_cast<size_t>(needed) - 1);
    }
    *exact = !usedDefault;
    return result;
}

char* Keep(std::vector<std::string>& store, std::string text) {
    store.push_back(std::move(text));
    return &store.back()[0];
}

}  // namespace

std::string CSimpleMapi::AnsiPathForMapi(const wchar_t* path) {
    if (path == nullptr) {
        return std::string();
    }
    bool exact = true;
    std::string ansi = ToAnsi(path, &exact);
    if (exact) {
        return ansi;
    }
    wchar_t shortPath[MAX_PATH] = {};
    DWORD length = GetShortPathNameW(path, shortPath, MAX_PATH);
    if (length == 0 || length >= MAX_PATH) {
        return ansi;
    }
    bool shortExact = true;
    std::string shortAnsi = ToAnsi(shortPath, &shortExact);
    return shortExact ? shortAnsi : ansi;
}

void CSimpleMapi::Init() {
    CAutoFunTrace trace("CSimpleMapi::Init");
    m_module.reset(LoadLibraryW(L"MAPI32.DLL"));
    if (!m_module) {
        TraceLevel2(TraceValue("CSimpleMapi::Init() There is the no MPAI Enviroment"));
        return;
    }
    m_sendMail = GetProcAs<LPMAPISENDMAIL>(m_module.get(), "MAPISendMail");
    if (m_sendMail == nullptr) {
        TraceLevel2(TraceValue(" the CSimpleMAPI init get funciont process failed"));
        DeInit();
        return;
    }
    m_initialized = TRUE;
}

BOOL CSimpleMapi::Send(const CRptInfo& report) {
    CAutoFunTrace trace("CSimpleMapi::Send");
    if (!m_initialized || !m_module) {
        return FALSE;
    }
    size_t count = report.attachmentPaths.size();
    size_t titles = report.attachmentTitles.size();
    if (titles != count) {
        TraceLevel4(TraceValue("nAttachmentTitleSize != nAttachmentSize"));
    }
    // Every text MAPI reads lives here until the call returns; the reserve
    // keeps the pointers handed out valid.
    std::vector<std::string> texts;
    texts.reserve(2 + 2 * count);
    MapiMessage message = {};
    message.lpszSubject = Keep(texts, WideToAnsi(report.strSubject.c_str()));
    message.lpszNoteText = Keep(texts, WideToAnsi(report.strBody.c_str()));
    std::vector<MapiFileDesc> files(count);
    for (size_t i = 0; i < count; ++i) {
        const wchar_t* path = report.attachmentPaths[i].c_str();
        files[i].nPosition = kAttachmentPositionNone;
        files[i].lpszPathName = Keep(texts, AnsiPathForMapi(path));
        files[i].lpszFileName =
            Keep(texts, WideToAnsi(i < titles ? report.attachmentTitles[i].c_str() : path));
    }
    message.nFileCount = static_cast<ULONG>(count);
    message.lpFiles = count > 0 ? files.data() : nullptr;

    ULONG nError = m_sendMail(0, 0, &message, MAPI_LOGON_UI | MAPI_DIALOG, 0);
    if (nError != SUCCESS_SUCCESS && nError != MAPI_USER_ABORT) {
        TraceLevel2(TraceValue("the send a email failed the error number "),
                    TraceNamed("nError", nError));
        // No mail was started: the caller tells the user.
        return FALSE;
    }
    TraceLevel2(TraceValue("send mail success"));
    return TRUE;
}

void CSimpleMapi::DeInit() {
    CAutoFunTrace trace("CSimpleMapi::DeInit");
    m_module.reset();
    m_sendMail = nullptr;
    m_initialized = FALSE;
}
