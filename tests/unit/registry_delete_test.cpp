// Deleting a key with its subkeys, on real scratch keys: CRegistry::RecurDeleteKey
// and RecursDeleteRegisterKey (below a parent). Nothing beside the tree goes,
// not in the other view, not for an empty name, not past a refused child.
#include <windows.h>
#include <gtest/gtest.h>

#include <string>

#include "base/registry_delete.h"
#include "base/win_handles.h"
#include "tests/unit/scratch_key.h"

namespace {

const HKEY kUser = HKEY_CURRENT_USER;

// top with children "a" and "b" down to `levels` below it and a value on every key.
void MakeTree(HKEY root, const std::wstring& top, int levels, REGSAM view = 0) {
    RegPutString(root, top, L"v", top, view);
    for (const wchar_t* child : {L"\\a", L"\\b"}) {
        if (levels > 0) {
            MakeTree(root, top + child, levels - 1, view);
        }
    }
}

class RegistryDeleteTest : public ::testing::Test {
protected:
    bool Has(const std::wstring& rel) const { return RegHasKey(kUser, m_user.Sub(rel)); }

    ScratchKey m_user{kUser, L"Software"};
};

TEST_F(RegistryDeleteTest, BothWaysRemoveTheTreeAndNothingBesideIt) {
    MakeTree(kUser, m_user.Sub(L"T1"), 3);
    MakeTree(kUser, m_user.Sub(L"T2"), 3);
    ASSERT_TRUE(RegPutString(kUser, m_user.Sub(L"T"), L"v", L"sibling"));
    EXPECT_TRUE(CRegistry::RecurDeleteKey(kUser, m_user.Sub(L"T1").c_str(), 0));
    EXPECT_TRUE(RecursDeleteRegisterKey(kUser, m_user.path().c_str(), L"T2"));
    EXPECT_FALSE(Has(L"T1") || Has(L"T2"));
    EXPECT_TRUE(RegHasValue(kUser, m_user.Sub(L"T"), L"v"));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(kUser, m_user.Sub(L"T1").c_str(), 0));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyDeletesInTheViewItWasGivenOnly) {
    // A tree in the 64-bit view and a key of the same name in the 32-bit view.
    ScratchKey machine(HKEY_LOCAL_MACHINE, L"SOFTWARE");
    const std::wstring tree = machine.Sub(L"T");
    MakeTree(HKEY_LOCAL_MACHINE, tree, 2, KEY_WOW64_64KEY);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, tree, L"view", L"32", 0));
    EXPECT_TRUE(CRegistry::RecurDeleteKey(HKEY_LOCAL_MACHINE, tree.c_str(), KEY_WOW64_64KEY));
    EXPECT_FALSE(RegHasKey(HKEY_LOCAL_MACHINE, tree, KEY_WOW64_64KEY));
    EXPECT_TRUE(RegHasValue(HKEY_LOCAL_MACHINE, tree, L"view", 0));
}

TEST_F(RegistryDeleteTest, EmptyAndNullNamesNeverDeleteTheRootOrTheParent) {
    const std::wstring tree = m_user.Sub(L"T");
    MakeTree(kUser, tree, 1);
    // A scratch key as the root: if an empty name were taken as "the root
    // itself", only scratch keys would be lost.
    UniqueHKey base;
    ASSERT_EQ(ERROR_SUCCESS,
              RegOpenKeyExW(kUser, m_user.path().c_str(), 0, KEY_ALL_ACCESS, base.put()));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(base.get(), L"", 0));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(base.get(), nullptr, 0));
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, tree.c_str(), L""));  // the parent itself
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, tree.c_str(), nullptr));
    EXPECT_TRUE(Has(L"T\\b"));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyStopsAtARefusedChild) {
    // "a" goes first (name order), then "b" is refused; nothing is rolled back.
    MakeTree(kUser, m_user.Sub(L"S"), 2);
    ASSERT_TRUE(m_user.Restrict(L"S\\b", L"D:P(A;;KR;;;WD)"));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(kUser, m_user.Sub(L"S").c_str(), 0));
    EXPECT_FALSE(Has(L"S\\a"));
    EXPECT_TRUE(Has(L"S\\b\\a"));
}

}  // namespace
