// Stand-in for Simple MAPI: records the message it is given (texts,
// attachments with whether each path opens, flags) as one entry, and answers
// with the code named by QM_FAKE_MAPI_RESULT (0 when unset).
#include <windows.h>
#include <mapi.h>

#include <string>

#include "tests/fakes/common/fake_recorder.h"

namespace {

std::string Text(const char* text) {
    return text == nullptr ? "(null)" : text;
}

bool Opens(const char* path) {
    if (path == nullptr) {
        return false;
    }
    HANDLE file =
        CreateFileA(path, GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING, 0, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        return false;
    }
    CloseHandle(file);
    return true;
}

}  // namespace

extern "C" ULONG WINAPI MAPISendMail(LHANDLE session, ULONG_PTR uiParam, lpMapiMessage message,
                                     FLAGS flags, ULONG reserved) {
    std::string entry = "MAPISendMail session=" + std::to_string(session) +
                        " ui=" + std::to_string(uiParam) + " flags=" + std::to_string(flags) +
                        " reserved=" + std::to_string(reserved) + "\n";
    if (message != nullptr) {
        entry += "subject=" + Text(message->lpszSubject) + "\n";
        entry += "note=" + Text(message->lpszNoteText) + "\n";
        entry += "recipients=" + std::to_string(message->nRecipCount) +
                 " originator=" + (message->lpOriginator ? "set" : "none") + "\n";
        for (ULONG i = 0; i < message->nFileCount && message->lpFiles != nullptr; ++i) {
            const MapiFileDesc& file = message->lpFiles[i];
            entry += "attachment position=" + std::to_string(file.nPosition) +
                     " name=" + Text(file.lpszFileName) +
                     " opens=" + (Opens(file.lpszPathName) ? "1" : "0") +
                     " path=" + Text(file.lpszPathName) + "\n";
        }
    }
    fake::AppendToFileNamedBy(L"QM_FAKE_CALLS_LOG", entry);
    std::wstring result = fake::EnvironmentValue(L"QM_FAKE_MAPI_RESULT");
    return result.empty() ? 0 : static_cast<ULONG>(_wtoi(result.c_str()));
}
