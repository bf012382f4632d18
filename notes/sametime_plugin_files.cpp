// Copying the meeting feature into the Sametime client layouts.
#include "notes/sametime_plugin_files.h"

#include "base/reparse_guard.h"
#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "notes/notes_plugin_files.h"
#include "notes/product_locations.h"
#include "notes/sametime_layout.h"

namespace sl = sametime_layout;

namespace {

void LogFailure(const char* message) {
    TraceLevel8(TraceValue(std::string(message) + "\n"));
}

// installFolder\name to targetFolder\name, renaming a locked target aside.
bool CopyWithBackup(const wchar_t* installFolder, const wchar_t* name,
                    const CStringEx& targetFolder) {
    CStringEx source = JoinLocalPath(installFolder, name);
    CStringEx target = JoinLocalPath(targetFolder.c_str(), name);
    return CopyFileWithBackup(source.c_str(), target.c_str(), FALSE);
}

// Creates featuresFolder\<feature folder> (one level) and copies feature.xml into it.
bool CopyFeatureDescriptor(const wchar_t* installFolder, const CStringEx& featuresFolder) {
    CStringEx featureFolder = JoinLocalPath(featuresFolder.c_str(), sl::kFeatureFolderName);
    CreateDirectoryW(featureFolder.c_str(), nullptr);  // an existing folder is fine
    return CopyWithBackup(installFolder, sl::kFeatureXml, featureFolder);
}

// The plain copy of the embedded files into the Notes data folder, with its
// trace of both paths; the target's folder is created first when one is
// named (one level, an existing folder is fine). The data folder may be the
// user's own: a target behind a reparse point below it is refused like a
// failed copy.
bool CopyEmbeddedFile(const wchar_t* dataFolder, const CStringEx& source, const CStringEx& target,
                      const wchar_t* folderToCreate = nullptr) {
    TraceLevel1(TraceNamed("szTargetFilePath", target), TraceNamed("szSourceFilePath", source));
    const bool allowed = IsFreeOfReparsePoints(dataFolder, target.c_str());
    if (allowed && folderToCreate != nullptr) {
        CreateDirectoryW(folderToCreate, nullptr);
    }
    if (!allowed || !CopyFileW(source.c_str(), target.c_str(), FALSE)) {
        LogFailure("NIHandle::CopyEmbeddedST8PluginFiles: CopyFile Failed!");
        return false;
    }
    return true;
}

}  // namespace

bool CopySametimePluginFiles(const wchar_t* sametimeFolder, const wchar_t* installFolder) {
    TraceLevel1(TraceValue("CopySametimePluginFiles"));
    if (sametimeFolder == nullptr || installFolder == nullptr) {
        LogFailure("NIHandle:CopySametimePluginFiles: Input Para is NULL!");
        return false;
    }
    // An empty folder comes from a failed lookup; joined to a name it would
    // point at the drive root.
    if (IsEmptyText(sametimeFolder) || IsEmptyText(installFolder)) {
        return false;
    }
    CStringEx native = JoinLocalPath(sametimeFolder, sl::kST7NativeFolder);
    if (!CopyWithBackup(installFolder, sl::kNativeLibrary, native)) {
        LogFailure("CQMCommon::CopySametimePluginFiles: CopyFile MIROVAN_SAMETIME_DLL Failed!");
        return false;
    }
    // The runtime is best effort: a failure is logged and the copy goes on.
    if (!CopyWithBackup(installFolder, sl::kRuntimeC, native)) {
        LogFailure("CQMCommon::CopySametimePluginFiles: CopyFile MSVCR120_DLL Failed!");
    } else if (!CopyWithBackup(installFolder, sl::kRuntimeCpp, native)) {
        LogFailure("CQMCommon::CopySametimePluginFiles: CopyFile MSVCP120_DLL Failed!");
    }
    if (!CopyWithBackup(installFolder, sl::kJar,
                        JoinLocalPath(sametimeFolder, sl::kST7PluginsFolder)) ||
        !CopyFeatureDescriptor(installFolder,
                               JoinLocalPath(sametimeFolder, sl::kST7FeaturesFolder))) {
        LogFailure("CQMCommon::CopySametimePluginFiles: CopyFile Failed!");
        return false;
    }
    return true;
}

bool CopySametime8PluginFiles(const wchar_t* sametimeFolder, const wchar_t* installFolder) {
    TraceLevel1(TraceValue("CopySametime8PluginFiles"));
    if (sametimeFolder == nullptr || installFolder == nullptr) {
        LogFailure("NIHandle:CopySametime8PluginFiles: Input Para is NULL!");
        return false;
    }
    if (IsEmptyText(sametimeFolder) || IsEmptyText(installFolder)) {
        return false;
    }
    CStringEx rcp = JoinLocalPath(sametimeFolder, sl::kST8NativeFolder);
    if (!CopyWithBackup(installFolder, sl::kNativeLibrary, rcp)) {
        LogFailure("NIHandle:: CopySametime8PluginFiles: CopyFile MIROVAN_SAMETIME_DLL Failed!");
        return false;
    }
    // Sametime 8 takes the C++ runtime first.
    if (!CopyWithBackup(installFolder, sl::kRuntimeCpp, rcp)) {
        LogFailure("CQMCommon::CopySametimePluginFiles: CopyFile MSVCP120_DLL Failed!");
    } else if (!CopyWithBackup(installFolder, sl::kRuntimeC, rcp)) {
        LogFailure("CQMCommon::CopySametimePluginFiles: CopyFile MSVCR120_DLL Failed!");
    }
    if (!CopyWithBackup(installFolder, sl::kJar,
                        JoinLocalPath(sametimeFolder, sl::kST8PluginsFolder)) ||
        !CopyFeatureDescriptor(installFolder,
                               JoinLocalPath(sametimeFolder, sl::kST8FeaturesFolder))) {
        LogFailure("NIHandle::CopySametime8PluginFiles: CopyFile Failed!");
        return false;
    }
    return true;
}

bool CopyEmbeddedST8PluginFiles(const wchar_t* notesFolder, const wchar_t* installFolder) {
    TraceLevel1(TraceValue("CopyEmbeddedST8PluginFiles"));
    if (notesFolder == nullptr || installFolder == nullptr) {
        LogFailure("NIHandle:CopyEmbeddedST8PluginFiles: Input Para is NULL!");
        return false;
    }
    if (IsEmptyText(installFolder)) {
        return false;
    }
    // Only the native library goes into the Notes program folder. The jar and
    // the feature go to the data folder, found on its own, so a program
    // folder that was not found (or is relative) holds only the library back.
    const bool notesFound = IsFullFolderPath(notesFolder);
    if (notesFound) {
        CStringEx source = JoinLocalPath(installFolder, sl::kNativeLibrary);
        CStringEx target = JoinLocalPath(notesFolder, sl::kNativeLibrary);
        if (!CopyFileW(source.c_str(), target.c_str(), FALSE)) {
            LogFailure("NIHandle:: CopyEmbeddedST8PluginFiles: CopyFile Failed!");
        }
    }
    CopyEmbeddedST8FilesForMultiUser(installFolder);
    return notesFound;
}

bool CopyEmbeddedST8FilesForMultiUser(const wchar_t* installFolder) {
    TraceLevel1(TraceValue("CopyEmbeddedST8FilesForMultiUser"));
    if (IsEmptyText(installFolder)) {
        return false;
    }
    wchar_t data[kLargeLocationCapacity] = {};
    DWORD version = sl::kPresetVersion;
    if (!GetEmbeddedSTDataPath(data, kLargeLocationCapacity, &version) || IsEmptyText(data)) {
        return false;
    }
    CopyEmbeddedFile(
        data, JoinLocalPath(installFolder, sl::kJar),
        JoinLocalPath(JoinLocalPath(data, sl::kEmbeddedPluginsFolder).c_str(), sl::kJar));

    CStringEx featureFolder = JoinLocalPath(
        JoinLocalPath(data, sl::kEmbeddedFeaturesFolder).c_str(), sl::kFeatureFolderName);
    return CopyEmbeddedFile(data, JoinLocalPath(installFolder, sl::kFeatureXml),
                            JoinLocalPath(featureFolder.c_str(), sl::kFeatureXml),
                            featureFolder.c_str());
}
