#include "tests/fakes/qmsrv/fake_script.h"

#include <cstdio>
#include <cstdlib>
#include <sstream>

#include "tests/fakes/common/fake_recorder.h"

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

std::string ReadWholeFile(const std::wstring& path) {
    std::string bytes;
    HANDLE file = CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                              0, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        return bytes;
    }
    char buffer[4096];
    DWORD got = 0;
    while (ReadFile(file, buffer, sizeof(buffer), &got, nullptr) && got > 0) {
        bytes.append(buffer, got);
    }
    CloseHandle(file);
    return bytes;
}

bool WriteWholeFile(const std::wstring& path, const std::string& bytes) {
    HANDLE file = CreateFileW(path.c_str(), GENERIC_WRITE, FILE_SHARE_READ, nullptr, CREATE_ALWAYS,
                              0, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        return false;
    }
    DWORD written = 0;
    BOOL ok = WriteFile(file, bytes.data(), static_cast<DWORD>(bytes.size()), &written, nullptr);
    CloseHandle(file);
    return ok && written == bytes.size();
}

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
    std::istringstream lines(ReadWholeFile(EnvironmentValue(L"QM_FAKE_QMSRV_SCRIPT")));
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
    LogArg arg;
    if (text == nullptr) {
        arg.isNull = true;
        return arg;
    }
    int size = WideCharToMultiByte(CP_UTF8, 0, text, -1, nullptr, 0, nullptr, nullptr);
    if (size > 1) {
        arg.text.resize(size - 1);
        WideCharToMultiByte(CP_UTF8, 0, text, -1, &arg.text[0], size, nullptr, nullptr);
    }
    return arg;
}

std::wstring Widen(const std::string& utf8) {
    if (utf8.empty()) {
        return std::wstring();
    }
    int size =
        MultiByteToWideChar(CP_UTF8, 0, utf8.data(), static_cast<int>(utf8.size()), nullptr, 0);
    std::wstring wide(size, L'\0');
    MultiByteToWideChar(CP_UTF8, 0, utf8.data(), static_cast<int>(utf8.size()), &wide[0], size);
    return wide;
}

double CounterMs() {
    LARGE_INTEGER now, frequency;
    QueryPerformanceCounter(&now);
    QueryPerformanceFrequency(&frequency);
    return static_cast<double>(now.QuadPart) * 1000.0 / static_cast<double>(frequency.QuadPart);
}

}  // namespace fake
