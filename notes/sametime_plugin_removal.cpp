// Removing the meeting feature from the Sametime client layouts, at once or
// at the next restart.
#include <cstdio>

#include "base/reparse_guard.h"
#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"
#include "notes/sametime_layout.h"
#include "notes/sametime_plugin_files.h"

namespace sl = sametime_layout;

namespace {

const char kST7DeleteFailed[] = "CQMCommon::RemoveSametimePluginFiles: DeleteFile Failed!";
const char kST8DeleteFailed[] = "NIHandle::RemoveSametime8PluginFiles: DeleteFile Failed!";
const char kST7FeatureDeleteFailed[] = "NIHandle::RemoveSametimePluginFiles: DeleteFile Failed!";

void LogFailure(const char* message) {
    TraceLevel8(TraceValue(std::string(message) + "\n"));
}

// One file of a removal walk: its path below the base folder and the message
// of a failed deletion.
struct RemovalStep {
    CStringEx relativePath;
    const char* failure;
};

CStringEx Join(const wchar_t* first, const wchar_t* second) {
    return JoinLocalPath(first, second);
}

CStringEx FeatureFolderIn(const wchar_t* featuresFolder) {
    return Join(featuresFolder, sl::kFeatureFolderName);
}

CStringEx FeatureXmlIn(const wchar_t* featuresFolder) {
    return Join(FeatureFolderIn(featuresFolder).c_str(), sl::kFeatureXml);
}

// Whether base is a folder the console user controls (the Notes data
// folder): nothing is deleted there through a reparse point below it.
enum class BaseFolder { kMachine, kUser };

bool MayActOn(const wchar_t* base, BaseFolder kind, const CStringEx& path) {
    return kind == BaseFolder::kMachine || IsFreeOfReparsePoints(base, path.c_str());
}

// Deletes each existing file in order; the first failed (or refused)
// deletion stops the walk.
bool DeleteSteps(const wchar_t* base, const RemovalStep* steps, size_t count,
                 BaseFolder kind = BaseFolder::kMachine) {
    for (size_t i = 0; i < count; ++i) {
        CStringEx path = Join(base, steps[i].relativePath.c_str());
        if (IsRegularFile(path.c_str()) &&
            (!MayActOn(base, kind, path) || !DeleteFileW(path.c_str()))) {
            LogFailure(steps[i].failure);
            return false;
        }
    }
    return true;
}

void RemoveFolderIfPresent(const wchar_t* base, const CStringEx& folder,
                           BaseFolder kind = BaseFolder::kMachine) {
    if (IsUsableFolder(folder.c_str()) && MayActOn(base, kind, folder)) {
        RemoveDirectoryW(folder.c_str());
    }
}

// The common walk of Sametime 7 and 8: native library, old runtime, jar,
// feature descriptor, feature folder.
bool RemoveConnectFiles(const wchar_t* folder, const wchar_t* nativeFolder,
                        const wchar_t* pluginsFolder, const wchar_t* featuresFolder,
                        const char* nativeFailure, const char* jarFailure,
                        const char* featureFailure) {
    const RemovalStep steps[] = {
        {Join(nativeFolder, sl::kNativeLibrary), nativeFailure},
        {Join(nativeFolder, sl::kOldRuntimeCpp), kST7DeleteFailed},
        {Join(nativeFolder, sl::kOldRuntimeC), kST7DeleteFailed},
        {Join(nativeFolder, sl::kOldRuntimeManifest), kST7DeleteFailed},
        {Join(pluginsFolder, sl::kJar), jarFailure},
        {FeatureXmlIn(featuresFolder), featureFailure},
    };
    if (!DeleteSteps(folder, steps, sizeof(steps) / sizeof(steps[0]))) {
        return false;
    }
    RemoveFolderIfPresent(folder, Join(folder, FeatureFolderIn(featuresFolder).c_str()));
    return true;
}

// Precondition of the removals: a given, existing folder.
bool AcceptRemovalFolder(const wchar_t* folder, const char* nullMessage) {
    if (folder == nullptr) {
        LogFailure(nullMessage);
        return false;
    }
    if (!IsUsableFolder(folder)) {
        return false;
    }
    TraceLevel1(TraceNamed("lpszFilePath", folder));
    return true;
}

// MoveFileEx with no target: deleted at the next restart; the file need not exist.
bool ScheduleDeletion(const CStringEx& path) {
    return MoveFileExW(path.c_str(), nullptr, MOVEFILE_DELAY_UNTIL_REBOOT) != FALSE;
}

// The same below the Notes data folder, refused through a reparse point.
bool ScheduleDeletionInData(const wchar_t* data, const CStringEx& path) {
    return MayActOn(data, BaseFolder::kUser, path) && ScheduleDeletion(path);
}

void LogSystemError(const char* format) {
    char text[160];
    snprintf(text, sizeof(text), format, static_cast<int>(GetLastError()));
    TraceLevel1(TraceValue(text));
}

bool ScheduleEmbeddedRemoval() {
    wchar_t notes[kLocationCapacity] = {};
    DWORD version = sl::kPresetVersion;
    if (!GetEmbeddedSTPath(notes, kLocationCapacity, &version) || version < sl::kSametime8Version ||
        IsEmptyText(notes)) {
        return true;
    }
    const char kMoveFailed[] = "NIHandle::RemoveEmbedST8PluginFiles: MoveFileEx Failed!\n";
    if (!ScheduleDeletion(Join(notes, sl::kNativeLibrary))) {
        TraceLevel1(TraceValue(kMoveFailed));
        return false;
    }
    wchar_t data[kLargeLocationCapacity] = {};
    DWORD dataVersion = sl::kPresetVersion;
    if (!GetEmbeddedSTDataPath(data, kLargeLocationCapacity, &dataVersion) || IsEmptyText(data)) {
        return true;
    }
    CStringEx features = Join(data, sl::kEmbeddedFeaturesFolder);
    if (!ScheduleDeletionInData(data,
                                Join(Join(data, sl::kEmbeddedPluginsFolder).c_str(), sl::kJar))) {
        TraceLevel1(TraceValue(kMoveFailed));
        return false;
    }
    if (!ScheduleDeletionInData(data, FeatureXmlIn(features.c_str()))) {
        LogSystemError("MoveFileEx FAILED: RemoveEmbedST8PluginFiles error=%d\n");
        return false;
    }
    ScheduleDeletionInData(data, FeatureFolderIn(features.c_str()));
    return true;
}

}  // namespace

bool RemoveSametimePluginFiles(const wchar_t* sametimeFolder) {
    TraceLevel1(TraceValue("RemoveSametimePluginFiles"));
    if (!AcceptRemovalFolder(sametimeFolder,
                             "NIHandle:RemoveSametimePluginFiles: lpszFilePath is NULL!")) {
        return false;
    }
    return RemoveConnectFiles(sametimeFolder, sl::kST7NativeFolder, sl::kST7PluginsFolder,
                              sl::kST7FeaturesFolder, kST7DeleteFailed, kST7DeleteFailed,
                              kST7FeatureDeleteFailed);
}

bool RemoveSametime8PluginFiles(const wchar_t* sametimeFolder) {
    TraceLevel1(TraceValue("RemoveSametime8PluginFiles"));
    if (!AcceptRemovalFolder(sametimeFolder,
                             "NIHandle:RemoveSametime8PluginFiles: lpszFilePath is NULL!")) {
        return false;
    }
    return RemoveConnectFiles(sametimeFolder, sl::kST8NativeFolder, sl::kST8PluginsFolder,
                              sl::kST8FeaturesFolder, kST8DeleteFailed, kST8DeleteFailed,
                              kST8DeleteFailed);
}

bool RemoveEmbeddedST8PluginFiles(const wchar_t* notesFolder) {
    TraceLevel1(TraceValue("RemoveEmbeddedST8PluginFiles"));
    if (!AcceptRemovalFolder(notesFolder,
                             "NIHandle:RemoveSametime8PluginFiles: lpszFilePath is NULL!")) {
        return false;
    }
    const RemovalStep programSteps[] = {
        {CStringEx(sl::kNativeLibrary), kST8DeleteFailed},
        {Join(sl::kEmbeddedOldRuntimeFolder, sl::kOldRuntimeCpp), kST7DeleteFailed},
        {Join(sl::kEmbeddedOldRuntimeFolder, sl::kOldRuntimeC), kST7DeleteFailed},
        {Join(sl::kEmbeddedOldRuntimeFolder, sl::kOldRuntimeManifest), kST7DeleteFailed},
    };
    if (!DeleteSteps(notesFolder, programSteps, sizeof(programSteps) / sizeof(programSteps[0]))) {
        return false;
    }
    wchar_t data[kLargeLocationCapacity] = {};
    DWORD version = sl::kPresetVersion;
    if (!GetEmbeddedSTDataPath(data, kLargeLocationCapacity, &version) || IsEmptyText(data)) {
        return true;
    }
    const RemovalStep dataSteps[] = {
        {Join(sl::kEmbeddedPluginsFolder, sl::kJar), kST8DeleteFailed},
        {FeatureXmlIn(sl::kEmbeddedFeaturesFolder), kST8DeleteFailed},
    };
    if (!DeleteSteps(data, dataSteps, sizeof(dataSteps) / sizeof(dataSteps[0]),
                     BaseFolder::kUser)) {
        return false;
    }
    RemoveFolderIfPresent(data, Join(data, FeatureFolderIn(sl::kEmbeddedFeaturesFolder).c_str()),
                          BaseFolder::kUser);
    return true;
}

bool RemoveSametimePluginFilesAfterPCReboot() {
    TraceLevel1(TraceValue("RemoveSametimePluginFilesAfterPCReboot"));
    if (!ScheduleEmbeddedRemoval()) {
        return false;
    }
    wchar_t sametime[kLargeLocationCapacity] = {};
    DWORD version = sl::kPresetVersion;
    if (!GetSametimePath(sametime, kLargeLocationCapacity, &version) || !IsUsableFolder(sametime)) {
        return false;
    }
    TraceLevel1(TraceValue("GetSametimePath:"), TraceNamed("szSametimePath", sametime));
    const bool sametime8 = version >= sl::kSametime8Version;
    CStringEx native = Join(sametime, sametime8 ? sl::kST8NativeFolder : sl::kST7NativeFolder);
    if (!ScheduleDeletion(Join(native.c_str(), sl::kNativeLibrary))) {
        LogSystemError("MoveFileEx FAILED: sametime dll file error=%d\n");
        return false;
    }
    CStringEx plugins = Join(sametime, sametime8 ? sl::kST8PluginsFolder : sl::kST7PluginsFolder);
    if (!ScheduleDeletion(Join(plugins.c_str(), sl::kJar))) {
        LogSystemError("MoveFileEx FAILED: sametime jar file error=%d\n");
        return false;
    }
    if (sametime8) {
        CStringEx features = Join(sametime, sl::kST8FeaturesFolder);
        if (!ScheduleDeletion(FeatureXmlIn(features.c_str()))) {
            LogSystemError("MoveFileEx FAILED: RemoveSametime8PluginFiles error=%d\n");
            return false;
        }
        ScheduleDeletion(FeatureFolderIn(features.c_str()));
    }
    return true;
}
