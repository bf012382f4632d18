// The registry value functions against real keys of the test prefix: exact
// type checks, buffer bounds, key creation on write, the two registry views
// (this program is 32-bit, so view 0 is the 32-bit one and KEY_WOW64_64KEY
// reaches the other), bad input and access denied.
#include <windows.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "base/registry.h"
#include "tests/support/registry_util.h"
#include "tests/unit/scratch_registry.h"

namespace {

const REGSAM k64 = KEY_WOW64_64KEY;

bool PutRaw(HKEY root, const std::wstring& key, const wchar_t* name, DWORD type, const void* data,
            DWORD bytes, REGSAM view = 0) {
    HKEY handle = nullptr;
    if (RegCreateKeyExW(root, key.c_str(), 0, nullptr, 0, KEY_ALL_ACCESS | view, nullptr, &handle,
                        nullptr) != ERROR_SUCCESS) {
        return false;
    }
    bool ok = RegSetValueExW(handle, name, 0, type, static_cast<const BYTE*>(data), bytes) ==
              ERROR_SUCCESS;
    RegCloseKey(handle);
    return ok;
}

std::vector<std::wstring> Texts(const std::vector<CStringEx>& names) {
    std::vector<std::wstring> texts;
    for (const CStringEx& name : names) {
        texts.push_back(name.c_str());
    }
    return texts;
}

class RegistryValueTest : public ::testing::Test {
protected:
    ScratchKey m_user{HKEY_CURRENT_USER, L"Software", L"val"};
    ScratchKey m_machine{HKEY_LOCAL_MACHINE, L"SOFTWARE", L"val", {0, k64}};
};

TEST_F(RegistryValueTest, SetRegStringCreatesTheMissingKeyAndEveryReaderSeesTheText) {
    std::wstring key = m_user.Sub(L"a\\b");
    ASSERT_FALSE(RegHasKey(HKEY_CURRENT_USER, key));
    ASSERT_TRUE(SetRegString(HKEY_CURRENT_USER, key.c_str(), L"Name", L"text", 0));

    DWORD type = 0;
    EXPECT_EQ(L"text", RegGetString(HKEY_CURRENT_USER, key, L"Name", 0, &type).value_or(L"?"));
    EXPECT_EQ(DWORD(REG_SZ), type);
    EXPECT_EQ(DWORD(REG_SZ), GetRegValueType(HKEY_CURRENT_USER, key.c_str(), L"Name", 0));
    EXPECT_EQ(10, GetRegValueSize(HKEY_CURRENT_USER, key.c_str(), L"Name", 0));

    wchar_t buffer[16];
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Name", buffer, 16, 0));
    EXPECT_STREQ(L"text", buffer);
    CStringEx text;
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Name", text, 0));
    EXPECT_STREQ(L"text", text.c_str());

    // The default value is the one with the empty name.
    ASSERT_TRUE(SetRegString(HKEY_CURRENT_USER, key.c_str(), L"", L"default", 0));
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"", text, 0));
    EXPECT_STREQ(L"default", text.c_str());

    ASSERT_TRUE(SetRegDWORD(HKEY_CURRENT_USER, m_user.Sub(L"c").c_str(), L"Count", 7, 0));
    DWORD count = 0;
    ASSERT_TRUE(GetRegDWORD(HKEY_CURRENT_USER, m_user.Sub(L"c").c_str(), L"Count", &count, 0));
    EXPECT_EQ(7u, count);
}

TEST_F(RegistryValueTest, AnExpandableStringIsWrittenAsAskedButNotReadAsAString) {
    std::wstring key = m_user.path();
    ASSERT_TRUE(
        SetRegString(HKEY_CURRENT_USER, key.c_str(), L"Expand", L"%TEMP%\\x", 0, REG_EXPAND_SZ));
    DWORD type = 0;
    EXPECT_EQ(L"%TEMP%\\x", RegGetString(HKEY_CURRENT_USER, key, L"Expand", 0, &type).value());
    EXPECT_EQ(DWORD(REG_EXPAND_SZ), type);
    EXPECT_EQ(DWORD(REG_EXPAND_SZ), GetRegValueType(HKEY_CURRENT_USER, key.c_str(), L"Expand", 0));

    wchar_t buffer[32];
    wmemset(buffer, L'x', 32);
    EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Expand", buffer, 32, 0));
    EXPECT_EQ(std::wstring(32, L'\0'), std::wstring(buffer, 32));
    CStringEx text(L"stale");
    EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Expand", text, 0));
    EXPECT_TRUE(text.IsEmpty());
}

TEST_F(RegistryValueTest, ValuesOfAnotherTypeCountAsAbsent) {
    std::wstring key = m_user.path();
    // Four bytes each, so only the type tells them from a REG_DWORD.
    const wchar_t shortText[] = L"a";
    const DWORD number = 0x01020304;
    ASSERT_TRUE(PutRaw(HKEY_CURRENT_USER, key, L"Sz", REG_SZ, shortText, 4));
    ASSERT_TRUE(PutRaw(HKEY_CURRENT_USER, key, L"Binary", REG_BINARY, &number, 4));
    ASSERT_TRUE(PutRaw(HKEY_CURRENT_USER, key, L"BigEndian", REG_DWORD_BIG_ENDIAN, &number, 4));
    const wchar_t multi[] = L"a\0b\0";
    ASSERT_TRUE(PutRaw(HKEY_CURRENT_USER, key, L"Multi", REG_MULTI_SZ, multi, sizeof(multi)));
    ASSERT_TRUE(PutRaw(HKEY_CURRENT_USER, key, L"Dword", REG_DWORD, &number, 4));
    const unsigned long long wide = 5;
    ASSERT_TRUE(PutRaw(HKEY_CURRENT_USER, key, L"Qword", REG_QWORD, &wide, 8));

    for (const wchar_t* name : {L"Sz", L"Binary", L"BigEndian", L"Multi", L"Qword", L"Missing"}) {
        DWORD out = 99;
        EXPECT_FALSE(GetRegDWORD(HKEY_CURRENT_USER, key.c_str(), name, &out, 0)) << name;
        EXPECT_EQ(99u, out) << name;
    }
    for (const wchar_t* name : {L"Dword", L"Binary", L"Multi", L"Qword", L"Missing"}) {
        wchar_t buffer[8] = L"zzz";
        EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), name, buffer, 8, 0)) << name;
        EXPECT_STREQ(L"", buffer) << name;
        CStringEx text(L"stale");
        EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), name, text, 0)) << name;
        EXPECT_TRUE(text.IsEmpty()) << name;
    }
    EXPECT_EQ(0u, GetRegValueType(HKEY_CURRENT_USER, key.c_str(), L"Missing", 0));
    EXPECT_EQ(-1, GetRegValueSize(HKEY_CURRENT_USER, key.c_str(), L"Missing", 0));
    EXPECT_EQ(-1, GetRegValueSize(HKEY_CURRENT_USER, m_user.Sub(L"none").c_str(), L"Sz", 0));
}

TEST_F(RegistryValueTest, StringReadsStayInsideTheBufferAndAreAlwaysTerminated) {
    std::wstring key = m_user.path();
    ASSERT_TRUE(SetRegString(HKEY_CURRENT_USER, key.c_str(), L"Four", L"abcd", 0));
    wchar_t exact[5];
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Four", exact, 5, 0));
    EXPECT_STREQ(L"abcd", exact);

    wchar_t small[4] = L"zzz";
    EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Four", small, 4, 0));
    EXPECT_EQ(std::wstring(4, L'\0'), std::wstring(small, 4));

    // Stored without its terminator, as other writers may leave it.
    ASSERT_TRUE(PutRaw(HKEY_CURRENT_USER, key, L"Bare", REG_SZ, L"wxyz", 8));
    wchar_t guarded[6];
    wmemset(guarded, L'#', 6);
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Bare", guarded, 5, 0));
    EXPECT_STREQ(L"wxyz", guarded);
    EXPECT_EQ(L'#', guarded[5]);
    // Filling the buffer without a terminator leaves no room for one.
    EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Bare", guarded, 4, 0));
    EXPECT_EQ(std::wstring(4, L'\0'), std::wstring(guarded, 4));
    CStringEx text;
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Bare", text, 0));
    EXPECT_STREQ(L"wxyz", text.c_str());

    // An empty string value reads as an empty text, successfully.
    ASSERT_TRUE(SetRegString(HKEY_CURRENT_USER, key.c_str(), L"Empty", L"", 0));
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Empty", text, 0));
    EXPECT_TRUE(text.IsEmpty());

    EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Four", exact, 0, 0));
    EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"Four", nullptr, 5, 0));
}

TEST_F(RegistryValueTest, NullNamesFailWithoutTouchingTheRegistry) {
    std::wstring key = m_user.Sub(L"null");
    wchar_t buffer[8] = L"zzz";
    DWORD number = 5;
    CStringEx text;
    std::vector<CStringEx> names;

    EXPECT_FALSE(SetRegString(nullptr, key.c_str(), L"v", L"t", 0));
    EXPECT_FALSE(SetRegString(HKEY_CURRENT_USER, nullptr, L"v", L"t", 0));
    EXPECT_FALSE(SetRegString(HKEY_CURRENT_USER, key.c_str(), nullptr, L"t", 0));
    EXPECT_FALSE(SetRegString(HKEY_CURRENT_USER, key.c_str(), L"v", nullptr, 0));
    EXPECT_FALSE(SetRegDWORD(HKEY_CURRENT_USER, key.c_str(), nullptr, 1, 0));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, key));  // nothing was created

    ASSERT_TRUE(SetRegString(HKEY_CURRENT_USER, key.c_str(), L"v", L"t", 0));
    EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, key.c_str(), nullptr, buffer, 8, 0));
    EXPECT_STREQ(L"", buffer);
    EXPECT_FALSE(GetRegString(HKEY_CURRENT_USER, nullptr, L"v", text, 0));
    EXPECT_FALSE(GetRegDWORD(HKEY_CURRENT_USER, key.c_str(), L"v", nullptr, 0));
    EXPECT_FALSE(GetRegDWORD(nullptr, key.c_str(), L"v", &number, 0));
    EXPECT_EQ(0u, GetRegValueType(HKEY_CURRENT_USER, key.c_str(), nullptr, 0));
    EXPECT_EQ(-1, GetRegValueSize(HKEY_CURRENT_USER, nullptr, L"v", 0));
    EXPECT_FALSE(DeleteRegValue(HKEY_CURRENT_USER, key.c_str(), nullptr, 0));
    EXPECT_FALSE(DeleteRegValue(nullptr, key.c_str(), L"v", 0));
    EXPECT_FALSE(IsRegKeyExist(HKEY_CURRENT_USER, nullptr, 0));
    EXPECT_FALSE(IsRegKeyExist(nullptr, key.c_str(), 0));
    EXPECT_FALSE(CreateRegKey(HKEY_CURRENT_USER, nullptr, 0));
    EXPECT_FALSE(EnumRegValueNames(HKEY_CURRENT_USER, nullptr, names, 0));
    EXPECT_TRUE(names.empty());
    EXPECT_EQ(L"t", RegGetString(HKEY_CURRENT_USER, key, L"v").value_or(L"?"));
}

TEST_F(RegistryValueTest, TheTwoViewsAreSeparateKeys) {
    // HKLM\SOFTWARE is split between the views; each write stays in its own.
    std::wstring key = m_machine.Sub(L"Split");
    ASSERT_TRUE(SetRegString(HKEY_LOCAL_MACHINE, key.c_str(), L"Which", L"64", k64));
    EXPECT_TRUE(RegHasKey(HKEY_LOCAL_MACHINE, key, k64));
    EXPECT_FALSE(RegHasKey(HKEY_LOCAL_MACHINE, key, 0));
    EXPECT_TRUE(IsRegKeyExist(HKEY_LOCAL_MACHINE, key.c_str(), k64));
    EXPECT_FALSE(IsRegKeyExist(HKEY_LOCAL_MACHINE, key.c_str(), 0));

    CStringEx text;
    EXPECT_FALSE(GetRegString(HKEY_LOCAL_MACHINE, key.c_str(), L"Which", text, 0));
    ASSERT_TRUE(SetRegString(HKEY_LOCAL_MACHINE, key.c_str(), L"Which", L"32", 0));
    ASSERT_TRUE(GetRegString(HKEY_LOCAL_MACHINE, key.c_str(), L"Which", text, k64));
    EXPECT_STREQ(L"64", text.c_str());
    ASSERT_TRUE(GetRegString(HKEY_LOCAL_MACHINE, key.c_str(), L"Which", text, 0));
    EXPECT_STREQ(L"32", text.c_str());

    ASSERT_TRUE(SetRegDWORD(HKEY_LOCAL_MACHINE, key.c_str(), L"N", 64, k64));
    ASSERT_TRUE(SetRegDWORD(HKEY_LOCAL_MACHINE, key.c_str(), L"N", 32, 0));
    DWORD n = 0;
    ASSERT_TRUE(GetRegDWORD(HKEY_LOCAL_MACHINE, key.c_str(), L"N", &n, k64));
    EXPECT_EQ(64u, n);
    EXPECT_EQ(4, GetRegValueSize(HKEY_LOCAL_MACHINE, key.c_str(), L"N", k64));

    ASSERT_TRUE(DeleteRegValue(HKEY_LOCAL_MACHINE, key.c_str(), L"Which", k64));
    EXPECT_FALSE(RegHasValue(HKEY_LOCAL_MACHINE, key, L"Which", k64));
    EXPECT_TRUE(RegHasValue(HKEY_LOCAL_MACHINE, key, L"Which", 0));
    EXPECT_FALSE(DeleteRegValue(HKEY_LOCAL_MACHINE, key.c_str(), L"Which", k64));

    std::vector<CStringEx> names;
    ASSERT_TRUE(EnumRegValueNames(HKEY_LOCAL_MACHINE, key.c_str(), names, k64));
    EXPECT_EQ(std::vector<std::wstring>{L"N"}, Texts(names));

    std::wstring only64 = m_machine.Sub(L"Only64");
    UniqueHKey created = CreateRegKey(HKEY_LOCAL_MACHINE, only64.c_str(), k64);
    ASSERT_TRUE(created);
    EXPECT_TRUE(RegHasKey(HKEY_LOCAL_MACHINE, only64, k64));
    EXPECT_FALSE(RegHasKey(HKEY_LOCAL_MACHINE, only64, 0));
}

TEST_F(RegistryValueTest, ValueNamesAreListedUpToTheBufferAndALongerOneFailsTheList) {
    std::wstring key = m_user.path();
    std::vector<CStringEx> names;
    ASSERT_TRUE(EnumRegValueNames(HKEY_CURRENT_USER, key.c_str(), names, 0));
    EXPECT_TRUE(names.empty());

    const std::wstring fits(2047, L'f');
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, key, L"", L"d"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, key, L"one", L"1"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, key, fits.c_str(), L"2"));
    ASSERT_TRUE(EnumRegValueNames(HKEY_CURRENT_USER, key.c_str(), names, 0));
    std::vector<std::wstring> listed = Texts(names);
    ASSERT_EQ(3u, listed.size());
    EXPECT_NE(listed.end(), std::find(listed.begin(), listed.end(), L""));
    EXPECT_NE(listed.end(), std::find(listed.begin(), listed.end(), L"one"));
    EXPECT_NE(listed.end(), std::find(listed.begin(), listed.end(), fits));

    // 2048 characters leave no room for the terminator in the buffer.
    const std::wstring tooLong(2048, L't');
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, key, tooLong.c_str(), L"3"));
    names.clear();
    EXPECT_FALSE(EnumRegValueNames(HKEY_CURRENT_USER, key.c_str(), names, 0));
    listed = Texts(names);
    EXPECT_EQ(3u, listed.size());
    EXPECT_EQ(listed.end(), std::find(listed.begin(), listed.end(), tooLong));

    names.clear();
    EXPECT_FALSE(EnumRegValueNames(HKEY_CURRENT_USER, m_user.Sub(L"none").c_str(), names, 0));
    EXPECT_TRUE(names.empty());
}

TEST_F(RegistryValueTest, DeletingOneValueLeavesTheOthers) {
    std::wstring key = m_user.path();
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, key, L"a", L"1"));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, key, L"b", L"2"));
    EXPECT_TRUE(DeleteRegValue(HKEY_CURRENT_USER, key.c_str(), L"a", 0));
    EXPECT_FALSE(RegHasValue(HKEY_CURRENT_USER, key, L"a"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, key, L"b"));
    EXPECT_FALSE(DeleteRegValue(HKEY_CURRENT_USER, key.c_str(), L"a", 0));
    EXPECT_FALSE(DeleteRegValue(HKEY_CURRENT_USER, m_user.Sub(L"none").c_str(), L"b", 0));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, m_user.Sub(L"none")));
}

TEST_F(RegistryValueTest, AReadOnlyKeyRefusesWritesAndDeletionsButStillReads) {
    std::wstring key = m_user.Sub(L"locked");
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, key, L"v", L"kept"));
    ASSERT_TRUE(m_user.Restrict(L"locked", scratch_registry::kReadOnlyDacl));

    EXPECT_FALSE(SetRegString(HKEY_CURRENT_USER, key.c_str(), L"v", L"changed", 0));
    EXPECT_FALSE(SetRegDWORD(HKEY_CURRENT_USER, key.c_str(), L"n", 1, 0));
    EXPECT_FALSE(DeleteRegValue(HKEY_CURRENT_USER, key.c_str(), L"v", 0));
    CStringEx text;
    ASSERT_TRUE(GetRegString(HKEY_CURRENT_USER, key.c_str(), L"v", text, 0));
    EXPECT_STREQ(L"kept", text.c_str());
    EXPECT_TRUE(IsRegKeyExist(HKEY_CURRENT_USER, key.c_str(), 0));
}

}  // namespace
