// CMSDom over real MSXML 3.0 documents: the failures a caller relies on, the
// comment search, and what SaveToFile writes.
#include <gtest/gtest.h>
#include <objbase.h>

#include <algorithm>
#include <functional>
#include <string>
#include <vector>

#include "base/com_owners.h"
#include "base/ms_dom.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"

namespace {

const wchar_t kSample[] =
    L"<!--  Mirovan legacy\t-->\n<!--Other-->\n<!--Mirovan legacy-->\n"
    L"<root a=\"7\">\n  <item>one</item><item>two</item><!--inner--></root>";

class MsDom : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)));
        ASSERT_EQ(S_OK, CMSDom::CreateFromString(B(kSample), m_doc.GetAddressOf()));
        ASSERT_EQ(S_OK, CMSDom::GetRootNode(m_doc.Get(), m_root.GetAddressOf()));
        ASSERT_EQ(S_OK, CMSDom::GetNodeList(m_root.Get(), B(L"item"), m_list.GetAddressOf()));
    }
    void TearDown() override {
        m_doc = m_root = m_list = m_out = nullptr;
        CoUninitialize();
    }

    // A BSTR that lives as long as the test.
    BSTR B(const wchar_t* text) {
        m_texts.emplace_back(SysAllocString(text));
        return m_texts.back().get();
    }
    IUnknown** Out() { return m_out.ReleaseAndGetAddressOf(); }
    std::wstring Xml(IUnknown* node) {
        UniqueBstr xml;
        EXPECT_EQ(S_OK, CMSDom::GetXML(node, xml.put()));
        return xml ? xml.get() : L"";
    }

    std::vector<UniqueBstr> m_texts;
    ComPtr<IUnknown> m_doc, m_root, m_list, m_out;
    ScratchDir m_scratch{L"msdom"};
};

// The wrapper's debugger lines while the object lives: OutputDebugString
// raises an exception carrying the narrow text, which a first vectored handler
// takes (a wide one raised first on newer systems is passed on).
class DebugLines {
public:
    DebugLines() : m_handler(AddVectoredExceptionHandler(1, &Take)) { s_lines = &m_lines; }
    ~DebugLines() {
        RemoveVectoredExceptionHandler(m_handler);
        s_lines = nullptr;
    }
    const std::string& Text() const { return m_lines; }

private:
    static LONG CALLBACK Take(EXCEPTION_POINTERS* pointers) {
        const EXCEPTION_RECORD* record = pointers->ExceptionRecord;
        if (s_lines == nullptr || record->ExceptionCode != DBG_PRINTEXCEPTION_C ||
            record->NumberParameters < 2) {
            return EXCEPTION_CONTINUE_SEARCH;
        }
        const std::string text = reinterpret_cast<const char*>(record->ExceptionInformation[1]);
        if (text.rfind("CMSDom", 0) == 0) {  // not the trace library's own lines
            *s_lines += text;
        }
        return EXCEPTION_CONTINUE_EXECUTION;
    }
    static inline std::string* s_lines = nullptr;
    PVOID m_handler;
    std::string m_lines;
};

TEST_F(MsDom, FailuresAnswerTheirCodesAndLines) {
    IUnknown* doc = m_doc.Get();
    IUnknown* root = m_root.Get();
    IUnknown* list = m_list.Get();
    CStringEx value = L"kept";
    const struct {
        const char* what;
        std::function<long()> call;
        long code;
        const char* line;  // the wrapper's debugger line, or none
    } cases[] = {
        // A missing guard of an out pointer writes through null.
        {"select null out", [&] { return CMSDom::SelectSingleChild(root, B(L"a"), nullptr); },
         E_INVALIDARG, "CMSDom::SelectSingleChild: Invalid Argument\n"},
        {"list null out", [&] { return CMSDom::GetNodeList(root, B(L"a"), nullptr); }, E_INVALIDARG,
         "CMSDom::GetNodeList: Invalid argument\n"},
        {"item null out", [&] { return CMSDom::GetNodeFromList(list, 0, nullptr); }, E_INVALIDARG,
         "CMSDom::GetNodeFromList: Invalid argument\n"},
        {"comment null out", [&] { return CMSDom::GetCommentsNode(root, B(L"Other"), nullptr); },
         E_POINTER, "CMSDom::GetCommentsNode: output ppINode is NULL!\n"},
        {"select empty path", [&] { return CMSDom::SelectSingleChild(root, B(L""), Out()); },
         E_INVALIDARG, "CMSDom::SelectSingleChild: Invalid Argument\n"},
        {"select in list", [&] { return CMSDom::SelectSingleChild(list, B(L"a"), Out()); }, E_FAIL,
         "CMSDom::SelectSingleChild: Failed to get IXMLDOMNodePtr\n"},
        {"last item", [&] { return CMSDom::GetNodeFromList(list, 1, Out()); }, S_OK, nullptr},
        {"item at length", [&] { return CMSDom::GetNodeFromList(list, 2, Out()); }, E_FAIL,
         "CMSDom::GetNodeFromList: Node Index overflow\n"},
        {"item -1", [&] { return CMSDom::GetNodeFromList(list, -1, Out()); }, E_INVALIDARG,
         "CMSDom::GetNodeFromList: Invalid argument\n"},
        {"count of node", [&] { return CMSDom::GetNodeListCount(root); }, -1,
         "CMSDom::GetNodeListCount: NodeList pointer is NULL!\n"},
        {"select missing node keeps out",
         [&] {
             IUnknown* kept = list;
             return CMSDom::SelectSingleChild(root, B(L"none"), &kept) + (kept != list);
         },
         E_FAIL, nullptr},
        {"attribute missing keeps value",
         [&] { return CMSDom::GetNodeAttribute(root, B(L"b"), value) + (value != L"kept"); },
         E_FAIL, nullptr},
        {"comment other case", [&] { return CMSDom::GetCommentsNode(root, B(L"other"), Out()); },
         E_FAIL, nullptr},
        {"append second root", [&] { return CMSDom::AppendChildNode(doc, root); }, E_FAIL,
         "CMSDom::AppendChildNode: appendChild failed!\n"},
        {"save into missing folder",
         [&] { return CMSDom::SaveToFile(doc, B(m_scratch.Sub(L"missing\\a.xml").c_str())); },
         E_FAIL, "CMSDom::SaveToFile: Failed to save to file\n"},
        {"save to http", [&] { return CMSDom::SaveToFile(doc, B(L"http://h/s.xml")); }, E_FAIL,
         "CMSDom::SaveToFile: Failed to save to file\n"},
    };
    for (const auto& row : cases) {
        DebugLines lines;
        EXPECT_EQ(row.code, row.call()) << row.what;
        EXPECT_EQ(row.line != nullptr ? row.line : "", lines.Text()) << row.what;
    }
    // None of the failures changed the document or left a file.
    EXPECT_EQ(L"<root a=\"7\">\r\n  <item>one</item><item>two</item><!--inner--></root>",
              Xml(root));
    EXPECT_EQ(std::vector<std::wstring>{}, ListDir(m_scratch.path()));
}

TEST_F(MsDom, CommentSearchTrimsWhiteSpaceAndTakesTheFirstMatch) {
    ASSERT_EQ(S_OK, CMSDom::GetCommentsNode(m_root.Get(), B(L"Mirovan legacy"), Out()));
    EXPECT_EQ(L"<!--  Mirovan legacy\t-->", Xml(m_out.Get()));
}

TEST_F(MsDom, SaveWritesUtf8AndDeclaresItFirst) {
    const std::wstring path = m_scratch.Sub(L"status.xml");
    const struct {
        const char* what;
        std::string before;    // file content loaded from disk
        std::string expected;  // saved content, up to the root element's end
        bool viaUrl;           // saved to the file:/// URL of the path
    } cases[] = {
        {"other encoding", "<?xml version=\"1.0\" encoding=\"ISO-8859-1\"?>\n<r>caf\xE9</r>",
         "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<r>caf\xC3\xA9</r>", false},
        {"comment first", "<!--c--><r/>",
         "<?xml version = \"1.0\" encoding=\"UTF-8\"?>\n<!--c-->\n<r/>", true},
    };
    std::wstring url = L"file:///" + path;
    std::replace(url.begin(), url.end(), L'\\', L'/');
    for (const auto& row : cases) {
        SCOPED_TRACE(row.what);
        ASSERT_TRUE(WriteFileBytes(path, row.before));
        ComPtr<IUnknown> doc;
        ASSERT_EQ(S_OK, CMSDom::MSDomCreate(doc.GetAddressOf()));
        ASSERT_EQ(VARIANT_TRUE, CMSDom::LoadXmlFile(doc.Get(), B(path.c_str())));
        ASSERT_EQ(S_OK, CMSDom::SaveToFile(doc.Get(), B((row.viaUrl ? url : path).c_str())));
        std::string saved = ReadFileBytes(path);
        saved.erase(std::remove(saved.begin(), saved.end(), '\r'), saved.end());
        EXPECT_EQ(row.expected, saved.substr(0, row.expected.size()));
        EXPECT_EQ(std::vector<std::wstring>{L"status.xml"}, ListDir(m_scratch.path()));
    }
}

}  // namespace
