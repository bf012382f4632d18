// The Notes plug-in keywords run by the real program against a simulated
// machine: suite files that name their origin in their content, a Notes folder
// found through the registry, files held open as a running Notes holds its
// libraries, and folders at the path limit.

#include <algorithm>

#include "notes/plugin_file_lists.h"
#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"

namespace {

const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kNotes8[] = L"SOFTWARE\\Lotus\\Notes\\8.0";

std::string Origin(const char* place, const std::wstring& name) {
    return std::string(place) + ":" + Narrow(name);
}

// The copy leaves out the library Notes shares and the database.
bool IsCopied(const std::wstring& name) {
    return name != L"NIURL.dll" && name != L"mirovan.nsf";
}

class NotesFilesE2E : public MachineTest {
protected:
    NotesFilesE2E() {
        for (const wchar_t* name : kPluginFiles) {
            Put(m_suite, name, Origin("suite", name));
        }
        EXPECT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", m_suite));
        EXPECT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", m_notes));
    }
    void Put(const std::wstring& folder, const std::wstring& name, const std::string& content) {
        ASSERT_TRUE(WriteFileBytes(JoinPath(folder, name), content));
    }

    const std::wstring m_suite = m_scratch.Sub(L"Quillmark Tools", true);
    const std::wstring m_notes = m_scratch.Sub(L"Lotus\\Notes", true);
};

TEST_F(NotesFilesE2E, CopyReplacesFilesInUseThenDeleteKeepsTheSharedLibrary) {
    for (const wchar_t* name : {L"NIURL.dll", L"mirovan.nsf", L"notes.ini"}) {
        Put(m_notes, name, Origin("notes", name));
    }
    Put(m_notes, L"qmnires.dll", "notes:loaded");
    Put(m_notes, L"qmnwintc.dll", "notes:locked");
    Put(m_suite, L"upd_temp\\a_upd_temp", "x");
    Put(m_suite, L"upd_temp\\components\\b.txt", "keep");
    Put(m_suite, L"qmniupd.exe_upd_temp.exe", "x");
    {
        HeldOpen loaded(JoinPath(m_notes, L"qmnires.dll"), kLikeALoadedLibrary);
        HeldOpen locked(JoinPath(m_notes, L"qmnwintc.dll"), FILE_SHARE_READ);
        ASSERT_TRUE(loaded.ok() && locked.ok());
        EXPECT_EQ(0, Program().Run(L"-copyfilestonotes").exitCode);
    }
    for (const std::wstring name : kPluginFiles) {
        EXPECT_EQ(!IsCopied(name)           ? Origin("notes", name)
                  : name == L"qmnwintc.dll" ? "notes:locked"  // could not even be renamed
                                            : Origin("suite", name),
                  ReadFileBytes(JoinPath(m_notes, name)))
            << Narrow(name);
    }
    // The loaded library went aside under its time-stamped name, slated for
    // deletion at restart; nothing else is left over.
    std::wstring backup;  // its name's format is checked on its own
    for (const std::wstring& name : ListDir(m_notes)) {
        backup = name.rfind(L"qmnires.dll.", 0) == 0 ? name : backup;
    }
    ASSERT_NE(std::wstring::npos, backup.find(L".bak"));
    EXPECT_EQ("notes:loaded", ReadFileBytes(JoinPath(m_notes, backup)));
    EXPECT_TRUE(IsPendingDelete(JoinPath(m_notes, backup)));
    EXPECT_EQ(size_t(kPluginFileCount) + 2, ListDir(m_notes).size());  // notes.ini, the backup

    EXPECT_EQ(0, Program().Run(L"-delnifiles").exitCode);
    EXPECT_EQ((std::vector<std::wstring>{L"NIURL.dll", L"notes.ini", backup}), ListDir(m_notes));
    EXPECT_EQ(Origin("notes", L"NIURL.dll"), ReadFileBytes(JoinPath(m_notes, L"NIURL.dll")));
    // The update leftovers of the suite folder went too; folders and other files stay.
    EXPECT_EQ(std::vector<std::wstring>{L"components"}, ListDir(m_suite + L"\\upd_temp"));
    EXPECT_EQ(size_t(kPluginFileCount) + 1, ListDir(m_suite).size());
}

TEST_F(NotesFilesE2E, FolderAtThePathLimitIsNeverOverrunOrCutShort) {
    // A 245-character Notes folder: names up to 13 characters fit after the
    // separator (245 + 1 + 13 = 259); stored with its trailing backslash, 14.
    std::wstring deep = m_notes;
    while (244 - deep.size() - 1 > 60) {
        deep = JoinPath(deep, std::wstring(30, L'd'));
    }
    deep = JoinPath(deep, std::wstring(244 - deep.size() - 1, L'd'));
    for (const std::wstring& stored : {deep + L"d", deep + L"\\"}) {
        SCOPED_TRACE(Narrow(stored.substr(stored.size() - 2)));
        ASSERT_TRUE(MakeDirs(stored.back() == L'\\' ? deep : stored));
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", stored));
        const size_t longest = stored.back() == L'\\' ? 14 : 13;
        // What "com.mrv.realtime.meeting_1.0.1.jar" would become if cut at 259.
        const std::wstring cut = std::wstring(L"com.mrv.realtime").substr(0, longest);
        Put(stored, cut, "decoy");
        std::vector<std::wstring> expected = {cut};
        for (const std::wstring name : kPluginFiles) {
            if (name.size() <= longest && IsCopied(name)) {
                expected.push_back(name);
            }
        }
        std::sort(expected.begin(), expected.end());
        EXPECT_EQ(0, Program().Run(L"-copyfilestonotes").exitCode);
        EXPECT_EQ(expected, ListDir(stored));
        EXPECT_EQ("decoy", ReadFileBytes(JoinPath(stored, cut)));
        EXPECT_EQ(0, Program().Run(L"-delnifiles").exitCode);
        EXPECT_EQ(std::vector<std::wstring>{cut}, ListDir(stored));
    }
}

}  // namespace
