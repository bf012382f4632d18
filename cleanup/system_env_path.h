// The suite's install folder in the machine-wide search path "Path".
#pragma once

void SetQMInstallPathToSystemEnv(const wchar_t* installFolder);
void RemoveQMInstallPathFromSystemEnv(const wchar_t* installFolder);
void RestoreSysEnvironment();
// Announces the changed environment to running programs.
void RefreshSysEnv();
