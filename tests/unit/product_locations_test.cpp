// The product location lookups against real registry keys of a scratch
// prefix: key order, the rule that a value too large for the caller's buffer
// counts as absent (and leaves the buffer empty), the version rules, the
// Notes plug-in folder, multi-user and Citrix branches, the Sametime search
// with its time budget, and the per-user folders.
#include <gtest/gtest.h>

#include <windows.h>

#include <string>

#include "base/path_api.h"
#include "notes/product_locations.h"
#include "notes/sametime_path_search.h"
#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"

namespace {

const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kNotes6[] = L"SOFTWARE\\Lotus\\Notes\\6.0";
const wchar_t kNotes7[] = L"SOFTWARE\\Lotus\\Notes\\7.0";
const wchar_t kNotes8[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
const wchar_t kNotes[] = L"SOFTWARE\\Lotus\\Notes";
const wchar_t kNIKey[] = L"SOFTWARE\\mirovan\\NI";
const wchar_t kCitrixKey[] = L"SOFTWARE\\Citrix\\Citrix Management Console";
const wchar_t kUninstall[] = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\";
const wchar_t kServerClsid[] = L"CLSID\\{A12A21B3-CFDA-497E-98C0-CE60D4D108C8}";
const wchar_t kServerClsidWow[] = L"Wow6432Node\\CLSID\\{A12A21B3-CFDA-497E-98C0-CE60D4D108C8}";

// A path-like text of exactly `chars` characters.
std::wstring PathOfLength(size_t chars) {
    std::wstring text = L"C:\\";
    while (text.size() < chars) {
        text += (text.size() % 40 == 39) ? L'\\' : L'p';
    }
    text.resize(chars);
    if (text.back() == L'\\') {
        text.back() = L'q';
    }
    return text;
}

// A buffer with its spare room filled, so a test sees what a lookup wrote.
struct Buffer {
    explicit Buffer(DWORD chars = kLocationCapacity) : capacity(chars) {
        for (wchar_t& ch : text) {
            ch = L'#';
        }
    }
    bool AllZero() const {
        for (DWORD i = 0; i < capacity; ++i) {
            if (text[i] != L'\0') {
                return false;
            }
        }
        return true;
    }
    std::wstring str() const { return text; }

    DWORD capacity;
    wchar_t text[kLargeLocationCapacity + 1] = {};
};

// A string value stored without its terminator.
bool PutUnterminated(HKEY root, const std::wstring& key, const wchar_t* name,
                     const std::wstring& value) {
    HKEY k = nullptr;
    if (RegCreateKeyExW(root, key.c_str(), 0, nullptr, 0, KEY_WRITE, nullptr, &k, nullptr) !=
        ERROR_SUCCESS) {
        return false;
    }
    LONG rc = RegSetValueExW(k, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(value.data()),
                             static_cast<DWORD>(value.size() * sizeof(wchar_t)));
    RegCloseKey(k);
    return rc == ERROR_SUCCESS;
}

class LocationsTest : public MachineTest {
protected:
    ~LocationsTest() override {
        for (const wchar_t* key : {kServerClsid, kServerClsidWow}) {
            RegRemoveTree(HKEY_CLASSES_ROOT, key);
        }
    }

    void AddUninstallEntry(const std::wstring& name, const wchar_t* displayName,
                           const std::wstring& location, const DWORD* versionMajor = nullptr) {
        std::wstring key = std::wstring(kUninstall) + name;
        ASSERT_EQ(0, name.find(kTestUninstallPrefix));
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, key, L"DisplayName", displayName));
        if (!location.empty()) {
            ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, key, L"InstallLocation", location));
        }
        if (versionMajor != nullptr) {
            ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, key, L"VersionMajor", *versionMajor));
        }
    }
};

// Ticks that jump past the Sametime budget after `calls` readings.
int g_ticksBeforeJump = 0;
DWORD JumpingTicks() {
    static DWORD now = 1000;
    if (g_ticksBeforeJump-- <= 0) {
        now += kSametimeSearchBudgetMs + 1;
    }
    return now;
}
DWORD FrozenTicks() {
    return 0xFFFFFF00u;  // near the wrap-around, never moving
}

}  // namespace

// --- Suite install folder ---------------------------------------------------

TEST_F(LocationsTest, InstallPathPrefersMachineThenUser) {
    Buffer buffer;
    EXPECT_FALSE(GetQMInstallPath(buffer.text, buffer.capacity));
    EXPECT_TRUE(buffer.AllZero());

    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kSuiteKey, L"Path", L"C:\\User\\QM"));
    EXPECT_TRUE(GetQMInstallPath(buffer.text, buffer.capacity));
    EXPECT_EQ(L"C:\\User\\QM", buffer.str());

    // Any value type is read; a trailing separator is kept as stored.
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", L"C:\\Machine\\QM\\", 0,
                             REG_EXPAND_SZ));
    EXPECT_TRUE(GetQMInstallPath(buffer.text, buffer.capacity));
    EXPECT_EQ(L"C:\\Machine\\QM\\", buffer.str());

    EXPECT_FALSE(GetQMInstallPath(nullptr, buffer.capacity));
    Buffer user;
    EXPECT_TRUE(GetQMInstallPathFromReg(HKEY_CURRENT_USER, user.text, user.capacity));
    EXPECT_EQ(L"C:\\User\\QM", user.str());
}

TEST_F(LocationsTest, ValueMustFitTheCallersCapacityWithItsTerminator) {
    const std::wstring fits = PathOfLength(259);
    const std::wstring exact = PathOfLength(260);
    const std::wstring large = PathOfLength(300);

    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", fits));
    Buffer buffer;
    EXPECT_TRUE(GetQMInstallPath(buffer.text, buffer.capacity));
    EXPECT_EQ(fits, buffer.str());

    for (const std::wstring& value : {exact, large}) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", value));
        Buffer tooSmall;
        EXPECT_FALSE(GetQMInstallPath(tooSmall.text, tooSmall.capacity)) << value.size();
        EXPECT_TRUE(tooSmall.AllZero()) << value.size();
        // The larger buffer of some commands holds it.
        Buffer large520(kLargeLocationCapacity);
        EXPECT_TRUE(GetQMInstallPath(large520.text, large520.capacity));
        EXPECT_EQ(value, large520.str());
    }

    // 260 characters stored without a terminator fill the buffer to the
    // last character: no room to end the text, so it counts as absent.
    ASSERT_TRUE(PutUnterminated(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", exact));
    Buffer unterminated;
    EXPECT_FALSE(GetQMInstallPath(unterminated.text, unterminated.capacity));
    EXPECT_TRUE(unterminated.AllZero());
    // 259 without a terminator get one added.
    ASSERT_TRUE(PutUnterminated(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", fits));
    EXPECT_TRUE(GetQMInstallPath(unterminated.text, unterminated.capacity));
    EXPECT_EQ(fits, unterminated.str());
}

// --- Notes program folder and version ---------------------------------------

TEST_F(LocationsTest, NotesPathTriesTheKeysInOrderAndSkipsUnfitValues) {
    Buffer buffer;
    EXPECT_FALSE(GetNotesPath(buffer.text, buffer.capacity));
    EXPECT_TRUE(buffer.AllZero());

    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Path", L"C:\\Notes9"));
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", L"C:\\Notes8"));
    EXPECT_TRUE(GetNotesPath(buffer.text, buffer.capacity));
    EXPECT_EQ(L"C:\\Notes8", buffer.str());

    // 6.0 opens but has no Path; 7.0's Path is too large: both skipped.
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNotes6));
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes7, L"Path", PathOfLength(300)));
    EXPECT_TRUE(GetNotesPath(buffer.text, buffer.capacity));
    EXPECT_EQ(L"C:\\Notes8", buffer.str());

    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes6, L"Path", PathOfLength(259)));
    EXPECT_TRUE(GetNotesPath(buffer.text, buffer.capacity));
    EXPECT_EQ(PathOfLength(259), buffer.str());

    EXPECT_FALSE(GetNotesPath(nullptr, buffer.capacity));
}

TEST_F(LocationsTest, NotesVersionRules) {
    EXPECT_EQ(6u, GetNotesVersion());  // nothing installed

    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Version", L"90001"));
    EXPECT_EQ(9u, GetNotesVersion());
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Version", L"85000"));
    EXPECT_EQ(6u, GetNotesVersion());
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Version", L"90000 FP1"));
    EXPECT_EQ(9u, GetNotesVersion());
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Version", L"release 9"));
    EXPECT_EQ(6u, GetNotesVersion());
    RegRemoveValue(HKEY_LOCAL_MACHINE, kNotes, L"Version");
    EXPECT_EQ(6u, GetNotesVersion());

    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Version", L"90001"));
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNotes8));
    EXPECT_EQ(8u, GetNotesVersion());  // the 8.0 key wins over the Version value
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNotes7));
    EXPECT_EQ(7u, GetNotesVersion());
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNotes6));
    EXPECT_EQ(6u, GetNotesVersion());
    RegRemoveTree(HKEY_LOCAL_MACHINE, kNotes7);
    EXPECT_EQ(6u, GetNotesVersion());  // 6.0 and 8.0 both present
}

TEST_F(LocationsTest, EmbeddedSametimeIsTheNotesFolderFromVersion8) {
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes7, L"Path", L"C:\\Notes7"));
    Buffer buffer;
    DWORD version = 7;
    EXPECT_FALSE(GetEmbeddedSTPath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(7u, version);
    EXPECT_TRUE(buffer.AllZero());

    RegRemoveTree(HKEY_LOCAL_MACHINE, kNotes7);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Version", L"90010"));
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Path", L"C:\\Notes9"));
    EXPECT_TRUE(GetEmbeddedSTPath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(9u, version);
    EXPECT_EQ(L"C:\\Notes9", buffer.str());

    // Version 8 but no folder: false, the version still reported.
    RegRemoveValue(HKEY_LOCAL_MACHINE, kNotes, L"Path");
    version = 7;
    EXPECT_FALSE(GetEmbeddedSTPath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(9u, version);
    EXPECT_TRUE(buffer.AllZero());

    // No buffer: the version is not touched.
    version = 7;
    EXPECT_FALSE(GetEmbeddedSTPath(nullptr, buffer.capacity, &version));
    EXPECT_EQ(7u, version);
}

TEST_F(LocationsTest, EmbeddedSametimeDataFolderMultiUserAndCitrix) {
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"DataPath", L"C:\\Notes8\\Data"));
    Buffer buffer;
    DWORD version = 0;
    EXPECT_TRUE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(8u, version);
    EXPECT_EQ(L"C:\\Notes8\\Data", buffer.str());

    // On a Citrix server without multi-user Notes there is no data folder.
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kCitrixKey));
    EXPECT_TRUE(IsCitrixServer());
    EXPECT_FALSE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    EXPECT_TRUE(buffer.AllZero());

    // Multi-user: the user's notes.ini folder, Citrix or not.
    DWORD multiUser = 0;
    EXPECT_FALSE(GetNotesMultiUser(&multiUser));
    ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kNotes, L"MultiUser", 1));
    EXPECT_TRUE(GetNotesMultiUser(&multiUser));
    EXPECT_EQ(1u, multiUser);
    EXPECT_FALSE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, L"Software\\Lotus\\Notes\\8.0", L"NotesIniPath",
                             L"D:\\Notes\\Data\\notes.ini"));
    EXPECT_TRUE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(L"D:\\Notes\\Data", buffer.str());

    // The per-user value must be a plain string.
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, L"Software\\Lotus\\Notes\\8.0", L"NotesIniPath",
                             L"D:\\Notes\\Data\\notes.ini", 0, REG_EXPAND_SZ));
    EXPECT_FALSE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    EXPECT_TRUE(buffer.AllZero());

    // The first MultiUser value in key order decides: 0 on the 8.0 key is
    // single-user although the unversioned key says 1.
    RegRemoveTree(HKEY_LOCAL_MACHINE, kCitrixKey);
    ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kNotes8, L"MultiUser", 0));
    EXPECT_TRUE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(L"C:\\Notes8\\Data", buffer.str());
}

// --- Notes plug-in folder ---------------------------------------------------

TEST_F(LocationsTest, PluginFolderEndsInNotes) {
    struct Case {
        const wchar_t* stored;
        const wchar_t* expected;
    } cases[] = {
        {L"C:\\Program Files\\Lotus\\Notes", L"C:\\Program Files\\Lotus\\Notes"},
        {L"C:\\Program Files\\Lotus", L"C:\\Program Files\\Lotus\\Notes"},
        {L"C:\\Program Files\\Lotus\\", L"C:\\Program Files\\Lotus\\Notes"},
        {L"C:\\Program Files\\Lotus\\NOTES", L"C:\\Program Files\\Lotus\\NOTES"},
        // A trailing separator does not hide the last folder's name.
        {L"C:\\Program Files\\Lotus\\Notes\\", L"C:\\Program Files\\Lotus\\Notes\\"},
        {L"C:\\Lotus\\MyNotes", L"C:\\Lotus\\MyNotes\\Notes"},
    };
    for (const Case& c : cases) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", c.stored));
        Buffer buffer;
        EXPECT_TRUE(GetNIPath(buffer.text, buffer.capacity)) << c.stored;
        EXPECT_EQ(c.expected, buffer.str());
    }
}

TEST_F(LocationsTest, PluginFolderThatWouldNotFitFailsWithAnEmptyBuffer) {
    // 255 characters plus "\Notes" need 262 with the terminator.
    const std::wstring stored = PathOfLength(255);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", stored));
    Buffer buffer;
    EXPECT_FALSE(GetNIPath(buffer.text, buffer.capacity));
    EXPECT_TRUE(buffer.AllZero());
    // 253 characters plus "\Notes" fit exactly.
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", PathOfLength(253)));
    EXPECT_TRUE(GetNIPath(buffer.text, buffer.capacity));
    EXPECT_EQ(PathOfLength(253) + L"\\Notes", buffer.str());
    // The 520-character buffer of deloldnifiles takes the longer one.
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", PathOfLength(300)));
    Buffer large(kLargeLocationCapacity);
    EXPECT_TRUE(GetNIPathAnyUser(large.text, large.capacity));
    EXPECT_EQ(PathOfLength(300) + L"\\Notes", large.str());
}

TEST_F(LocationsTest, PluginFolderOfTheUserOnlyWhenTheMachineHasNoKey) {
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kNIKey, L"Path", L"C:\\UserNI"));
    Buffer buffer;
    EXPECT_FALSE(GetNIPath(buffer.text, buffer.capacity));
    EXPECT_TRUE(buffer.AllZero());
    EXPECT_TRUE(GetNIPathAnyUser(buffer.text, buffer.capacity));
    EXPECT_EQ(L"C:\\UserNI\\Notes", buffer.str());

    // The machine key exists without a value: no fallback.
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNIKey));
    EXPECT_FALSE(GetNIPathAnyUser(buffer.text, buffer.capacity));
    EXPECT_TRUE(buffer.AllZero());
}

// --- Sametime Connect -------------------------------------------------------

TEST_F(LocationsTest, SametimeFoundByCaseSensitiveDisplayName) {
    Buffer buffer;
    DWORD version = 7;
    EXPECT_FALSE(GetSametimePath(buffer.text, buffer.capacity, &version));
    EXPECT_TRUE(buffer.AllZero());

    AddUninstallEntry(L"QMTestLower", L"ibm lotus sametime connect 8.5", L"C:\\Lower");
    EXPECT_FALSE(GetSametimePath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(7u, version);

    const DWORD eight = 8;
    AddUninstallEntry(L"QMTestST", L"IBM Lotus Sametime Connect 8.5", L"C:\\ST85", &eight);
    EXPECT_TRUE(GetSametimePath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(L"C:\\ST85", buffer.str());
    EXPECT_EQ(8u, version);

    // Either out-value alone is enough.
    version = 7;
    EXPECT_TRUE(GetSametimePath(nullptr, 0, &version));
    EXPECT_EQ(8u, version);
    Buffer only;
    EXPECT_TRUE(GetSametimePath(only.text, only.capacity, nullptr));
    EXPECT_EQ(L"C:\\ST85", only.str());
    EXPECT_FALSE(GetSametimePath(nullptr, 0, nullptr));
}

TEST_F(LocationsTest, SametimeFirstUsableEntryWinsAndKeepsThePresetVersion) {
    // Enumeration order of these names: A, B, C.
    AddUninstallEntry(L"QMTestA", L"Sametime Connect", PathOfLength(300));
    AddUninstallEntry(L"QMTestB", L"Sametime Connect 7.5", L"C:\\ST75");
    const DWORD eight = 8;
    AddUninstallEntry(L"QMTestC", L"Sametime Connect 8", L"C:\\ST8", &eight);

    Buffer buffer;
    DWORD version = 7;
    // A's folder does not fit: never cut short, B is next.
    EXPECT_TRUE(GetSametimePath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(L"C:\\ST75", buffer.str());
    EXPECT_EQ(7u, version);

    // A found with the larger buffer.
    Buffer large(kLargeLocationCapacity);
    EXPECT_TRUE(GetSametimePath(large.text, large.capacity, &version));
    EXPECT_EQ(PathOfLength(300), large.str());
}

TEST_F(LocationsTest, SametimeSearchGivesUpAfterItsBudget) {
    AddUninstallEntry(L"QMTestST", L"IBM Lotus Sametime Connect 8.5", L"C:\\ST85");
    Buffer buffer;
    DWORD version = 7;
    // The clock passes the budget before the first entry is looked at.
    g_ticksBeforeJump = 1;
    EXPECT_FALSE(GetSametimePathWithClock(buffer.text, buffer.capacity, &version, &JumpingTicks));
    EXPECT_TRUE(buffer.AllZero());
    // A clock that stays put (just before its wrap-around) leaves time for all.
    EXPECT_TRUE(GetSametimePathWithClock(buffer.text, buffer.capacity, &version, &FrozenTicks));
    EXPECT_EQ(L"C:\\ST85", buffer.str());
}

TEST_F(LocationsTest, SametimeConfigurationOfEachProfile) {
    CStringEx path;
    EXPECT_FALSE(GetSametimeConfigPath(0, path));
    EXPECT_FALSE(GetSametimeConfigPath(1, path));

    const std::wstring first =
        RoamingAppData() + L"\\Lotus\\Sametime\\.config\\org.eclipse.update\\platform.xml";
    const std::wstring second =
        RoamingAppData() + L"\\IBM\\Sametime\\.config\\org.eclipse.update\\platform.xml";
    ASSERT_TRUE(WriteFileBytes(second, "<config/>"));
    EXPECT_FALSE(GetSametimeConfigPath(0, path));
    EXPECT_TRUE(GetSametimeConfigPath(1, path));
    EXPECT_EQ(second, std::wstring(path.c_str()));
    ASSERT_TRUE(WriteFileBytes(first, "<config/>"));
    EXPECT_TRUE(GetSametimeConfigPath(0, path));
    EXPECT_EQ(first, std::wstring(path.c_str()));
}

// --- Per-user data folder ---------------------------------------------------

TEST_F(LocationsTest, AppDataPathCreatesTheSuiteFolders) {
    const std::wstring folder = RoamingAppData() + L"\\Mirovan\\Quillmark Tools";
    ASSERT_FALSE(DirExists(folder));
    CStringEx path;
    EXPECT_TRUE(GetAppDataMrvQMPath(L"Mirovan_Trace.zip", path));
    EXPECT_EQ(folder + L"\\Mirovan_Trace.zip", std::wstring(path.c_str()));
    EXPECT_TRUE(DirExists(folder));
    EXPECT_FALSE(FileExists(folder + L"\\Mirovan_Trace.zip"));  // only folders are made

    EXPECT_FALSE(GetAppDataMrvQMPath(nullptr, path));
    // A name that would not fit a path fails instead of being cut short.
    EXPECT_FALSE(GetAppDataMrvQMPath(std::wstring(300, L'n').c_str(), path));
}

// --- Suite root folder ------------------------------------------------------

TEST_F(LocationsTest, RootPathMachineThenUserThenServiceRegistration) {
    CStringEx root(L"stale");
    EXPECT_TRUE(CPathApi::GetQMRootPath(root));
    EXPECT_TRUE(root.IsEmpty());

    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kSuiteKey, L"Path", L"C:\\User\\QM"));
    EXPECT_TRUE(CPathApi::GetQMRootPath(root));
    EXPECT_EQ(std::wstring(L"C:\\User\\QM"), root.c_str());

    // An empty machine value does not send the lookup to the user's value,
    // but to the suite service's registration.
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", L""));
    const std::wstring server = std::wstring(kServerClsidWow) + L"\\LocalServer32";
    ASSERT_TRUE(RegPutString(HKEY_CLASSES_ROOT, server, L"",
                             L"\"C:\\Program Files\\Quillmark\\qmSrv.exe\""));
    EXPECT_TRUE(CPathApi::GetQMRootPath(root));
    EXPECT_EQ(std::wstring(L"C:\\Program Files\\Quillmark"), root.c_str());

    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", L"C:\\Machine\\QM"));
    EXPECT_TRUE(CPathApi::GetQMRootPath(root));
    EXPECT_EQ(std::wstring(L"C:\\Machine\\QM"), root.c_str());

    // A machine value that is not a plain string counts as missing.
    ASSERT_TRUE(
        RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", L"C:\\Expand", 0, REG_EXPAND_SZ));
    EXPECT_TRUE(CPathApi::GetQMRootPath(root));
    EXPECT_EQ(std::wstring(L"C:\\User\\QM"), root.c_str());
}
