// The registry value functions on real keys: exact types, buffer bounds, key
// creation on write, the two views (this program is 32-bit: view 0 is the
// 32-bit one), bad input and access denied.
#include <windows.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "base/registry.h"
#include "tests/unit/scratch_registry.h"

namespace {

const REGSAM k64 = KEY_WOW64_64KEY;
const HKEY kUser = HKEY_CURRENT_USER;
const HKEY kMachine = HKEY_LOCAL_MACHINE;

std::vector<std::wstring> Sorted(const std::vector<CStringEx>& names) {
    std::vector<std::wstring> texts(names.size());
    std::transform(names.begin(), names.end(), texts.begin(), [](auto& n) { return n.c_str(); });
    std::sort(texts.begin(), texts.end());
    return texts;
}

class RegistryValueTest : public ::testing::Test {
protected:
    bool PutRaw(const wchar_t* name, DWORD type, const void* data, DWORD bytes) {
        UniqueHKey handle(CreateRegKey(kUser, m_key, 0));
        return handle && RegSetValueExW(handle.get(), name, 0, type, static_cast<const BYTE*>(data),
                                        bytes) == ERROR_SUCCESS;
    }

    ScratchKey m_user{kUser, L"Software", L"val"};
    const wchar_t* m_key = m_user.path().c_str();
};

TEST_F(RegistryValueTest, WritesCreateTheMissingKeyInTheirOwnViewOnly) {
    // HKLM\SOFTWARE is split between the views: what one gets, the other lacks.
    ScratchKey scratch(kMachine, L"SOFTWARE", L"val");
    std::wstring split = scratch.Sub(L"a\\b");
    const wchar_t* key = split.c_str();
    ASSERT_TRUE(SetRegString(kMachine, key, L"Which", L"64", k64));
    EXPECT_TRUE(IsRegKeyExist(kMachine, key, k64));
    EXPECT_FALSE(IsRegKeyExist(kMachine, key, 0));
    EXPECT_EQ(6, GetRegValueSize(kMachine, key, L"Which", k64));  // the terminator included
    CStringEx text;
    EXPECT_FALSE(GetRegString(kMachine, key, L"Which", text, 0));
    ASSERT_TRUE(SetRegString(kMachine, key, L"Which", L"32", 0));
    ASSERT_TRUE(GetRegString(kMachine, key, L"Which", text, k64));
    EXPECT_STREQ(L"64", text.c_str());

    ASSERT_TRUE(SetRegDWORD(kMachine, key, L"N", 64, k64));
    DWORD n = 0;
    EXPECT_FALSE(GetRegDWORD(kMachine, key, L"N", &n, 0));
    ASSERT_TRUE(DeleteRegValue(kMachine, key, L"Which", k64));
    EXPECT_TRUE(RegHasValue(kMachine, split, L"Which", 0));
    std::vector<CStringEx> names;
    ASSERT_TRUE(EnumRegValueNames(kMachine, key, names, k64));
    EXPECT_EQ(std::vector<std::wstring>{L"N"}, Sorted(names));
}

TEST_F(RegistryValueTest, ValuesOfAnotherTypeCountAsAbsent) {
    // Four bytes each, so only the type tells them from a REG_DWORD.
    const DWORD number = 0x01020304;
    ASSERT_TRUE(PutRaw(L"Sz", REG_SZ, L"a", 4));
    ASSERT_TRUE(PutRaw(L"BigEndian", REG_DWORD_BIG_ENDIAN, &number, 4));
    ASSERT_TRUE(PutRaw(L"Multi", REG_MULTI_SZ, L"a\0b\0", 10));
    ASSERT_TRUE(PutRaw(L"Dword", REG_DWORD, &number, 4));
    ASSERT_TRUE(SetRegString(kUser, m_key, L"Expand", L"%TEMP%\\x", 0, REG_EXPAND_SZ));
    EXPECT_EQ(DWORD(REG_EXPAND_SZ), GetRegValueType(kUser, m_key, L"Expand", 0));

    for (const wchar_t* name : {L"Sz", L"BigEndian", L"Multi", L"Missing"}) {
        DWORD out = 99;
        EXPECT_FALSE(GetRegDWORD(kUser, m_key, name, &out, 0)) << name;
        EXPECT_EQ(99u, out) << name;
    }
    for (const wchar_t* name : {L"Expand", L"Dword", L"Multi", L"Missing"}) {
        wchar_t buffer[16];
        wmemset(buffer, L'x', 16);
        EXPECT_FALSE(GetRegString(kUser, m_key, name, buffer, 16, 0)) << name;
        EXPECT_EQ(std::wstring(16, L'\0'), std::wstring(buffer, 16)) << name;
        CStringEx text(L"stale");
        EXPECT_FALSE(GetRegString(kUser, m_key, name, text, 0)) << name;
        EXPECT_TRUE(text.IsEmpty()) << name;
    }
    EXPECT_EQ(-1, GetRegValueSize(kUser, m_user.Sub(L"none").c_str(), L"Sz", 0));
}

TEST_F(RegistryValueTest, StringReadsStayInsideTheBufferAndAreAlwaysTerminated) {
    ASSERT_TRUE(SetRegString(kUser, m_key, L"Four", L"abcd", 0));
    wchar_t buffer[6];
    wmemset(buffer, L'z', 6);
    EXPECT_FALSE(GetRegString(kUser, m_key, L"Four", buffer, 4, 0));
    EXPECT_EQ(std::wstring(4, L'\0') + L"zz", std::wstring(buffer, 6));
    EXPECT_FALSE(GetRegString(kUser, m_key, L"Four", buffer, 0, 0));
    EXPECT_FALSE(GetRegString(kUser, m_key, L"Four", nullptr, 5, 0));
    ASSERT_TRUE(GetRegString(kUser, m_key, L"Four", buffer, 5, 0));
    EXPECT_STREQ(L"abcd", buffer);

    // Stored without its terminator, as other writers may leave it.
    ASSERT_TRUE(PutRaw(L"Bare", REG_SZ, L"wxyz", 8));
    wmemset(buffer, L'#', 6);
    ASSERT_TRUE(GetRegString(kUser, m_key, L"Bare", buffer, 5, 0));
    EXPECT_EQ(std::wstring(L"wxyz\0#", 6), std::wstring(buffer, 6));
    EXPECT_FALSE(GetRegString(kUser, m_key, L"Bare", buffer, 4, 0));
    CStringEx text;
    ASSERT_TRUE(GetRegString(kUser, m_key, L"Bare", text, 0));
    EXPECT_STREQ(L"wxyz", text.c_str());
}

TEST_F(RegistryValueTest, NullNamesFailWithoutTouchingTheRegistry) {
    // A null value name would reach the default value, a null subkey the root.
    ASSERT_TRUE(RegPutString(kUser, m_key, L"", L"default"));
    wchar_t buffer[8] = L"zzz";
    DWORD number = 0;
    EXPECT_FALSE(SetRegString(kUser, m_key, nullptr, L"t", 0));
    EXPECT_FALSE(SetRegDWORD(kUser, m_key, nullptr, 1, 0));
    EXPECT_FALSE(GetRegString(kUser, m_key, nullptr, buffer, 8, 0));
    EXPECT_STREQ(L"", buffer);
    EXPECT_FALSE(GetRegDWORD(kUser, m_key, nullptr, &number, 0));
    EXPECT_EQ(0u, GetRegValueType(kUser, m_key, nullptr, 0));
    EXPECT_FALSE(DeleteRegValue(kUser, m_key, nullptr, 0));
    EXPECT_EQ(L"default", RegGetString(kUser, m_user.path(), L"").value_or(L"?"));

    std::wstring missing = m_user.Sub(L"null");
    CStringEx text;
    std::vector<CStringEx> names;
    EXPECT_FALSE(SetRegString(kUser, missing.c_str(), L"v", nullptr, 0));
    EXPECT_FALSE(RegHasKey(kUser, missing));  // nothing was created
    EXPECT_FALSE(SetRegString(kUser, nullptr, L"v", L"t", 0));
    EXPECT_FALSE(GetRegString(kUser, nullptr, L"", text, 0));
    EXPECT_FALSE(GetRegDWORD(kUser, m_key, L"", nullptr, 0));
    EXPECT_FALSE(IsRegKeyExist(kUser, nullptr, 0));
    EXPECT_FALSE(CreateRegKey(kUser, nullptr, 0));
    EXPECT_FALSE(EnumRegValueNames(kUser, nullptr, names, 0));
}

TEST_F(RegistryValueTest, ValueNamesAreListedUpToTheBufferAndALongerOneFailsTheList) {
    std::vector<CStringEx> names;
    ASSERT_TRUE(EnumRegValueNames(kUser, m_key, names, 0));
    EXPECT_TRUE(names.empty());
    // 2047 characters and the terminator fill the 2048-character buffer.
    const std::vector<std::wstring> listed{L"", std::wstring(2047, L'f'), L"one"};
    for (const std::wstring& name : listed) {
        ASSERT_TRUE(RegPutString(kUser, m_key, name.c_str(), L"1"));
    }
    ASSERT_TRUE(EnumRegValueNames(kUser, m_key, names, 0));
    EXPECT_EQ(listed, Sorted(names));

    ASSERT_TRUE(RegPutString(kUser, m_key, std::wstring(2048, L't').c_str(), L"2"));
    names.clear();
    EXPECT_FALSE(EnumRegValueNames(kUser, m_key, names, 0));
    EXPECT_EQ(listed, Sorted(names));
}

TEST_F(RegistryValueTest, DeletionTakesOneValueAndAReadOnlyKeyRefusesChanges) {
    ASSERT_TRUE(RegPutString(kUser, m_key, L"a", L"1"));
    ASSERT_TRUE(RegPutString(kUser, m_key, L"v", L"kept"));
    EXPECT_TRUE(DeleteRegValue(kUser, m_key, L"a", 0));
    EXPECT_FALSE(DeleteRegValue(kUser, m_key, L"a", 0));

    ASSERT_TRUE(m_user.Restrict(L"", kReadOnlyDacl));
    EXPECT_FALSE(SetRegString(kUser, m_key, L"v", L"changed", 0));
    EXPECT_FALSE(SetRegDWORD(kUser, m_key, L"n", 1, 0));
    EXPECT_FALSE(DeleteRegValue(kUser, m_key, L"v", 0));
    EXPECT_EQ(L"kept", RegGetString(kUser, m_user.path(), L"v").value_or(L"?"));
}

}  // namespace
