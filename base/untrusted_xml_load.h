// Loading into a CMSDom document an XML file that someone other than this
// program may write: the checks of untrusted_xml_bytes.h on the bytes, the
// parse of exactly those bytes without validation or external resolution,
// and no document type in what the parser made of them.
#pragma once

#include <windows.h>

#include "base/untrusted_xml_bytes.h"

// kOk when the file at path passed the checks and parsed into pDoc; else why
// not (nothing is logged: the caller knows what the file is).
UntrustedXmlRead LoadUntrustedXmlFile(IUnknown* pDoc, const wchar_t* path);
