#include "app/maintenance_keywords.h"

#include <windows.h>

#include "app/maintenance_jobs.h"

namespace {

const MaintenanceKeyword kKeywords[] = {
    {L"nupdate", &JobNUpdate, true},
    {L"nendupdate", &JobNEndUpdate, false},
    {L"nendupdatefail", &JobNEndUpdateFail, false},
    {L"copyfilestonotes", &JobCopyFilesToNotes, false},
    {L"copyfilestosametime", &JobCopyFilesToSametime, false},
    {L"delnifiles", &JobDelNIFiles, false},
    {L"deloldnifiles", &JobDelOldNIFiles, false},
    {L"delsametimefiles", &JobDelSametimeFiles, false},
    {L"enablesametime8confige", &JobEnableSametime8Config, true},
    {L"disablesametime8confige", &JobDisableSametime8Config, true},
    {L"issametime8enable", &JobIsSametime8Enable, true},
    {L"enablesametime7confige", &JobEnableSametime7Config, true},
    {L"disablesametime7confige", &JobDisableSametime7Config, true},
    {L"enableSTembedded", &JobEnableSTEmbedded, true},
    {L"disableSTembedded", &JobDisableSTEmbedded, true},
    {L"isembedST8enable", &JobIsEmbedST8Enable, true},
    {L"delsametimestampfile", &JobDelSametimeStampFile, false},
    {L"delsametimefilesreboot", &JobDelSametimeFilesReboot, false},
    {L"smsinstallsametimeex", &JobSmsInstallSametimeEx, false},
    {L"smsinstallsmarttag", &JobSmsInstallSmartTag, false},
    {L"smsuninstallsmarttag", &JobSmsUninstallSmartTag, false},
    {L"uninstalloldoini", &JobUninstallOldOINI, false},
    {L"uninstalloldoi", &JobUninstallOldOI, false},
    {L"uninstalloldni", &JobUninstallOldNI, false},
    {L"smsdeloldnicuruserkey", &JobSmsDelOldNICurUserKey, false},
    {L"smsdeloldoicuruserkey", &JobSmsDelOldOICurUserKey, false},
    {L"clearoldrmenureg", &JobClearOldRMenuReg, false},
    {L"delallqmfiles", &JobDelAllQMFiles, false},
    {L"delupdtemp", &JobDelUpdTemp, false},
    {L"delsametimefilesEx", &JobDelSametimeFilesEx, false},
    {L"mocvistainstall", &JobMocVistaInstall, false},
    {L"clearcuruserqmreg", &JobClearCurUserQMReg, false},
    {L"smsclearoldoireg", &JobSmsClearOldOIReg, false},
    {L"deleteregfeaturecontrol", &JobDeleteRegFeatureControl, false},
    {L"smsrefreshsysenv", &JobSmsRefreshSysEnv, false},
    {L"updateshortcuts", &JobUpdateShortcuts, false},
    {L"addshortcuts", &JobAddShortcuts, false},
    {L"delunuseddata", &JobDelUnusedData, false},
    {L"delshortcuts", &JobDelShortcuts, false},
    {L"modifyadminmsidisplayversion", &JobModifyAdminMsiDisplayVersion, false},
};

}  // namespace

const MaintenanceKeyword* GetMaintenanceKeywords(int* count) {
    if (count != nullptr) {
        *count = static_cast<int>(sizeof(kKeywords) / sizeof(kKeywords[0]));
    }
    return kKeywords;
}

const MaintenanceKeyword* FindMaintenanceKeywordEntry(const wchar_t* keyword) {
    if (keyword == nullptr) {
        return nullptr;
    }
    for (const MaintenanceKeyword& entry : kKeywords) {
        if (lstrcmpiW(keyword, entry.keyword) == 0) {
            return &entry;
        }
    }
    return nullptr;
}
