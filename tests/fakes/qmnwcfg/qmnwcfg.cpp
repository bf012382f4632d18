// Stand-in for the Notes plug-in's configuration tool "qmnwcfg.exe", and for
// any program whose start a test wants to see (copied under its name): records
// its start, waits QM_FAKE_CONFIG_DELAY_MS milliseconds and exits with
// QM_FAKE_CONFIG_EXIT (0 when unset).
#include <windows.h>

#include <cstdlib>

#include "tests/fakes/common/fake_program.h"

int WINAPI wWinMain(HINSTANCE, HINSTANCE, PWSTR, int) {
    fake::RecordStart();
    Sleep(static_cast<DWORD>(_wtoi(fake::EnvironmentValue(L"QM_FAKE_CONFIG_DELAY_MS").c_str())));
    return _wtoi(fake::EnvironmentValue(L"QM_FAKE_CONFIG_EXIT").c_str());
}
