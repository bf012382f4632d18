#include "tests/support/machine_fixture.h"

#include <shlobj.h>

#include "tests/support/file_util.h"

const wchar_t kSessionManagerKey[] = L"SYSTEM\\CurrentControlSet\\Control\\Session Manager";
const wchar_t kEnvironmentKey[] =
    L"SYSTEM\\CurrentControlSet\\Control\\Session Manager\\Environment";
const wchar_t kTestUninstallPrefix[] = L"QMTest";

namespace {

const wchar_t kUninstallKey[] = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall";

}  // namespace

void ClearProductState() {
    for (REGSAM view : {REGSAM(0), REGSAM(KEY_WOW64_64KEY)}) {
        for (const wchar_t* key :
             {L"SOFTWARE\\Mirovan", L"SOFTWARE\\Lotus",
              L"SOFTWARE\\Citrix\\Citrix Management Console",
              L"SOFTWARE\\Classes\\CLSID\\{A12A21B3-CFDA-497E-98C0-CE60D4D108C8}",
              L"Software\\Policies\\Microsoft\\Communicator",
              L"Software\\Policies\\Microsoft\\Office\\15.0\\Lync"}) {
            RegRemoveTree(HKEY_LOCAL_MACHINE, key, view);
        }
        for (const wchar_t* key :
             {L"Software\\Mirovan", L"Software\\Mirovan_Outlook", L"Software\\Lotus",
              L"Software\\Microsoft\\Office\\Common\\Smart Tag\\Actions\\"
              L"{0A4C50AC-AD3F-4245-B324-3C8696A3408A}",
              L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu",
              L"SOFTWARE\\Classes\\MrvRMenu.MirovanRightMenu.1",
              L"SOFTWARE\\Classes\\*\\shellex\\ContextMenuHandlers\\MirovanShareMenu",
              L"Software\\Policies\\Microsoft\\Communicator",
              L"Software\\Policies\\Microsoft\\Office\\15.0\\Lync",
              L"Software\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\QuillmarkTools"}) {
            RegRemoveTree(HKEY_CURRENT_USER, key, view);
        }
        HKEY uninstall = nullptr;
        if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, kUninstallKey, 0, KEY_READ | view, &uninstall) ==
            ERROR_SUCCESS) {
            std::vector<std::wstring> doomed;
            wchar_t name[256];
            for (DWORD i = 0, size = 256; RegEnumKeyExW(uninstall, i, name, &size, nullptr, nullptr,
                                                        nullptr, nullptr) == ERROR_SUCCESS;
                 ++i, size = 256) {
                if (wcsncmp(name, kTestUninstallPrefix, wcslen(kTestUninstallPrefix)) == 0) {
                    doomed.push_back(name);
                }
            }
            RegCloseKey(uninstall);
            for (const std::wstring& entry : doomed) {
                RegRemoveTree(HKEY_LOCAL_MACHINE, JoinPath(kUninstallKey, entry), view);
            }
        }
    }
    const std::wstring run = L"Software\\Microsoft\\Windows\\CurrentVersion\\Run";
    for (const wchar_t* name : {L"QMOneClick", L"QMIM.exe", L"qmmsgfrm.exe"}) {
        RegRemoveValue(HKEY_CURRENT_USER, run, name);
    }
    RegRemoveValue(HKEY_CURRENT_USER, run + L"once", L"Mirovan_QM");
    for (const wchar_t* folder : {L"Lotus", L"IBM", L"Mirovan"}) {
        RemoveTree(JoinPath(RoamingAppData(), folder));
    }
    RemoveTree(JoinPath(CommonAppData(), L"Mirovan"));
}

std::wstring RoamingAppData() {
    wchar_t path[MAX_PATH] = {};
    SHGetFolderPathW(nullptr, CSIDL_APPDATA | CSIDL_FLAG_CREATE, nullptr, SHGFP_TYPE_CURRENT, path);
    return path;
}

std::wstring CommonAppData() {
    wchar_t path[MAX_PATH] = {};
    SHGetFolderPathW(nullptr, CSIDL_COMMON_APPDATA, nullptr, SHGFP_TYPE_CURRENT, path);
    return path;
}

MachineTest::MachineTest()
    : m_scratch(L"m"),
      m_pathGuard(HKEY_LOCAL_MACHINE, kEnvironmentKey, L"Path"),
      m_pendingGuard(HKEY_LOCAL_MACHINE, kSessionManagerKey, L"PendingFileRenameOperations") {
    ClearProductState();
}

MachineTest::~MachineTest() {
    ClearProductState();
}

ProgramUnderTest& MachineTest::Program() {
    if (!m_program) {
        m_program = std::make_unique<ProgramUnderTest>(m_scratch.Sub(L"program"));
    }
    return *m_program;
}
