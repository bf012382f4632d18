// The two ways a suite program receives the feedback of an upload page: a
// window that records the WM_COPYDATA messages it is sent (it runs on a
// thread of its own, so a sender is answered while the test waits for the
// program), and the shared memory "MRVPPUINFO" of a chosen size.
#pragma once

#include <windows.h>

#include <mutex>
#include <string>
#include <vector>

struct CopyData {
    ULONG_PTR dwData = 0;
    DWORD cbData = 0;
    std::string bytes;
    double receivedMs = 0;  // on the machine-wide performance counter

    // The bytes as UTF-16 text, up to the first terminator.
    std::wstring Text() const;
};

class FeedbackWindow {
public:
    FeedbackWindow();
    ~FeedbackWindow();
    FeedbackWindow(const FeedbackWindow&) = delete;
    FeedbackWindow& operator=(const FeedbackWindow&) = delete;

    HWND window() const { return m_window; }
    // The handle as a command's hWnd element gives it.
    std::wstring HandleText() const;
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

// "MRVPPUINFO" of `size` bytes, every byte `fill` to begin with.
class SharedFeedbackMemory {
public:
    explicit SharedFeedbackMemory(DWORD size, unsigned char fill = 0xA5);
    ~SharedFeedbackMemory();
    SharedFeedbackMemory(const SharedFeedbackMemory&) = delete;
    SharedFeedbackMemory& operator=(const SharedFeedbackMemory&) = delete;

    // The UTF-16 text at the start, up to its terminator.
    std::wstring Text() const;
    // Bytes from offset to the end that still hold the fill.
    bool FillIntactFrom(size_t offset) const;

private:
    HANDLE m_mapping = nullptr;
    unsigned char* m_view = nullptr;
    DWORD m_size;
    unsigned char m_fill;
};

// Milliseconds on the machine-wide performance counter.
double CounterMilliseconds();
