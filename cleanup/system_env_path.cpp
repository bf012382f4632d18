#include "cleanup/system_env_path.h"

// Filled in with the machine path work.
void SetQMInstallPathToSystemEnv(const wchar_t*) {}
void RemoveQMInstallPathFromSystemEnv(const wchar_t*) {}
void RestoreSysEnvironment() {}
void RefreshSysEnv() {}
