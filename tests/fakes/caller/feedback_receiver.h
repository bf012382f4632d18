// Stand-in for the suite program that starts an upload page and receives its
// feedback: a window that records the WM_COPYDATA messages it is sent (on a
// thread of its own, so a sender is answered while the host waits for the
// program), and the shared memory "MRVPPUINFO" of a chosen size.
#pragma once

#include <windows.h>

#include <mutex>
#include <string>
#include <vector>

struct CopyData {
    ULONG_PTR dwData = 0;
    DWORD cbData = 0;
    std::wstring text;      // the data as UTF-16, up to its first terminator
    double receivedMs = 0;  // fake::CounterMilliseconds
};

class FeedbackWindow {
public:
    FeedbackWindow();
    ~FeedbackWindow();
    FeedbackWindow(const FeedbackWindow&) = delete;
    FeedbackWindow& operator=(const FeedbackWindow&) = delete;

    // The handle as a command's hWnd element gives it.
    std::wstring HandleText() const { return std::to_wstring(HandleToLong(m_window)); }
    std::vector<CopyData> Received() const;

private:
    static DWORD WINAPI Thread(void* self);
    static LRESULT CALLBACK Proc(HWND window, UINT message, WPARAM wParam, LPARAM lParam);

    HANDLE m_thread = nullptr;
    HANDLE m_ready = nullptr;
    HWND m_window = nullptr;
    mutable std::mutex m_lock;
    std::vector<CopyData> m_received;
};

// "MRVPPUINFO" of `size` bytes, each 0xA5 to begin with.
class SharedFeedbackMemory {
public:
    explicit SharedFeedbackMemory(DWORD size);
    ~SharedFeedbackMemory();
    SharedFeedbackMemory(const SharedFeedbackMemory&) = delete;
    SharedFeedbackMemory& operator=(const SharedFeedbackMemory&) = delete;

    // The UTF-16 text at the start, up to its terminator.
    std::wstring Text() const;
    // The bytes from offset to the end still hold 0xA5.
    bool UntouchedFrom(size_t offset) const;

private:
    HANDLE m_mapping = nullptr;
    unsigned char* m_view = nullptr;
    DWORD m_size;
};
