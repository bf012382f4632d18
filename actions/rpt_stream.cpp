#include "actions/rpt_stream.h"

#include <new>

#include "base/string_ex.h"
#include "base/trace.h"
#include "base/win_handles.h"

namespace {

HANDLE OpenForReading(const wchar_t* path) {
    return CreateFileW(path, GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                       FILE_ATTRIBUTE_NORMAL, nullptr);
}

// Deletes the copy of a trace file in use (if one was made) when the read is
// over; declared before the file's handle so that the handle closes first.
class CopyRemover {
public:
    explicit CopyRemover(const CStringEx& path) : m_path(path) {}
    ~CopyRemover() {
        if (!m_path.IsEmpty()) {
            DeleteFileW(m_path.c_str());
        }
    }
    CopyRemover(const CopyRemover&) = delete;
    CopyRemover& operator=(const CopyRemover&) = delete;

private:
    const CStringEx& m_path;
};

}  // namespace

BOOL CRptStream::ReadExpected(HANDLE file, DWORD expected, DWORD extra) {
    Clear();
    if (expected > 0xFFFFFFFF - extra) {
        return FALSE;
    }
    if (expected + extra > m_capacity) {
        m_data.reset();
        m_capacity = 0;
        m_data.reset(new (std::nothrow) BYTE[expected + extra]);
        if (!m_data) {
            return FALSE;
        }
        m_capacity = expected + extra;
    }
    BYTE* data = m_data.get();
    DWORD total = 0;
    while (total < expected) {
        DWORD got = 0;
        if (!::ReadFile(file, data + total, expected - total, &got, nullptr) || got == 0) {
            return FALSE;  // failed, or the file ended early: it shrank
        }
        total += got;
    }
    for (DWORD i = 0; i < extra; ++i) {
        data[expected + i] = 0;
    }
    m_size = expected;
    return TRUE;
}

BOOL CRptStream::ReadFromFile(const wchar_t* path, BOOL addTerminator) {
    Clear();
    if (path == nullptr) {
        return FALSE;
    }
    CStringEx copyPath;
    CopyRemover removeCopy(copyPath);
    UniqueFileHandle file(OpenForReading(path));
    if (!file) {
        DWORD error = GetLastError();
        if (error != ERROR_SHARING_VIOLATION) {
            TraceLevel2(TraceValue("CRptStream::ReadFromFile CreateFile error"),
                        TraceNamed("(LPCTSTR)strCopyTag", L""),
                        TraceNamed("hFile", static_cast<const void*>(file.get())),
                        TraceNamed("dwErr", error));
            return FALSE;
        }
        // The trace library is still writing the file: read a copy of it.
        copyPath.Format(L"%s.mvt", path);
        if (CopyFileW(path, copyPath.c_str(), FALSE)) {
            file.reset(OpenForReading(copyPath.c_str()));
        }
        if (!file) {
            DWORD copyError = GetLastError();
            TraceLevel2(TraceValue("CRptStream::ReadFromFile for FILE_ATTRIBUTE_ARCHIVE error"),
                        TraceNamed("(LPCTSTR)strCopyTag", copyPath),
                        TraceNamed("hFile", static_cast<const void*>(file.get())),
                        TraceNamed("dwErr", copyError));
            return FALSE;
        }
        TraceLevel2(TraceValue("CRptStream::ReadFromFile for FILE_ATTRIBUTE_ARCHIVE success"),
                    TraceNamed("(LPCTSTR)strCopyTag", copyPath),
                    TraceNamed("hFile", static_cast<const void*>(file.get())));
    }
    DWORD sizeHigh = 0;
    DWORD size = GetFileSize(file.get(), &sizeHigh);
    if ((size == INVALID_FILE_SIZE && GetLastError() != NO_ERROR) || sizeHigh != 0 || size == 0) {
        return FALSE;
    }
    if (copyPath.IsEmpty() && size > kMaxDirectSize) {
        return FALSE;
    }
    return ReadExpected(file.get(), size, addTerminator ? 2 : 0);
}
