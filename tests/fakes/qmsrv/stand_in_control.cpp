#include "tests/fakes/qmsrv/stand_in_control.h"

#include <tlhelp32.h>

#include <cstdlib>

#include "tests/support/file_util.h"

std::vector<ServiceEntry> ParseServiceLog(const std::string& bytes) {
    std::vector<ServiceEntry> entries;
    size_t pos = 0;
    while (pos < bytes.size()) {
        size_t end = bytes.find('\n', pos);
        if (end == std::string::npos) {
            break;
        }
        ServiceEntry entry;
        std::string header = bytes.substr(pos, end - pos);
        size_t space1 = header.find(' ');
        size_t space2 = header.rfind(' ');
        if (space1 == std::string::npos || space2 == space1) {
            break;
        }
        entry.kind = header.substr(0, space1);
        entry.name = header.substr(space1 + 1, space2 - space1 - 1);
        int count = atoi(header.c_str() + space2 + 1);
        pos = end + 1;
        for (int i = 0; i < count && pos < bytes.size(); ++i) {
            if (bytes.compare(pos, 5, "null\n") == 0) {
                entry.args.push_back("(null)");
                pos += 5;
                continue;
            }
            size_t colon = bytes.find(':', pos);
            if (colon == std::string::npos) {
                return entries;
            }
            size_t length = strtoul(bytes.c_str() + pos, nullptr, 10);
            entry.args.push_back(bytes.substr(colon + 1, length));
            pos = colon + 1 + length + 1;
        }
        entries.push_back(entry);
    }
    return entries;
}

bool ServiceStandIn::Run(const wchar_t* argument) {
    std::wstring line = L"\"" + m_exe + L"\" " + argument;
    STARTUPINFOW startup = {};
    startup.cb = sizeof(startup);
    PROCESS_INFORMATION process = {};
    if (!CreateProcessW(nullptr, &line[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup,
                        &process)) {
        return false;
    }
    WaitForSingleObject(process.hProcess, 30000);
    DWORD exitCode = 1;
    GetExitCodeProcess(process.hProcess, &exitCode);
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
    return exitCode == 0;
}

namespace {

std::vector<DWORD> ProcessIdsNamed(const wchar_t* name) {
    std::vector<DWORD> ids;
    HANDLE snapshot = CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0);
    PROCESSENTRY32W entry = {};
    entry.dwSize = sizeof(entry);
    for (BOOL more = Process32FirstW(snapshot, &entry); more;
         more = Process32NextW(snapshot, &entry)) {
        if (_wcsicmp(entry.szExeFile, name) == 0) {
            ids.push_back(entry.th32ProcessID);
        }
    }
    CloseHandle(snapshot);
    return ids;
}

void EndProcesses(const std::vector<DWORD>& ids, bool terminate, DWORD waitMs) {
    for (DWORD id : ids) {
        HANDLE process = OpenProcess(SYNCHRONIZE | PROCESS_TERMINATE, FALSE, id);
        if (process != nullptr) {
            if (terminate) {
                TerminateProcess(process, 1);
            }
            WaitForSingleObject(process, waitMs);
            CloseHandle(process);
        }
    }
}

}  // namespace

void ServiceStandIn::WaitForServersToEnd(DWORD timeoutMs) {
    DWORD start = GetTickCount();
    for (std::vector<DWORD> running = ProcessIdsNamed(L"qmSrv.exe"); !running.empty();
         running = ProcessIdsNamed(L"qmSrv.exe")) {
        if (GetTickCount() - start <= timeoutMs) {
            EndProcesses(running, false, 200);
            continue;
        }
        // A server ended from outside leaves its classes registered in rpcss,
        // which then turns every later activation away: restart rpcss too.
        EndProcesses(running, true, 5000);
        EndProcesses(ProcessIdsNamed(L"rpcss.exe"), true, 5000);
    }
}

ServiceStandIn::ServiceStandIn(const std::wstring& standInExe, const std::wstring& folder)
    : m_exe(standInExe), m_script(folder + L"\\qmsrv-script.txt"), m_log(folder + L"\\qmsrv.log") {
    CreateDirectoryW(folder.c_str(), nullptr);
    SetScript("");
    m_registered = Register();
    SetEnvironmentVariableW(L"QM_FAKE_QMSRV_SCRIPT", m_script.c_str());
    SetEnvironmentVariableW(L"QM_FAKE_QMSRV_LOG", m_log.c_str());
}

ServiceStandIn::~ServiceStandIn() {
    WaitForServersToEnd();
    Unregister();
    SetEnvironmentVariableW(L"QM_FAKE_QMSRV_SCRIPT", nullptr);
    SetEnvironmentVariableW(L"QM_FAKE_QMSRV_LOG", nullptr);
    DeleteFileW(m_script.c_str());
    DeleteFileW(m_log.c_str());
}

void ServiceStandIn::SetScript(const std::string& text) {
    WriteFileBytes(m_script, text);
    DeleteFileW(m_log.c_str());
}

std::vector<ServiceEntry> ServiceStandIn::Log() const {
    return ParseServiceLog(ReadFileBytes(m_log));
}

std::vector<ServiceEntry> ServiceStandIn::Calls(const std::string& method) const {
    std::vector<ServiceEntry> calls;
    for (const ServiceEntry& entry : Log()) {
        if (entry.kind == "call" && (method.empty() || entry.name == method)) {
            calls.push_back(entry);
        }
    }
    return calls;
}

std::vector<std::string> ServiceStandIn::CallNames() const {
    std::vector<std::string> names;
    for (const ServiceEntry& entry : Calls()) {
        names.push_back(entry.name);
    }
    return names;
}

double ServiceStandIn::TimeOf(const std::string& kind, const std::string& name) const {
    for (const ServiceEntry& entry : Log()) {
        if (entry.kind == kind && entry.name == name && !entry.args.empty()) {
            return atof(entry.kind == "event" ? entry.args[0].c_str() : entry.args.back().c_str());
        }
    }
    return -1;
}
