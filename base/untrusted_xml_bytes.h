// Reading an XML file that an ordinary user can write while this program may
// run as the system account: a size limit, and no document type declaration,
// so that neither a DTD nor an entity (internal, external or nested) can reach
// the parser. The bytes handed back are the bytes checked, so the file cannot
// be swapped between the check and the parse.
#pragma once

#include <windows.h>
#include <oleauto.h>

#include <cstddef>

// Far above any real configuration file (a large one holds a few megabytes).
constexpr ULONGLONG kMaxUntrustedXmlBytes = 64ull * 1024 * 1024;

enum class UntrustedXmlRead {
    kOk,
    kUnreadable,  // missing, not a plain file, or a read error
    kEmpty,
    kTooLarge,
    kHasDoctype,
    kNotWellFormed,  // the parser refused the bytes (LoadUntrustedXmlFile)
};

// True when data holds "<!DOCTYPE" in any of the encodings the parser reads
// (UTF-8 and other ASCII supersets, UTF-16 and UCS-4 in either byte order):
// NUL bytes are skipped while matching.
bool HasDoctypeDeclaration(const BYTE* data, size_t size);

// Why a read was refused, as a log line ends it ("the file is too large\n");
// empty for kOk.
const char* DescribeUntrustedXmlRead(UntrustedXmlRead reason);

// Reads the whole file into a new one-dimensional byte array (*bytes, owned
// by the caller, null on failure) after the checks above.
UntrustedXmlRead ReadUntrustedXml(const wchar_t* path, SAFEARRAY** bytes);
