// Conversion of wide text to the system ANSI code page, for the narrow
// interfaces the program calls (trace library, MAPI).
#pragma once

#include <memory>
#include <string>
#include <vector>

// The text in the ANSI code page; null or empty gives "".
std::string WideToAnsi(const wchar_t* text);

// Owner of the narrow strings that AnsiCopyToList hands out.
class AnsiStringList {
public:
    char* Add(std::unique_ptr<char[]> text);
    size_t size() const { return m_entries.size(); }

private:
    std::vector<std::unique_ptr<char[]>> m_entries;
};

// Converts `text` into a new ANSI string owned by `list` and returns it; null
// input or a failed conversion returns null and adds nothing.
char* AnsiCopyToList(const wchar_t* text, AnsiStringList& list);
