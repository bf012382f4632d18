// addshortcuts and delshortcuts (their jobs, without the keywords' pauses)
// against the same nine shortcuts created and deleted with bare shell link
// calls in the same run: create = CoCreateInstance, the setters and a save
// per shortcut (and the two folders); delete = load, read the target and
// delete each known shortcut file (and the two folders). Prints medians and
// the ratios ours / bare (goal: at most 1.5). Usage: shortcuts_bench [rounds]
#include <windows.h>
#include <objbase.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "bench/process_timing.h"
#include "cleanup/shortcuts.h"

namespace {

const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kFolderName[] = L"Mirovan Meetings";

struct Link {
    std::wstring path;
    std::wstring target;
    std::wstring arguments;
    std::wstring icon;
    int index;
};

std::wstring ShellFolder(int csidl) {
    wchar_t path[MAX_PATH] = {};
    SHGetFolderPathW(nullptr, csidl, nullptr, SHGFP_TYPE_DEFAULT, path);
    return path;
}

std::wstring Join(const std::wstring& folder, const std::wstring& name) {
    return folder + L"\\" + name;
}

bool CreateBare(const Link& link, const std::wstring& workingDir) {
    IShellLinkW* shellLink = nullptr;
    if (FAILED(CoCreateInstance(CLSID_ShellLink, nullptr, CLSCTX_INPROC_SERVER,
                                IID_PPV_ARGS(&shellLink)))) {
        return false;
    }
    shellLink->SetPath(link.target.c_str());
    if (!link.icon.empty()) {
        shellLink->SetIconLocation(link.icon.c_str(), link.index);
    }
    shellLink->SetWorkingDirectory(workingDir.c_str());
    if (!link.arguments.empty()) {
        shellLink->SetArguments(link.arguments.c_str());
    }
    IPersistFile* file = nullptr;
    bool saved = SUCCEEDED(shellLink->QueryInterface(IID_PPV_ARGS(&file))) &&
                 SUCCEEDED(file->Save(link.path.c_str(), TRUE));
    if (file != nullptr) {
        file->Release();
    }
    shellLink->Release();
    return saved;
}

bool DeleteBare(const Link& link) {
    IShellLinkW* shellLink = nullptr;
    if (FAILED(CoCreateInstance(CLSID_ShellLink, nullptr, CLSCTX_INPROC_SERVER,
                                IID_PPV_ARGS(&shellLink)))) {
        return false;
    }
    IPersistFile* file = nullptr;
    wchar_t target[MAX_PATH] = {};
    bool read = SUCCEEDED(shellLink->QueryInterface(IID_PPV_ARGS(&file))) &&
                SUCCEEDED(file->Load(link.path.c_str(), STGM_READ)) &&
                SUCCEEDED(shellLink->GetPath(target, MAX_PATH, nullptr, SLGP_SHORTPATH));
    if (file != nullptr) {
        file->Release();
    }
    shellLink->Release();
    return read && DeleteFileW(link.path.c_str());
}

bool AllExist(const std::vector<Link>& links, bool exist) {
    for (const Link& link : links) {
        if ((GetFileAttributesW(link.path.c_str()) != INVALID_FILE_ATTRIBUTES) != exist) {
            return false;
        }
    }
    return true;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    const int rounds = argc > 1 ? std::max(1, _wtoi(argv[1])) : 21;
    CoInitialize(nullptr);

    // The suite's root folder: a scratch folder with the stand-ins beside the
    // benchmark (build/bin/fakes).
    wchar_t self[MAX_PATH] = {};
    GetModuleFileNameW(nullptr, self, MAX_PATH);
    PathRemoveFileSpecW(self);
    std::wstring fakes = std::wstring(self) + L"\\..\\fakes";
    wchar_t temp[MAX_PATH] = {};
    GetTempPathW(MAX_PATH, temp);
    std::wstring root = std::wstring(temp) + L"qm-shortcuts-bench";
    CreateDirectoryW(root.c_str(), nullptr);
    for (const wchar_t* name : {L"qmRes.dll", L"qmOI3Res.dll", L"qmoneclk.exe", L"qminst.exe"}) {
        CopyFileW(Join(fakes, name).c_str(), Join(root, name).c_str(), FALSE);
    }
    const wchar_t kProductCode[] = L"{6F1B2C3D-4E5F-4A6B-8C7D-9E0F1A2B3C4D}";
    SHSetValueW(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", REG_SZ, root.c_str(),
                static_cast<DWORD>((root.size() + 1) * sizeof(wchar_t)));
    SHSetValueW(HKEY_LOCAL_MACHINE, kSuiteKey, L"ProductCode", REG_SZ, kProductCode,
                sizeof(kProductCode));

    wchar_t wow64[MAX_PATH] = {};
    GetSystemWow64DirectoryW(wow64, MAX_PATH);
    const std::wstring oneClick = Join(root, L"qmoneclk.exe");
    const std::wstring installer = Join(root, L"qminst.exe");
    const std::wstring res = Join(root, L"qmRes.dll");
    const std::wstring folders[] = {Join(ShellFolder(CSIDL_PROGRAMS), kFolderName),
                                    Join(ShellFolder(CSIDL_COMMON_PROGRAMS), kFolderName)};
    std::vector<Link> links;
    for (const std::wstring& folder : folders) {
        links.push_back({Join(folder, L"Mirovan Meetings.lnk"), oneClick, L"", oneClick, 0});
        links.push_back(
            {Join(folder, L"Quillmark Tools Settings.lnk"), installer, L"/OpenSetting=1", res, 3});
        links.push_back({Join(folder, L"Quillmark Tools Help.lnk"), installer,
                         L"/help for quillmark tools", res, 2});
        links.push_back({Join(folder, L"Uninstall Quillmark Tools.lnk"),
                         Join(wow64, L"msiexec.exe"), std::wstring(L"/x ") + kProductCode, L"", 0});
    }
    links.push_back({Join(ShellFolder(CSIDL_COMMON_DESKTOPDIRECTORY), L"Mirovan Meetings.lnk"),
                     oneClick, L"", oneClick, 0});

    Series bareCreate{"bare: create the 9 shortcuts", {}};
    Series bareDelete{"bare: delete the 9 shortcuts", {}};
    Series add{"AddShortcuts", {}};
    Series remove{"UnInstallShortcuts", {}};
    bool allOk = true;
    for (int i = 0; i < rounds; ++i) {
        double start = NowMilliseconds();
        for (const std::wstring& folder : folders) {
            CreateDirectoryW(folder.c_str(), nullptr);
        }
        for (const Link& link : links) {
            allOk &= CreateBare(link, root);
        }
        bareCreate.ms.push_back(NowMilliseconds() - start);

        start = NowMilliseconds();
        for (const Link& link : links) {
            allOk &= DeleteBare(link);
        }
        for (const std::wstring& folder : folders) {
            RemoveDirectoryW(folder.c_str());
        }
        bareDelete.ms.push_back(NowMilliseconds() - start);
        allOk &= AllExist(links, false);

        start = NowMilliseconds();
        AddShortcuts();
        add.ms.push_back(NowMilliseconds() - start);
        allOk &= AllExist(links, true);

        start = NowMilliseconds();
        UnInstallShortcuts();
        remove.ms.push_back(NowMilliseconds() - start);
        allOk &= AllExist(links, false);
        for (const std::wstring& folder : folders) {
            allOk &= GetFileAttributesW(folder.c_str()) == INVALID_FILE_ATTRIBUTES;
        }
    }
    SHDeleteKeyW(HKEY_LOCAL_MACHINE, kSuiteKey);
    for (const wchar_t* name : {L"qmRes.dll", L"qmOI3Res.dll", L"qmoneclk.exe", L"qminst.exe"}) {
        DeleteFileW(Join(root, name).c_str());
    }
    RemoveDirectoryW(root.c_str());
    CoUninitialize();

    std::printf("9 shortcuts (4 + 4 in the Start menus, 1 on the desktop), %d rounds (median ms)\n",
                rounds);
    double createMs = bareCreate.Median();
    double deleteMs = bareDelete.Median();
    std::printf("%-32s %8.3f ms\n", bareCreate.name, createMs);
    std::printf("%-32s %8.3f ms\n", bareDelete.name, deleteMs);
    double addMs = add.Median();
    double removeMs = remove.Median();
    std::printf("%-32s %8.3f ms  x%.2f of bare create (goal: at most 1.5)\n", add.name, addMs,
                createMs > 0 ? addMs / createMs : 0.0);
    std::printf("%-32s %8.3f ms  x%.2f of bare delete (goal: at most 1.5)\n", remove.name, removeMs,
                deleteMs > 0 ? removeMs / deleteMs : 0.0);
    std::printf("results: %s\n", allOk ? "every shortcut was made and removed" : "A STEP FAILED");
    return allOk ? 0 : 1;
}
