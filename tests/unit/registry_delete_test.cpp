// The three ways of deleting a key with its subkeys, on real scratch keys:
// CRegistry::RecurDeleteKey, RecursDeleteRegisterKey (below a parent) and
// DeleteRegKeyTree (depth and time budget). Bad input and denied access must
// delete nothing that was not asked for.
#include <windows.h>
#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

#include "base/registry_delete.h"
#include "base/win_handles.h"
#include "tests/support/trace_capture.h"
#include "tests/unit/scratch_registry.h"

namespace {

const HKEY kUser = HKEY_CURRENT_USER;

// top with children "a" and "b" down to `levels` below it and a value on
// every key; `made` gets each key, parents before their children.
void MakeTree(const std::wstring& top, int levels, std::vector<std::wstring>* made = nullptr,
              REGSAM view = 0, HKEY root = kUser) {
    RegPutString(root, top, L"v", top, view);
    if (made) {
        made->push_back(top);
    }
    for (const wchar_t* child : {L"\\a", L"\\b"}) {
        if (levels > 0) {
            MakeTree(top + child, levels - 1, made, view, root);
        }
    }
}

class RegistryDeleteTest : public ::testing::Test {
protected:
    ~RegistryDeleteTest() override { SetRegistryDeleteTickSource(nullptr); }
    bool Has(const std::wstring& rel) const { return RegHasKey(kUser, m_user.Sub(rel)); }

    ScratchKey m_user{kUser, L"Software", L"del"};
    std::wstring m_base = m_user.path();
};

TEST_F(RegistryDeleteTest, EachWayRemovesAThreeLevelTreeAndNothingBesideIt) {
    for (const wchar_t* top : {L"T1", L"T2", L"T3"}) {
        MakeTree(m_user.Sub(top), 3);
    }
    ASSERT_TRUE(Has(L"T3\\b\\b\\b"));
    ASSERT_TRUE(RegPutString(kUser, m_user.Sub(L"T"), L"v", L"sibling"));
    EXPECT_TRUE(CRegistry::RecurDeleteKey(kUser, m_user.Sub(L"T1").c_str(), 0));
    EXPECT_TRUE(RecursDeleteRegisterKey(kUser, m_base.c_str(), L"T2"));
    EXPECT_EQ(ERROR_SUCCESS, DeleteRegKeyTree(kUser, m_user.Sub(L"T3").c_str(), 0));
    EXPECT_FALSE(Has(L"T1") || Has(L"T2") || Has(L"T3"));
    EXPECT_TRUE(RegHasValue(kUser, m_user.Sub(L"T"), L"v"));

    EXPECT_FALSE(CRegistry::RecurDeleteKey(kUser, m_user.Sub(L"T1").c_str(), 0));
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, m_base.c_str(), L"T2"));
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, m_user.Sub(L"none").c_str(), L"x"));
    EXPECT_EQ(ERROR_FILE_NOT_FOUND, DeleteRegKeyTree(kUser, m_user.Sub(L"T3").c_str(), 0));
    EXPECT_FALSE(Has(L"none"));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyDeletesInTheViewItWasGivenOnly) {
    // A tree in the 64-bit view and a bare key of the same name in the 32-bit
    // view: deleting the first must not take the second.
    ScratchKey machine(HKEY_LOCAL_MACHINE, L"SOFTWARE", L"del");
    std::wstring tree = machine.Sub(L"T");
    MakeTree(tree, 2, nullptr, KEY_WOW64_64KEY, HKEY_LOCAL_MACHINE);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, tree, L"view", L"32", 0));

    EXPECT_TRUE(CRegistry::RecurDeleteKey(HKEY_LOCAL_MACHINE, tree.c_str(), KEY_WOW64_64KEY));
    EXPECT_FALSE(RegHasKey(HKEY_LOCAL_MACHINE, tree, KEY_WOW64_64KEY));
    EXPECT_TRUE(RegHasValue(HKEY_LOCAL_MACHINE, tree, L"view", 0));
}

TEST_F(RegistryDeleteTest, EmptyAndNullNamesNeverDeleteTheRootOrTheParent) {
    std::wstring tree = m_user.Sub(L"T");
    MakeTree(tree, 2);
    // A scratch key as the root: if an empty name were taken as "the root
    // itself", only scratch keys would be lost.
    UniqueHKey base;
    ASSERT_EQ(ERROR_SUCCESS, RegOpenKeyExW(kUser, m_base.c_str(), 0, KEY_ALL_ACCESS, base.put()));
    TraceCapture traces;
    EXPECT_FALSE(CRegistry::RecurDeleteKey(base.get(), L"", 0));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(base.get(), nullptr, 0));
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, tree.c_str(), nullptr));
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, nullptr, L"a"));
    // An empty child would have SHDeleteKeyW remove the parent itself.
    EXPECT_FALSE(RecursDeleteRegisterKey(kUser, tree.c_str(), L""));
    EXPECT_EQ(ERROR_INVALID_PARAMETER, DeleteRegKeyTree(base.get(), L"", 0));
    EXPECT_EQ(ERROR_INVALID_PARAMETER, DeleteRegKeyTree(kUser, nullptr, 0));
    EXPECT_EQ(ERROR_INVALID_PARAMETER, DeleteRegKeyTree(kUser, tree.c_str(), -1));
    EXPECT_TRUE(Has(L"T\\b\\b"));

    std::vector<TraceRecord> records = traces.Records();
    ASSERT_EQ(3u, records.size());
    for (const TraceRecord& record : records) {
        EXPECT_EQ(1u, record.level);
        EXPECT_EQ(" RecursDeleteRegisterKey: input para is NULL!\n,\n", record.text);
    }
}

TEST_F(RegistryDeleteTest, DeniedAccessFailsClearlyAndDeletesNothingElse) {
    // RecurDeleteKey stops at a subkey it may not delete: "a" goes first
    // (name order), then "b" is refused; nothing is rolled back.
    MakeTree(m_user.Sub(L"S"), 2);
    ASSERT_TRUE(m_user.Restrict(L"S\\b", kReadOnlyDacl));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(kUser, m_user.Sub(L"S").c_str(), 0));
    EXPECT_FALSE(Has(L"S\\a"));
    EXPECT_TRUE(Has(L"S\\b\\a"));
    EXPECT_TRUE(RegHasValue(kUser, m_user.Sub(L"S"), L"v"));

    // DeleteRegKeyTree goes on past a child it cannot open at all.
    MakeTree(m_user.Sub(L"T"), 2);
    ASSERT_TRUE(RegMakeKey(kUser, m_user.Sub(L"T\\c")));
    ASSERT_TRUE(m_user.Restrict(L"T\\a", L"D:P"));
    EXPECT_NE(ERROR_SUCCESS, DeleteRegKeyTree(kUser, m_user.Sub(L"T").c_str(), 0));
    EXPECT_TRUE(Has(L"T"));
    EXPECT_FALSE(Has(L"T\\b"));
    EXPECT_FALSE(Has(L"T\\c"));
}

TEST_F(RegistryDeleteTest, LongSubkeyNamesAtAndPastTheBuffers) {
    // DeleteRegKeyTree's 256-character buffer has no room for a 256-character
    // name (this registry accepts them) and its terminator: that child stays.
    const std::wstring fits = L"D\\" + std::wstring(255, L'f');
    const std::wstring tooLong = L"D\\" + std::wstring(256, L'x');
    ASSERT_TRUE(RegMakeKey(kUser, m_user.Sub(fits + L"\\" + std::wstring(255, L'f'))));
    ASSERT_TRUE(RegMakeKey(kUser, m_user.Sub(tooLong + L"\\" + std::wstring(256, L'x'))));
    ASSERT_TRUE(RegMakeKey(kUser, m_user.Sub(L"D\\z")));
    LONG result = DeleteRegKeyTree(kUser, m_user.Sub(L"D").c_str(), 0);
    EXPECT_NE(ERROR_SUCCESS, result);
    EXPECT_NE(-1, result);
    EXPECT_FALSE(Has(fits));
    EXPECT_FALSE(Has(L"D\\z"));
    EXPECT_TRUE(Has(tooLong));
    // RecurDeleteKey's 2048-character buffer takes it.
    EXPECT_TRUE(CRegistry::RecurDeleteKey(kUser, m_user.Sub(L"D").c_str(), 0));
    EXPECT_FALSE(Has(L"D"));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyFinishesWhileAnotherThreadRemovesItsKeys) {
    std::wstring tree = m_user.Sub(L"T");
    std::vector<std::wstring> keys;
    MakeTree(tree, 6, &keys);
    ASSERT_TRUE(RegPutString(kUser, m_user.Sub(L"Other"), L"v", L"kept"));
    // Deepest first, so keys vanish between our enumeration and our delete.
    std::atomic<bool> go{false};
    std::thread remover([&] {
        while (!go) {
        }
        for (auto key = keys.rbegin(); key != keys.rend(); ++key) {
            RegDeleteKeyW(kUser, key->c_str());
        }
    });
    go = true;
    BOOL deleted = CRegistry::RecurDeleteKey(kUser, tree.c_str(), 0);
    remover.join();
    EXPECT_TRUE(deleted);
    EXPECT_FALSE(Has(L"T"));
    EXPECT_TRUE(RegHasValue(kUser, m_user.Sub(L"Other"), L"v"));
}

DWORD g_fakeNow = 0;
DWORD SevenSecondsPerLook() {
    return g_fakeNow += 7000;
}

TEST_F(RegistryDeleteTest, DeleteRegKeyTreeKeepsItsDepthAndStopsAfterTwentySeconds) {
    std::wstring tree = m_user.Sub(L"T");
    MakeTree(tree, 3);
    EXPECT_EQ(-1, DeleteRegKeyTree(kUser, tree.c_str(), 1));
    EXPECT_TRUE(RegHasValue(kUser, tree + L"\\a", L"v"));
    EXPECT_TRUE(RegHasValue(kUser, tree + L"\\b", L"v"));
    EXPECT_FALSE(Has(L"T\\a\\a"));
    EXPECT_FALSE(Has(L"T\\b\\b"));

    // Each look at the clock is 7 s later: "a" goes at 7 s, "b" would start at 21 s.
    SetRegistryDeleteTickSource(SevenSecondsPerLook);
    EXPECT_NE(ERROR_SUCCESS, DeleteRegKeyTree(kUser, tree.c_str(), 0));
    EXPECT_FALSE(Has(L"T\\a"));
    EXPECT_TRUE(Has(L"T\\b"));
}

}  // namespace
