#include "notes/notes_plugin_files.h"

// Filled in with the Notes plug-in file work.
bool CopyFileWithBackup(const wchar_t*, const wchar_t*, BOOL) {
    return false;
}
bool IsFileAllowRW(const wchar_t*) {
    return false;
}
bool CopyNotesPluginFiles(const wchar_t*, const wchar_t*) {
    return false;
}
bool CopyPluginRemainedFiles(const wchar_t*, const wchar_t*) {
    return false;
}
bool RemoveNotesPluginFiles(const wchar_t*) {
    return false;
}
bool RemoveOldNotesPluginFiles(const wchar_t*) {
    return false;
}
bool DeleteInstallFolder(const wchar_t*) {
    return false;
}
bool RemoveFilesSpecPostfix(const wchar_t*, const wchar_t*) {
    return false;
}
