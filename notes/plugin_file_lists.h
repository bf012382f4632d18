// The file names of the Notes plug-in: the current generation, the previous
// generation, and the extra files of the previous generation's own folder.
// The copy, removal and completion walks go through them in this order.
#pragma once

constexpr int kPluginFileCount = 28;
extern const wchar_t* const kPluginFiles[kPluginFileCount];

constexpr int kOldPluginFileCount = 20;
extern const wchar_t* const kOldPluginFiles[kOldPluginFileCount];

constexpr int kOldInstallExtraFileCount = 5;
extern const wchar_t* const kOldInstallExtraFiles[kOldInstallExtraFileCount];

// Names the copy into the Notes folder leaves out. The URL library is never
// removed either; the database is removed with the plug-in.
extern const wchar_t kSharedUrlLibrary[];  // "NIURL.dll"
extern const wchar_t kPluginDatabase[];    // "mirovan.nsf"

// File-name comparison of the plug-in code (case-insensitive).
bool IsSameFileName(const wchar_t* a, const wchar_t* b);
