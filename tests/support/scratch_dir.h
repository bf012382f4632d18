// A fresh folder under the prefix's temporary folder, removed with all its
// content when the test ends.
#pragma once

#include <string>

class ScratchDir {
public:
    explicit ScratchDir(const wchar_t* tag = L"t");
    ~ScratchDir();
    ScratchDir(const ScratchDir&) = delete;
    ScratchDir& operator=(const ScratchDir&) = delete;

    const std::wstring& path() const { return m_path; }
    // path\rel, with the folder created when makeDir is true.
    std::wstring Sub(const std::wstring& rel, bool makeDir = false) const;

private:
    std::wstring m_path;
};
