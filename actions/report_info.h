// What a problem report mails: subject, body and the attachments with the
// titles they are shown under.
#pragma once

#include <vector>

#include "base/string_ex.h"

struct CRptInfo {
    CStringEx strUnused;  // kept for the record's layout; nothing reads it
    CStringEx strSubject;
    CStringEx strBody;
    std::vector<CStringEx> attachmentPaths;
    std::vector<CStringEx> attachmentTitles;
};
