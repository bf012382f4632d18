#include "base/untrusted_xml_bytes.h"

#include "base/com_owners.h"
#include "base/win_handles.h"

namespace {

// Unlocks the data of a safe array at the end of a scope.
class SafeArrayDataLock {
public:
    explicit SafeArrayDataLock(SAFEARRAY* array) : m_array(array) {
        if (FAILED(SafeArrayAccessData(array, &m_data))) {
            m_data = nullptr;
        }
    }
    ~SafeArrayDataLock() {
        if (m_data != nullptr) {
            SafeArrayUnaccessData(m_array);
        }
    }
    SafeArrayDataLock(const SafeArrayDataLock&) = delete;
    SafeArrayDataLock& operator=(const SafeArrayDataLock&) = delete;

    BYTE* data() const { return static_cast<BYTE*>(m_data); }

private:
    SAFEARRAY* m_array;
    void* m_data = nullptr;
};

bool ReadAll(HANDLE file, BYTE* data, DWORD size) {
    DWORD done = 0;
    while (done < size) {
        DWORD got = 0;
        if (!ReadFile(file, data + done, size - done, &got, nullptr) || got == 0) {
            return false;
        }
        done += got;
    }
    return true;
}

}  // namespace

bool HasDoctypeDeclaration(const BYTE* data, size_t size) {
    static const char kMarker[] = "<!DOCTYPE";
    const size_t markerLength = sizeof(kMarker) - 1;
    size_t matched = 0;
    for (size_t i = 0; i < size; ++i) {
        BYTE ch = data[i];
        if (ch == 0) {
            continue;
        }
        if (ch == static_cast<BYTE>(kMarker[matched])) {
            if (++matched == markerLength) {
                return true;
            }
        } else {
            matched = ch == static_cast<BYTE>(kMarker[0]) ? 1 : 0;
        }
    }
    return false;
}

const char* DescribeUntrustedXmlRead(UntrustedXmlRead reason) {
    switch (reason) {
        case UntrustedXmlRead::kUnreadable:
            return "the file cannot be read\n";
        case UntrustedXmlRead::kEmpty:
            return "the file is empty\n";
        case UntrustedXmlRead::kTooLarge:
            return "the file is too large\n";
        case UntrustedXmlRead::kHasDoctype:
            return "the file has a document type declaration\n";
        case UntrustedXmlRead::kNotWellFormed:
            return "the file is not well-formed XML\n";
        case UntrustedXmlRead::kOk:
            break;
    }
    return "";
}

UntrustedXmlRead ReadUntrustedXml(const wchar_t* path, SAFEARRAY** bytes) {
    if (bytes == nullptr) {
        return UntrustedXmlRead::kUnreadable;
    }
    *bytes = nullptr;
    if (path == nullptr) {
        return UntrustedXmlRead::kUnreadable;
    }
    UniqueFileHandle file(CreateFileW(path, GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                                      FILE_ATTRIBUTE_NORMAL, nullptr));
    if (!file || GetFileType(file.get()) != FILE_TYPE_DISK) {
        return UntrustedXmlRead::kUnreadable;
    }
    LARGE_INTEGER size = {};
    if (!GetFileSizeEx(file.get(), &size) || size.QuadPart < 0) {
        return UntrustedXmlRead::kUnreadable;
    }
    if (size.QuadPart == 0) {
        return UntrustedXmlRead::kEmpty;
    }
    if (static_cast<ULONGLONG>(size.QuadPart) > kMaxUntrustedXmlBytes) {
        return UntrustedXmlRead::kTooLarge;
    }
    const DWORD length = static_cast<DWORD>(size.QuadPart);
    UniqueSafeArray array(SafeArrayCreateVector(VT_UI1, 0, length));
    if (!array) {
        return UntrustedXmlRead::kUnreadable;
    }
    {
        SafeArrayDataLock lock(array.get());
        if (lock.data() == nullptr || !ReadAll(file.get(), lock.data(), length)) {
            return UntrustedXmlRead::kUnreadable;
        }
        if (HasDoctypeDeclaration(lock.data(), length)) {
            return UntrustedXmlRead::kHasDoctype;
        }
    }
    *bytes = array.release();
    return UntrustedXmlRead::kOk;
}
