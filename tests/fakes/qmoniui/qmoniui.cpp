// Stand-in for the suite's UI library: records the message boxes it is asked
// to show and the attendee postings, and answers with the result named by
// QM_FAKE_ONIUI_RESULT (1 when unset).
#include <windows.h>

#include <string>

#include "tests/fakes/common/fake_recorder.h"
#include "tests/fakes/common/fake_text.h"

namespace {

int ScriptedResult() {
    std::wstring value = fake::EnvironmentValue(L"QM_FAKE_ONIUI_RESULT");
    return value.empty() ? 1 : _wtoi(value.c_str());
}

}  // namespace

extern "C" int WINAPI QclMessageBox(HWND owner, const wchar_t* text, const wchar_t* caption,
                                    UINT style) {
    char numbers[64];
    wsprintfA(numbers, "owner=%lu style=0x%x",
              static_cast<unsigned long>(reinterpret_cast<ULONG_PTR>(owner)), style);
    fake::RecordCall(std::string("QclMessageBox ") + numbers + " text=" + fake::Utf8(text) +
                     " caption=" + fake::Utf8(caption));
    return ScriptedResult();
}

extern "C" int WINAPI PostAttendee(const wchar_t* commandLine) {
    fake::RecordCall("PostAttendee " + fake::Utf8(commandLine));
    return ScriptedResult();
}
