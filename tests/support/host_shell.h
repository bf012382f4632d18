// Commands of the host, the Unix side of Wine, for what Windows calls cannot
// do here, such as reading Wine's debug channels: they go to the host's
// standard error of the process that started wine.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

// The host path of a Windows path (UTF-8).
std::string HostPath(const std::wstring& windowsPath);

// Runs script with the host's /bin/sh, args as $1, $2...; the script's exit
// status, or -1 when it did not end within timeoutMs. Wine starts a host
// program but hands back no handle to wait on, so the end is marked in a file.
int RunHostShell(const std::string& script, const std::vector<std::string>& args,
                 DWORD timeoutMs = 120000);
