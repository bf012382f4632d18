// The registry functions on real keys: reads that stay inside the caller's
// buffer, and deletions of a key with its subkeys (CRegistry::RecurDeleteKey
// and, below a parent, RecursDeleteRegisterKey) that take nothing in the
// other view and nothing for an empty name.
#include <gtest/gtest.h>

#include "base/registry.h"
#include "base/registry_delete.h"
#include "base/win_handles.h"
#include "tests/unit/scratch_key.h"

namespace {

const HKEY kUser = HKEY_CURRENT_USER;

TEST(RegistryValues, StringReadsStayInsideTheBuffer) {
    ScratchKey scratch(kUser, L"Software");
    const wchar_t* key = scratch.path().c_str();
    ASSERT_TRUE(SetRegString(kUser, key, L"Four", L"abcd", 0));
    wchar_t buffer[6];
    wmemset(buffer, L'z', 6);
    EXPECT_FALSE(GetRegString(kUser, key, L"Four", buffer, 4, 0));
    EXPECT_EQ(std::wstring(4, L'\0') + L"zz", std::wstring(buffer, 6));
    ASSERT_TRUE(GetRegString(kUser, key, L"Four", buffer, 5, 0));
    EXPECT_STREQ(L"abcd", buffer);
}

// top with children "a" and "b" down to `levels` below it and a value on every key.
void MakeTree(HKEY root, const std::wstring& top, int levels, REGSAM view = 0) {
    RegPutString(root, top, L"v", top, view);
    for (const wchar_t* child : {L"\\a", L"\\b"}) {
        if (levels > 0) {
            MakeTree(root, top + child, levels - 1, view);
        }
    }
}

TEST(RegistryDelete, RecurDeleteKeyDeletesInTheViewItWasGivenOnly) {
    // A tree in the 64-bit view and a key of the same name in the 32-bit view.
    ScratchKey machine(HKEY_LOCAL_MACHINE, L"SOFTWARE");
    const std::wstring tree = machine.Sub(L"T");
    MakeTree(HKEY_LOCAL_MACHINE, tree, 2, KEY_WOW64_64KEY);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, tree, L"view", L"32", 0));
    EXPECT_TRUE(CRegistry::RecurDeleteKey(HKEY_LOCAL_MACHINE, tree.c_str(), KEY_WOW64_64KEY));
    EXPECT_FALSE(RegHasKey(HKEY_LOCAL_MACHINE, tree, KEY_WOW64_64KEY));
    EXPECT_TRUE(RegHasValue(HKEY_LOCAL_MACHINE, tree, L"view", 0));
}

TEST(RegistryDelete, EmptyAndNullNamesNeverDeleteTheRootOrTheParent) {
    ScratchKey user(kUser, L"Software");
    const std::wstring tree = user.Sub(L"T");
    MakeTree(kUser, tree, 1);
    // A scratch key as the root: if an empty name were taken as "the root
    // itself", only scratch keys would be lost.
    UniqueHKey base;
    ASSERT_EQ(ERROR_SUCCESS,
              RegOpenKeyExW(kUser, user.path().c_str(), 0, KEY_ALL_ACCESS, base.put()));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(base.get(), L"", 0));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(base.get(), nullptr, 0));
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, tree.c_str(), L""));  // the parent itself
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, tree.c_str(), nullptr));
    EXPECT_TRUE(RegHasKey(kUser, user.Sub(L"T\\b")));
}

}  // namespace
