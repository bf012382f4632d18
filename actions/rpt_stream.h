// One file's bytes in memory, read as the problem report attaches trace
// files: a file that the trace library is still writing is read through a
// copy.
#pragma once

#include <windows.h>

#include <memory>

class CRptStream {
public:
    // Largest trace file read directly; a copy of a file in use has no limit.
    static const DWORD kMaxDirectSize = 2097152;

    CRptStream() = default;
    virtual ~CRptStream() = default;
    CRptStream(const CRptStream&) = delete;
    CRptStream& operator=(const CRptStream&) = delete;

    // 1 when the file's bytes are in the buffer (two zero bytes follow them
    // when addTerminator is set); else 0 with an empty buffer.
    BOOL ReadFromFile(const wchar_t* path, BOOL addTerminator);

    // The file's bytes, null while there are none.
    const BYTE* Data() const { return m_size > 0 ? m_data.get() : nullptr; }
    // The number of the file's bytes, without the terminator.
    DWORD Size() const { return m_size; }
    // Empties the buffer; its memory is kept for the next file.
    void Clear() { m_size = 0; }

    // Reads exactly `expected` bytes (the size just measured) from the start
    // of file, with `extra` zero bytes reserved behind them. A file that
    // shrank since it was measured fails rather than giving a short buffer;
    // bytes a writer appended since are not read.
    BOOL ReadExpected(HANDLE file, DWORD expected, DWORD extra);

private:
    std::unique_ptr<BYTE[]> m_data;
    DWORD m_capacity = 0;
    DWORD m_size = 0;
};
