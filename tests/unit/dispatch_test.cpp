// The keyword vocabulary of the Maintenance command dispatcher and the
// Action table of the command-line parser: order, letter case, results.
#include <windows.h>
#include <gtest/gtest.h>

#include <set>
#include <string>

#include "app/maintenance_keywords.h"
#include "app/ni_handle.h"
#include "app/ui_language.h"

namespace {

TEST(KeywordTable, FortyKeywordsInTheirOrderOfTesting) {
    int count = 0;
    const MaintenanceKeyword* keywords = GetMaintenanceKeywords(&count);
    ASSERT_EQ(40, count);
    EXPECT_STREQ(L"nupdate", keywords[0].keyword);
    EXPECT_STREQ(L"nendupdate", keywords[1].keyword);
    EXPECT_STREQ(L"nendupdatefail", keywords[2].keyword);
    EXPECT_STREQ(L"delsametimefilesEx", keywords[29].keyword);
    EXPECT_STREQ(L"modifyadminmsidisplayversion", keywords[39].keyword);
    std::set<std::wstring> lowerCased;
    for (int i = 0; i < count; ++i) {
        std::wstring lower = keywords[i].keyword;
        CharLowerW(&lower[0]);
        lowerCased.insert(lower);
        EXPECT_NE(nullptr, keywords[i].job) << i;
    }
    EXPECT_EQ(40u, lowerCased.size()) << "keywords differ only in letter case";
}

TEST(KeywordTable, OnlyTheUpdateAndConfigurationKeywordsHaveTheirOwnResult) {
    int count = 0;
    const MaintenanceKeyword* keywords = GetMaintenanceKeywords(&count);
    std::set<std::wstring> withResult;
    for (int i = 0; i < count; ++i) {
        if (keywords[i].returnsResult) {
            withResult.insert(keywords[i].keyword);
        }
    }
    EXPECT_EQ((std::set<std::wstring>{
                  L"nupdate", L"enablesametime8confige", L"disablesametime8confige",
                  L"issametime8enable", L"enablesametime7confige", L"disablesametime7confige",
                  L"enableSTembedded", L"disableSTembedded", L"isembedST8enable"}),
              withResult);
}

TEST(KeywordTable, LookupIsCaseInsensitiveAndExact) {
    EXPECT_STREQ(L"enableSTembedded", FindMaintenanceKeywordEntry(L"enablesTembedded")->keyword);
    EXPECT_STREQ(L"copyfilestonotes", FindMaintenanceKeywordEntry(L"COPYFILESTONOTES")->keyword);
    // "nendupdate" must not be taken for "nupdate" or "nendupdatefail".
    EXPECT_STREQ(L"nendupdate", FindMaintenanceKeywordEntry(L"NENDUPDATE")->keyword);
    EXPECT_EQ(nullptr, FindMaintenanceKeywordEntry(L"delnifiles "));
    EXPECT_EQ(nullptr, FindMaintenanceKeywordEntry(L"delnifiles x"));
    EXPECT_EQ(nullptr, FindMaintenanceKeywordEntry(L""));
    EXPECT_EQ(nullptr, FindMaintenanceKeywordEntry(nullptr));
}

TEST(KeywordScan, RestAfterTheFirstDelimiter) {
    EXPECT_STREQ(L"nupdate", FindMaintenanceKeyword(L"x-nupdate"));
    EXPECT_STREQ(L"a-b", FindMaintenanceKeyword(L"/a-b"));
    EXPECT_STREQ(L"b/c", FindMaintenanceKeyword(L"a-b/c"));
    EXPECT_STREQ(L"", FindMaintenanceKeyword(L"-"));
    EXPECT_STREQ(L"\U0001F600x", FindMaintenanceKeyword(L"\u00e9-\U0001F600x"));
    EXPECT_EQ(nullptr, FindMaintenanceKeyword(L"copyfilestonotes"));
    EXPECT_EQ(nullptr, FindMaintenanceKeyword(L""));
    EXPECT_EQ(nullptr, FindMaintenanceKeyword(nullptr));
}

TEST(UILanguage, CodesMapToTheirLangIds) {
    EXPECT_EQ(1033, LanguageCodeToLangId(L"EN"));
    EXPECT_EQ(1041, LanguageCodeToLangId(L"jp"));
    EXPECT_EQ(2058, LanguageCodeToLangId(L"ES"));
    EXPECT_EQ(3082, LanguageCodeToLangId(L"SP"));
    EXPECT_EQ(1055, LanguageCodeToLangId(L"TR"));
    EXPECT_EQ(1033, LanguageCodeToLangId(L"XX"));
    EXPECT_EQ(1033, LanguageCodeToLangId(L""));
    EXPECT_EQ(1033, LanguageCodeToLangId(nullptr));
}

}  // namespace
