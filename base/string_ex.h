// CStringEx: the program's wide-character string. Deep-copied, no buffer
// while empty, no spare capacity. Operations never throw; failures show in
// their results (-1 for "not found", an empty string for out of range).
#pragma once

#include <windows.h>

class CStringEx {
public:
    CStringEx() noexcept = default;
    CStringEx(const wchar_t* text);  // NOLINT: implicit by design, like a string literal
    CStringEx(const wchar_t* text, int length);
    CStringEx(const CStringEx& other);
    CStringEx(CStringEx&& other) noexcept;
    virtual ~CStringEx();

    CStringEx& operator=(const CStringEx& other);
    CStringEx& operator=(CStringEx&& other) noexcept;
    CStringEx& operator=(const wchar_t* text);

    CStringEx& operator+=(const CStringEx& other);
    CStringEx& operator+=(const wchar_t* text);
    CStringEx& operator+=(wchar_t ch);

    // The text; an empty string first gets an allocated empty text, so the
    // result is never null.
    const wchar_t* GetConstBuffer();
    operator const wchar_t*() { return GetConstBuffer(); }
    // The text without allocating: a static empty text while empty.
    const wchar_t* c_str() const noexcept { return m_buffer ? m_buffer : L""; }

    int GetLength() const noexcept;
    bool IsEmpty() const noexcept { return m_buffer == nullptr || m_buffer[0] == L'\0'; }
    void Empty() noexcept;
    wchar_t GetAt(int index) const noexcept;

    // Writable buffer of at least minLength characters plus terminator; null
    // while locked, or for an empty string when fewer than two characters are
    // asked for.
    wchar_t* GetBuffer(int minLength);
    void ReleaseBuffer(int ignored = -1) noexcept;

    int Compare(const wchar_t* other) const noexcept;
    int CompareNoCase(const wchar_t* other) const noexcept;
    int Find(wchar_t ch, int start = 0) const noexcept;
    int Find(const wchar_t* sub, int start = 0) const noexcept;
    int ReverseFind(wchar_t ch) const noexcept;
    int ReverseFind(const wchar_t* sub) const noexcept;

    CStringEx Mid(int start, int count = -1) const;
    CStringEx Left(int count) const;
    CStringEx Right(int count) const;

    int Insert(int index, const wchar_t* text);
    int Delete(int index, int count = 1);
    int Replace(const wchar_t* oldText, const wchar_t* replacement);
    int Replace(wchar_t ch, const wchar_t* replacement);

    void TrimLeft(wchar_t ch);
    void TrimRight(wchar_t ch);
    void TrimLeft(const wchar_t* text);
    void TrimRight(const wchar_t* text);
    void TrimLeft();
    void TrimRight();
    void MakeUpper() noexcept;

    // printf-style formatting with the C runtime's wide rules: %s takes a
    // wide string, %S a narrow one.
    void Format(const wchar_t* format, ...);

    // Copies string `id` from the string table of `module`; true when the
    // result is not empty.
    bool LoadString(HMODULE module, UINT id);

    // Joins `file` to `path` with exactly one backslash.
    static void PathAppend(CStringEx& path, const wchar_t* file);

private:
    // Replaces the text with `length` characters from `text` (which may point
    // into the current buffer).
    void Assign(const wchar_t* text, int length);
    // Takes ownership of a buffer allocated with new[].
    void Adopt(wchar_t* buffer) noexcept;

    wchar_t* m_buffer = nullptr;
    int m_locked = 0;
};

inline bool operator==(const CStringEx& a, const wchar_t* b) {
    return a.Compare(b) == 0;
}
inline bool operator!=(const CStringEx& a, const wchar_t* b) {
    return !(a == b);
}
