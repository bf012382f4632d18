// What the stand-in Suite service answers, read once at start from the file
// named by QM_FAKE_QMSRV_SCRIPT, one "Key=Value" a line:
//   HasValidAccount=0                        default 1
//   AccountInfo=<Mirovan_QM>...</Mirovan_QM> GetAccountInfo's document
//   LoginResponse=<Mirovan_QM>...            GeneralCall's response document
//   StartOCMeetingResult=5                   any method's result, default 0
//   DisclaimerCount=2                        CheckIfDisclaimerInProgress answers 1 twice
//   SettingDlgOpenMs=300                     the dialog reports open this long
//   Event=StartOCMeeting Meeting 96 500 7    after each StartOCMeeting call, raise
//                                            meeting event 96 (argument 7) 500 ms
//                                            later; "sync" raises it inside the call
//   Fail=HasValidAccount 1 0x80004005        the 1st HasValidAccount call fails so
//   ExitAfter=StartOCMeeting 200             the process ends 200 ms after that call
#pragma once

#include <windows.h>
#include <oaidl.h>

#include <map>
#include <string>
#include <vector>

namespace fake {

struct ScriptedEvent {
    std::string afterMethod;
    std::string source;  // "Meeting" or "Setting"
    DISPID dispid = 0;
    int delayMs = 0;  // -1: inside the call
    std::vector<long> args;
};

struct ScriptedFailure {
    std::string method;
    int nthCall = 0;
    HRESULT hr = S_OK;
};

struct Script {
    std::map<std::string, std::string> values;
    std::vector<ScriptedEvent> events;
    std::vector<ScriptedFailure> failures;
    std::map<std::string, int> exitAfter;  // method -> delay in ms

    std::string Value(const std::string& key, const std::string& fallback = "") const;
    long Number(const std::string& key, long fallback = 0) const;
};

Script LoadScript();

// The service log named by QM_FAKE_QMSRV_LOG. One entry is a line
// "<kind> <name> <count>" followed by count arguments, each "<bytes>:<text>\n"
// (UTF-8, verbatim) or "null\n".
struct LogArg {
    bool isNull = false;
    std::string text;
};
void LogEntry(const std::string& kind, const std::string& name, const std::vector<LogArg>& args);
LogArg Utf8Arg(const wchar_t* text);  // null stays null
// Milliseconds of the performance counter, comparable across processes,
// and the same as a log argument.
double CounterMs();
LogArg CounterMsArg();

}  // namespace fake
