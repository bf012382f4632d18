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
                                      FILE_ATTRIBUTE_NORMAL, nullptr));
    return file && FlushFileBuffers(file.get());
}

// The staged copy takes the target's access rules, so a replaced file is
// protected as the one it replaces. Best effort: a target we may not read the
// rules of keeps the folder's inherited ones.
void CopyAccessRules(const wchar_t* from, const wchar_t* to) {
    PACL dacl = nullptr;
    PSECURITY_DESCRIPTOR descriptor = nullptr;
    if (GetNamedSecurityInfoW(from, SE_FILE_OBJECT, DACL_SECURITY_INFORMATION, nullptr, nullptr,
                              &dacl, nullptr, &descriptor) != ERROR_SUCCESS) {
        return;
    }
    UniqueLocalMem owner(descriptor);
    SECURITY_DESCRIPTOR_CONTROL control = 0;
    DWORD revision = 0;
    if (dacl != nullptr && GetSecurityDescriptorControl(descriptor, &control, &revision)) {
        SECURITY_INFORMATION info = DACL_SECURITY_INFORMATION;
        info |= (control & SE_DACL_PROTECTED) ? PROTECTED_DACL_SECURITY_INFORMATION
                                              : UNPROTECTED_DACL_SECURITY_INFORMATION;
        SetNamedSecurityInfoW(const_cast<wchar_t*>(to), SE_FILE_OBJECT, info, nullptr, nullptr,
                              dacl, nullptr);
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
    if (folder.empty() || folder.size() >= MAX_PATH - 14 ||
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
                                      FILE_ATTRIBUTE_NORMAL, nullptr));
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
        SetFileAttributesW(m_target.c_str(), attributes & ~FILE_ATTRIBUTE_TEMPORARY);
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
