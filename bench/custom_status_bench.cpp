// mocvistainstall's work (without the pause before it) adding the suite's
// state to a configured 5 MB status file, against loading and saving the
// same file with bare MSXML calls, measured in the same run on the same
// bytes. Usage: custom_status_bench [repetitions]
#include <windows.h>
#include <msxml2.h>
#include <objbase.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "base/com_owners.h"
#include "bench/process_timing.h"
#include "presence/custom_status.h"

namespace {

const size_t kTargetBytes = 5u * 1024 * 1024;
const wchar_t kCommunicatorKey[] = L"Software\\Policies\\Microsoft\\Communicator";
const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";

// An administrator's file: many states in many languages, none the suite's.
std::string BigStatusFile() {
    std::string text =
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<customStates "
        "xmlns=\"http://schemas.microsoft.com/09/2005/communicator/customStates\">\n";
    for (int id = 1; text.size() < kTargetBytes; ++id) {
        text += "  <customState ID=\"" + std::to_string(id) +
                "\" availability=\"busy\">\n    <activity LCID=\"1033\">Busy with case " +
                std::to_string(id) + "</activity>\n    <activity LCID=\"1031\">Besetzt, Fall " +
                std::to_string(id) + "</activity>\n  </customState>\n";
    }
    return text + "</customStates>\n";
}

bool SetString(HKEY root, const wchar_t* key, const wchar_t* name, const std::wstring& value) {
    HKEY handle = nullptr;
    if (RegCreateKeyExW(root, key, 0, nullptr, 0, KEY_SET_VALUE, nullptr, &handle, nullptr) !=
        ERROR_SUCCESS) {
        return false;
    }
    LONG result =
        RegSetValueExW(handle, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(value.c_str()),
                       static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)));
    RegCloseKey(handle);
    return result == ERROR_SUCCESS;
}

bool BareLoadAndSave(const std::wstring& path) {
    ComPtr<IXMLDOMDocument> doc;
    if (FAILED(CoCreateInstance(CLSID_DOMDocument30, nullptr, CLSCTX_ALL, IID_IXMLDOMDocument,
                                reinterpret_cast<void**>(doc.GetAddressOf())))) {
        return false;
    }
    doc->put_async(VARIANT_FALSE);
    VARIANT source;
    VariantInit(&source);
    V_VT(&source) = VT_BSTR;
    V_BSTR(&source) = SysAllocString(path.c_str());
    VARIANT_BOOL loaded = VARIANT_FALSE;
    bool ok =
        doc->load(source, &loaded) == S_OK && loaded == VARIANT_TRUE && doc->save(source) == S_OK;
    VariantClear(&source);
    return ok;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    const int repetitions = argc > 1 ? std::max(1, _wtoi(argv[1])) : 7;
    if (FAILED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED))) {
        std::printf("COM could not be initialised\n");
        return 1;
    }
    const std::wstring folder = MakeScratchFolder(L"qm-custom-status-bench");
    const std::wstring path = folder + L"\\status.xml";
    const std::wstring templatePath = folder + L"\\MirovanStatus.xml";
    const std::string original = BigStatusFile();
    if (!CopyFileW((BuildBinDir() + L"\\fakes\\MirovanStatus.xml").c_str(), templatePath.c_str(),
                   FALSE) ||
        !SetString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", folder) ||
        !SetString(HKEY_LOCAL_MACHINE, kCommunicatorKey, L"CustomStateURL", L"file://" + path)) {
        std::printf("cannot arrange the machine (template or registry)\n");
        return 1;
    }

    Series bare{"baseline: bare MSXML load + save", {}};
    Series install{"mocvistainstall (state appended, saved)", {}};
    bool allOk = true;
    for (int i = 0; i < repetitions; ++i) {
        allOk &= WriteWholeFile(path, original);
        double start = NowMilliseconds();
        allOk &= BareLoadAndSave(path);
        bare.ms.push_back(NowMilliseconds() - start);

        allOk &= WriteWholeFile(path, original);
        start = NowMilliseconds();
        allOk &= CMOCCustomStatusInstall::SilentInstall() == 1;
        install.ms.push_back(NowMilliseconds() - start);
    }
    std::printf("status file of %u bytes, %d repetitions (median ms)\n",
                static_cast<unsigned>(original.size()), repetitions);
    const double bareMs = bare.Median();
    for (Series* series : {&bare, &install}) {
        const double ms = series->Median();
        std::printf("%-44s %9.1f ms  x%.2f of bare MSXML (goal: at most x1.30)\n", series->name, ms,
                    bareMs > 0 ? ms / bareMs : 0.0);
    }
    std::printf("results: %s\n", allOk ? "every run did its work" : "A RUN FAILED");
    RegDeleteTreeW(HKEY_LOCAL_MACHINE, kCommunicatorKey);
    RegDeleteTreeW(HKEY_LOCAL_MACHINE, kSuiteKey);
    DeleteFileW(path.c_str());
    DeleteFileW(templatePath.c_str());
    RemoveDirectoryW(folder.c_str());
    CoUninitialize();
    return allOk ? 0 : 1;
}
