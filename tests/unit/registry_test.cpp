// The registry value functions on real keys: reads that stay inside the
// caller's buffer, values of another type counting as absent, and writes that
// create their key in their own view only.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "base/registry.h"
#include "tests/unit/scratch_key.h"

namespace {

const HKEY kUser = HKEY_CURRENT_USER;

TEST(RegistryValues, StringReadsStayInsideTheBufferAndAreAlwaysTerminated) {
    ScratchKey scratch(kUser, L"Software");
    const wchar_t* key = scratch.path().c_str();
    ASSERT_TRUE(SetRegString(kUser, key, L"Four", L"abcd", 0));
    wchar_t buffer[6];
    wmemset(buffer, L'z', 6);
    EXPECT_FALSE(GetRegString(kUser, key, L"Four", buffer, 4, 0));
    EXPECT_EQ(std::wstring(4, L'\0') + L"zz", std::wstring(buffer, 6));
    ASSERT_TRUE(GetRegString(kUser, key, L"Four", buffer, 5, 0));
    EXPECT_STREQ(L"abcd", buffer);
    // Stored without its terminator, as other writers may leave it.
    HKEY handle = nullptr;
    ASSERT_EQ(ERROR_SUCCESS, RegOpenKeyExW(kUser, key, 0, KEY_SET_VALUE, &handle));
    RegSetValueExW(handle, L"Bare", 0, REG_SZ, reinterpret_cast<const BYTE*>(L"wxyz"), 8);
    RegCloseKey(handle);
    wmemset(buffer, L'#', 6);
    ASSERT_TRUE(GetRegString(kUser, key, L"Bare", buffer, 5, 0));
    EXPECT_EQ(std::wstring(L"wxyz\0#", 6), std::wstring(buffer, 6));
    EXPECT_FALSE(GetRegString(kUser, key, L"Bare", buffer, 4, 0));
}

TEST(RegistryValues, ValuesOfAnotherTypeCountAsAbsent) {
    ScratchKey scratch(kUser, L"Software");
    const wchar_t* key = scratch.path().c_str();
    ASSERT_TRUE(RegPutString(kUser, key, L"Sz", L"a"));
    ASSERT_TRUE(RegPutString(kUser, key, L"Expand", L"%TEMP%", 0, REG_EXPAND_SZ));
    ASSERT_TRUE(RegPutDword(kUser, key, L"Dword", 5));
    DWORD number = 99;
    EXPECT_FALSE(GetRegDWORD(kUser, key, L"Sz", &number, 0));
    EXPECT_EQ(99u, number);
    for (const wchar_t* name : {L"Expand", L"Dword"}) {
        CStringEx text(L"stale");
        EXPECT_FALSE(GetRegString(kUser, key, name, text, 0)) << name;
        EXPECT_TRUE(text.IsEmpty()) << name;
    }
}

TEST(RegistryValues, WritesCreateTheMissingKeyInTheirOwnViewOnly) {
    // HKLM\SOFTWARE is split between the views: what one gets, the other lacks.
    ScratchKey scratch(HKEY_LOCAL_MACHINE, L"SOFTWARE");
    const std::wstring split = scratch.Sub(L"a\\b");
    ASSERT_TRUE(SetRegString(HKEY_LOCAL_MACHINE, split.c_str(), L"Which", L"64", KEY_WOW64_64KEY));
    ASSERT_TRUE(SetRegDWORD(HKEY_LOCAL_MACHINE, split.c_str(), L"N", 64, KEY_WOW64_64KEY));
    EXPECT_FALSE(RegHasKey(HKEY_LOCAL_MACHINE, split, 0));
    CStringEx text;
    EXPECT_TRUE(GetRegString(HKEY_LOCAL_MACHINE, split.c_str(), L"Which", text, KEY_WOW64_64KEY));
    EXPECT_STREQ(L"64", text.c_str());
    EXPECT_FALSE(GetRegString(HKEY_LOCAL_MACHINE, split.c_str(), L"Which", text, 0));
}

}  // namespace
