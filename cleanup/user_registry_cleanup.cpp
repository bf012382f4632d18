#include "cleanup/user_registry_cleanup.h"

// Filled in with the per-user registry cleanup.
void ClearCurUserQMReg() {}
void DeleteAllCurUserReg(const wchar_t*, const wchar_t*, const wchar_t*) {}
