#include "tests/support/feedback_receiver.h"

#include <cstring>

double CounterMilliseconds() {
    LARGE_INTEGER now, frequency;
    QueryPerformanceCounter(&now);
    QueryPerformanceFrequency(&frequency);
    return static_cast<double>(now.QuadPart) * 1000.0 / static_cast<double>(frequency.QuadPart);
}

std::wstring CopyData::Text() const {
    std::wstring text(bytes.size() / sizeof(wchar_t), L'\0');
    memcpy(&text[0], bytes.data(), text.size() * sizeof(wchar_t));
    return text.substr(0, text.find(L'\0'));
}

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

std::wstring FeedbackWindow::HandleText() const {
    return std::to_wstring(HandleToLong(m_window));
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
    windowClass.lpszClassName = L"QmTestFeedbackReceiver";
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
        double now = CounterMilliseconds();
        auto* receiver =
            reinterpret_cast<FeedbackWindow*>(GetWindowLongPtrW(window, GWLP_USERDATA));
        const auto* data = reinterpret_cast<const COPYDATASTRUCT*>(lParam);
        CopyData copy;
        copy.dwData = data->dwData;
        copy.cbData = data->cbData;
        copy.bytes.assign(static_cast<const char*>(data->lpData), data->cbData);
        copy.receivedMs = now;
        std::lock_guard<std::mutex> hold(receiver->m_lock);
        receiver->m_received.push_back(copy);
        return TRUE;
    }
    if (message == WM_DESTROY) {
        PostQuitMessage(0);
    }
    return DefWindowProcW(window, message, wParam, lParam);
}

SharedFeedbackMemory::SharedFeedbackMemory(DWORD size, unsigned char fill)
    : m_size(size), m_fill(fill) {
    m_mapping =
        CreateFileMappingW(INVALID_HANDLE_VALUE, nullptr, PAGE_READWRITE, 0, size, L"MRVPPUINFO");
    m_view = static_cast<unsigned char*>(MapViewOfFile(m_mapping, FILE_MAP_ALL_ACCESS, 0, 0, size));
    if (m_view != nullptr) {
        memset(m_view, fill, size);
    }
}

SharedFeedbackMemory::~SharedFeedbackMemory() {
    if (m_view != nullptr) {
        UnmapViewOfFile(m_view);
    }
    if (m_mapping != nullptr) {
        CloseHandle(m_mapping);
    }
}

std::wstring SharedFeedbackMemory::Text() const {
    if (m_view == nullptr) {
        return std::wstring();
    }
    const auto* text = reinterpret_cast<const wchar_t*>(m_view);
    size_t length = 0;
    while ((length + 1) * sizeof(wchar_t) <= m_size && text[length] != L'\0') {
        ++length;
    }
    return std::wstring(text, length);
}

bool SharedFeedbackMemory::FillIntactFrom(size_t offset) const {
    for (size_t i = offset; m_view != nullptr && i < m_size; ++i) {
        if (m_view[i] != m_fill) {
            return false;
        }
    }
    return m_view != nullptr;
}
