#include "notes/sametime_config.h"

#include <windows.h>

#include <string>

#include "base/reparse_guard.h"
#include "base/trace.h"
#include "notes/config_stamp.h"
#include "notes/plugin_paths.h"
#include "notes/notes_plugin_files.h"
#include "notes/platform_xml.h"
#include "notes/product_locations.h"
#include "notes/sametime_layout.h"

namespace sl = sametime_layout;

namespace {

// What each layout logs when a step fails.
struct ConfigMessages {
    const char* cannotCreate;
    const char* loadFailed;
    const char* noSite;
    const char* editFailed;
    const char* saveFailed;
    bool tracePathOnLoadFailure;
};

const char kNoSharedSite[] = "IsSametime8ConfigEnable: get Shared Site element failed!";

const ConfigMessages kSametime8Messages = {
    "IsSametime8ConfigEnable: Cannot create MSXML2::MSXML2::IXMLDOMDocument object",
    "IsSametime8ConfigEnable: Load config file failed!",
    kNoSharedSite,
    "UpdateSametime8Config: Update feature element failed!",
    "UpdateSametime8Config: Save config file failed!",
    false,
};

const ConfigMessages kSametime7Messages = {
    "IsSametime8ConfigEnable: Cannot create IXMLDOMDocument object",
    "IsSametime8ConfigEnable: Load config file failed!",
    kNoSharedSite,
    "UpdateSametime7Config: Update feature element failed!",
    "UpdateSametime7Config: Save config file failed!",
    false,
};

const ConfigMessages kEmbeddedMessages = {
    "UpdateEmbeddedST8Config: Cannot create MSXML2::IXMLDOMDocument object",
    "UpdateEmbeddedST8Config: Load config file failed!",
    kNoSharedSite,
    "UpdateEmbeddedST8Config: Update feature element failed!",
    "UpdateEmbeddedST8Config: Save config file failed!",
    true,
};

const ConfigMessages kEmbeddedTestMessages = {
    "UpdateEmbeddedST8Config: Cannot create MSXML2::MSXML2::IXMLDOMDocument object",
    "isembedST8enable: Load config file failed!",
    kNoSharedSite,
    nullptr,
    nullptr,
    false,
};

const SiteXPaths kSametime8Sites = {sl::kST8Site, sl::kST8SiteNested};
const SiteXPaths kSametime7Sites = {sl::kST7Site};
const SiteXPaths kEmbeddedSites = {sl::kEmbeddedSite};

void LogFailure(const char* message) {
    if (message != nullptr) {
        TraceLevel8(TraceValue(std::string(message) + "\n"));
    }
}

// 1 when the step succeeded; otherwise logs the layout's message and gives 0.
int Outcome(PlatformXmlStatus status, const ConfigMessages& messages, const CStringEx& path) {
    switch (status) {
        case PlatformXmlStatus::kOk:
            return 1;
        case PlatformXmlStatus::kCannotCreate:
            LogFailure(messages.cannotCreate);
            break;
        case PlatformXmlStatus::kLoadFailed:
            if (messages.tracePathOnLoadFailure) {
                TraceLevel8(TraceNamed("szConfigFile", path));
            }
            LogFailure(messages.loadFailed);
            break;
        case PlatformXmlStatus::kNoSite:
            LogFailure(messages.noSite);
            break;
        case PlatformXmlStatus::kEditFailed:
            LogFailure(messages.editFailed);
            break;
        case PlatformXmlStatus::kSaveFailed:
            LogFailure(messages.saveFailed);
            break;
    }
    return 0;
}

// The folder that holds a configuration file.
CStringEx FolderOf(const CStringEx& file) {
    int slash = file.ReverseFind(L'\\');
    return slash > 0 ? file.Left(slash) : CStringEx();
}

// The embedded layout's platform.xml, or false (logging notFound when the data
// folder is found but the file is missing or lies behind a reparse point).
bool FindEmbeddedConfig(CStringEx& path, const char* notFound) {
    wchar_t data[kLocationCapacity] = {};
    DWORD version = sl::kPresetVersion;
    if (!GetEmbeddedSTDataPath(data, kLocationCapacity, &version) || IsEmptyText(data)) {
        return false;
    }
    path = JoinLocalPath(data, sl::kEmbeddedPlatformXml);
    // The data folder may be the user's: nothing below it may lead elsewhere.
    if (!IsRegularFile(path.c_str()) || !IsFreeOfReparsePoints(data, path.c_str())) {
        LogFailure(notFound);
        return false;
    }
    return true;
}

bool FindSametime8Config(int profile, CStringEx& path, const char* notFound) {
    if (!GetSametimeConfigPath(profile, path)) {
        LogFailure(notFound);
        return false;
    }
    TraceLevel1(TraceNamed("strConfigFile.c_str()", path));
    return true;
}

}  // namespace

int UpdateSametime8Config(bool enable, int profile) {
    TraceLevel1(TraceValue("UpdateSametime8Config"));
    CStringEx path;
    if (!FindSametime8Config(profile, path,
                             "UpdateSametime8Config: platform.xml file can not be found!")) {
        return 0;
    }
    // The profile belongs to the user: written back whatever its attributes say.
    PlatformXmlEdit edit = EditPlatformXml(path.c_str(), kSametime8Sites, enable, nullptr);
    if (Outcome(edit.status, kSametime8Messages, path) == 0) {
        return 0;
    }
    RenameConfigStamp(FolderOf(path).c_str());
    return 1;
}

int UpdateSametime7Config(bool enable) {
    TraceLevel1(TraceValue("UpdateSametime7Config"));
    wchar_t sametime[kLocationCapacity] = {};
    DWORD version = sl::kPresetVersion;
    if (!GetSametimePath(sametime, kLocationCapacity, &version) || IsEmptyText(sametime)) {
        LogFailure("UpdateSametime7Config: sametime was not installed!");
        return 0;
    }
    CStringEx path = JoinLocalPath(sametime, sl::kST7PlatformXml);
    if (!IsRegularFile(path.c_str())) {
        LogFailure("UpdateSametime7Config: platform.xml file can not be found!");
        return 0;
    }
    // A read-only configuration is left as it is.
    PlatformXmlEdit edit = EditPlatformXml(path.c_str(), kSametime7Sites, enable, IsFileAllowRW);
    return Outcome(edit.status, kSametime7Messages, path);
}

int UpdateEmbeddedST8Config(bool enable) {
    TraceLevel1(TraceValue("UpdateEmbeddedST8Config"));
    CStringEx path;
    if (!FindEmbeddedConfig(path, "UpdateEmbeddedST8Config: platform.xml file can not be found!")) {
        return 0;
    }
    PlatformXmlEdit edit = EditPlatformXml(path.c_str(), kEmbeddedSites, enable, IsFileAllowRW);
    if (Outcome(edit.status, kEmbeddedMessages, path) == 0) {
        return 0;
    }
    RenameConfigStamp(FolderOf(path).c_str());
    return 1;
}

int IsSametime8ConfigEnable(int profile) {
    CStringEx path;
    if (!FindSametime8Config(profile, path,
                             "IsSametime8ConfigEnable: platform.xml file can not be found!")) {
        return 0;
    }
    bool listed = false;
    PlatformXmlStatus status = TestPlatformXml(path.c_str(), kSametime8Sites, &listed);
    return Outcome(status, kSametime8Messages, path) != 0 && listed ? 1 : 0;
}

int isembedST8enable() {
    TraceLevel1(TraceValue("isembedST8enable"));
    CStringEx path;
    if (!FindEmbeddedConfig(path, "isembedST8enable: platform.xml file can not be found!")) {
        return 0;
    }
    bool listed = false;
    PlatformXmlStatus status = TestPlatformXml(path.c_str(), kEmbeddedSites, &listed);
    return Outcome(status, kEmbeddedTestMessages, path) != 0 && listed ? 1 : 0;
}
