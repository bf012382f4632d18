// SilentInstall: the policy values of Communicator and Lync 2013, and the
// status files they name.
#include "presence/custom_status.h"

#include "base/registry.h"
#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "presence/status_paths.h"

namespace {

const wchar_t kCommunicatorKey[] = L"Software\\Policies\\Microsoft\\Communicator";
const wchar_t kLyncKey[] = L"Software\\Policies\\Microsoft\\Office\\15.0\\Lync";
const wchar_t kUrlValue[] = L"CustomStateURL";
const wchar_t kHighSecurityValue[] = L"EnableSIPHighSecurityMode";
const wchar_t kStatusFile[] = L"status.xml";

// The URL written for a status file: its path as the file system gives it,
// unescaped.
CStringEx FileUrl(const CStringEx& path) {
    CStringEx url(L"file://");
    url += path;
    return url;
}

bool ReadsHighSecurityMode(HKEY root, const wchar_t* key) {
    DWORD mode = 0;
    return GetRegDWORD(root, key, kHighSecurityValue, &mode, 0) != FALSE;
}

bool WriteHighSecurityModeOff(HKEY root, const wchar_t* key) {
    return SetRegDWORD(root, key, kHighSecurityValue, 0, 0) != FALSE;
}

bool HasUserLyncKey() {
    return IsRegKeyExist(RedirectedRoot(HKEY_CURRENT_USER), kLyncKey, 0) != FALSE;
}

// No Communicator policy yet: the all-users status file where the machine's
// policy may be written, else the user's own.
void InstallCommunicatorState() {
    CStringEx path;
    if (!CMOCCustomStatusInstall::GetAllUserAppDataMrvQMFilePath(kStatusFile, path) ||
        !SetRegString(HKEY_LOCAL_MACHINE, kCommunicatorKey, kUrlValue, FileUrl(path).c_str(), 0)) {
        TraceLevel4(TraceValue("CMOCCustomStatusInstall::SilentInstall: write HKEY_CURRENT_USER!"));
        // A path that could not be built names no file: no policy for it.
        if (CMOCCustomStatusInstall::GetAppDataMrvQMPath(kStatusFile, path)) {
            SetRegString(HKEY_CURRENT_USER, kCommunicatorKey, kUrlValue, FileUrl(path).c_str(), 0);
        } else {
            path.Empty();
        }
    }
    if (!ReadsHighSecurityMode(HKEY_LOCAL_MACHINE, kCommunicatorKey) &&
        !WriteHighSecurityModeOff(HKEY_LOCAL_MACHINE, kCommunicatorKey)) {
        WriteHighSecurityModeOff(HKEY_CURRENT_USER, kCommunicatorKey);
    }
    if (!path.IsEmpty()) {
        CopyStatusTemplate(path.c_str());
    }
}

// No Lync policy yet: the user's own status file, named by the machine's
// policy, or by the user's where the user already has a Lync policy key.
void InstallLyncState() {
    CStringEx path;
    if (CMOCCustomStatusInstall::GetAppDataMrvQMPath(kStatusFile, path)) {
        CopyStatusTemplate(path.c_str());
        if (IsRegularFile(path.c_str()) &&
            !SetRegString(HKEY_LOCAL_MACHINE, kLyncKey, kUrlValue, FileUrl(path).c_str(), 0) &&
            HasUserLyncKey()) {
            SetRegString(HKEY_CURRENT_USER, kLyncKey, kUrlValue, FileUrl(path).c_str(), 0);
        }
    }
    if (!ReadsHighSecurityMode(HKEY_LOCAL_MACHINE, kLyncKey) &&
        !ReadsHighSecurityMode(HKEY_CURRENT_USER, kLyncKey) &&
        !WriteHighSecurityModeOff(HKEY_LOCAL_MACHINE, kLyncKey) && HasUserLyncKey()) {
        WriteHighSecurityModeOff(HKEY_CURRENT_USER, kLyncKey);
    }
}

int Install() {
    CAutoFunTrace trace("CMOCCustomStatusInstall::SilentInstall");
    int result = 0;
    CStringEx communicatorUrl;
    if (!GetRegString(HKEY_LOCAL_MACHINE, kCommunicatorKey, kUrlValue, communicatorUrl, 0)) {
        InstallCommunicatorState();
        result = 1;
    }
    CStringEx lyncUrl;
    if (IsRegKeyExist(HKEY_LOCAL_MACHINE, kLyncKey, 0)) {
        TraceLevel4(TraceValue(
            "CMOCCustomStatusInstall::SilentInstall: can found the office2013 Lync reg key!"));
        if (!GetRegString(HKEY_LOCAL_MACHINE, kLyncKey, kUrlValue, lyncUrl, 0)) {
            InstallLyncState();
            result = 1;
        }
    }
    for (const CStringEx* url : {&communicatorUrl, &lyncUrl}) {
        if (!url->IsEmpty()) {
            CMOCCustomStatusInstall::ValidateCustomStatusFile(url->c_str());
            result = CMOCCustomStatusInstall::UpdateStatusFileForInstall(url->c_str());
        }
    }
    return result;
}

}  // namespace

int CMOCCustomStatusInstall::SilentInstall() {
    try {
        return Install();
    } catch (...) {
        // Out of memory part-way: each file is either as it was or rewritten
        // whole, and the next run finishes the work.
        TraceLevel8(TraceValue("CMOCCustomStatusInstall::SilentInstall: stopped by an exception"));
        return 0;
    }
}
