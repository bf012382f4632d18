#include "tests/fakes/caller/feedback_receiver.h"

#include "tests/fakes/common/fake_recorder.h"

namespace {

const unsigned char kFill = 0xA5;

std::wstring TextUpToTerminator(const void* data, size_t bytes) {
    std::wstring text(static_cast<const wchar_t*>(data), bytes / sizeof(wchar_t));
    return text.substr(0, text.find(L'\0'));
}

}  // namespace

FeedbackWindow::FeedbackWindow() {
    m_ready = CreateEventW(nullptr, TRUE, FALSE, nullptr);
    m_thread = CreateThread(nullptr, 0, Thread, this, 0, nullptr);
    WaitForSingleObject(m_ready, 10000);
}

FeedbackWindow::~FeedbackWindow() {
    PostMessageW(m_window, WM_CLOSE, 0, 0);
    WaitForSingleObject(m_thread, 10000);
    CloseHandle(m_thread);
    CloseHandle(m_ready);
}

std::vector<CopyData> FeedbackWindow::Received() const {
    std::lock_guard<std::mutex> hold(m_lock);
    return m_received;
}

DWORD WINAPI FeedbackWindow::Thread(void* self) {
    auto* receiver = static_cast<FeedbackWindow*>(self);
    WNDCLASSW windowClass = {};
    windowClass.lpfnWndProc = Proc;
    windowClass.hInstance = GetModuleHandleW(nullptr);
    windowClass.lpszClassName = L"QmFakeFeedbackReceiver";
    RegisterClassW(&windowClass);
    receiver->m_window = CreateWindowW(windowClass.lpszClassName, L"", WS_OVERLAPPED, 0, 0, 10, 10,
                                       nullptr, nullptr, windowClass.hInstance, nullptr);
    SetWindowLongPtrW(receiver->m_window, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(receiver));
    SetEvent(receiver->m_ready);
    MSG message;
    while (GetMessageW(&message, nullptr, 0, 0) > 0) {
        DispatchMessageW(&message);
    }
    return 0;
}

LRESULT CALLBACK FeedbackWindow::Proc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_COPYDATA) {
        const auto* data = reinterpret_cast<const COPYDATASTRUCT*>(lParam);
        CopyData copy{data->dwData, data->cbData, TextUpToTerminator(data->lpData, data->cbData),
                      fake::CounterMilliseconds()};
        auto* receiver =
            reinterpret_cast<FeedbackWindow*>(GetWindowLongPtrW(window, GWLP_USERDATA));
        std::lock_guard<std::mutex> hold(receiver->m_lock);
        receiver->m_received.push_back(copy);
        return TRUE;
    }
    if (message == WM_DESTROY) {
        PostQuitMessage(0);
    }
    return DefWindowProcW(window, message, wParam, lParam);
}

SharedFeedbackMemory::SharedFeedbackMemory(DWORD size) : m_size(size) {
    m_mapping =
        CreateFileMappingW(INVALID_HANDLE_VALUE, nullptr, PAGE_READWRITE, 0, size, L"MRVPPUINFO");
    m_view = static_cast<unsigned char*>(MapViewOfFile(m_mapping, FILE_MAP_ALL_ACCESS, 0, 0, size));
    if (m_view != nullptr) {
        memset(m_view, kFill, size);
    }
}

SharedFeedbackMemory::~SharedFeedbackMemory() {
    UnmapViewOfFile(m_view);
    CloseHandle(m_mapping);
}

std::wstring SharedFeedbackMemory::Text() const {
    return m_view ? TextUpToTerminator(m_view, m_size) : std::wstring();
}

bool SharedFeedbackMemory::UntouchedFrom(size_t offset) const {
    for (size_t i = offset; m_view != nullptr && i < m_size; ++i) {
        if (m_view[i] != kFill) {
            return false;
        }
    }
    return m_view != nullptr;
}
