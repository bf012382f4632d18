// Base fixture of tests that arrange a simulated machine: products found
// through fixed registry keys (suite, Notes, Sametime...) and per-user folders.
// Every test starts and ends without any of them, and the machine-wide "Path"
// and the pending delete-at-restart list are put back as they were.
#pragma once

#include <windows.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "tests/support/program_run.h"
#include "tests/support/registry_util.h"
#include "tests/support/scratch_dir.h"

extern const wchar_t kEnvironmentKey[];     // Session Manager\Environment
extern const wchar_t kSessionManagerKey[];  // holds PendingFileRenameOperations
// Uninstall entries that tests create are named with this prefix.
extern const wchar_t kTestUninstallPrefix[];

// Removes every key, value and per-user folder the simulated products use.
void ClearProductState();
// The user's roaming application-data folder of this prefix.
std::wstring RoamingAppData();
// The all-users application-data folder of this prefix.
std::wstring CommonAppData();

class MachineTest : public ::testing::Test {
protected:
    MachineTest();
    ~MachineTest() override;

    // The program in its own folder under the scratch folder.
    ProgramUnderTest& Program();

    ScratchDir m_scratch;

private:
    RegValueGuard m_pathGuard;
    RegValueGuard m_pendingGuard;
    std::unique_ptr<ProgramUnderTest> m_program;
};
