// The temporary update copy's final step, after its message loop: let the two
// programs it ran end (or end them), then hand over to the installed program.
#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "notes/self_update.h"
#include "notes/update_file_names.h"
#include "notes/update_process_start.h"
#include "notes/update_state.h"

namespace {

const DWORD kChildGraceMs = 30000;

void AwaitOrTerminate(UniqueHandle& process) {
    if (!process) {
        return;
    }
    if (WaitForSingleObject(process.get(), kChildGraceMs) != WAIT_OBJECT_0) {
        TerminateProcess(process.get(), static_cast<UINT>(-1));
    }
    process.reset();
}

}  // namespace

void FinishUpdate() {
    UpdateState& state = CurrentUpdateState();
    AwaitOrTerminate(state.config);
    AwaitOrTerminate(state.download);

    wchar_t program[MAX_PATH] = {};
    const wchar_t* parameters = g_bUpdateSuccess == 1 ? L"-nendupdate" : L"-nendupdatefail";
    UniqueHandle process;
    if (!JoinFilePath(state.notesFolder, kInstalledProgramFileName, program) ||
        !StartUpdateProcess(program, parameters, nullptr, SW_HIDE, &process)) {
        TraceLevel8(TraceValue("\nLaunching qmMrvONI.exe process failed.\n"));
    }
}
