#include "tests/fakes/qmsrv/fake_script.h"

#include <cstdio>
#include <cstdlib>
#include <sstream>

#include "tests/fakes/common/fake_recorder.h"
#include "tests/support/file_util.h"

namespace fake {

namespace {

void AddLine(Script& script, const std::string& key, const std::string& value) {
    std::istringstream in(value);
    if (key == "Event") {
        ScriptedEvent event;
        std::string delay;
        in >> event.afterMethod >> event.source >> event.dispid >> delay;
        event.delayMs = delay == "sync" ? -1 : atoi(delay.c_str());
        long arg = 0;
        while (in >> arg) {
            event.args.push_back(arg);
        }
        script.events.push_back(event);
    } else if (key == "Fail") {
        ScriptedFailure failure;
        std::string hr;
        in >> failure.method >> failure.nthCall >> hr;
        failure.hr = static_cast<HRESULT>(strtoul(hr.c_str(), nullptr, 0));
        script.failures.push_back(failure);
    } else if (key == "ExitAfter") {
        std::string method;
        int delay = 0;
        in >> method >> delay;
        script.exitAfter[method] = delay;
    } else {
        script.values[key] = value;
    }
}

}  // namespace

std::string Script::Value(const std::string& key, const std::string& fallback) const {
    auto found = values.find(key);
    return found == values.end() ? fallback : found->second;
}

long Script::Number(const std::string& key, long fallback) const {
    auto found = values.find(key);
    return found == values.end() ? fallback
                                 : static_cast<long>(strtoul(found->second.c_str(), nullptr, 0));
}

Script LoadScript() {
    Script script;
    std::istringstream lines(ReadFileBytes(EnvironmentValue(L"QM_FAKE_QMSRV_SCRIPT")));
    std::string line;
    while (std::getline(lines, line)) {
        if (!line.empty() && line.back() == '\r') {
            line.pop_back();
        }
        size_t eq = line.find('=');
        if (eq != std::string::npos && line[0] != '#') {
            AddLine(script, line.substr(0, eq), line.substr(eq + 1));
        }
    }
    return script;
}

void LogEntry(const std::string& kind, const std::string& name, const std::vector<LogArg>& args) {
    std::string entry = kind + " " + name + " " + std::to_string(args.size()) + "\n";
    for (const LogArg& arg : args) {
        entry += arg.isNull ? std::string("null\n")
                            : std::to_string(arg.text.size()) + ":" + arg.text + "\n";
    }
    AppendToFileNamedBy(L"QM_FAKE_QMSRV_LOG", entry);
}

LogArg Utf8Arg(const wchar_t* text) {
    return text == nullptr ? LogArg{true, ""} : LogArg{false, Narrow(text)};
}

double CounterMs() {
    LARGE_INTEGER now, frequency;
    QueryPerformanceCounter(&now);
    QueryPerformanceFrequency(&frequency);
    return static_cast<double>(now.QuadPart) * 1000.0 / static_cast<double>(frequency.QuadPart);
}

LogArg CounterMsArg() {
    char text[32];
    snprintf(text, sizeof(text), "%.3f", CounterMs());
    return LogArg{false, text};
}

}  // namespace fake
