#include "actions/log_posting.h"

#include "actions/url_object.h"
#include "base/com_owners.h"
#include "base/message_pump.h"
#include "base/path_api.h"
#include "base/proc_address.h"
#include "base/trace.h"
#include "base/win_handles.h"

namespace {

using PostAttendeeFn = int(WINAPI*)(const wchar_t*);

const int kLogModule = 24;
const LONG kBeginValue = 1;
const DWORD kRequestSeconds = 10;
const DWORD kAfterReleaseSeconds = 2;

}  // namespace

void PostAttendeeEx(const wchar_t* commandLine) {
    CAutoFunTrace trace("PostAttendeeEx");
    if (commandLine == nullptr) {
        TraceLevel8(TraceValue("PostAttendeeEx: input para is NULL!\n"));
        return;
    }
    CStringEx path;
    CPathApi::GetResFilePath(nullptr, L"qmONIUI.dll", path);
    UniqueModule library(path.IsEmpty() ? nullptr : LoadLibraryW(path.c_str()));
    auto postAttendee = GetProcAs<PostAttendeeFn>(library.get(), "PostAttendee");
    if (postAttendee == nullptr) {
        TraceLevel8(TraceValue("Load Lib failed or GetProcAddress failed.\n"));
        return;
    }
    if (postAttendee(commandLine) == 0) {
        TraceLevel8(TraceValue("PostAttendeeEx: CALL qmONIUI.dll -->  PostAttendee FAILED!\n"));
    }
}

void PostJMFLog(const CStringEx& logUrl, int errorId) {
    CStringEx strLogUrl(logUrl);
    strLogUrl.TrimRight(L'&');
    CStringEx suffix;
    suffix.Format(L"&Module=%d&ErrorCode=%d", kLogModule, errorId);
    strLogUrl += suffix;
    TraceLevel1(TraceValue("Start PostJMFLog in MrvONI.exe"),
                TraceNamed("strLogUrl.GetConstBuffer()", strLogUrl));

    ComPtr<IMrvURL> request;
    CreateUrlObject(request.GetAddressOf());
    if (!request) {
        TraceLevel8(TraceValue("Can not create URL Object"));
        return;
    }
    UniqueBstr url(SysAllocString(strLogUrl.c_str()));
    request->Begin(kBeginValue);
    request->SetWaitSeconds(static_cast<LONG>(kRequestSeconds));
    request->Request(url.get(), nullptr, 0, 0);
    PumpMessagesFor(kRequestSeconds);
    request->End();
    request.Reset();
    PumpMessagesFor(kAfterReleaseSeconds);
    UnloadUrlLibrary();
}
