#include "app/ui_language.h"

namespace {

struct CodeToLangId {
    const wchar_t* code;
    LANGID langId;
};

// Rows 0 to 15 of the language table, in the order of comparison.
const CodeToLangId kCodeToLangId[] = {
    {L"EN", 1033}, {L"B5", 1028}, {L"DA", 1030}, {L"DE", 1031}, {L"ES", 2058}, {L"FR", 1036},
    {L"GB", 2052}, {L"IT", 1040}, {L"JP", 1041}, {L"KO", 1042}, {L"NL", 1043}, {L"PT", 1046},
    {L"RU", 1049}, {L"SP", 3082}, {L"SV", 1053}, {L"TR", 1055},
};

}  // namespace

// The selection from the suite's registry settings and the installed
// product's language arrives with the UI language work; until then the
// suite runs in the table's default language.
CStringEx GetUILanguageCode() {
    return CStringEx(L"EN");
}

LANGID LanguageCodeToLangId(const wchar_t* code) {
    if (code != nullptr) {
        for (const CodeToLangId& row : kCodeToLangId) {
            if (lstrcmpiW(code, row.code) == 0) {
                return row.langId;
            }
        }
    }
    return kCodeToLangId[0].langId;
}
