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

int RunQuietly(const std::wstring& commandLine) {
    SECURITY_ATTRIBUTES inherit = {sizeof(inherit), nullptr, TRUE};
    HANDLE nul =
        CreateFileW(L"NUL", GENERIC_READ | GENERIC_WRITE, FILE_SHARE_READ | FILE_SHARE_WRITE,
                    &inherit, OPEN_EXISTING, 0, nullptr);
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    startup.dwFlags = STARTF_USESTDHANDLES;
    startup.hStdInput = nul;
    startup.hStdOutput = nul;
    startup.hStdError = nul;
    std::vector<wchar_t> line(commandLine.begin(), commandLine.end());
    line.push_back(L'\0');
    PROCESS_INFORMATION info = {};
    int code = -1;
    if (CreateProcessW(nullptr, line.data(), nullptr, nullptr, TRUE, CREATE_NO_WINDOW, nullptr,
                       nullptr, &startup, &info)) {
        WaitForSingleObject(info.hProcess, INFINITE);
        DWORD exitCode = 0;
        GetExitCodeProcess(info.hProcess, &exitCode);
        code = static_cast<int>(exitCode);
        CloseHandle(info.hThread);
        CloseHandle(info.hProcess);
    }
    if (nul != INVALID_HANDLE_VALUE) {
        CloseHandle(nul);
    }
    return code;
}

std::wstring BuildBinDir() {
    wchar_t path[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, path, MAX_PATH);
    PathRemoveFileSpecW(path);  // bin/bench
    PathRemoveFileSpecW(path);  // bin
    return path;
}

bool WriteWholeFile(const std::wstring& path, const std::string& bytes) {
    HANDLE file = CreateFileW(path.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS,
                              FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        return false;
    }
    DWORD written = 0;
    BOOL ok = WriteFile(file, bytes.data(), static_cast<DWORD>(bytes.size()), &written, nullptr);
    CloseHandle(file);
    return ok && written == bytes.size();
}

std::wstring MakeScratchFolder(const wchar_t* name) {
    wchar_t temp[MAX_PATH] = {};
    GetTempPathW(MAX_PATH, temp);
    std::wstring folder = std::wstring(temp) + name;
    CreateDirectoryW(folder.c_str(), nullptr);
    return folder;
}

ProgramCopy::ProgramCopy(const wchar_t* folderName)
    : m_folder(MakeScratchFolder(folderName)), m_program(m_folder + L"\\qmMrvONI.exe") {
    std::wstring bin = BuildBinDir();
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
