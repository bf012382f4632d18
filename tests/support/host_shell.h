// Commands of the host, the Unix side of Wine, for what Windows calls cannot
// do here, such as reading Wine's debug channels (on the host's stderr).
#pragma once

#include <windows.h>

#include <string>
#include <vector>

// The host path of a Windows path (UTF-8).
std::string HostPath(const std::wstring& windowsPath);

// Runs script with the host's /bin/sh, args as $1, $2...; its exit status, or
// -1 after timeoutMs. Wine gives no handle of a host program: a file marks the end.
int RunHostShell(const std::string& script, const std::vector<std::string>& args,
                 DWORD timeoutMs = 120000);
