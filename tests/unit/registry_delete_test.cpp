// The three ways of deleting a key with its subkeys, on real scratch keys:
// CRegistry::RecurDeleteKey (stops at the first subkey it cannot delete),
// RecursDeleteRegisterKey (SHDeleteKeyW below a parent) and DeleteRegKeyTree
// (depth and time budget). Bad input must delete nothing that was not asked
// for.
#include <windows.h>
#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

#include "base/registry_delete.h"
#include "base/win_handles.h"
#include "tests/support/registry_util.h"
#include "tests/support/trace_capture.h"
#include "tests/unit/scratch_registry.h"

namespace {

const REGSAM k64 = KEY_WOW64_64KEY;

// root\base\T with two children per level down to `levels` below T, and a
// value on every key. Returns the keys made, deepest last.
std::vector<std::wstring> MakeTree(HKEY root, const std::wstring& top, int levels,
                                   REGSAM view = 0) {
    std::vector<std::wstring> made{top};
    std::vector<std::wstring> level{top};
    RegPutString(root, top, L"v", L"top", view);
    for (int depth = 0; depth < levels; ++depth) {
        std::vector<std::wstring> next;
        for (const std::wstring& parent : level) {
            for (const wchar_t* child : {L"a", L"b"}) {
                std::wstring key = parent + L"\\" + child;
                RegPutString(root, key, L"v", key, view);
                next.push_back(key);
                made.push_back(key);
            }
        }
        level = next;
    }
    return made;
}

class RegistryDeleteTest : public ::testing::Test {
protected:
    ~RegistryDeleteTest() override { SetRegistryDeleteTickSource(nullptr); }

    ScratchKey m_user{HKEY_CURRENT_USER, L"Software", L"del"};
    ScratchKey m_machine{HKEY_LOCAL_MACHINE, L"SOFTWARE", L"del", {0, k64}};
};

TEST_F(RegistryDeleteTest, RecurDeleteKeyRemovesAThreeLevelTreeAndNothingBesideIt) {
    std::wstring tree = m_user.Sub(L"T");
    std::vector<std::wstring> keys = MakeTree(HKEY_CURRENT_USER, tree, 3);
    ASSERT_EQ(15u, keys.size());
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, m_user.Sub(L"T2"), L"v", L"sibling"));

    EXPECT_TRUE(CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, tree.c_str(), 0));
    for (const std::wstring& key : keys) {
        EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, key));
    }
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, m_user.Sub(L"T2"), L"v"));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, m_user.path()));

    EXPECT_FALSE(CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, tree.c_str(), 0));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyNeverTakesTheRootForAnEmptyOrNullName) {
    MakeTree(HKEY_CURRENT_USER, m_user.Sub(L"T"), 1);
    // A scratch key as the root: if an empty name were taken as "the root
    // itself", only scratch keys would be lost.
    HKEY base = nullptr;
    ASSERT_EQ(ERROR_SUCCESS,
              RegOpenKeyExW(HKEY_CURRENT_USER, m_user.path().c_str(), 0, KEY_ALL_ACCESS, &base));
    UniqueHKey owner(base);
    EXPECT_FALSE(CRegistry::RecurDeleteKey(base, L"", 0));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(base, nullptr, 0));
    EXPECT_FALSE(CRegistry::RecurDeleteKey(nullptr, L"T", 0));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, m_user.Sub(L"T\\a")));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyDeletesInTheViewItWasGivenOnly) {
    // A tree in the 64-bit view and a bare key of the same name in the 32-bit
    // view: deleting the first must not take the second.
    std::wstring tree = m_machine.Sub(L"T");
    MakeTree(HKEY_LOCAL_MACHINE, tree, 2, k64);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, tree, L"view", L"32", 0));

    EXPECT_TRUE(CRegistry::RecurDeleteKey(HKEY_LOCAL_MACHINE, tree.c_str(), k64));
    EXPECT_FALSE(RegHasKey(HKEY_LOCAL_MACHINE, tree, k64));
    EXPECT_TRUE(RegHasValue(HKEY_LOCAL_MACHINE, tree, L"view", 0));

    EXPECT_FALSE(CRegistry::RecurDeleteKey(HKEY_LOCAL_MACHINE, tree.c_str(), k64));
    EXPECT_TRUE(CRegistry::RecurDeleteKey(HKEY_LOCAL_MACHINE, tree.c_str(), 0));
    EXPECT_FALSE(RegHasKey(HKEY_LOCAL_MACHINE, tree, 0));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyStopsAtASubkeyItMayNotDeleteAndKeepsWhatWasDone) {
    std::wstring tree = m_user.Sub(L"T");
    MakeTree(HKEY_CURRENT_USER, tree, 2);
    // Subkeys are listed in name order: "a" goes first, then "b" is refused.
    ASSERT_TRUE(m_user.Restrict(L"T\\b", scratch_registry::kReadOnlyDacl));

    EXPECT_FALSE(CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, tree.c_str(), 0));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\a"));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\b\\a"));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\b\\b"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, tree, L"v"));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyOfAReadOnlyKeyChangesNothing) {
    std::wstring tree = m_user.Sub(L"T");
    std::vector<std::wstring> keys = MakeTree(HKEY_CURRENT_USER, tree, 2);
    ASSERT_TRUE(m_user.Restrict(L"T", scratch_registry::kReadOnlyDacl));

    EXPECT_FALSE(CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, tree.c_str(), 0));
    for (const std::wstring& key : keys) {
        EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, key));
    }
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyTakesTheLongestNamesTheRegistryAllows) {
    std::wstring tree = m_user.Sub(L"T");
    // 255 characters is the documented limit; this registry accepts 256.
    for (size_t length : {size_t(255), size_t(256)}) {
        std::wstring name(length, static_cast<wchar_t>(L'a' + length % 26));
        ASSERT_TRUE(RegMakeKey(HKEY_CURRENT_USER, tree + L"\\" + name + L"\\" + name));
    }
    EXPECT_TRUE(CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, tree.c_str(), 0));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree));
}

TEST_F(RegistryDeleteTest, RecurDeleteKeyFinishesWhileAnotherThreadRemovesItsKeys) {
    std::wstring tree = m_user.Sub(L"T");
    std::vector<std::wstring> keys = MakeTree(HKEY_CURRENT_USER, tree, 6);
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, m_user.Sub(L"Other"), L"v", L"kept"));

    // The other thread removes the leaves, deepest first in reverse order,
    // so keys vanish between our enumeration and our open or delete.
    std::atomic<bool> go{false};
    std::thread remover([&] {
        while (!go) {
        }
        for (auto key = keys.rbegin(); key != keys.rend(); ++key) {
            RegDeleteKeyW(HKEY_CURRENT_USER, key->c_str());
        }
    });
    go = true;
    BOOL deleted = CRegistry::RecurDeleteKey(HKEY_CURRENT_USER, tree.c_str(), 0);
    remover.join();

    EXPECT_TRUE(deleted);
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, m_user.Sub(L"Other"), L"v"));
}

TEST_F(RegistryDeleteTest, RecursDeleteRegisterKeyRemovesTheChildBelowItsParent) {
    std::wstring parent = m_user.Sub(L"P");
    MakeTree(HKEY_CURRENT_USER, parent + L"\\Child", 3);
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, parent + L"\\Sibling", L"v", L"kept"));

    EXPECT_TRUE(RecursDeleteRegisterKey(HKEY_CURRENT_USER, parent.c_str(), L"Child"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, parent + L"\\Child"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, parent + L"\\Sibling", L"v"));

    EXPECT_FALSE(RecursDeleteRegisterKey(HKEY_CURRENT_USER, parent.c_str(), L"Child"));
    EXPECT_FALSE(RecursDeleteRegisterKey(HKEY_CURRENT_USER, m_user.Sub(L"none").c_str(), L"x"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, m_user.Sub(L"none")));
}

TEST_F(RegistryDeleteTest, RecursDeleteRegisterKeyRefusesAMissingOrEmptyNameAndLogsIt) {
    std::wstring parent = m_user.Sub(L"P");
    MakeTree(HKEY_CURRENT_USER, parent, 2);
    TraceCapture traces;
    const std::string line = " RecursDeleteRegisterKey: input para is NULL!\n,\n";

    EXPECT_FALSE(RecursDeleteRegisterKey(HKEY_CURRENT_USER, parent.c_str(), nullptr));
    EXPECT_FALSE(RecursDeleteRegisterKey(HKEY_CURRENT_USER, nullptr, L"a"));
    // An empty child would have SHDeleteKeyW remove the parent itself.
    EXPECT_FALSE(RecursDeleteRegisterKey(HKEY_CURRENT_USER, parent.c_str(), L""));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, parent + L"\\a\\b"));

    std::vector<TraceRecord> records = traces.Records();
    ASSERT_EQ(3u, records.size());
    for (const TraceRecord& record : records) {
        EXPECT_EQ(1u, record.level);
        EXPECT_EQ(line, record.text);
    }
}

TEST_F(RegistryDeleteTest, DeleteRegKeyTreeWithDepthZeroRemovesTheWholeTree) {
    std::wstring tree = m_user.Sub(L"T");
    MakeTree(HKEY_CURRENT_USER, tree, 3);
    EXPECT_EQ(ERROR_SUCCESS, DeleteRegKeyTree(HKEY_CURRENT_USER, tree.c_str(), 0));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, m_user.path()));
}

TEST_F(RegistryDeleteTest, DeleteRegKeyTreeKeepsAsManyLevelsBelowTheKeyAsItsDepth) {
    std::wstring tree = m_user.Sub(L"T");
    MakeTree(HKEY_CURRENT_USER, tree, 3);

    EXPECT_EQ(-1, DeleteRegKeyTree(HKEY_CURRENT_USER, tree.c_str(), 2));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\a\\b"));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\b\\a"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\a\\b\\a"));

    EXPECT_EQ(-1, DeleteRegKeyTree(HKEY_CURRENT_USER, tree.c_str(), 1));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, tree, L"v"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, tree + L"\\a", L"v"));
    EXPECT_TRUE(RegHasValue(HKEY_CURRENT_USER, tree + L"\\b", L"v"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\a\\a"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\a\\b"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\b\\a"));
}

TEST_F(RegistryDeleteTest, DeleteRegKeyTreeReportsBadInputAndMissingKeysAsFailures) {
    std::wstring tree = m_user.Sub(L"T");
    MakeTree(HKEY_CURRENT_USER, tree, 2);
    EXPECT_EQ(ERROR_FILE_NOT_FOUND,
              DeleteRegKeyTree(HKEY_CURRENT_USER, m_user.Sub(L"none").c_str(), 0));
    EXPECT_EQ(ERROR_INVALID_PARAMETER, DeleteRegKeyTree(HKEY_CURRENT_USER, tree.c_str(), -1));
    EXPECT_EQ(ERROR_INVALID_PARAMETER, DeleteRegKeyTree(HKEY_CURRENT_USER, nullptr, 0));
    EXPECT_EQ(ERROR_INVALID_PARAMETER, DeleteRegKeyTree(nullptr, tree.c_str(), 0));
    HKEY base = nullptr;
    ASSERT_EQ(ERROR_SUCCESS,
              RegOpenKeyExW(HKEY_CURRENT_USER, m_user.path().c_str(), 0, KEY_ALL_ACCESS, &base));
    UniqueHKey owner(base);
    EXPECT_EQ(ERROR_INVALID_PARAMETER, DeleteRegKeyTree(base, L"", 0));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\b\\b"));
}

TEST_F(RegistryDeleteTest, DeleteRegKeyTreeLeavesAChildWhoseNameOverrunsItsBuffer) {
    std::wstring tree = m_user.Sub(L"T");
    const std::wstring fits(255, L'f');
    const std::wstring tooLong(256, L'x');  // 256 characters and no room for the terminator
    ASSERT_TRUE(RegMakeKey(HKEY_CURRENT_USER, tree + L"\\" + fits + L"\\inner"));
    ASSERT_TRUE(RegMakeKey(HKEY_CURRENT_USER, tree + L"\\" + tooLong + L"\\inner"));
    ASSERT_TRUE(RegMakeKey(HKEY_CURRENT_USER, tree + L"\\z"));

    LONG result = DeleteRegKeyTree(HKEY_CURRENT_USER, tree.c_str(), 0);
    EXPECT_NE(ERROR_SUCCESS, result);
    EXPECT_NE(-1, result);
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\" + fits));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\z"));
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\" + tooLong + L"\\inner"));
}

DWORD g_fakeNow = 0;
DWORD SevenSecondsPerLook() {
    g_fakeNow += 7000;
    return g_fakeNow;
}

TEST_F(RegistryDeleteTest, DeleteRegKeyTreeStopsALevelOnceItsTwentySecondsAreSpent) {
    std::wstring tree = m_user.Sub(L"T");
    for (const wchar_t* child : {L"c1", L"c2", L"c3", L"c4"}) {
        ASSERT_TRUE(RegMakeKey(HKEY_CURRENT_USER, tree + L"\\" + child));
    }
    // Each look at the clock is 7 s later: the first child is removed at
    // 7 s, the second would start after 21 s.
    SetRegistryDeleteTickSource(SevenSecondsPerLook);
    LONG result = DeleteRegKeyTree(HKEY_CURRENT_USER, tree.c_str(), 0);
    EXPECT_NE(ERROR_SUCCESS, result);
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\c1"));
    for (const wchar_t* child : {L"c2", L"c3", L"c4"}) {
        EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\" + child)) << child;
    }

    SetRegistryDeleteTickSource(nullptr);
    EXPECT_EQ(ERROR_SUCCESS, DeleteRegKeyTree(HKEY_CURRENT_USER, tree.c_str(), 0));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree));
}

TEST_F(RegistryDeleteTest, DeleteRegKeyTreeGoesOnPastAChildItCannotOpen) {
    std::wstring tree = m_user.Sub(L"T");
    MakeTree(HKEY_CURRENT_USER, tree, 2);
    ASSERT_TRUE(RegMakeKey(HKEY_CURRENT_USER, tree + L"\\c"));
    // "a" cannot be opened at all; "b" and "c" come after it.
    ASSERT_TRUE(m_user.Restrict(L"T\\a", L"D:P"));

    LONG result = DeleteRegKeyTree(HKEY_CURRENT_USER, tree.c_str(), 0);
    EXPECT_NE(ERROR_SUCCESS, result);
    EXPECT_TRUE(RegHasKey(HKEY_CURRENT_USER, tree));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\b"));
    EXPECT_FALSE(RegHasKey(HKEY_CURRENT_USER, tree + L"\\c"));
}

}  // namespace
