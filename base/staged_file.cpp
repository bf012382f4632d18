#include "base/staged_file.h"

#include <aclapi.h>

#include "base/trace.h"
#include "base/win_handles.h"

namespace {

// The folder part of path, without the trailing backslash; empty when the
// path names no folder.
std::wstring FolderOf(const std::wstring& path) {
    size_t slash = path.find_last_of(L"\\/");
    if (slash == std::wstring::npos || slash == 0) {
        return std::wstring();
    }
    return path.substr(0, slash);
}

bool FlushToDisk(const wchar_t* path) {
    UniqueFileHandle file(CreateFileW(path, GENERIC_WRITE, 0, nullptr, OPEN_EXISTING,
                                      FILE_FLAG_OPEN_REPARSE_POINT, nullptr));
    return file && FlushFileBuffers(file.get());
}

// The staged copy takes the target's access rules and, where the account may
// hand it on, its owner: a user's file rewritten by the system account stays
// the user's. Best effort: a target we may not read the rules of keeps the
// folder's inherited ones.
void CopyAccessRules(const wchar_t* from, const wchar_t* to) {
    PSID ownerSid = nullptr;
    PACL dacl = nullptr;
    PSECURITY_DESCRIPTOR descriptor = nullptr;
    if (GetNamedSecurityInfoW(from, SE_FILE_OBJECT,
                              OWNER_SECURITY_INFORMATION | DACL_SECURITY_INFORMATION, &ownerSid,
                              nullptr, &dacl, nullptr, &descriptor) != ERROR_SUCCESS) {
        return;
    }
    UniqueLocalMem descriptorOwner(descriptor);
    wchar_t* staging = const_cast<wchar_t*>(to);
    SECURITY_DESCRIPTOR_CONTROL control = 0;
    DWORD revision = 0;
    if (dacl != nullptr && GetSecurityDescriptorControl(descriptor, &control, &revision)) {
        SECURITY_INFORMATION info = DACL_SECURITY_INFORMATION;
        info |= (control & SE_DACL_PROTECTED) ? PROTECTED_DACL_SECURITY_INFORMATION
                                              : UNPROTECTED_DACL_SECURITY_INFORMATION;
        SetNamedSecurityInfoW(staging, SE_FILE_OBJECT, info, nullptr, nullptr, dacl, nullptr);
    }
    if (ownerSid != nullptr) {
        // Needs the restore privilege for another account's owner; without it
        // the file stays ours, its access rules as above.
        SetNamedSecurityInfoW(staging, SE_FILE_OBJECT, OWNER_SECURITY_INFORMATION, ownerSid,
                              nullptr, nullptr, nullptr);
    }
}

}  // namespace

StagedFile::StagedFile(const wchar_t* target) : m_target(target ? target : L"") {}

StagedFile::~StagedFile() {
    if (!m_committed) {
        Discard();
    }
}

bool StagedFile::Begin() {
    Discard();
    std::wstring folder = FolderOf(m_target);
    wchar_t staging[MAX_PATH] = {};
    // GetTempFileNameW takes a folder of up to MAX_PATH - 14 characters.
    if (folder.empty() || folder.size() > MAX_PATH - 14 ||
        GetTempFileNameW(folder.c_str(), L"qm~", 0, staging) == 0) {
        TraceLevel4(TraceValue("StagedFile: cannot create a staging file beside"),
                    TraceNamed("target", m_target.c_str()),
                    TraceNamed("GetLastError", GetLastError()));
        return false;
    }
    m_staging = staging;
    return true;
}

bool StagedFile::Write(const void* bytes, size_t size) {
    if (m_staging.empty() || size > MAXDWORD) {
        return false;
    }
    UniqueFileHandle file(CreateFileW(m_staging.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS,
                                      FILE_FLAG_OPEN_REPARSE_POINT, nullptr));
    DWORD written = 0;
    return file && WriteFile(file.get(), bytes, static_cast<DWORD>(size), &written, nullptr) &&
           written == size;
}

bool StagedFile::Commit() {
    if (m_staging.empty()) {
        return false;
    }
    if (!FlushToDisk(m_staging.c_str())) {
        TraceLevel4(TraceValue("StagedFile: cannot flush"),
                    TraceNamed("staging", m_staging.c_str()),
                    TraceNamed("GetLastError", GetLastError()));
        Discard();
        return false;
    }
    DWORD attributes = GetFileAttributesW(m_target.c_str());
    // Windows refuses to replace a read-only file; so do we where the
    // attribute would be ignored (an account that bypasses file modes).
    if (attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_READONLY)) {
        TraceLevel4(TraceValue("StagedFile: the target is read-only"),
                    TraceNamed("target", m_target.c_str()));
        Discard();
        return false;
    }
    if (attributes != INVALID_FILE_ATTRIBUTES) {
        CopyAccessRules(m_target.c_str(), m_staging.c_str());
    }
    if (!MoveFileExW(m_staging.c_str(), m_target.c_str(),
                     MOVEFILE_REPLACE_EXISTING | MOVEFILE_WRITE_THROUGH)) {
        TraceLevel4(TraceValue("StagedFile: cannot replace"),
                    TraceNamed("target", m_target.c_str()),
                    TraceNamed("GetLastError", GetLastError()));
        Discard();
        return false;
    }
    m_committed = true;
    if (attributes != INVALID_FILE_ATTRIBUTES) {
        // Only what a file may be given (a replaced link's reparse flag is not).
        const DWORD kept =
            attributes & (FILE_ATTRIBUTE_HIDDEN | FILE_ATTRIBUTE_SYSTEM | FILE_ATTRIBUTE_ARCHIVE |
                          FILE_ATTRIBUTE_NOT_CONTENT_INDEXED);
        SetFileAttributesW(m_target.c_str(), kept != 0 ? kept : FILE_ATTRIBUTE_NORMAL);
    }
    return true;
}

void StagedFile::Discard() {
    if (!m_staging.empty()) {
        SetFileAttributesW(m_staging.c_str(), FILE_ATTRIBUTE_NORMAL);
        DeleteFileW(m_staging.c_str());
        m_staging.clear();
    }
}

bool WriteFileStaged(const wchar_t* target, const void* bytes, size_t size) {
    StagedFile staged(target);
    return staged.Begin() && staged.Write(bytes, size) && staged.Commit();
}
