// The browser stand-in's objects: an Internet Explorer whose page comes from
// a page script (page_script.h), served either by the local server
// iexplore.exe or in-process by iexplore_inproc.dll. Both record "Created",
// "Navigate <url> <vt of the four optional arguments>", "Visible <value>",
// "Quit", "Released", "Closed by the user" and "Gone" in the calls log.
#pragma once

#define CINTERFACE
#define COBJMACROS
#include <windows.h>
#include <objbase.h>

#include <string>

// Reads the page script and opens the page's top-level window (hidden until
// the program shows it) on a thread of its own. ownProcess: the stand-in is
// a process of its own, which ends when the browser is released or gone.
void StartBrowserStandIn(const std::wstring& scriptPath, bool ownProcess);

// The class object of Internet Explorer's class (a static object).
IClassFactory* BrowserClassFactory();
