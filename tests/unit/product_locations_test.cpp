// The product location lookups against real registry keys of a scratch
// prefix: key order, values too large for the caller's buffer counting as
// absent (with the buffer left empty), the version rules, the plug-in folder,
// the multi-user and Citrix branches, and the Sametime search and its budget.
#include <gtest/gtest.h>

#include <windows.h>

#include <algorithm>
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
const wchar_t kUninstall[] = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\";
const wchar_t kServerClsid[] = L"Wow6432Node\\CLSID\\{A12A21B3-CFDA-497E-98C0-CE60D4D108C8}";

// A path-like text of exactly `chars` characters.
std::wstring PathOfLength(size_t chars) {
    std::wstring text = L"C:\\";
    while (text.size() < chars) {
        text += (text.size() % 40 == 39) ? L'\\' : L'p';
    }
    text.resize(chars - 1);
    return text + L'q';
}

// A buffer prefilled with '#', so a test sees everything a lookup wrote.
struct Buffer {
    explicit Buffer(DWORD chars = kLocationCapacity) : capacity(chars) {
        std::fill(text, text + kLargeLocationCapacity, L'#');
    }
    bool AllZero() const {
        return std::all_of(text, text + capacity, [](wchar_t ch) { return ch == L'\0'; });
    }
    std::wstring str() const { return text; }
    DWORD capacity;
    wchar_t text[kLargeLocationCapacity + 1] = {};
};

// A string value stored without its terminator.
void PutUnterminated(const std::wstring& value) {
    HKEY k = nullptr;
    ASSERT_EQ(ERROR_SUCCESS, RegCreateKeyExW(HKEY_LOCAL_MACHINE, kSuiteKey, 0, nullptr, 0,
                                             KEY_WRITE, nullptr, &k, nullptr));
    RegSetValueExW(k, L"Path", 0, REG_SZ, reinterpret_cast<const BYTE*>(value.data()),
                   static_cast<DWORD>(value.size() * sizeof(wchar_t)));
    RegCloseKey(k);
}

class LocationsTest : public MachineTest {
protected:
    ~LocationsTest() override { RegRemoveTree(HKEY_CLASSES_ROOT, kServerClsid); }

    void AddUninstallEntry(const wchar_t* name, const wchar_t* displayName,
                           const std::wstring& location, DWORD versionMajor = 0) {
        const std::wstring key = kUninstall + std::wstring(kTestUninstallPrefix) + name;
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, key, L"DisplayName", displayName));
        if (!location.empty()) {
            ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, key, L"InstallLocation", location));
        }
        if (versionMajor != 0) {
            ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, key, L"VersionMajor", versionMajor));
        }
    }
};

// A clock that moves by g_tickStep on each reading, from just before its
// wrap-around.
DWORD g_tickStep = 0;
DWORD SteppingTicks() {
    static DWORD now = 0xFFFFFF00u;
    return now += g_tickStep;
}

}  // namespace

TEST_F(LocationsTest, ValueMustFitTheCallersCapacityWithItsTerminator) {
    Buffer none;
    EXPECT_FALSE(GetQMInstallPath(none.text, none.capacity));
    EXPECT_TRUE(none.AllZero());
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kSuiteKey, L"Path", L"C:\\User\\QM"));
    EXPECT_TRUE(GetQMInstallPath(none.text, none.capacity));  // the user's, as no machine value
    EXPECT_EQ(L"C:\\User\\QM", none.str());

    // Stored without a terminator, 260 characters leave no room to end the
    // text; 259 get one added.
    for (size_t chars : {259u, 260u, 300u}) {
        const std::wstring value = PathOfLength(chars);
        const bool fits = chars < kLocationCapacity;
        for (bool terminated : {true, false}) {
            SCOPED_TRACE(testing::Message() << chars << (terminated ? "" : " unterminated"));
            if (terminated) {
                ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", value));
            } else {
                PutUnterminated(value);
            }
            Buffer buffer;
            EXPECT_EQ(fits,
                      GetQMInstallPathFromReg(HKEY_LOCAL_MACHINE, buffer.text, buffer.capacity));
            EXPECT_TRUE(fits ? buffer.str() == value : buffer.AllZero());
            Buffer large(kLargeLocationCapacity);
            EXPECT_TRUE(GetQMInstallPath(large.text, large.capacity));
            EXPECT_EQ(value, large.str());
        }
    }
}

TEST_F(LocationsTest, NotesPathTriesTheKeysInOrderAndSkipsUnfitValues) {
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Path", L"C:\\Notes9"));
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", L"C:\\Notes8"));
    // 6.0 opens but has no Path; 7.0's Path is too large: both skipped.
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNotes6));
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes7, L"Path", PathOfLength(300)));
    Buffer buffer;
    EXPECT_TRUE(GetNotesPath(buffer.text, buffer.capacity));
    EXPECT_EQ(L"C:\\Notes8", buffer.str());

    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes6, L"Path", PathOfLength(259)));
    EXPECT_TRUE(GetNotesPath(buffer.text, buffer.capacity));
    EXPECT_EQ(PathOfLength(259), buffer.str());
}

TEST_F(LocationsTest, NotesVersionRules) {
    EXPECT_EQ(6u, GetNotesVersion());  // nothing installed
    const struct {
        const wchar_t* version;
        DWORD expected;
    } values[] = {{L"90001", 9}, {L"85000", 6}, {L"90000 FP1", 9}, {L"release 9", 6}};
    for (const auto& v : values) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Version", v.version));
        EXPECT_EQ(v.expected, GetNotesVersion()) << Narrow(v.version);
    }
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes, L"Version", L"90001"));
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNotes8));
    EXPECT_EQ(8u, GetNotesVersion());  // the 8.0 key wins over the Version value
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, kNotes6));
    EXPECT_EQ(6u, GetNotesVersion());  // 6.0 and 8.0 both present
}

TEST_F(LocationsTest, EmbeddedSametimeFoldersMultiUserAndCitrix) {
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"DataPath", L"C:\\Notes8\\Data"));
    Buffer buffer;
    DWORD version = 0;
    EXPECT_TRUE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(8u, version);
    EXPECT_EQ(L"C:\\Notes8\\Data", buffer.str());
    EXPECT_FALSE(GetEmbeddedSTPath(buffer.text, buffer.capacity, &version));  // no Path
    EXPECT_TRUE(buffer.AllZero());

    // On a Citrix server without multi-user Notes there is no data folder.
    ASSERT_TRUE(RegMakeKey(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Citrix\\Citrix Management Console"));
    EXPECT_FALSE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    EXPECT_TRUE(buffer.AllZero());

    // Multi-user: the folder of the user's notes.ini, Citrix or not.
    ASSERT_TRUE(RegPutDword(HKEY_LOCAL_MACHINE, kNotes, L"MultiUser", 1));
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, L"Software\\Lotus\\Notes\\8.0", L"NotesIniPath",
                             L"D:\\Notes\\Data\\notes.ini"));
    EXPECT_TRUE(GetEmbeddedSTDataPath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(L"D:\\Notes\\Data", buffer.str());
}

TEST_F(LocationsTest, PluginFolderEndsInNotes) {
    const struct {
        std::wstring stored;
        std::wstring expected;
    } cases[] = {
        {L"C:\\Program Files\\Lotus\\Notes", L"C:\\Program Files\\Lotus\\Notes"},
        {L"C:\\Program Files\\Lotus", L"C:\\Program Files\\Lotus\\Notes"},
        {L"C:\\Program Files\\Lotus\\", L"C:\\Program Files\\Lotus\\Notes"},
        {L"C:\\Program Files\\Lotus\\NOTES", L"C:\\Program Files\\Lotus\\NOTES"},
        {L"C:\\Lotus\\MyNotes", L"C:\\Lotus\\MyNotes\\Notes"},
        {PathOfLength(253), PathOfLength(253) + L"\\Notes"},  // 259 characters
        {PathOfLength(255), L""},  // "\Notes" would pass the buffer's end
    };
    for (const auto& c : cases) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", c.stored));
        Buffer buffer;
        EXPECT_EQ(!c.expected.empty(), GetNIPath(buffer.text, buffer.capacity)) << c.stored.size();
        EXPECT_EQ(c.expected, buffer.str());
    }
    Buffer large(kLargeLocationCapacity);  // as deloldnifiles hands it
    EXPECT_TRUE(GetNIPathAnyUser(large.text, large.capacity));
    EXPECT_EQ(PathOfLength(255) + L"\\Notes", large.str());
}

TEST_F(LocationsTest, SametimeFirstMatchingUsableEntryWins) {
    // Enumeration order: A, B, C, D, E.
    AddUninstallEntry(L"A", L"ibm lotus sametime connect 8.5", L"C:\\Lower");
    AddUninstallEntry(L"B", L"IBM Lotus Sametime Connect 8.5", L"");
    AddUninstallEntry(L"C", L"Sametime Connect", PathOfLength(300));
    AddUninstallEntry(L"D", L"Sametime Connect 8", L"C:\\ST8", 8);
    AddUninstallEntry(L"E", L"Sametime Connect 7.5", L"C:\\ST75");
    Buffer buffer;
    DWORD version = 7;
    EXPECT_TRUE(GetSametimePath(buffer.text, buffer.capacity, &version));
    EXPECT_EQ(L"C:\\ST8", buffer.str());
    EXPECT_EQ(8u, version);

    Buffer large(kLargeLocationCapacity);
    version = 7;
    EXPECT_TRUE(GetSametimePath(large.text, large.capacity, &version));
    EXPECT_EQ(PathOfLength(300), large.str());
    EXPECT_EQ(7u, version);  // C has no VersionMajor: the preset stays
}

TEST_F(LocationsTest, SametimeSearchGivesUpAfterItsBudget) {
    AddUninstallEntry(L"ST", L"IBM Lotus Sametime Connect 8.5", L"C:\\ST85");
    // The entry is looked at one clock step after the start.
    for (DWORD step : {0ul, kSametimeSearchBudgetMs, kSametimeSearchBudgetMs + 1}) {
        g_tickStep = step;
        Buffer buffer;
        DWORD version = 7;
        const bool found = step <= kSametimeSearchBudgetMs;
        EXPECT_EQ(found,
                  GetSametimePathWithClock(buffer.text, buffer.capacity, &version, &SteppingTicks))
            << step;
        EXPECT_EQ(found ? L"C:\\ST85" : L"", buffer.str());
    }
}

TEST_F(LocationsTest, AppDataPathCreatesTheSuiteFolders) {
    const std::wstring folder = RoamingAppData() + L"\\Mirovan\\Quillmark Tools";
    ASSERT_FALSE(DirExists(RoamingAppData() + L"\\Mirovan"));
    CStringEx path;
    EXPECT_TRUE(GetAppDataMrvQMPath(L"Mirovan_Trace.zip", path));
    EXPECT_EQ(folder + L"\\Mirovan_Trace.zip", std::wstring(path.c_str()));
    EXPECT_TRUE(DirExists(folder));
    EXPECT_FALSE(FileExists(folder + L"\\Mirovan_Trace.zip"));  // only folders are made
}

TEST_F(LocationsTest, RootPathMachineThenUserThenServiceRegistration) {
    auto root = [] {
        CStringEx path(L"stale");
        EXPECT_TRUE(CPathApi::GetQMRootPath(path));
        return std::wstring(path.c_str());
    };
    EXPECT_EQ(L"", root());
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kSuiteKey, L"Path", L"C:\\User\\QM"));
    EXPECT_EQ(L"C:\\User\\QM", root());

    // An empty machine value sends the lookup to the service's registration,
    // not to the user's value.
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", L""));
    ASSERT_TRUE(RegPutString(HKEY_CLASSES_ROOT, std::wstring(kServerClsid) + L"\\LocalServer32",
                             L"", L"\"C:\\Program Files\\Quillmark\\qmSrv.exe\""));
    EXPECT_EQ(L"C:\\Program Files\\Quillmark", root());
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", L"C:\\Machine\\QM"));
    EXPECT_EQ(L"C:\\Machine\\QM", root());
}
