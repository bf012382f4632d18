// The data island of an upload page: the XML text that the page publishes in
// an <xml> element directly under its HTML or BODY element.
#pragma once

#include <windows.h>
#include <exdisp.h>
#include <mshtml.h>

#include "base/string_ex.h"

// Searches element for the island: an "xml" element is the island (its
// innerHTML); an "HTML" or "BODY" element is searched through its children,
// from the last to the first, skipping FORM elements; any other element
// holds none. Tag names compare without regard to case.
bool FindXmlIsland(IHTMLElement* element, CStringEx& island);

// The island of the page shown in browser. busyMeansNotReady: a page that is
// still loading is not searched.
bool ReadPageIsland(IWebBrowserApp* browser, bool busyMeansNotReady, CStringEx& island);
