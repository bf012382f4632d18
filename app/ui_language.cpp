#include "app/ui_language.h"

#include "base/registry.h"
#include "base/suite_key.h"
#include "base/win_handles.h"
#include "cleanup/suite_products.h"

namespace {

struct LanguageRow {
    const wchar_t* code;
    LANGID fromCode;  // what the code gives
    LANGID toCode;    // the LANGID that gives the code
};

// The two columns differ for Spanish on purpose: "ES" gives 2058 while 1034
// gives "ES", and "SP" gives 3082 while 2058 gives "SP". The last row is
// searched only from a LANGID.
const LanguageRow kLanguages[] = {
    {L"EN", 1033, 1033}, {L"B5", 1028, 1028}, {L"DA", 1030, 1030}, {L"DE", 1031, 1031},
    {L"ES", 2058, 1034}, {L"FR", 1036, 1036}, {L"GB", 2052, 2052}, {L"IT", 1040, 1040},
    {L"JP", 1041, 1041}, {L"KO", 1042, 1042}, {L"NL", 1043, 1043}, {L"PT", 1046, 1046},
    {L"RU", 1049, 1049}, {L"SP", 3082, 2058}, {L"SV", 1053, 1053}, {L"TR", 1055, 1055},
    {L"EN", 0, 4105},
};
const size_t kCodeRows = 16;

const wchar_t kLanguageValue[] = L"QMUILanguage";

void UpperAndTrim(CStringEx& code) {
    code.MakeUpper();
    code.TrimLeft();
    code.TrimRight();
}

// The first row (0 to 15) whose code equals code without regard to case.
const LanguageRow* FindCodeRow(const wchar_t* code) {
    for (size_t row = 0; code != nullptr && row < kCodeRows; ++row) {
        if (lstrcmpiW(code, kLanguages[row].code) == 0) {
            return &kLanguages[row];
        }
    }
    return nullptr;
}

}  // namespace

CStringEx GetUILanguageCode() {
    CStringEx code;
    GetRegString(HKEY_CURRENT_USER, kSuiteKey, kLanguageValue, code, 0);
    if (code.IsEmpty()) {
        code = FindUILanguageInMachineKey();
    }
    if (code.IsEmpty()) {
        LangIdToLanguageCode(code);
    }
    UpperAndTrim(code);
    return code;
}

CStringEx FindUILanguageInMachineKey() {
    CStringEx code;
    GetRegString(HKEY_LOCAL_MACHINE, kSuiteKey, kLanguageValue, code, KEY_WOW64_32KEY);
    UpperAndTrim(code);
    if (FindCodeRow(code.c_str()) == nullptr) {
        code.Empty();
    }
    return code;
}

void LangIdToLanguageCode(CStringEx& code) {
    DWORD langId = 0;
    CStringEx key = FindSuiteUninstallKey();
    if (key.IsEmpty() ||
        !GetRegDWORD(HKEY_LOCAL_MACHINE, key.c_str(), L"Language", &langId, KEY_WOW64_32KEY) ||
        langId > 0xFFFF) {
        code = kLanguages[0].code;
        return;
    }
    code = LanguageCodeOfLangId(static_cast<LANGID>(langId));
}

const wchar_t* LanguageCodeOfLangId(LANGID langId) {
    for (const LanguageRow& row : kLanguages) {
        if (row.toCode == langId) {
            return row.code;
        }
    }
    return kLanguages[0].code;
}

CStringEx FindSuiteUninstallKey() {
    for (const wchar_t* upgradeCode : kSuiteUpgradeCodes) {
        for (const CStringEx& product : ProductsOfUpgradeCode(upgradeCode, KEY_WOW64_64KEY)) {
            CStringEx key = UninstallKeyOf(product);
            UniqueHKey opened;
            if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, key.c_str(), 0, KEY_READ | KEY_WOW64_32KEY,
                              opened.put()) == ERROR_SUCCESS) {
                return key;
            }
            opened.release();  // nothing was opened
        }
    }
    return CStringEx();
}

LANGID LanguageCodeToLangId(const wchar_t* code) {
    const LanguageRow* row = FindCodeRow(code);
    return row != nullptr ? row->fromCode : kLanguages[0].fromCode;
}

LANGID SetProgramUILanguage() {
    LANGID langId = LanguageCodeToLangId(GetUILanguageCode().c_str());
    CStringEx line;
    line.Format(L"qmMrvONI.exe: _tWinMain: SetThreadUILanguage %u\n", langId);
    OutputDebugStringW(line.c_str());
    SetThreadUILanguage(langId);
    return langId;
}
