// The product lookups against real registry keys: values that do not fit the
// caller's buffer count as absent (and leave it empty), the Notes version
// rules, the plug-in folder, and the Sametime search with its budget.

#include <algorithm>

#include "notes/product_locations.h"
#include "notes/sametime_path_search.h"
#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"

namespace {

const HKEY kMachine = HKEY_LOCAL_MACHINE;
const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kNotes[] = L"SOFTWARE\\Lotus\\Notes";
const std::wstring kNotes8 = std::wstring(kNotes) + L"\\8.0";

// A path-like text of exactly `chars` characters.
std::wstring PathOfLength(size_t chars) {
    std::wstring text = L"C:\\";
    while (text.size() < chars) {
        text += text.size() % 40 == 39 ? L'\\' : L'p';
    }
    return text;
}

// A buffer prefilled with '#', so a test sees everything a lookup wrote.
struct Buffer {
    explicit Buffer(DWORD chars = kLocationCapacity) : capacity(chars) {
        std::fill(text, text + kLargeLocationCapacity, L'#');
    }
    bool Empty() const {
        return std::all_of(text, text + capacity, [](wchar_t c) { return !c; });
    }
    DWORD capacity;
    wchar_t text[kLargeLocationCapacity + 1] = {};
};

DWORD g_tickStep = 0;
DWORD SteppingTicks() {  // from just before its wrap-around
    static DWORD now = 0xFFFFFF00u;
    return now += g_tickStep;
}

class LocationsTest : public MachineTest {
protected:
    void AddSametime(const wchar_t* tag, const wchar_t* displayName, const std::wstring& location,
                     DWORD versionMajor = 0) {
        const std::wstring key = L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\Uninstall\\" +
                                 std::wstring(kTestUninstallPrefix) + tag;
        ASSERT_TRUE(RegPutString(kMachine, key, L"DisplayName", displayName));
        ASSERT_TRUE(location.empty() || RegPutString(kMachine, key, L"InstallLocation", location));
        ASSERT_TRUE(versionMajor == 0 || RegPutDword(kMachine, key, L"VersionMajor", versionMajor));
    }
};

TEST_F(LocationsTest, ValueMustFitTheBufferWithItsTerminator) {
    for (size_t chars : {259u, 260u}) {
        const std::wstring value = PathOfLength(chars);
        for (bool terminated : {true, false}) {
            SCOPED_TRACE(testing::Message() << chars << (terminated ? "" : " unterminated"));
            const size_t bytes = (chars + (terminated ? 1 : 0)) * sizeof(wchar_t);
            HKEY key = nullptr;
            ASSERT_EQ(ERROR_SUCCESS, RegCreateKeyExW(kMachine, kSuiteKey, 0, nullptr, 0, KEY_WRITE,
                                                     nullptr, &key, nullptr));
            // Wine counts a terminator into the size of a REG_SZ stored without one;
            // a binary value shows the bare bytes, as Windows reads such a REG_SZ.
            RegSetValueExW(key, L"Path", 0, terminated ? REG_SZ : REG_BINARY,
                           reinterpret_cast<const BYTE*>(value.c_str()), static_cast<DWORD>(bytes));
            RegCloseKey(key);
            Buffer buffer;
            EXPECT_EQ(chars < 260, GetQMInstallPath(buffer.text, buffer.capacity));
            EXPECT_TRUE(chars < 260 ? value == buffer.text : buffer.Empty());
            Buffer large(kLargeLocationCapacity);
            EXPECT_TRUE(GetQMInstallPath(large.text, large.capacity));
            EXPECT_EQ(value, large.text);
        }
    }
}

TEST_F(LocationsTest, NotesVersionRules) {
    EXPECT_EQ(6u, GetNotesVersion());  // nothing installed
    for (const auto& [version, expected] :
         {std::pair{L"90001", 9u}, {L"85000", 6u}, {L"90000 FP1", 9u}, {L"release 9", 6u}}) {
        ASSERT_TRUE(RegPutString(kMachine, kNotes, L"Version", version));
        EXPECT_EQ(expected, GetNotesVersion()) << Narrow(version);
    }
    ASSERT_TRUE(RegMakeKey(kMachine, kNotes8));
    EXPECT_EQ(8u, GetNotesVersion());  // the 8.0 key wins over the Version value
}

TEST_F(LocationsTest, PluginFolderEndsInNotes) {
    const struct {
        std::wstring stored;
        std::wstring expected;
    } cases[] = {
        {L"C:\\Lotus\\NOTES", L"C:\\Lotus\\NOTES"},
        {L"C:\\Lotus\\", L"C:\\Lotus\\Notes"},
        {L"C:\\Lotus\\MyNotes", L"C:\\Lotus\\MyNotes\\Notes"},
        {PathOfLength(253), PathOfLength(253) + L"\\Notes"},  // 259 characters
        {PathOfLength(254), L""},  // "\Notes" would pass the buffer's end
    };
    for (const auto& c : cases) {
        ASSERT_TRUE(RegPutString(kMachine, L"SOFTWARE\\mirovan\\NI", L"Path", c.stored));
        Buffer buffer;
        EXPECT_EQ(!c.expected.empty(), GetNIPath(buffer.text, buffer.capacity)) << c.stored.size();
        EXPECT_EQ(c.expected, buffer.text);
    }
}

TEST_F(LocationsTest, SametimeFirstMatchingUsableEntryWinsWithinTheBudget) {
    // Enumeration order: A, B, C, D.
    AddSametime(L"A", L"ibm lotus sametime connect 8.5", L"C:\\Lower");
    AddSametime(L"B", L"IBM Lotus Sametime Connect 8.5", L"");
    AddSametime(L"C", L"Sametime Connect", PathOfLength(300));
    AddSametime(L"D", L"Sametime Connect 8", L"C:\\ST8", 8);
    Buffer buffer;
    DWORD version = 7;
    EXPECT_TRUE(GetSametimePath(buffer.text, buffer.capacity, &version));
    EXPECT_STREQ(L"C:\\ST8", buffer.text);
    EXPECT_EQ(8u, version);
    // Each entry is looked at one clock step later than the one before.
    for (DWORD step : {kSametimeSearchBudgetMs / 4, kSametimeSearchBudgetMs / 4 + 1}) {
        g_tickStep = step;
        EXPECT_EQ(step * 4 <= kSametimeSearchBudgetMs,
                  GetSametimePathWithClock(buffer.text, buffer.capacity, &version, &SteppingTicks))
            << step;
    }
}

}  // namespace
