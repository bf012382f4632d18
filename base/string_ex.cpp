#include "base/string_ex.h"

#include <cstdarg>
#include <cstdio>
#include <cwchar>
#include <cwctype>
#include <new>

namespace {

int SafeLength(const wchar_t* text) {
    if (text == nullptr) {
        return 0;
    }
    size_t len = wcslen(text);
    return len > 0x7FFFFFFF ? 0 : static_cast<int>(len);
}

wchar_t* AllocateText(int length) {
    wchar_t* buffer = new (std::nothrow) wchar_t[static_cast<size_t>(length) + 1];
    if (buffer) {
        buffer[length] = L'\0';
    }
    return buffer;
}

wchar_t FoldAscii(wchar_t ch) {
    return (ch >= L'A' && ch <= L'Z') ? static_cast<wchar_t>(ch + (L'a' - L'A')) : ch;
}

// The order when either text is empty or null: an empty string equals a
// null or empty text and precedes any other; a text follows null. False when
// both texts have characters to compare.
bool CompareWithEmpty(const wchar_t* self, const wchar_t* other, int* order) {
    bool selfEmpty = self == nullptr || self[0] == L'\0';
    bool otherEmpty = other == nullptr || other[0] == L'\0';
    if (selfEmpty) {
        *order = otherEmpty ? 0 : -1;
        return true;
    }
    if (other == nullptr) {
        *order = 1;
        return true;
    }
    return false;
}

int Sign(int value) {
    return value < 0 ? -1 : (value > 0 ? 1 : 0);
}

}  // namespace

CStringEx::CStringEx(const wchar_t* text) {
    Assign(text, SafeLength(text));
}

CStringEx::CStringEx(const wchar_t* text, int length) {
    Assign(text, text ? length : 0);
}

CStringEx::CStringEx(const CStringEx& other) {
    Assign(other.m_buffer, other.GetLength());
}

CStringEx::CStringEx(CStringEx&& other) noexcept : m_buffer(other.m_buffer) {
    other.m_buffer = nullptr;
    other.m_locked = 0;
}

CStringEx::~CStringEx() {
    delete[] m_buffer;
}

CStringEx& CStringEx::operator=(const CStringEx& other) {
    if (this != &other) {
        Assign(other.m_buffer, other.GetLength());
    }
    return *this;
}

CStringEx& CStringEx::operator=(CStringEx&& other) noexcept {
    if (this != &other) {
        delete[] m_buffer;
        m_buffer = other.m_buffer;
        m_locked = 0;
        other.m_buffer = nullptr;
        other.m_locked = 0;
    }
    return *this;
}

CStringEx& CStringEx::operator=(const wchar_t* text) {
    Assign(text, SafeLength(text));
    return *this;
}

CStringEx& CStringEx::operator+=(const CStringEx& other) {
    return *this += other.m_buffer;
}

CStringEx& CStringEx::operator+=(const wchar_t* text) {
    int addLength = SafeLength(text);
    if (addLength == 0) {
        return *this;
    }
    int length = GetLength();
    wchar_t* joined = AllocateText(length + addLength);
    if (joined == nullptr) {
        return *this;
    }
    if (length > 0) {
        wmemcpy(joined, m_buffer, length);
    }
    wmemcpy(joined + length, text, addLength);
    Adopt(joined);
    return *this;
}

CStringEx& CStringEx::operator+=(wchar_t ch) {
    wchar_t text[2] = {ch, L'\0'};
    if (ch == L'\0') {
        return *this;
    }
    return *this += text;
}

const wchar_t* CStringEx::GetConstBuffer() {
    if (m_buffer == nullptr) {
        m_buffer = AllocateText(0);
        if (m_buffer == nullptr) {
            return L"";
        }
    }
    return m_buffer;
}

int CStringEx::GetLength() const noexcept {
    return SafeLength(m_buffer);
}

void CStringEx::Empty() noexcept {
    delete[] m_buffer;
    m_buffer = nullptr;
    m_locked = 0;
}

wchar_t CStringEx::GetAt(int index) const noexcept {
    if (index < 0 || index >= GetLength()) {
        return L'\0';
    }
    return m_buffer[index];
}

wchar_t* CStringEx::GetBuffer(int minLength) {
    if (m_locked) {
        return nullptr;
    }
    int length = GetLength();
    // Room for minLength characters and the terminator. An empty string is
    // given a buffer only when at least two characters are asked for.
    bool enlarge = length > 0 ? minLength > length : minLength > 1;
    if (enlarge) {
        wchar_t* larger = new (std::nothrow) wchar_t[static_cast<size_t>(minLength) + 1]();
        if (larger == nullptr) {
            return nullptr;
        }
        if (length > 0) {
            wmemcpy(larger, m_buffer, length);
        }
        delete[] m_buffer;
        m_buffer = larger;
    }
    if (m_buffer == nullptr) {
        return nullptr;
    }
    m_locked = 1;
    return m_buffer;
}

void CStringEx::ReleaseBuffer(int /*ignored*/) noexcept {
    m_locked = !m_locked;
}

int CStringEx::Compare(const wchar_t* other) const noexcept {
    int emptyOrder;
    if (CompareWithEmpty(m_buffer, other, &emptyOrder)) {
        return emptyOrder;
    }
    return Sign(wcscmp(m_buffer, other));
}

int CStringEx::CompareNoCase(const wchar_t* other) const noexcept {
    int emptyOrder;
    if (CompareWithEmpty(m_buffer, other, &emptyOrder)) {
        return emptyOrder;
    }
    const wchar_t* a = m_buffer;
    const wchar_t* b = other;
    for (;; ++a, ++b) {
        wchar_t ca = FoldAscii(*a);
        wchar_t cb = FoldAscii(*b);
        if (ca != cb) {
            return ca < cb ? -1 : 1;
        }
        if (ca == L'\0') {
            return 0;
        }
    }
}

int CStringEx::Find(wchar_t ch, int start) const noexcept {
    int length = GetLength();
    if (start < 0) {
        start = 0;
    }
    if (length == 0 || start >= length) {
        return -1;
    }
    const wchar_t* found = wmemchr(m_buffer + start, ch, length - start);
    return found ? static_cast<int>(found - m_buffer) : -1;
}

int CStringEx::Find(const wchar_t* sub, int start) const noexcept {
    int length = GetLength();
    if (start < 0) {
        start = 0;
    }
    if (sub == nullptr || length == 0 || start >= length) {
        return -1;
    }
    const wchar_t* found = wcsstr(m_buffer + start, sub);
    return found ? static_cast<int>(found - m_buffer) : -1;
}

int CStringEx::ReverseFind(wchar_t ch) const noexcept {
    for (int i = GetLength() - 1; i >= 0; --i) {
        if (m_buffer[i] == ch) {
            return i;
        }
    }
    return -1;
}

int CStringEx::ReverseFind(const wchar_t* sub) const noexcept {
    int length = GetLength();
    if (length == 0 || sub == nullptr) {
        return -1;
    }
    int subLength = SafeLength(sub);
    if (subLength > length) {
        return -1;
    }
    if (subLength == 0) {
        return length;
    }
    for (int i = length - subLength; i >= 0; --i) {
        if (wmemcmp(m_buffer + i, sub, subLength) == 0) {
            return i;
        }
    }
    return -1;
}

CStringEx CStringEx::Mid(int start, int count) const {
    int length = GetLength();
    if (start < 0) {
        start = 0;
    }
    if (length == 0 || start >= length) {
        return CStringEx();
    }
    if (count < 0 || count > length - start) {
        count = length - start;
    }
    return CStringEx(m_buffer + start, count);
}

CStringEx CStringEx::Left(int count) const {
    return Mid(0, count);
}

CStringEx CStringEx::Right(int count) const {
    int length = GetLength();
    if (count <= 0) {
        return CStringEx();
    }
    if (count >= length) {
        return *this;
    }
    return Mid(length - count, count);
}

int CStringEx::Insert(int index, const wchar_t* text) {
    int length = GetLength();
    int addLength = SafeLength(text);
    if (addLength == 0) {
        return length;
    }
    if (index < 0) {
        index = 0;
    }
    if (index > length) {
        index = length;
    }
    wchar_t* joined = AllocateText(length + addLength);
    if (joined == nullptr) {
        return length;
    }
    wmemcpy(joined, m_buffer ? m_buffer : L"", index);
    wmemcpy(joined + index, text, addLength);
    wmemcpy(joined + index + addLength, m_buffer ? m_buffer + index : L"", length - index);
    Adopt(joined);
    return length + addLength;
}

int CStringEx::Delete(int index, int count) {
    int length = GetLength();
    if (length == 0) {
        return 0;
    }
    if (index < 0 || index > length || count <= 0) {
        return length;
    }
    if (count >= length - index) {
        m_buffer[index] = L'\0';
        return index;
    }
    wmemmove(m_buffer + index, m_buffer + index + count, length - index - count + 1);
    return length - count;
}

int CStringEx::Replace(const wchar_t* oldText, const wchar_t* replacement) {
    if (oldText == nullptr || replacement == nullptr || IsEmpty() || oldText[0] == L'\0' ||
        wcscmp(oldText, replacement) == 0) {
        return 0;
    }
    int oldLength = SafeLength(oldText);
    int newLength = SafeLength(replacement);
    int count = 0;
    for (const wchar_t* p = wcsstr(m_buffer, oldText); p; p = wcsstr(p + oldLength, oldText)) {
        ++count;
    }
    if (count == 0) {
        return 0;
    }
    int length = GetLength();
    long long resultLength = length + static_cast<long long>(count) * (newLength - oldLength);
    if (resultLength > 0x7FFFFFFE) {
        return 0;
    }
    wchar_t* result = AllocateText(static_cast<int>(resultLength));
    if (result == nullptr) {
        return 0;
    }
    wchar_t* out = result;
    const wchar_t* in = m_buffer;
    for (const wchar_t* p = wcsstr(in, oldText); p; p = wcsstr(in, oldText)) {
        wmemcpy(out, in, p - in);
        out += p - in;
        wmemcpy(out, replacement, newLength);
        out += newLength;
        in = p + oldLength;
    }
    wcscpy(out, in);
    Adopt(result);
    return count;
}

int CStringEx::Replace(wchar_t ch, const wchar_t* replacement) {
    wchar_t single[2] = {ch, L'\0'};
    if (ch == L'\0') {
        return 0;
    }
    return Replace(single, replacement);
}

void CStringEx::TrimLeft(wchar_t ch) {
    int length = GetLength();
    int skip = 0;
    while (skip < length && m_buffer[skip] == ch) {
        ++skip;
    }
    if (skip > 0) {
        Delete(0, skip);
    }
}

void CStringEx::TrimRight(wchar_t ch) {
    int length = GetLength();
    while (length > 0 && m_buffer[length - 1] == ch) {
        m_buffer[--length] = L'\0';
    }
}

void CStringEx::TrimLeft(const wchar_t* text) {
    int textLength = SafeLength(text);
    int length = GetLength();
    if (textLength == 0 || length == 0) {
        return;
    }
    int skip = 0;
    while (length - skip >= textLength && wmemcmp(m_buffer + skip, text, textLength) == 0) {
        skip += textLength;
    }
    if (skip > 0) {
        Delete(0, skip);
    }
}

void CStringEx::TrimRight(const wchar_t* text) {
    int textLength = SafeLength(text);
    int length = GetLength();
    if (textLength == 0 || length == 0) {
        return;
    }
    while (length >= textLength && wmemcmp(m_buffer + length - textLength, text, textLength) == 0) {
        length -= textLength;
        m_buffer[length] = L'\0';
    }
}

void CStringEx::TrimLeft() {
    int length = GetLength();
    int skip = 0;
    while (skip < length && (m_buffer[skip] == L' ' || m_buffer[skip] == L'\r' ||
                             m_buffer[skip] == L'\n' || m_buffer[skip] == L'\t')) {
        ++skip;
    }
    if (skip > 0) {
        Delete(0, skip);
    }
}

void CStringEx::TrimRight() {
    int length = GetLength();
    while (length > 0 && iswspace(m_buffer[length - 1])) {
        m_buffer[--length] = L'\0';
    }
}

void CStringEx::MakeUpper() noexcept {
    if (!IsEmpty()) {
        _wcsupr(m_buffer);
    }
}

void CStringEx::Format(const wchar_t* format, ...) {
    if (format == nullptr) {
        return;
    }
    va_list args;
    va_start(args, format);
    va_list sizing;
    va_copy(sizing, args);
    int needed = _vscwprintf(format, sizing);
    va_end(sizing);
    if (needed >= 0) {
        wchar_t* text = AllocateText(needed);
        if (text) {
            _vsnwprintf(text, static_cast<size_t>(needed) + 1, format, args);
            text[needed] = L'\0';
            Adopt(text);
        }
    }
    va_end(args);
}

bool CStringEx::LoadString(HMODULE module, UINT id) {
    Empty();
    // String ids are 16-bit; a larger id would wrap to another block's text.
    if (id > 0xFFFF) {
        return false;
    }
    HRSRC block = FindResourceW(module, MAKEINTRESOURCEW((id / 16) + 1), MAKEINTRESOURCEW(6));
    if (block == nullptr) {
        return false;
    }
    DWORD blockSize = SizeofResource(module, block);
    HGLOBAL loaded = LoadResource(module, block);
    const WORD* entry = loaded ? static_cast<const WORD*>(LockResource(loaded)) : nullptr;
    if (entry == nullptr) {
        return false;
    }
    const WORD* end = entry + blockSize / sizeof(WORD);
    for (UINT i = 0; i < id % 16 && entry < end; ++i) {
        entry += 1 + *entry;
    }
    if (entry >= end || entry + 1 + *entry > end) {
        return false;
    }
    Assign(reinterpret_cast<const wchar_t*>(entry + 1), *entry);
    return !IsEmpty();
}

void CStringEx::PathAppend(CStringEx& path, const wchar_t* file) {
    if (file == nullptr) {
        OutputDebugStringW(L"CStringEx::PathAppend: lpszFile == NULL\n");
        return;
    }
    CStringEx name(file);
    name.TrimLeft(L'/');
    name.TrimLeft(L'\\');
    path.TrimRight(L'/');
    path.TrimRight(L'\\');
    path += L'\\';
    path += name;
}

void CStringEx::Assign(const wchar_t* text, int length) {
    if (text == nullptr || length <= 0) {
        Empty();
        return;
    }
    wchar_t* copy = AllocateText(length);
    if (copy == nullptr) {
        return;
    }
    wmemcpy(copy, text, length);
    Adopt(copy);
}

void CStringEx::Adopt(wchar_t* buffer) noexcept {
    delete[] m_buffer;
    m_buffer = buffer;
}
