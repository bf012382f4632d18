#include "base/com_error_text.h"

#include <cwchar>

#include "base/win_handles.h"

std::wstring ComErrorMessageText(HRESULT hr) {
    wchar_t* buffer = nullptr;
    DWORD length = FormatMessageW(
        FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS,
        nullptr, static_cast<DWORD>(hr), MAKELANGID(LANG_NEUTRAL, SUBLANG_DEFAULT),
        reinterpret_cast<wchar_t*>(&buffer), 0, nullptr);
    UniqueLocalMem owner(buffer);
    if (length > 0 && buffer != nullptr) {
        std::wstring text(buffer, length);
        if (text.size() > 1 && text.back() == L'\n') {
            text.pop_back();
            if (text.back() == L'\r') {
                text.pop_back();
            }
        }
        return text;
    }
    wchar_t text[64];
    const DWORD code = static_cast<DWORD>(hr);
    if (code >= 0x80040200u && code <= 0x8004FFFFu) {
        swprintf(text, 64, L"IDispatch error #%d", static_cast<int>(code - 0x80040200u));
    } else {
        swprintf(text, 64, L"Unknown error 0x%0lX", static_cast<unsigned long>(code));
    }
    return text;
}
