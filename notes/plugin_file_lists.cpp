#include "notes/plugin_file_lists.h"

#include <windows.h>

const wchar_t kSharedUrlLibrary[] = L"NIURL.dll";
const wchar_t kPluginDatabase[] = L"mirovan.nsf";

const wchar_t* const kPluginFiles[kPluginFileCount] = {
    L"lcppn30.dll",
    L"ndbmrvqm.dll",
    L"qmnires.dll",
    kSharedUrlLibrary,
    L"qmMRVURL.DLL",
    L"qmnwintc.dll",
    L"qmnwinto.dll",
    L"qmwnictl.dll",
    kPluginDatabase,
    L"qmniscpt.xml",
    L"qmniupd.exe",
    L"mirovanni.chm",
    L"qmniadpt.dll",
    L"qmnwcfg.exe",
    L"qmMrvONI.exe",
    L"qmONIUI.dll",
    L"qmOI3Res.dll",
    L"ieqmcodec.dll",
    L"QCLDLL.dll",
    L"QCLDLL64.dll",
    L"QCLProxy.dll",
    L"QCLProxy64.dll",
    L"com.mrv.realtime.meeting_1.0.1.jar",
    L"qmmrvjni.dll",
    L"msvcp120.dll",
    L"msvcr120.dll",
    L"mrvtrace.dll",
    L"mrvtraceX64.dll",
};

const wchar_t* const kOldPluginFiles[kOldPluginFileCount] = {
    L"ndbmrv.dll",   L"nires.dll",      L"NIURL.dll",    L"MRVOIURL.DLL",  L"nwdbmon.dll",
    L"nwinstc.dll",  L"nwinsto.dll",    L"nwmsgctl.dll", L"nwmtmgr.dll",   L"wnictrl.dll",
    L"mirovan.nsf",  L"mirvscpt.xml",   L"nwsetup.exe",  L"mirovanni.chm", L"nadapter.dll",
    L"nwconfig.exe", L"MirovanONI.exe", L"ONIUI.dll",    L"OI3Res.dll",    L"nwsp2c.dll",
};

const wchar_t* const kOldInstallExtraFiles[kOldInstallExtraFileCount] = {
    L"lcppn30.dll", L"ieqmcodec.dll", L"qmcodec.dll", L"QMCODEXT.DLL", L"mirovan_ball_32.ico",
};

bool IsSameFileName(const wchar_t* a, const wchar_t* b) {
    return lstrcmpiW(a, b) == 0;
}
