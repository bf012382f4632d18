#include "app/maintenance_jobs.h"

#include <windows.h>

#include "base/suite_key.h"
#include "base/trace.h"
#include "cleanup/installer_registration.h"
#include "cleanup/legacy_removal.h"
#include "cleanup/shortcuts.h"
#include "cleanup/system_env_path.h"
#include "cleanup/update_service.h"
#include "cleanup/user_registry_cleanup.h"
#include "notes/notes_plugin_files.h"
#include "notes/product_locations.h"
#include "notes/sametime_config.h"
#include "notes/sametime_plugin_files.h"
#include "notes/self_update.h"
#include "presence/custom_status.h"

namespace {

const DWORD kJobPause = 1000;
const DWORD kShortJobPause = 500;
// Sametime version presumed before a lookup that may not find one.
const DWORD kPresetSametimeVersion = 7;

// Start and end messages: level 1, with a trailing line feed.
void LogJobMessage(const char* text) {
    TraceLevel1(TraceValue(std::string(text) + "\n"));
}

void PauseBeforeJob(DWORD milliseconds = kJobPause) {
    Sleep(milliseconds);
}

// A location buffer that reads as empty when its lookup failed.
struct LocationBuffer {
    explicit LocationBuffer(DWORD capacityChars = kLocationCapacity) : capacity(capacityChars) {}

    DWORD capacity;
    wchar_t text[kLargeLocationCapacity] = {};
};

// Removes the Sametime Connect and embedded Sametime files and takes the
// install folder out of the machine path (delsametimefiles and its "Ex" twin).
void RemoveSametimeFilesAndPath() {
    LocationBuffer sametime;
    DWORD version = kPresetSametimeVersion;
    GetSametimePath(sametime.text, sametime.capacity, &version);
    if (version >= 8) {
        RemoveSametime8PluginFiles(sametime.text);
    } else {
        RemoveSametimePluginFiles(sametime.text);
    }

    LocationBuffer embedded;
    DWORD embeddedVersion = kPresetSametimeVersion;
    GetEmbeddedSTPath(embedded.text, embedded.capacity, &embeddedVersion);
    TraceLevel1(TraceValue("Delete Mirovan files from Embedded ST Path."),
                TraceNamed("szEmbeddedSTPath", embedded.text));
    if (embeddedVersion > 7) {
        RemoveEmbeddedST8PluginFiles(embedded.text);
    }

    LocationBuffer install;
    GetQMInstallPath(install.text, install.capacity);
    RemoveQMInstallPathFromSystemEnv(install.text);
}

void UpdateSametime8Profiles(bool enable, int* result) {
    *result = UpdateSametime8Config(enable, 0);
    *result |= UpdateSametime8Config(enable, 1);
}

}  // namespace

int JobNUpdate() {
    if (!IsTemporaryUpdateCopy()) {
        return LaunchTemporaryUpdateCopy();
    }
    SetUpdateModeFlag(1);
    return 0;
}

int JobNEndUpdate() {
    PauseBeforeJob();
    DeleteTemporaryUpdateCopies();
    LocationBuffer notes;
    LocationBuffer plugin;
    GetNotesPath(notes.text, notes.capacity);
    GetNIPath(plugin.text, plugin.capacity);
    LogJobMessage("Start copy remained notes plugin files after update!");
    CopyPluginRemainedFiles(notes.text, plugin.text);
    LogJobMessage("End copy remained notes plugin files after update!");
    return 0;
}

int JobNEndUpdateFail() {
    PauseBeforeJob();
    DeleteTemporaryUpdateCopies();
    return 0;
}

int JobCopyFilesToNotes() {
    LogJobMessage("Start Copy notesplugin files to notes path!");
    PauseBeforeJob();
    LocationBuffer install;
    LocationBuffer notes;
    GetQMInstallPath(install.text, install.capacity);
    GetNotesPath(notes.text, notes.capacity);
    TraceLevel1(TraceValue("Copy File from QM Install path to Notes Path."),
                TraceNamed("szNotesPath", notes.text), TraceNamed("szInstallPath", install.text));
    CopyNotesPluginFiles(notes.text, install.text);
    LogJobMessage("End Copy notesplugin files to notes path!");
    return 0;
}

int JobCopyFilesToSametime() {
    LogJobMessage("Start Copy sametimeplugin files to sametime path!");
    PauseBeforeJob();
    LocationBuffer install;
    GetQMInstallPath(install.text, install.capacity);

    LocationBuffer sametime;
    DWORD version = kPresetSametimeVersion;
    bool found = GetSametimePath(sametime.text, sametime.capacity, &version);
    TraceLevel1(TraceValue("Copy File from QM Install path to sametime Path."),
                TraceNamed("szSametimePath", sametime.text),
                TraceNamed("szInstallPath", install.text));
    if (found) {
        if (version >= 8) {
            CopySametime8PluginFiles(sametime.text, install.text);
        } else {
            CopySametimePluginFiles(sametime.text, install.text);
        }
    }
    LogJobMessage("End Copy sametimeplugin files to sametime path!");

    LocationBuffer embedded;
    DWORD embeddedVersion = kPresetSametimeVersion;
    GetEmbeddedSTPath(embedded.text, embedded.capacity, &embeddedVersion);
    TraceLevel1(TraceValue("Copy File from QM Install path to Embedded ST Path."),
                TraceNamed("szEmbeddedSTPath", embedded.text),
                TraceNamed("szInstallPath", install.text));
    if (embeddedVersion > 7) {
        CopyEmbeddedST8PluginFiles(embedded.text, install.text);
    }
    SetQMInstallPathToSystemEnv(install.text);
    return 0;
}

int JobDelNIFiles() {
    LogJobMessage("Start Delete notes plugin Files for QM Uninstall!");
    PauseBeforeJob();
    LocationBuffer notes;
    GetNotesPath(notes.text, notes.capacity);
    RemoveNotesPluginFiles(notes.text);
    RemoveUpdTempFolder();
    LogJobMessage("End Delete notes plugin Files for QM Uninstall!");
    return 0;
}

int JobDelOldNIFiles() {
    LogJobMessage("Start Delete old notes plugin Files for QM Uninstall!");
    PauseBeforeJob();
    LocationBuffer plugin(kLargeLocationCapacity);
    if (GetNIPathAnyUser(plugin.text, plugin.capacity)) {
        DeleteInstallFolder(plugin.text);
    }
    LocationBuffer notes(kLargeLocationCapacity);
    if (GetNotesPath(notes.text, notes.capacity)) {
        RemoveOldNotesPluginFiles(notes.text);
    }
    return 0;
}

int JobDelSametimeFiles() {
    LogJobMessage("Start Delete sametime plugin Files for QM Uninstall!");
    PauseBeforeJob();
    RemoveSametimeFilesAndPath();
    LogJobMessage("End Delete sametime plugin Files for QM Uninstall!");
    return 0;
}

int JobEnableSametime8Config() {
    LogJobMessage("qmMirovanONI: Command is enablesametime8confige.");
    int result = 0;
    UpdateSametime8Profiles(true, &result);
    return result;
}

int JobDisableSametime8Config() {
    LogJobMessage("qmMirovanONI: Command is disablesametime8confige.");
    int result = 0;
    UpdateSametime8Profiles(false, &result);
    return result;
}

int JobIsSametime8Enable() {
    LogJobMessage("qmMirovanONI: Command is issametime8enable.");
    int result = IsSametime8ConfigEnable(0);
    result |= IsSametime8ConfigEnable(1);
    return result;
}

int JobEnableSametime7Config() {
    return UpdateSametime7Config(true);
}

int JobDisableSametime7Config() {
    return UpdateSametime7Config(false);
}

int JobEnableSTEmbedded() {
    return UpdateEmbeddedST8Config(true);
}

int JobDisableSTEmbedded() {
    return UpdateEmbeddedST8Config(false);
}

int JobIsEmbedST8Enable() {
    return isembedST8enable();
}

int JobDelSametimeStampFile() {
    LogJobMessage("Start Delete sametime last.config.stamp file for sametime install!");
    PauseBeforeJob();
    DeleteSametimeStampFile();
    LogJobMessage("End Delete sametime last.config.stamp file for sametime install!");
    return 0;
}

int JobDelSametimeFilesReboot() {
    LogJobMessage("For silent install Start Delete sametime files after pc restart!");
    PauseBeforeJob();
    RemoveSametimePluginFilesAfterPCReboot();
    LogJobMessage("For silent install Delete sametime files after pc restart!");
    return 0;
}

int JobSmsInstallSametimeEx() {
    LogJobMessage("smsinstallsametimeex, execute some operator for current user!");
    PauseBeforeJob();
    LocationBuffer install;
    GetQMInstallPath(install.text, install.capacity);
    LocationBuffer embedded;
    DWORD embeddedVersion = kPresetSametimeVersion;
    GetEmbeddedSTPath(embedded.text, embedded.capacity, &embeddedVersion);
    if (embeddedVersion > 7) {
        CopyEmbeddedST8FilesForMultiUser(install.text);
    }
    DeleteSametimeStampFile();
    return 0;
}

int JobSmsInstallSmartTag() {
    LogJobMessage("qmmirovanoni: For silent install smart tag!");
    PauseBeforeJob();
    InstallSmartTag();
    return 0;
}

int JobSmsUninstallSmartTag() {
    LogJobMessage("qmmirovanoni: For silent uninstall smart tag!");
    PauseBeforeJob();
    UninstallSmartTag();
    return 0;
}

int JobUninstallOldOINI() {
    LogJobMessage("qmmirovanoni: for uninstall old OI and NI!");
    PauseBeforeJob();
    DelInstallerKeyByUpgrade(kOldNotesUpgradeCode);
    RemoveOldOIInstallFiles();
    DelInstallerKeyByUpgrade(kOldOutlookUpgradeCode);
    return 0;
}

int JobUninstallOldOI() {
    LogJobMessage("qmmirovanoni: Only for uninstall old OI!");
    PauseBeforeJob();
    RemoveOldOIInstallFiles();
    DelInstallerKeyByUpgrade(kOldOutlookUpgradeCode);
    return 0;
}

int JobUninstallOldNI() {
    LogJobMessage("qmmirovanoni: for uninstall old NI!");
    PauseBeforeJob();
    DelInstallerKeyByUpgrade(kOldNotesUpgradeCode);
    return 0;
}

int JobSmsDelOldNICurUserKey() {
    LogJobMessage("qmmirovanoni: smsdeloldnicuruserkey: Delete old NI HKEY_CURRENT_USER key!");
    PauseBeforeJob();
    DelInstallerKeyOnCurrentUserForSMS(kOldNotesUpgradeCode);
    return 0;
}

int JobSmsDelOldOICurUserKey() {
    LogJobMessage("qmmirovanoni: smsdeloldoicuruserkey: Delete old OI HKEY_CURRENT_USER key!");
    PauseBeforeJob();
    DelInstallerKeyOnCurrentUserForSMS(kOldOutlookUpgradeCode);
    return 0;
}

int JobClearOldRMenuReg() {
    LogJobMessage("For silent REMOVE clear old rmenu registry from current user.");
    ClearOldRMenuReg();
    return 0;
}

int JobDelAllQMFiles() {
    LogJobMessage("qmmirovanoni.exe: Call delallqmfiles.");
    PauseBeforeJob();
    LocationBuffer notes;
    if (GetNotesPath(notes.text, notes.capacity)) {
        RemoveNotesPluginFiles(notes.text);
    }
    LocationBuffer sametime;
    DWORD version = kPresetSametimeVersion;
    if (GetSametimePath(sametime.text, sametime.capacity, &version)) {
        if (version >= 8) {
            RemoveSametime8PluginFiles(sametime.text);
        } else {
            RemoveSametimePluginFiles(sametime.text);
        }
    }
    LocationBuffer embedded;
    DWORD embeddedVersion = kPresetSametimeVersion;
    GetEmbeddedSTPath(embedded.text, embedded.capacity, &embeddedVersion);
    TraceLevel1(TraceValue("Delete Mirovan files from Embedded ST Path."),
                TraceNamed("szEmbeddedSTPath", embedded.text));
    if (embeddedVersion > 7) {
        RemoveEmbeddedST8PluginFiles(embedded.text);
    }
    RemoveUpdTempFolder();
    UnRegisterOldClassIDs();
    RegQM64BitAddin();
    SvcUninstall();
    return 0;
}

int JobDelUpdTemp() {
    LogJobMessage("qmmirovanoni.exe: Call delupdtemp.");
    PauseBeforeJob();
    RemoveUpdTempFolder();
    UnRegisterOldClassIDs();
    RegQM64BitAddin();
    return 0;
}

int JobDelSametimeFilesEx() {
    const char kStart[] = "For disable sametime to delete sametime plugin Files for QM Uninstall!";
    LogJobMessage(kStart);
    PauseBeforeJob();
    RemoveSametimeFilesAndPath();
    LogJobMessage(kStart);
    return 0;
}

int JobMocVistaInstall() {
    LogJobMessage("qmmirovanoni.exe: Call mocvistainstall.");
    PauseBeforeJob();
    CMOCCustomStatusInstall::SilentInstall();
    return 0;
}

int JobClearCurUserQMReg() {
    LogJobMessage("qmmirovanoni.exe: Call clearcuruserqmreg.");
    PauseBeforeJob();
    ClearCurUserQMReg();
    return 0;
}

int JobSmsClearOldOIReg() {
    LogJobMessage("qmmirovanoni: For silent install smsclearoldoireg!");
    PauseBeforeJob();
    RemoveOldOIRegistry(HKEY_CURRENT_USER);
    return 0;
}

int JobDeleteRegFeatureControl() {
    LogJobMessage("qmmirovanoni: For silent install deleteregfeaturecontrol!");
    PauseBeforeJob();
    return 0;
}

int JobSmsRefreshSysEnv() {
    LogJobMessage("qmmirovanoni.exe: Call smsrefreshsysenv.");
    PauseBeforeJob();
    RefreshSysEnv();
    return 0;
}

int JobUpdateShortcuts() {
    LogJobMessage("qmmirovanoni.exe: Call udpateshortlinks.");
    PauseBeforeJob();
    if (UpdateShortcuts() != 0) {
        MoveShortcuts();
    } else {
        AddShortcuts();
    }
    return 0;
}

int JobAddShortcuts() {
    LogJobMessage("qmmirovanoni.exe: Call addshortcutslinks.");
    PauseBeforeJob(kShortJobPause);
    AddShortcuts();
    return 0;
}

int JobDelUnusedData() {
    LogJobMessage("qmmirovanoni.exe: Call delshortcuts and ClearAllCurUserqmreg.");
    UnInstallShortcuts();
    DeleteAllCurUserReg(kSuiteKey, nullptr, nullptr);
    return 0;
}

int JobDelShortcuts() {
    LogJobMessage("qmmirovanoni.exe: Call delshortcuts.");
    UnInstallShortcuts();
    return 0;
}

int JobModifyAdminMsiDisplayVersion() {
    LogJobMessage("qmmirovanoni.exe: Call modifymsiadmindisplayversion.");
    ModifyAdminMsiDisplayVersion();
    return 0;
}
