#include "notes/sametime_plugin_files.h"

// Filled in with the Sametime plug-in file work.
bool CopySametimePluginFiles(const wchar_t*, const wchar_t*) {
    return false;
}
bool CopySametime8PluginFiles(const wchar_t*, const wchar_t*) {
    return false;
}
bool CopyEmbeddedST8PluginFiles(const wchar_t*, const wchar_t*) {
    return false;
}
bool CopyEmbeddedST8FilesForMultiUser(const wchar_t*) {
    return false;
}
bool RemoveSametimePluginFiles(const wchar_t*) {
    return false;
}
bool RemoveSametime8PluginFiles(const wchar_t*) {
    return false;
}
bool RemoveEmbeddedST8PluginFiles(const wchar_t*) {
    return false;
}
bool RemoveSametimePluginFilesAfterPCReboot() {
    return false;
}
void DeleteSametimeStampFile() {}
