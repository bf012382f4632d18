// The Notes plug-in keywords run by the real program against a simulated
// machine: a suite folder whose plug-in files name their origin in their
// content, a Notes folder found through the registry, files held open the
// way a running Notes holds its libraries, and folders at the path limit.
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

// The plug-in's files, in the order the program walks them.
const wchar_t* const kPlugin[] = {
    L"lcppn30.dll",
    L"ndbmrvqm.dll",
    L"qmnires.dll",
    L"NIURL.dll",
    L"qmMRVURL.DLL",
    L"qmnwintc.dll",
    L"qmnwinto.dll",
    L"qmwnictl.dll",
    L"mirovan.nsf",
    L"qmniscpt.xml",
    L"qmniupd.exe",
    L"mirovanni.chm",
    L"qmniadpt.dll",
    L"qmnwcfg.exe",
    L"qmMrvONI.exe",
    L"qmONIUI.dll",
    L"qmOI3Res.dll",
    L"ieqmcodec.dll",
    L"QCLDLL.dll",
    L"QCLDLL64.dll",
    L"QCLProxy.dll",
    L"QCLProxy64.dll",
    L"com.mrv.realtime.meeting_1.0.1.jar",
    L"qmmrvjni.dll",
    L"msvcp120.dll",
    L"msvcr120.dll",
    L"mrvtrace.dll",
    L"mrvtraceX64.dll",
};
// The previous generation's files and the extras of its own folder.
const wchar_t* const kOldPlugin[] = {
    L"ndbmrv.dll",   L"nires.dll",      L"NIURL.dll",    L"MRVOIURL.DLL",  L"nwdbmon.dll",
    L"nwinstc.dll",  L"nwinsto.dll",    L"nwmsgctl.dll", L"nwmtmgr.dll",   L"wnictrl.dll",
    L"mirovan.nsf",  L"mirvscpt.xml",   L"nwsetup.exe",  L"mirovanni.chm", L"nadapter.dll",
    L"nwconfig.exe", L"MirovanONI.exe", L"ONIUI.dll",    L"OI3Res.dll",    L"nwsp2c.dll",
};
const wchar_t* const kOldExtras[] = {
    L"lcppn30.dll", L"ieqmcodec.dll", L"qmcodec.dll", L"QMCODEXT.DLL", L"mirovan_ball_32.ico",
};

const wchar_t kSuiteKey[] = L"SOFTWARE\\Mirovan\\QmkTools";
const wchar_t kNotes6[] = L"SOFTWARE\\Lotus\\Notes\\6.0";
const wchar_t kNotes8[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
const wchar_t kNIKey[] = L"SOFTWARE\\mirovan\\NI";

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

// Every file and folder below `folder` (relative names), with a digest of
// each file's content; the program's own trace logs are left out.
std::set<std::wstring> Tree(const std::wstring& folder, const std::wstring& prefix = L"") {
    std::set<std::wstring> entries;
    for (const std::wstring& name : ListDir(folder)) {
        if (prefix.empty() && (name == L"trace.log" || name == L"calls.log")) {
            continue;
        }
        const std::wstring path = JoinPath(folder, name);
        const std::wstring rel = prefix + name;
        if (DirExists(path)) {
            entries.insert(rel + L"\\");
            std::set<std::wstring> below = Tree(path, rel + L"\\");
            entries.insert(below.begin(), below.end());
        } else {
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
          m_notes(m_scratch.Sub(L"Lotus\\Notes", true)) {}

    void InstallSuite() {
        for (const wchar_t* name : kPlugin) {
            ASSERT_TRUE(WriteFileBytes(JoinPath(m_suite, name), Origin("suite", name)));
        }
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kSuiteKey, L"Path", m_suite));
    }
    void FindNotesAt(const std::wstring& folder) {
        ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8, L"Path", folder));
    }
    void Put(const std::wstring& folder, const wchar_t* name, const std::string& content) {
        ASSERT_TRUE(WriteFileBytes(JoinPath(folder, name), content));
    }

    std::wstring m_suite;
    std::wstring m_notes;
};

}  // namespace

TEST_F(NotesFilesE2E, CopyFilesToNotesReplacesFilesInUseAndLeavesSharedOnes) {
    InstallSuite();
    FindNotesAt(m_notes);
    // A Notes 6 key whose Path is too long for the program's buffers is skipped.
    ASSERT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes6, L"Path",
                             m_notes + L"\\" + std::wstring(300, L'x')));
    Put(m_notes, L"NIURL.dll", "notes:NIURL.dll");
    Put(m_notes, L"notes.ini", "notes:notes.ini");
    Put(m_notes, L"qmnires.dll", "notes:loaded");
    Put(m_notes, L"qmnwintc.dll", "notes:locked");
    HeldOpen loaded(JoinPath(m_notes, L"qmnires.dll"), kLikeALoadedLibrary);
    HeldOpen locked(JoinPath(m_notes, L"qmnwintc.dll"), FILE_SHARE_READ);
    ASSERT_TRUE(loaded.ok() && locked.ok());

    SYSTEMTIME before;
    GetLocalTime(&before);
    RunResult run = Program().Run(L"-copyfilestonotes");
    SYSTEMTIME after;
    GetLocalTime(&after);

    EXPECT_EQ(0, run.exitCode);
    EXPECT_FALSE(run.crashed);
    EXPECT_TRUE(run.HasTraceContaining("Start Copy notesplugin files to notes path!\n"));
    EXPECT_TRUE(run.HasTraceContaining("Copy File from QM Install path to Notes Path."));
    EXPECT_TRUE(run.HasTraceContaining("szNotesPath=" + Narrow(m_notes)));
    EXPECT_TRUE(run.HasTraceContaining("szInstallPath=" + Narrow(m_suite)));
    EXPECT_TRUE(run.HasTraceContaining("End Copy notesplugin files to notes path!\n"));

    for (const wchar_t* name : kPlugin) {
        std::wstring target = JoinPath(m_notes, name);
        std::wstring n = name;
        if (n == L"NIURL.dll") {
            EXPECT_EQ("notes:NIURL.dll", ReadFileBytes(target));
        } else if (n == L"mirovan.nsf") {
            EXPECT_FALSE(FileExists(target));
        } else if (n == L"qmnwintc.dll") {
            EXPECT_EQ("notes:locked", ReadFileBytes(target));  // could not be renamed
        } else {
            EXPECT_EQ(Origin("suite", name), ReadFileBytes(target)) << Narrow(name);
        }
    }

    // The loaded library went aside under its time-stamped name, slated for
    // deletion at restart; nothing else is left over.
    std::wstring early = BackupName(L"qmnires.dll", before);
    std::wstring late = BackupName(L"qmnires.dll", after);
    std::wstring backup = FileExists(JoinPath(m_notes, early)) ? early : late;
    EXPECT_EQ("notes:loaded", ReadFileBytes(JoinPath(m_notes, backup)));
    EXPECT_TRUE(IsPendingDelete(JoinPath(m_notes, backup)));
    EXPECT_FALSE(IsPendingDelete(JoinPath(m_notes, L"qmnwintc.dll")));
    std::vector<std::wstring> names = ListDir(m_notes);
    EXPECT_EQ(26u + 1 + 1 + 1, names.size());  // copied, NIURL.dll, notes.ini, backup
    EXPECT_TRUE(std::find(names.begin(), names.end(), backup) != names.end());
}

TEST_F(NotesFilesE2E, DelNIFilesRemovesThePluginButNotTheSharedLibrary) {
    InstallSuite();
    FindNotesAt(m_notes);
    for (const wchar_t* name : kPlugin) {
        Put(m_notes, name, Origin("notes", name));
    }
    Put(m_notes, L"notes.ini", "notes:notes.ini");
    Put(m_suite, L"upd_temp\\a_upd_temp", "x");
    Put(m_suite, L"upd_temp\\components\\c_upd_temp", "x");
    Put(m_suite, L"qmniupd.exe_upd_temp.exe", "x");

    RunResult run = Program().Run(L"-delnifiles");

    EXPECT_EQ(0, run.exitCode);
    EXPECT_TRUE(run.HasTraceContaining("Start Delete notes plugin Files for QM Uninstall!\n"));
    EXPECT_TRUE(run.HasTraceContaining("End Delete notes plugin Files for QM Uninstall!\n"));
    EXPECT_EQ((std::vector<std::wstring>{L"NIURL.dll", L"notes.ini"}), ListDir(m_notes));
    EXPECT_EQ("notes:NIURL.dll", ReadFileBytes(JoinPath(m_notes, L"NIURL.dll")));
    // The update leftovers of the suite folder went too; its own files stay.
    EXPECT_FALSE(DirExists(JoinPath(m_suite, L"upd_temp")));
    EXPECT_FALSE(FileExists(JoinPath(m_suite, L"qmniupd.exe_upd_temp.exe")));
    EXPECT_EQ(28u, ListDir(m_suite).size());
}

TEST_F(NotesFilesE2E, DelOldNIFilesClearsTheOldGenerationEverywhere) {
    // The old plug-in was installed for the user only, in "<folder>\Notes".
    const std::wstring oldRoot = m_scratch.Sub(L"Old Plugin", true);
    const std::wstring oldFolder = JoinPath(oldRoot, L"Notes");
    ASSERT_TRUE(RegPutString(HKEY_CURRENT_USER, kNIKey, L"Path", oldRoot));
    for (const wchar_t* name : kOldPlugin) {
        Put(oldFolder, name, "old");
    }
    for (const wchar_t* name : kOldExtras) {
        Put(oldFolder, name, "old");
    }
    FindNotesAt(m_notes);
    for (const wchar_t* name : kOldPlugin) {
        Put(m_notes, name, "old");
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
    InstallSuite();
    // A Notes folder of 245 characters: names up to 13 characters fit
    // (245 + 1 + 13 = 259), longer ones cannot be placed there.
    std::wstring deep = m_notes;
    while (deep.size() < 245) {
        deep = JoinPath(deep, std::wstring(std::min<size_t>(40, 245 - deep.size() - 1), L'd'));
    }
    ASSERT_EQ(245u, deep.size());
    ASSERT_TRUE(MakeDirs(deep));
    FindNotesAt(deep);
    // What "com.mrv.realtime.meeting_1.0.1.jar" would become if cut at 259.
    const std::wstring cut = L"com.mrv.realt";
    Put(deep, cut.c_str(), "decoy");
    const std::wstring lotus = m_scratch.Sub(L"Lotus");
    const std::wstring deepRel = deep.substr(lotus.size() + 1) + L"\\";
    const std::set<std::wstring> lotusBefore = Tree(lotus);

    RunResult run = Program().Run(L"-copyfilestonotes");
    EXPECT_EQ(0, run.exitCode);
    std::set<std::wstring> expected = {cut};
    for (const wchar_t* name : kPlugin) {
        std::wstring n = name;
        if (n.size() <= 13 && n != L"NIURL.dll" && n != L"mirovan.nsf") {
            expected.insert(n);
            EXPECT_EQ(Origin("suite", name), ReadFileBytes(JoinPath(deep, name)));
        }
    }
    std::vector<std::wstring> names = ListDir(deep);
    EXPECT_EQ(expected, std::set<std::wstring>(names.begin(), names.end()));
    EXPECT_EQ("decoy", ReadFileBytes(JoinPath(deep, cut)));
    // Nothing was written anywhere else under the Notes tree.
    std::set<std::wstring> lotusAfter;
    for (const std::wstring& entry : Tree(lotus)) {
        bool inside =
            entry.size() > deepRel.size() && entry.compare(0, deepRel.size(), deepRel) == 0;
        if (!inside || entry.compare(deepRel.size(), cut.size(), cut) == 0) {
            lotusAfter.insert(entry);
        }
    }
    EXPECT_EQ(lotusBefore, lotusAfter);

    run = Program().Run(L"-delnifiles");
    EXPECT_EQ(0, run.exitCode);
    EXPECT_EQ(std::vector<std::wstring>{cut}, ListDir(deep));
    EXPECT_EQ("decoy", ReadFileBytes(JoinPath(deep, cut)));
}

TEST_F(NotesFilesE2E, MissingOrRelativeNotesFolderTouchesNothing) {
    InstallSuite();
    // The program's own folder is its current folder and holds files whose
    // names are on the plug-in list (the program itself, the trace library).
    const std::wstring own = Program().folder();
    const std::set<std::wstring> ownBefore = Tree(own);
    const std::set<std::wstring> suiteBefore = Tree(m_suite);

    RunResult run = Program().Run(L"-delnifiles");  // no Notes at all
    EXPECT_EQ(0, run.exitCode);
    FindNotesAt(L".");
    run = Program().Run(L"-delnifiles");
    EXPECT_EQ(0, run.exitCode);
    run = Program().Run(L"-copyfilestonotes");
    EXPECT_EQ(0, run.exitCode);

    EXPECT_EQ(ownBefore, Tree(own));
    EXPECT_EQ(suiteBefore, Tree(m_suite));
    EXPECT_FALSE(FileExists(L"C:\\qmnires.dll"));
}
