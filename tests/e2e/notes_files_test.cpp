// The Notes plug-in keywords run by the real program against a simulated
// machine: suite files that name their origin in their content, a Notes folder
// found through the registry, files held open as a running Notes holds its
// libraries, and folders at the path limit or given relative.
#include <gtest/gtest.h>

#include <windows.h>

#include <algorithm>
#include <set>
#include <string>
#include <vector>

#include "tests/support/file_util.h"
#include "tests/support/held_files.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/registry_util.h"

namespace {

// The plug-in's files, the previous generation's, and the extras of its folder.
// clang-format off
const wchar_t* const kPlugin[] = {
    L"lcppn30.dll", L"ndbmrvqm.dll", L"qmnires.dll", L"NIURL.dll", L"qmMRVURL.DLL",
    L"qmnwintc.dll", L"qmnwinto.dll", L"qmwnictl.dll", L"mirovan.nsf", L"qmniscpt.xml",
    L"qmniupd.exe", L"mirovanni.chm", L"qmniadpt.dll", L"qmnwcfg.exe", L"qmMrvONI.exe",
    L"qmONIUI.dll", L"qmOI3Res.dll", L"ieqmcodec.dll", L"QCLDLL.dll", L"QCLDLL64.dll",
    L"QCLProxy.dll", L"QCLProxy64.dll", L"com.mrv.realtime.meeting_1.0.1.jar",
    L"qmmrvjni.dll", L"msvcp120.dll", L"msvcr120.dll", L"mrvtrace.dll", L"mrvtraceX64.dll"};
const wchar_t* const kOldPlugin[] = {
    L"ndbmrv.dll", L"nires.dll", L"NIURL.dll", L"MRVOIURL.DLL", L"nwdbmon.dll", L"nwinstc.dll",
    L"nwinsto.dll", L"nwmsgctl.dll", L"nwmtmgr.dll", L"wnictrl.dll", L"mirovan.nsf",
    L"mirvscpt.xml", L"nwsetup.exe", L"mirovanni.chm", L"nadapter.dll", L"nwconfig.exe",
    L"MirovanONI.exe", L"ONIUI.dll", L"OI3Res.dll", L"nwsp2c.dll"};
const wchar_t* const kOldExtras[] = {
    L"lcppn30.dll", L"ieqmcodec.dll", L"qmcodec.dll", L"QMCODEXT.DLL", L"mirovan_ball_32.ico"};
// clang-format on

const wchar_t kNotes8[] = L"SOFTWARE\\Lotus\\Notes\\8.0";

std::string Origin(const char* place, const wchar_t* name) {
    return std::string(place) + ":" + Narrow(name);
}

std::wstring BackupName(const wchar_t* name, const SYSTEMTIME& t) {
    wchar_t text[MAX_PATH];
    _snwprintf(text, MAX_PATH, L"%ls.%d.%d.%d.%d.%d.%d.bak", name, t.wYear, t.wMonth, t.wDay,
               t.wHour, t.wMinute, t.wSecond);
    text[MAX_PATH - 1] = L'\0';
    return text;
}

// Every file (with a digest of its content) and folder below `folder`; the
// program's own trace logs are left out.
std::set<std::wstring> Tree(const std::wstring& folder, const std::wstring& prefix = L"") {
    std::set<std::wstring> entries;
    for (const std::wstring& name : ListDir(folder)) {
        const std::wstring path = JoinPath(folder, name);
        const std::wstring rel = prefix + name;
        if (DirExists(path)) {
            std::set<std::wstring> below = Tree(path, rel + L"\\");
            entries.insert(below.begin(), below.end());
            entries.insert(rel + L"\\");
        } else if (!prefix.empty() || (name != L"trace.log" && name != L"calls.log")) {
            unsigned digest = 2166136261u;
            for (unsigned char ch : ReadFileBytes(path)) {
                digest = (digest ^ ch) * 16777619u;
            }
            entries.insert(rel + L" #" + std::to_wstring(digest));
        }
    }
    return entries;
}

class NotesFilesE2E : public MachineTest {
protected:
    NotesFilesE2E()
        : m_suite(m_scratch.Sub(L"Quillmark Tools", true)),
          m_notes(m_scratch.Sub(L"Lotus\\Notes", true)) {
        for (const wchar_t* name : kPlugin) {
            WriteFileBytes(JoinPath(m_suite, name), Origin("suite", name));
        }
        EXPECT_TRUE(
            RegPutString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Mirovan\\QmkTools", L"Path", m_suite));
        EXPECT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", m_notes));
    }
    void Put(const std::wstring& folder, const wchar_t* name, const std::string& content) {
        ASSERT_TRUE(WriteFileBytes(JoinPath(folder, name), content));
    }

    std::wstring m_suite;
    std::wstring m_notes;
};

}  // namespace

TEST_F(NotesFilesE2E, CopyReplacesFilesInUseThenDeleteKeepsTheSharedLibrary) {
    for (const wchar_t* name : {L"NIURL.dll", L"mirovan.nsf", L"notes.ini"}) {
        Put(m_notes, name, Origin("notes", name));
    }
    Put(m_notes, L"qmnires.dll", "notes:loaded");
    Put(m_notes, L"qmnwintc.dll", "notes:locked");
    Put(m_suite, L"upd_temp\\a_upd_temp", "x");
    Put(m_suite, L"upd_temp\\components\\c_upd_temp", "x");
    Put(m_suite, L"upd_temp\\components\\b.txt", "keep");
    Put(m_suite, L"qmniupd.exe_upd_temp.exe", "x");
    SYSTEMTIME before, after;
    RunResult run;
    {
        HeldOpen loaded(JoinPath(m_notes, L"qmnires.dll"), kLikeALoadedLibrary);
        HeldOpen locked(JoinPath(m_notes, L"qmnwintc.dll"), FILE_SHARE_READ);
        ASSERT_TRUE(loaded.ok() && locked.ok());
        GetLocalTime(&before);
        run = Program().Run(L"-copyfilestonotes");
        GetLocalTime(&after);
    }
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining("Start Copy notesplugin files to notes path!\n"));
    EXPECT_TRUE(run.HasTraceContaining("Copy File from QM Install path to Notes Path."));
    EXPECT_TRUE(run.HasTraceContaining("szNotesPath=" + Narrow(m_notes)));
    EXPECT_TRUE(run.HasTraceContaining("szInstallPath=" + Narrow(m_suite)));
    EXPECT_TRUE(run.HasTraceContaining("End Copy notesplugin files to notes path!\n"));
    for (const wchar_t* name : kPlugin) {
        const std::wstring n = name;
        const bool notesOwn = n == L"NIURL.dll" || n == L"mirovan.nsf";
        EXPECT_EQ(notesOwn               ? Origin("notes", name)
                  : n == L"qmnwintc.dll" ? "notes:locked"  // could not even be renamed
                                         : Origin("suite", name),
                  ReadFileBytes(JoinPath(m_notes, name)))
            << Narrow(name);
    }
    // The loaded library went aside under its time-stamped name, slated for
    // deletion at restart; nothing else is left over.
    std::wstring backup = BackupName(L"qmnires.dll", before);
    if (!FileExists(JoinPath(m_notes, backup))) {
        backup = BackupName(L"qmnires.dll", after);
    }
    EXPECT_EQ("notes:loaded", ReadFileBytes(JoinPath(m_notes, backup)));
    EXPECT_TRUE(IsPendingDelete(JoinPath(m_notes, backup)));
    EXPECT_FALSE(IsPendingDelete(JoinPath(m_notes, L"qmnwintc.dll")));
    EXPECT_EQ(28u + 1 + 1, ListDir(m_notes).size());  // the list, notes.ini, the backup

    run = Program().Run(L"-delnifiles");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining("Start Delete notes plugin Files for QM Uninstall!\n"));
    EXPECT_TRUE(run.HasTraceContaining("End Delete notes plugin Files for QM Uninstall!\n"));
    const std::vector<std::wstring> left = ListDir(m_notes);
    EXPECT_EQ((std::set<std::wstring>{L"NIURL.dll", L"notes.ini", backup}),
              std::set<std::wstring>(left.begin(), left.end()));
    EXPECT_EQ("notes:NIURL.dll", ReadFileBytes(JoinPath(m_notes, L"NIURL.dll")));
    // The update leftovers of the suite folder went too; other files stay.
    EXPECT_EQ(std::vector<std::wstring>{L"components"}, ListDir(m_suite + L"\\upd_temp"));
    EXPECT_EQ(std::vector<std::wstring>{L"b.txt"}, ListDir(m_suite + L"\\upd_temp\\components"));
    EXPECT_EQ(28u + 1, ListDir(m_suite).size());
}

TEST_F(NotesFilesE2E, DelOldNIFilesClearsTheOldGenerationEverywhere) {
    // The old plug-in was installed for the user only, in "<folder>\Notes".
    const std::wstring oldRoot = m_scratch.Sub(L"Old Plugin", true);
    const std::wstring oldFolder = JoinPath(oldRoot, L"Notes");
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, L"SOFTWARE\\mirovan\\NI", L"Path", oldRoot));
    for (const wchar_t* name : kOldPlugin) {
        Put(oldFolder, name, "old");
        Put(m_notes, name, "old");
    }
    for (const wchar_t* name : kOldExtras) {
        Put(oldFolder, name, "old");
    }
    Put(m_notes, L"qmnires.dll", "current");
    Put(m_notes, L"notes.ini", "notes:notes.ini");
    HeldOpen busy(JoinPath(m_notes, L"nwsetup.exe"), FILE_SHARE_READ);
    ASSERT_TRUE(busy.ok());

    RunResult run = Program().Run(L"-deloldnifiles");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining("Start Delete old notes plugin Files for QM Uninstall!\n"));
    EXPECT_FALSE(DirExists(oldFolder));
    EXPECT_EQ((std::vector<std::wstring>{L"notes.ini", L"nwsetup.exe", L"qmnires.dll"}),
              ListDir(m_notes));
    EXPECT_TRUE(IsPendingDelete(JoinPath(m_notes, L"nwsetup.exe")));
}

TEST_F(NotesFilesE2E, FolderAtThePathLimitIsNeverOverrunOrCutShort) {
    // A Notes folder of 245 characters: names up to 13 characters fit
    // (245 + 1 + 13 = 259), longer ones cannot be placed there.
    std::wstring deep = m_notes;
    while (deep.size() < 245) {
        deep = JoinPath(deep, std::wstring(std::min<size_t>(40, 245 - deep.size() - 1), L'd'));
    }
    ASSERT_TRUE(MakeDirs(deep));
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", deep));
    // What "com.mrv.realtime.meeting_1.0.1.jar" would become if cut at 259.
    const std::wstring cut = L"com.mrv.realt";
    Put(deep, cut.c_str(), "decoy");
    const std::wstring lotus = m_scratch.Sub(L"Lotus");
    const std::set<std::wstring> lotusBefore = Tree(lotus);

    RunResult run = Program().Run(L"-copyfilestonotes");
    EXPECT_EQ(0, run.exitCode);
    // Only the names that fit arrived, in the Notes folder and nowhere else.
    std::set<std::wstring> expected = lotusBefore;
    const std::set<std::wstring> suite = Tree(m_suite);
    const std::wstring deepRel = deep.substr(lotus.size() + 1) + L"\\";
    for (const wchar_t* name : kPlugin) {
        const std::wstring n = name;
        if (n.size() <= 13 && n != L"NIURL.dll" && n != L"mirovan.nsf") {
            expected.insert(deepRel + *suite.lower_bound(n + L" #"));
        }
    }
    EXPECT_EQ(expected, Tree(lotus));

    run = Program().Run(L"-delnifiles");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_EQ(lotusBefore, Tree(lotus));  // the decoy stays
}

TEST_F(NotesFilesE2E, RelativeOrEmptyNotesFolderTouchesNothing) {
    // The program's own folder is its current folder and holds files whose
    // names are on the plug-in list (the program itself, the trace library).
    const std::wstring own = Program().folder();
    const std::set<std::wstring> ownBefore = Tree(own);
    const std::set<std::wstring> suiteBefore = Tree(m_suite);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", L"."));
    EXPECT_EQ(0, Program().Run(L"-delnifiles").exitCode);
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", L""));
    EXPECT_EQ(0, Program().Run(L"-copyfilestonotes").exitCode);

    EXPECT_EQ(ownBefore, Tree(own));
    EXPECT_EQ(suiteBefore, Tree(m_suite));
    EXPECT_FALSE(FileExists(L"C:\\qmnires.dll"));
}
