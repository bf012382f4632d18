// What an upload page's data island says: its status and its result fields.
#pragma once

#include "base/oixml.h"
#include "base/string_ex.h"

// The child `name`, or `lowerName` when there is no `name`; empty when neither.
CStringEx IslandField(const COIXML& island, const wchar_t* name, const wchar_t* lowerName);

// "Status" (or "status"), without spaces at either end, is SUCCESS in any case.
bool IslandReportsSuccess(const COIXML& island);

// An uploaded file's path as the page gives it, without its leading "/"
// characters and then its leading "\" characters.
CStringEx UploadedFileName(const COIXML& island);
