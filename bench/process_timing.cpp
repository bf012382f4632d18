#include "bench/process_timing.h"

#include <shlwapi.h>

#include <vector>

namespace {

void RunOnce(const std::wstring& commandLine) {
    std::vector<wchar_t> line(commandLine.begin(), commandLine.end());
    line.push_back(L'\0');
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessW(nullptr, line.data(), nullptr, nullptr, FALSE, 0, nullptr, nullptr,
                        &startup, &process)) {
        return;
    }
    WaitForSingleObject(process.hProcess, INFINITE);
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
}

}  // namespace

double NowMilliseconds() {
    LARGE_INTEGER frequency, now;
    QueryPerformanceFrequency(&frequency);
    QueryPerformanceCounter(&now);
    return static_cast<double>(now.QuadPart) * 1000.0 / static_cast<double>(frequency.QuadPart);
}

double MeanProcessMilliseconds(const std::wstring& commandLine, int runs, int warmUp) {
    for (int i = 0; i < warmUp; ++i) {
        RunOnce(commandLine);
    }
    double start = NowMilliseconds();
    for (int i = 0; i < runs; ++i) {
        RunOnce(commandLine);
    }
    return (NowMilliseconds() - start) / runs;
}

std::wstring BenchBinDir() {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, path, MAX_PATH);
    PathRemoveFileSpecW(path);  // bin/bench
    PathRemoveFileSpecW(path);  // bin
    return path;
}

ProgramCopy::ProgramCopy(const wchar_t* folderName) {
    wchar_t temp[MAX_PATH] = {};
    GetTempPathW(MAX_PATH, temp);
    m_folder = std::wstring(temp) + folderName;
    m_program = m_folder + L"\\qmMrvONI.exe";
    CreateDirectoryW(m_folder.c_str(), nullptr);
    std::wstring bin = BenchBinDir();
    CopyFileW((bin + L"\\qmMrvONI.exe").c_str(), m_program.c_str(), FALSE);
    CopyFileW((bin + L"\\fakes\\mrvtrace.dll").c_str(), (m_folder + L"\\mrvtrace.dll").c_str(),
              FALSE);
    SetEnvironmentVariableW(L"QM_FAKE_TRACE_LOG", nullptr);
}

ProgramCopy::~ProgramCopy() {
    DeleteFileW(m_program.c_str());
    DeleteFileW((m_folder + L"\\mrvtrace.dll").c_str());
    RemoveDirectoryW(m_folder.c_str());
}
