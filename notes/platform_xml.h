// The meeting feature's entry in an Eclipse platform.xml: the element
//   <feature id="com.mrv.realtime.meeting.feature"
//            url="features/com.mrv.realtime.meeting.feature_1.0.1/" version="1.0.1"/>
// below an update site element. The file goes through the MSXML 3.0 DOM; it
// is read with the guards of untrusted_xml_bytes.h and never validated, and
// nothing outside it (DTD, entity, schema) is fetched.
// The caller initialises COM.
#pragma once

#include <windows.h>

#include <vector>

enum class PlatformXmlStatus {
    kOk,
    kCannotCreate,  // no DOM document
    kLoadFailed,    // unreadable, too large, malformed or with a DTD
    kNoSite,        // no site expression selected an element
    kEditFailed,    // the feature element could not be added or removed
    kSaveFailed,    // the changed document could not be written
};

// Site expressions, tried in order; the first that selects an element wins.
using SiteXPaths = std::vector<const wchar_t*>;

// Decides, after an edit that changed the document, whether it is written
// back (for example IsFileAllowRW); null writes it always.
using SaveGate = bool (*)(const wchar_t* path);

struct PlatformXmlEdit {
    PlatformXmlStatus status = PlatformXmlStatus::kLoadFailed;
    bool changed = false;  // the feature element was added or removed
    bool saved = false;    // the document was written back
};

// Adds (enable) or removes (disable) the feature element below the site and,
// when that changed the document and the gate allows it, writes it back
// through a staging file that replaces the original in one step. An
// unchanged document is not written at all. A failed write is kSaveFailed
// and leaves the file byte for byte as it was.
PlatformXmlEdit EditPlatformXml(const wchar_t* path, const SiteXPaths& sites, bool enable,
                                SaveGate gate);

// Whether the site lists the feature; never writes.
PlatformXmlStatus TestPlatformXml(const wchar_t* path, const SiteXPaths& sites, bool* listed);
