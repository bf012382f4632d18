// A simulated machine for the Notes plug-in's self-update: a Notes folder and
// the plug-in folder found through the registry, the stand-in updater and
// configuration tool, and the way to see the programs the update starts.
#pragma once

#include <windows.h>
#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <vector>

#include "tests/support/file_util.h"
#include "tests/support/machine_fixture.h"
#include "tests/support/process_wait.h"
#include "tests/support/registry_util.h"
#include "tests/support/test_paths.h"

namespace self_update_test {

const wchar_t kNotes8Key[] = L"SOFTWARE\\Lotus\\Notes\\8.0";
const wchar_t kNIKey[] = L"SOFTWARE\\mirovan\\NI";
const wchar_t kSiteKey[] = L"Software\\Mirovan_Notes\\General";

inline std::vector<std::string> Lines(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        lines.push_back(line);
    }
    return lines;
}

inline int CountStartingWith(const std::vector<std::string>& lines, const std::string& start) {
    int count = 0;
    for (const std::string& line : lines) {
        count += line.compare(0, start.size(), start) == 0 ? 1 : 0;
    }
    return count;
}

class SelfUpdateMachine : public MachineTest {
protected:
    SelfUpdateMachine()
        : m_notes(m_scratch.Sub(L"Lotus\\Notes", true)),
          m_plugin(m_scratch.Sub(L"NI\\Notes", true)) {
        EXPECT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNotes8Key, L"Path", m_notes));
        EXPECT_TRUE(RegPutString(HKEY_LOCAL_MACHINE, kNIKey, L"Path", m_scratch.Sub(L"NI")));
        PutFake(L"qmnwcfg.exe", m_plugin, L"qmnwcfg.exe");
    }

    static void PutFake(const wchar_t* fake, const std::wstring& folder, const wchar_t* name) {
        ASSERT_TRUE(CopyFileW(FakePath(fake).c_str(), JoinPath(folder, name).c_str(), FALSE));
    }

    // The scripts of the stand-ins for every later run of `program`.
    static void Script(ProgramUnderTest& program, const wchar_t* updater, int configExit,
                       int configDelayMs = 0) {
        program.SetEnv(L"QM_FAKE_UPDATER", updater);
        program.SetEnv(L"QM_FAKE_CONFIG_EXIT", std::to_wstring(configExit));
        program.SetEnv(L"QM_FAKE_CONFIG_DELAY_MS", std::to_wstring(configDelayMs));
    }

    // The temporary copy in the plug-in folder, beside the stand-in updater
    // under its temporary name; the installed program in the Notes folder is
    // a stand-in that records how it is started.
    ProgramUnderTest& TemporaryCopy() {
        if (!m_copy) {
            ProgramOptions options;
            options.exeName = L"~MRVONI.EXE";  // the name is compared in any case
            m_copy = std::make_unique<ProgramUnderTest>(m_plugin, options);
            PutFake(L"qmniupd.exe", m_plugin, L"~TmpDown.exe");
            PutFake(L"qmnwcfg.exe", m_notes, L"qmMrvONI.exe");
        }
        return *m_copy;
    }

    // Runs the temporary copy with "-nupdate" and waits for the installed
    // program it starts last.
    RunResult RunTemporaryCopy(DWORD timeoutMs = 20000) {
        RunResult run = TemporaryCopy().Run(L"-nupdate", timeoutMs);
        EXPECT_TRUE(AwaitProcessesNamed(L"qmMrvONI.exe", 60000));
        return run;
    }

    std::vector<std::string> Calls(ProgramUnderTest& program) {
        return Lines(ReadFileBytes(program.callsLogPath()));
    }

    std::wstring m_notes;
    std::wstring m_plugin;
    std::unique_ptr<ProgramUnderTest> m_copy;
};

}  // namespace self_update_test
