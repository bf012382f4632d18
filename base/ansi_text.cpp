#include "base/ansi_text.h"

#include <windows.h>

#include <new>

std::string WideToAnsi(const wchar_t* text) {
    if (text == nullptr || text[0] == L'\0') {
        return std::string();
    }
    int needed = WideCharToMultiByte(CP_ACP, 0, text, -1, nullptr, 0, nullptr, nullptr);
    if (needed <= 1) {
        return std::string();
    }
    std::string result(static_cast<size_t>(needed), '\0');
    WideCharToMultiByte(CP_ACP, 0, text, -1, &result[0], needed, nullptr, nullptr);
    result.resize(static_cast<size_t>(needed) - 1);
    return result;
}

char* AnsiStringList::Add(std::unique_ptr<char[]> text) {
    char* raw = text.get();
    m_entries.push_back(std::move(text));
    return raw;
}

char* AnsiCopyToList(const wchar_t* text, AnsiStringList& list) {
    if (text == nullptr) {
        return nullptr;
    }
    int needed = WideCharToMultiByte(CP_ACP, 0, text, -1, nullptr, 0, nullptr, nullptr);
    if (needed <= 0) {
        return nullptr;
    }
    std::unique_ptr<char[]> buffer(new (std::nothrow) char[static_cast<size_t>(needed) + 2]());
    if (!buffer ||
        WideCharToMultiByte(CP_ACP, 0, text, -1, buffer.get(), needed, nullptr, nullptr) == 0) {
        return nullptr;
    }
    return list.Add(std::move(buffer));
}
