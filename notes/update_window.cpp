// The hidden window of the temporary update copy and its side of the protocol
// with the updater: start the updater, run the configuration tool when the
// download is finished, then commit or roll back and end the message loop.
#include <shlwapi.h>

#include <cwchar>
#include <utility>

#include "base/registry.h"
#include "base/trace.h"
#include "notes/plugin_paths.h"
#include "notes/product_locations.h"
#include "notes/self_update.h"
#include "notes/update_file_names.h"
#include "notes/update_process_start.h"
#include "notes/update_state.h"

namespace {

const wchar_t kWindowClass[] = L"Mirovan MirovanONI Window Class";
const wchar_t kWindowTitle[] = L"MirovanONI Hide Window";

// Messages of the protocol.
const UINT kDownloadFinished = WM_USER + 101;  // from the updater, wParam its window
const UINT kEndWithSuccess = WM_USER + 102;
const UINT kEndWithFailure = WM_USER + 103;
const UINT WM_DOWN_ROLLBACK = WM_USER + 104;  // posted to the updater
const UINT WM_DOWN_COMMIT = WM_USER + 105;    // sent to the updater

// Watches the updater until it reports its download.
const UINT_PTR kWatchTimer = 1028;
const UINT kWatchPeriodMs = 500;

const wchar_t kSiteKey[] = L"Software\\Mirovan_Notes\\General";
const DWORD kSiteNameChars = 512 / sizeof(wchar_t);
const size_t kUpdaterParameterChars = 512;

void EndUpdateLoop(int code) {
    UpdateState& state = CurrentUpdateState();
    if (!state.quitPosted) {
        state.quitPosted = true;
        PostQuitMessage(code);
    }
}

bool FindModuleFolder(wchar_t (&folder)[MAX_PATH]) {
    DWORD chars = GetModuleFileNameW(nullptr, folder, MAX_PATH);
    if (chars == 0 || chars >= MAX_PATH) {
        folder[0] = L'\0';
        return false;
    }
    PathRemoveFileSpecW(folder);
    return IsUsableFolder(folder);
}

// WM_CREATE: starts the updater; -1 (no window) when it cannot be started.
LRESULT StartUpdater(HWND window) {
    UpdateState& state = CurrentUpdateState();
    wchar_t updater[MAX_PATH] = {};
    bool known = FindModuleFolder(state.moduleFolder) &&
                 JoinFilePath(state.moduleFolder, kTemporaryUpdaterFileName, updater);
    TraceLevel1(TraceValue("\nLaunching download process."), TraceNamed("szExeName", updater));

    wchar_t siteName[kSiteNameChars] = {};
    GetRegString(HKEY_CURRENT_USER, kSiteKey, L"sitename", siteName, kSiteNameChars, 0);
    wchar_t parameters[kUpdaterParameterChars] = {};
    _snwprintf(parameters, kUpdaterParameterChars - 1, L"-downstart -hParentWnd=%d -sitename=%ls",
               static_cast<int>(reinterpret_cast<INT_PTR>(window)), siteName);

    // The updater works in the Notes folder; without one there is nothing
    // to update and no installed program to finish with.
    known = known && GetNotesPath(state.notesFolder, MAX_PATH) && IsUsableFolder(state.notesFolder);
    if (!known ||
        !StartUpdateProcess(updater, parameters, state.notesFolder, SW_HIDE, &state.download)) {
        TraceLevel8(TraceValue("\nLaunching download process failed.\n"));
        return -1;
    }
    SetTimer(window, kWatchTimer, kWatchPeriodMs, nullptr);
    return 0;
}

// Runs the configuration tool and waits for it; true when it ended with 0.
// Posts the failing end itself when the tool cannot be started.
bool RunConfigTool(bool* started) {
    UpdateState& state = CurrentUpdateState();
    wchar_t config[MAX_PATH] = {};
    bool known = JoinFilePath(state.moduleFolder, kConfigToolFileName, config);
    TraceLevel1(TraceValue("Launching config process at Notes directory."),
                TraceNamed("szNotesPath", state.notesFolder), TraceNamed("szExeName", config));
    UniqueHandle process;
    *started =
        known && StartUpdateProcess(config, L"-update", state.notesFolder, SW_SHOW, &process);
    if (!*started) {
        TraceLevel8(TraceValue("Launching config process failed."));
        return false;
    }
    DWORD exitCode = 1;
    bool succeeded = process && WaitForSingleObject(process.get(), INFINITE) == WAIT_OBJECT_0 &&
                     GetExitCodeProcess(process.get(), &exitCode) && exitCode == 0;
    if (succeeded) {
        state.config = std::move(process);
    }
    return succeeded;
}

// The updater's window, when wParam still names one.
HWND UpdaterWindow(WPARAM wParam) {
    HWND window = reinterpret_cast<HWND>(wParam);
    return (window != nullptr && IsWindow(window)) ? window : nullptr;
}

// Message 1125: the download is finished. A second report, or one after the
// loop's end was decided, changes nothing.
void OnDownloadFinished(HWND window, WPARAM updaterWindow) {
    UpdateState& state = CurrentUpdateState();
    if (state.downloadFinished || state.quitPosted) {
        TraceLevel4(TraceValue("\nDownload process reported success again, ignored.\n"));
        return;
    }
    TraceLevel1(TraceValue("\nDownload process exit with success.\n"));
    state.downloadFinished = true;
    KillTimer(window, kWatchTimer);

    bool started = false;
    if (RunConfigTool(&started)) {
        TraceLevel1(TraceValue(
            "Config process exit with success, send out WM_DOWN_COMMIT to qmniupd.exe."));
        if (HWND updater = UpdaterWindow(updaterWindow)) {
            SendMessageW(updater, WM_DOWN_COMMIT, 0, 0);
        }
        g_bUpdateSuccess = 1;
        TraceLevel1(TraceValue("Set g_bUpdateSuccess\n"));
        EndUpdateLoop(0);
        return;
    }
    if (started) {
        TraceLevel8(
            TraceValue("qmniupd.exe exit with error, send out WM_DOWN_ROLLBACK to qmniupd.exe."));
    }
    // A tool that could not be started configured nothing either: the
    // updater undoes its download rather than waiting to be terminated.
    if (HWND updater = UpdaterWindow(updaterWindow)) {
        PostMessageW(updater, WM_DOWN_ROLLBACK, 0, 0);
    }
    g_bUpdateSuccess = 0;
    EndUpdateLoop(-1);
}

// Timer 1028: an updater that ends before reporting its download failed.
void OnWatchTimer(HWND window) {
    UpdateState& state = CurrentUpdateState();
    if (!state.download || WaitForSingleObject(state.download.get(), 0) != WAIT_OBJECT_0) {
        return;
    }
    state.download.reset();
    if (state.downloadFinished) {
        KillTimer(window, kWatchTimer);
    } else {
        EndUpdateLoop(-1);
    }
}

LRESULT CALLBACK UpdateWindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    switch (message) {
        case WM_CREATE:
            if (GetUpdateModeFlag() == 1 && StartUpdater(window) != 0) {
                return -1;
            }
            break;
        case kDownloadFinished:
            OnDownloadFinished(window, wParam);
            return 0;
        case kEndWithSuccess:
            EndUpdateLoop(0);
            return 0;
        case kEndWithFailure:
            EndUpdateLoop(-1);
            return 0;
        case WM_TIMER:
            if (wParam == kWatchTimer) {
                OnWatchTimer(window);
                return 0;
            }
            break;
        default:
            break;
    }
    return DefWindowProcW(window, message, wParam, lParam);
}

}  // namespace

// The window is never shown, so the show command plays no part.
HWND CreateUpdateWindow(HINSTANCE instance, int /*showCommand*/) {
    WNDCLASSW windowClass = {};
    windowClass.lpfnWndProc = UpdateWindowProc;
    windowClass.hInstance = instance;
    windowClass.lpszClassName = kWindowClass;
    RegisterClassW(&windowClass);
    return CreateWindowW(kWindowClass, kWindowTitle, WS_OVERLAPPEDWINDOW, CW_USEDEFAULT, 0,
                         CW_USEDEFAULT, 0, nullptr, nullptr, instance, nullptr);
}
