// The page the browser stand-in shows, driven by a small script file, one
// directive a line:
//   log <path>            the calls log (else QM_FAKE_CALLS_LOG)
//   stamp                 calls are stamped (fake::Stamped)
//   tree <elements>       the element tree, e.g. HTML(HEAD,BODY(DIV,xml));
//                         elements named xml (any case) hold the data island
//   busy <ms>             the page is busy for ms after Navigate
//   island <ms> <text>    from ms after Navigate on, the islands hold text
//                         (before the first such line there is no island)
//   island#<n> <ms> <text>  the same for the n-th island only (0 the first
//                         in document order)
//   close <ms>            the user closes the window ms after Navigate
//   gone <ms>             the browser process ends ms after Navigate
//   fail <method>         the method answers E_FAIL (Navigate, get_Busy,
//                         get_Document, get_HWND, get_documentElement,
//                         get_tagName, get_children, get_innerHTML,
//                         get_length, item)
#pragma once

#include <windows.h>

#include <memory>
#include <set>
#include <string>
#include <vector>

struct PageNode {
    std::wstring tag;
    std::vector<PageNode*> children;
    int island = -1;  // the island's number in document order, or -1
};

class PageScript {
public:
    // Reads the script; false when the file cannot be read.
    bool Load(const std::wstring& path);

    const PageNode* Root() const { return m_root; }
    // Children of node as the page shows them now: islands only once due.
    std::vector<const PageNode*> VisibleChildren(const PageNode* node) const;
    // The text of island number `island` now, and whether it is shown.
    bool IslandText(int island, std::wstring& text) const;
    bool Busy() const;
    bool Fails(const char* method) const { return m_failing.count(method) > 0; }
    const std::wstring& logPath() const { return m_logPath; }
    bool stamp() const { return m_stamp; }

    // Times are counted from Navigate, on the performance counter, so a
    // benchmark knows to the millisecond when the island appeared.
    void StartClock();
    bool Navigated() const { return m_navigated; }
    long closeMs() const { return m_closeMs; }
    long goneMs() const { return m_goneMs; }

private:
    void ParseTree(const std::wstring& text);
    double Elapsed() const;

    std::vector<std::unique_ptr<PageNode>> m_nodes;
    const PageNode* m_root = nullptr;
    DWORD m_busyMs = 0;
    struct IslandStep {
        int island;  // -1 for every island
        DWORD atMs;
        std::wstring text;
    };
    std::vector<IslandStep> m_islands;
    long m_closeMs = -1;
    long m_goneMs = -1;
    std::set<std::string> m_failing;
    std::wstring m_logPath;
    bool m_stamp = false;
    bool m_navigated = false;
    double m_navigatedAt = 0;
};
