// Text helpers of the stand-ins: what they record is UTF-8.
#pragma once

#include <windows.h>

#include <string>

namespace fake {

// UTF-8 of a wide text; "(null)" for a null pointer.
inline std::string Utf8(const wchar_t* text) {
    if (text == nullptr) {
        return "(null)";
    }
    int size = WideCharToMultiByte(CP_UTF8, 0, text, -1, nullptr, 0, nullptr, nullptr);
    std::string out(size > 1 ? size - 1 : 0, '\0');
    if (size > 1) {
        WideCharToMultiByte(CP_UTF8, 0, text, -1, &out[0], size, nullptr, nullptr);
    }
    return out;
}

}  // namespace fake
