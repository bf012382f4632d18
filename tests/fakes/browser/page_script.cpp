#include "tests/fakes/browser/page_script.h"

#include <cwctype>

#include "tests/fakes/common/fake_recorder.h"

namespace {

std::wstring ReadUtf8File(const std::wstring& path) {
    HANDLE file = CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                              0, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        return std::wstring();
    }
    std::string bytes(GetFileSize(file, nullptr), '\0');
    DWORD got = 0;
    ReadFile(file, &bytes[0], static_cast<DWORD>(bytes.size()), &got, nullptr);
    CloseHandle(file);
    bytes.resize(got);
    int length =
        MultiByteToWideChar(CP_UTF8, 0, bytes.data(), static_cast<int>(bytes.size()), nullptr, 0);
    std::wstring text(length, L'\0');
    MultiByteToWideChar(CP_UTF8, 0, bytes.data(), static_cast<int>(bytes.size()), &text[0], length);
    return text;
}

std::string Narrow(const std::wstring& text) {
    return std::string(text.begin(), text.end());
}

bool IsIslandTag(const std::wstring& tag) {
    return tag.size() == 3 && towlower(tag[0]) == L'x' && towlower(tag[1]) == L'm' &&
           towlower(tag[2]) == L'l';
}

}  // namespace

bool PageScript::Load(const std::wstring& path) {
    std::wstring text = ReadUtf8File(path);
    if (text.empty()) {
        return false;
    }
    ParseTree(L"HTML(BODY(xml))");
    size_t pos = 0;
    while (pos < text.size()) {
        size_t end = text.find(L'\n', pos);
        std::wstring line = text.substr(pos, end == std::wstring::npos ? end : end - pos);
        pos = end == std::wstring::npos ? text.size() : end + 1;
        if (!line.empty() && line.back() == L'\r') {
            line.pop_back();
        }
        size_t space = line.find(L' ');
        std::wstring directive = line.substr(0, space);
        std::wstring rest = space == std::wstring::npos ? L"" : line.substr(space + 1);
        if (directive == L"log") {
            m_logPath = rest;
        } else if (directive == L"stamp") {
            m_stamp = true;
        } else if (directive == L"tree") {
            ParseTree(rest);
        } else if (directive == L"busy") {
            m_busyMs = _wtoi(rest.c_str());
        } else if (directive.compare(0, 6, L"island") == 0) {
            int island = directive.size() > 7 ? _wtoi(directive.c_str() + 7) : -1;
            size_t gap = rest.find(L' ');
            m_islands.push_back({island, static_cast<DWORD>(_wtoi(rest.c_str())),
                                 gap == std::wstring::npos ? L"" : rest.substr(gap + 1)});
        } else if (directive == L"close") {
            m_closeMs = _wtoi(rest.c_str());
        } else if (directive == L"gone") {
            m_goneMs = _wtoi(rest.c_str());
        } else if (directive == L"fail") {
            m_failing.insert(Narrow(rest));
        }
    }
    return true;
}

// Iterative, so a tree nested thousands deep is read as well.
void PageScript::ParseTree(const std::wstring& text) {
    m_nodes.clear();
    m_root = nullptr;
    std::vector<PageNode*> open;  // the elements whose children are being read
    PageNode* last = nullptr;
    int islands = 0;
    size_t i = 0;
    while (i < text.size()) {
        wchar_t ch = text[i];
        if (ch == L'(') {
            if (last != nullptr) {
                open.push_back(last);
            }
            ++i;
        } else if (ch == L')') {
            if (!open.empty()) {
                open.pop_back();
            }
            ++i;
        } else if (ch == L',' || ch == L' ') {
            ++i;
        } else {
            size_t end = text.find_first_of(L"(), ", i);
            m_nodes.push_back(std::make_unique<PageNode>());
            last = m_nodes.back().get();
            last->tag = text.substr(i, end == std::wstring::npos ? end : end - i);
            last->island = IsIslandTag(last->tag) ? islands++ : -1;
            if (open.empty()) {
                if (m_root == nullptr) {
                    m_root = last;
                }
            } else {
                open.back()->children.push_back(last);
            }
            i = end == std::wstring::npos ? text.size() : end;
        }
    }
}

void PageScript::StartClock() {
    m_navigatedAt = fake::CounterMilliseconds();
    m_navigated = true;
}

double PageScript::Elapsed() const {
    return m_navigated ? fake::CounterMilliseconds() - m_navigatedAt : 0;
}

bool PageScript::IslandText(int island, std::wstring& text) const {
    if (!Navigated() || island < 0) {
        return false;
    }
    double now = Elapsed();
    bool due = false;
    for (const IslandStep& step : m_islands) {
        if (step.atMs <= now && (step.island == -1 || step.island == island)) {
            text = step.text;
            due = true;
        }
    }
    return due;
}

std::vector<const PageNode*> PageScript::VisibleChildren(const PageNode* node) const {
    std::vector<const PageNode*> shown;
    std::wstring ignored;
    for (const PageNode* child : node->children) {
        if (child->island < 0 || IslandText(child->island, ignored)) {
            shown.push_back(child);
        }
    }
    return shown;
}

bool PageScript::Busy() const {
    return Navigated() && Elapsed() < m_busyMs;
}
