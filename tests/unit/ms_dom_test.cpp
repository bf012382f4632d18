// CMSDom over real MSXML 3.0 documents: each operation's codes and debugger
// lines, the comment search, and what SaveToFile writes.
#include <gtest/gtest.h>
#include <objbase.h>

#include <algorithm>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "base/com_owners.h"
#include "base/ms_dom.h"
#include "tests/support/file_util.h"
#include "tests/support/scratch_dir.h"
#include "tests/unit/debug_output_capture.h"

namespace {

const wchar_t kSample[] =
    L"<!--  Mirovan legacy\t-->\n<!--Other-->\n"
    L"<root a=\"7\">\n  <item>one</item><item>two</item><!--inner--></root>";

struct ArrayFree {
    void operator()(SAFEARRAY* array) const { SafeArrayDestroy(array); }
};

class MsDom : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)));
        ASSERT_EQ(S_OK, CMSDom::CreateFromString(B(kSample), m_doc.GetAddressOf()));
        ASSERT_EQ(S_OK, CMSDom::GetRootNode(m_doc.Get(), m_root.GetAddressOf()));
        ASSERT_EQ(S_OK, CMSDom::GetNodeList(m_root.Get(), B(L"item"), m_list.GetAddressOf()));
        ASSERT_EQ(S_OK, CMSDom::SelectSingleChild(m_root.Get(), B(L"comment()"),
                                                  m_comment.GetAddressOf()));
        ASSERT_EQ(S_OK, CMSDom::MSDomCreate(m_empty.GetAddressOf()));
    }
    void TearDown() override {
        m_doc = m_root = m_list = m_comment = m_empty = m_out = nullptr;
        CoUninitialize();
    }

    // A BSTR that lives as long as the test.
    BSTR B(const wchar_t* text) {
        m_texts.emplace_back(SysAllocString(text));
        return m_texts.back().get();
    }
    // A byte array that lives as long as the test.
    SAFEARRAY* Bytes(const std::string& text) {
        SAFEARRAY* array = SafeArrayCreateVector(VT_UI1, 0, static_cast<ULONG>(text.size()));
        void* data = nullptr;
        SafeArrayAccessData(array, &data);
        memcpy(data, text.data(), text.size());
        SafeArrayUnaccessData(array);
        m_arrays.emplace_back(array);
        return array;
    }
    IUnknown** Out() { return m_out.ReleaseAndGetAddressOf(); }
    std::wstring Xml(IUnknown* node) {
        UniqueBstr xml;
        EXPECT_EQ(S_OK, CMSDom::GetXML(node, xml.put()));
        return xml ? xml.get() : L"";
    }

    std::vector<UniqueBstr> m_texts;
    std::vector<std::unique_ptr<SAFEARRAY, ArrayFree>> m_arrays;
    ComPtr<IUnknown> m_doc, m_root, m_list, m_comment, m_empty, m_out;
    CStringEx m_value;
    ScratchDir m_scratch{L"msdom"};
};

struct Case {
    const char* what;
    std::function<long()> call;
    long code;
    const wchar_t* message;  // the one debugger line, or none
};

TEST_F(MsDom, EachFailureAnswersItsCodeAndLine) {
    IUnknown* doc = m_doc.Get();
    IUnknown* root = m_root.Get();
    IUnknown* list = m_list.Get();
    IUnknown* comment = m_comment.Get();
    const std::wstring missingFolder = m_scratch.Sub(L"missing\\out.xml");
    const Case cases[] = {
        {"create null", [&] { return CMSDom::MSDomCreate(nullptr); }, E_INVALIDARG,
         L"CMSDom::MSDomCreate: Invalid argument\n"},
        {"load null doc", [&] { return CMSDom::LoadXmlFile(nullptr, B(L"C:\\a.xml")); }, 0,
         L"CMSDom::LoadXmlFile: Invalid argument\n"},
        {"load empty path", [&] { return CMSDom::LoadXmlFile(doc, B(L"")); }, 0,
         L"CMSDom::LoadXmlFile: Invalid argument\n"},
        {"load into node", [&] { return CMSDom::LoadXmlFile(root, B(L"C:\\a.xml")); }, 0,
         L"CMSDom::LoadXmlFile: Failed to get IXMLDOMDocumentPtr\n"},
        {"load missing file",
         [&] { return CMSDom::LoadXmlFile(m_empty.Get(), B(L"C:\\none.xml")); }, 0, nullptr},
        {"bytes null array", [&] { return CMSDom::LoadXmlBytes(m_empty.Get(), nullptr); }, 0,
         L"CMSDom::LoadXmlBytes: Invalid argument\n"},
        {"bytes into node", [&] { return CMSDom::LoadXmlBytes(root, Bytes("<a/>")); }, 0,
         L"CMSDom::LoadXmlBytes: Failed to get IXMLDOMDocumentPtr\n"},
        {"bytes malformed", [&] { return CMSDom::LoadXmlBytes(m_empty.Get(), Bytes("<a>")); }, 0,
         nullptr},
        {"parse null xml", [&] { return CMSDom::LoadFromString(doc, nullptr); }, 0,
         L"CMSDom::LoadFromString:Invalid argument\n"},
        {"parse into list", [&] { return CMSDom::LoadFromString(list, B(L"<a/>")); }, 0,
         L"CMSDom::LoadFromString:Failed to get IXMLDOMDocumentPtr\n"},
        {"parse malformed", [&] { return CMSDom::LoadFromString(m_empty.Get(), B(L"<a>")); }, 0,
         nullptr},
        {"create empty xml", [&] { return CMSDom::CreateFromString(B(L""), Out()); }, E_FAIL,
         nullptr},
        {"save null doc", [&] { return CMSDom::SaveToFile(nullptr, B(L"C:\\a.xml")); },
         E_INVALIDARG, L"CMSDom::SaveToFile : Invalid Argument\n"},
        {"save empty path", [&] { return CMSDom::SaveToFile(doc, nullptr); }, E_INVALIDARG,
         L"CMSDom::SaveToFile : Invalid Argument\n"},
        {"save node", [&] { return CMSDom::SaveToFile(root, B(L"C:\\a.xml")); }, E_POINTER,
         L"CMSDom::SaveToFile : Failed to get IXMLDOMDocumentPtr\n"},
        {"save into missing folder",
         [&] { return CMSDom::SaveToFile(doc, B(missingFolder.c_str())); }, E_FAIL,
         L"CMSDom::SaveToFile: Failed to save to file\n"},
        {"save to http", [&] { return CMSDom::SaveToFile(doc, B(L"http://h/s.xml")); }, E_FAIL,
         L"CMSDom::SaveToFile: Failed to save to file\n"},
        {"xml of null", [&] { return CMSDom::GetXML(nullptr, nullptr); }, E_INVALIDARG,
         L"CMSDom::GetXML: Invalid Argument\n"},
        {"xml of list",
         [&] {
             UniqueBstr x;
             return CMSDom::GetXML(list, x.put());
         },
         E_FAIL, L"CMSDom::GetXML: Failed to get IXMLDOMDocumentPtr\n"},
        {"root of node", [&] { return CMSDom::GetRootNode(root, Out()); }, E_FAIL,
         L"CMSDom::GetRootNode: can not get IXMLDOMDocument!\n"},
        {"root of empty document", [&] { return CMSDom::GetRootNode(m_empty.Get(), Out()); },
         E_FAIL, nullptr},
        {"select null node", [&] { return CMSDom::SelectSingleChild(nullptr, B(L"a"), Out()); },
         E_INVALIDARG, L"CMSDom::SelectSingleChild: Invalid Argument\n"},
        {"select empty path", [&] { return CMSDom::SelectSingleChild(root, B(L""), Out()); },
         E_INVALIDARG, L"CMSDom::SelectSingleChild: Invalid Argument\n"},
        {"select null out", [&] { return CMSDom::SelectSingleChild(root, B(L"a"), nullptr); },
         E_INVALIDARG, L"CMSDom::SelectSingleChild: Invalid Argument\n"},
        {"select in list", [&] { return CMSDom::SelectSingleChild(list, B(L"a"), Out()); }, E_FAIL,
         L"CMSDom::SelectSingleChild: Failed to get IXMLDOMNodePtr\n"},
        {"select missing node keeps out",
         [&] {
             IUnknown* kept = list;
             return CMSDom::SelectSingleChild(root, B(L"none"), &kept) + (kept != list);
         },
         E_FAIL, nullptr},
        {"list null node", [&] { return CMSDom::GetNodeList(nullptr, B(L"a"), Out()); },
         E_INVALIDARG, L"CMSDom::GetNodeList: Invalid argument\n"},
        {"list empty path", [&] { return CMSDom::GetNodeList(root, nullptr, Out()); }, E_INVALIDARG,
         L"CMSDom::GetNodeList: Invalid argument\n"},
        {"list null out", [&] { return CMSDom::GetNodeList(root, B(L"a"), nullptr); }, E_INVALIDARG,
         L"CMSDom::GetNodeList: Invalid argument\n"},
        {"list in list", [&] { return CMSDom::GetNodeList(list, B(L"a"), Out()); }, E_FAIL,
         L"CMSDom::GetNodeList: can not get IXMLDOMNodePtr\n"},
        {"list of nothing is empty",
         [&] {
             return CMSDom::GetNodeList(root, B(L"none"), Out()) +
                    CMSDom::GetNodeListCount(m_out.Get());
         },
         0, nullptr},
        {"count of null", [&] { return CMSDom::GetNodeListCount(nullptr); }, -1,
         L"CMSDom::GetNodeListCount: input para is NULL!\n"},
        {"count of node", [&] { return CMSDom::GetNodeListCount(root); }, -1,
         L"CMSDom::GetNodeListCount: NodeList pointer is NULL!\n"},
        {"item of null", [&] { return CMSDom::GetNodeFromList(nullptr, 0, Out()); }, E_INVALIDARG,
         L"CMSDom::GetNodeFromList: Invalid argument\n"},
        {"item -1", [&] { return CMSDom::GetNodeFromList(list, -1, Out()); }, E_INVALIDARG,
         L"CMSDom::GetNodeFromList: Invalid argument\n"},
        {"item null out", [&] { return CMSDom::GetNodeFromList(list, 0, nullptr); }, E_INVALIDARG,
         L"CMSDom::GetNodeFromList: Invalid argument\n"},
        {"item of node", [&] { return CMSDom::GetNodeFromList(root, 0, Out()); }, E_FAIL,
         L"CMSDom::GetNodeFromList: Can not get IXMLDOMNodeListPtr\n"},
        {"item at length", [&] { return CMSDom::GetNodeFromList(list, 2, Out()); }, E_FAIL,
         L"CMSDom::GetNodeFromList: Node Index overflow\n"},
        {"comment null out", [&] { return CMSDom::GetCommentsNode(root, B(L"Other"), nullptr); },
         E_POINTER, L"CMSDom::GetCommentsNode: output ppINode is NULL!\n"},
        {"comment of list", [&] { return CMSDom::GetCommentsNode(list, B(L"Other"), Out()); },
         E_POINTER, L"CMSDom::GetCommentsNode: Failed to get IXMLDOMNodePtr\n"},
        {"comment of document", [&] { return CMSDom::GetCommentsNode(doc, B(L"Other"), Out()); },
         E_POINTER, L"CMSDom::GetCommentsNode: Failed to get ownerDocument\n"},
        {"comment other case", [&] { return CMSDom::GetCommentsNode(root, B(L"other"), Out()); },
         E_FAIL, nullptr},
        {"comment not top level", [&] { return CMSDom::GetCommentsNode(root, B(L"inner"), Out()); },
         E_FAIL, nullptr},
        {"value of null", [&] { return CMSDom::GetNodeValue(nullptr, m_value); }, E_POINTER,
         L"CMSDom::GetNodeValue: Invalid Argument\n"},
        {"value of list empties",
         [&] { return CMSDom::GetNodeValue(list, m_value) + m_value.GetLength(); }, E_POINTER,
         nullptr},
        {"child value missing empties",
         [&] { return CMSDom::GetChildNodeValue(root, B(L"none"), m_value) + m_value.GetLength(); },
         E_FAIL, nullptr},
        {"attribute missing keeps value",
         [&] {
             CStringEx v = L"x";
             return CMSDom::GetNodeAttribute(root, B(L"b"), v) + (v != L"x");
         },
         E_FAIL, nullptr},
        {"attribute null name", [&] { return CMSDom::GetNodeAttribute(root, nullptr, m_value); },
         E_FAIL, nullptr},
        {"attribute of document", [&] { return CMSDom::GetNodeAttribute(doc, B(L"a"), m_value); },
         E_FAIL, nullptr},
        {"create empty name", [&] { return CMSDom::CreateNode(root, B(L"")); }, E_INVALIDARG,
         L"CMSDom::CreateNode: Invalid argument\n"},
        {"create under list", [&] { return CMSDom::CreateNode(list, B(L"n")); }, E_POINTER,
         L"CMSDom::CreateNode: Failed to get IXMLDOMNodePtr\n"},
        {"create under document", [&] { return CMSDom::CreateNode(doc, B(L"n")); }, E_POINTER,
         L"CMSDom::CreateNode: Failed to get ownerDocument\n"},
        {"create null name adds nothing",
         [&] { return CMSDom::CreateNode(root, nullptr, Out()) + !!m_out; }, S_OK, nullptr},
        {"create under comment", [&] { return CMSDom::CreateNode(comment, B(L"n")); }, E_FAIL,
         nullptr},
        {"set value of document", [&] { return CMSDom::SetNodeValue(m_empty.Get(), B(L"x")); },
         E_FAIL, L"CMSDom::SetNodeValueInternal: put_text FAILED!\n"},
        {"set value of list", [&] { return CMSDom::SetNodeValue(list, 5); }, E_FAIL,
         L"CMSDom::SetNodeValue: Failed to get IXMLDOMNodePtr\n"},
        {"append null", [&] { return CMSDom::AppendChildNode(root, nullptr); }, E_INVALIDARG,
         L"CMSDom::AppendChildNode: Input para is NULL!\n"},
        {"append second root", [&] { return CMSDom::AppendChildNode(doc, root); }, E_FAIL,
         L"CMSDom::AppendChildNode: appendChild failed!\n"},
        {"clone null", [&] { return CMSDom::CloneNode(root, nullptr); }, E_POINTER,
         L"CMSDom::CloneNode: input para is NULL!\n"},
        {"clone list", [&] { return CMSDom::CloneNode(list, Out()); }, E_POINTER,
         L"CMSDom::CloneNode: can not get Src IXMLDOMNode!\n"},
        {"remove null", [&] { return CMSDom::RemoveSingleNode(nullptr); }, E_INVALIDARG,
         L"CMSDom::RemoveSingleNode: Invalid Argument\n"},
        {"remove list", [&] { return CMSDom::RemoveSingleNode(list); }, E_FAIL,
         L"CMSDom::RemoveSingleNode: Failed to get IXMLDOMNodePtr\n"},
        {"remove document", [&] { return CMSDom::RemoveSingleNode(doc); }, E_FAIL,
         L"CMSDom::RemoveSingleNode: Failed to get parent IXMLDOMNodePtr\n"},
    };
    for (const Case& row : cases) {
        SCOPED_TRACE(row.what);
        std::vector<std::wstring> lines;
        long code = 0;
        {
            DebugOutputCapture debug;  // the test framework writes there too
            code = row.call();
            for (const std::wstring& line : debug.lines()) {
                if (line.find(L"CMSDom") != std::wstring::npos) {  // not the trace library's
                    lines.push_back(line);
                }
            }
        }
        EXPECT_EQ(row.code, code);
        std::vector<std::wstring> expected;
        if (row.message != nullptr) {
            expected.push_back(row.message);
        }
        EXPECT_EQ(expected, lines);
    }
    // None of the failures changed the document.
    EXPECT_EQ(L"<root a=\"7\">\r\n  <item>one</item><item>two</item><!--inner--></root>",
              Xml(root));
}

TEST_F(MsDom, CommentSearchTrimsWhiteSpaceAndTakesTheFirstMatch) {
    ASSERT_EQ(S_OK, CMSDom::GetCommentsNode(m_root.Get(), B(L"Mirovan legacy"), Out()));
    EXPECT_EQ(L"<!--  Mirovan legacy\t-->", Xml(m_out.Get()));
    ASSERT_EQ(S_OK, CMSDom::RemoveSingleNode(m_out.Get()));
    EXPECT_EQ(E_FAIL, CMSDom::GetCommentsNode(m_root.Get(), B(L"Mirovan legacy"), Out()));
}

TEST_F(MsDom, ReadsAndBuildsValues) {
    ASSERT_EQ(VARIANT_TRUE, CMSDom::LoadXmlBytes(m_empty.Get(), Bytes("<r><v>\xC3\xA9</v></r>")));
    EXPECT_EQ(S_OK, CMSDom::GetChildNodeValue(m_empty.Get(), B(L"r/v"), m_value));
    EXPECT_STREQ(L"\u00E9", m_value.c_str());
    ASSERT_EQ(S_OK, CMSDom::GetNodeFromList(m_list.Get(), 1, Out()));
    EXPECT_EQ(S_OK, CMSDom::GetNodeValue(m_out.Get(), m_value));
    EXPECT_STREQ(L"two", m_value.c_str());
    EXPECT_EQ(S_OK, CMSDom::GetNodeAttribute(m_root.Get(), B(L"a"), m_value));
    EXPECT_STREQ(L"7", m_value.c_str());
    EXPECT_EQ(S_OK, CMSDom::CreateNode(m_root.Get(), B(L"n"), -12));
    EXPECT_EQ(S_OK, CMSDom::GetChildNodeValue(m_root.Get(), B(L"n"), m_value));
    EXPECT_STREQ(L"-12", m_value.c_str());
    ASSERT_EQ(S_OK, CMSDom::CreateNode(m_root.Get(), B(L"t"), B(L"x&y"), Out()));
    EXPECT_EQ(L"<t>x&amp;y</t>", Xml(m_out.Get()));
    ASSERT_EQ(S_OK, CMSDom::GetNodeFromList(m_list.Get(), 0, Out()));
    ComPtr<IUnknown> clone;
    ASSERT_EQ(S_OK, CMSDom::CloneNode(m_out.Get(), clone.GetAddressOf()));
    ASSERT_EQ(S_OK, CMSDom::AppendChildNode(m_root.Get(), clone.Get()));
    std::wstring xml = Xml(m_root.Get());
    EXPECT_NE(std::wstring::npos, xml.find(L"<n>-12</n><t>x&amp;y</t><item>one</item></root>"))
        << xml;
}

struct SaveCase {
    const char* what;
    std::string before;    // file content loaded from disk
    std::string expected;  // saved content, up to the root element's end
    bool viaUrl = false;   // saved to the file:/// URL of the path
};

TEST_F(MsDom, SaveWritesUtf8AndDeclaresItFirst) {
    const std::wstring path = m_scratch.Sub(L"status.xml");
    const SaveCase cases[] = {
        {"other encoding", "<?xml version=\"1.0\" encoding=\"ISO-8859-1\"?>\n<r>caf\xE9</r>",
         "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<r>caf\xC3\xA9</r>"},
        {"standalone kept",
         "<?xml version='1.0' encoding='windows-1252' standalone='yes'?><r>\x80</r>",
         "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"yes\"?>\n<r>\xE2\x82\xAC</r>"},
        {"no declaration", "<r>caf\xC3\xA9</r>",
         "<?xml version = \"1.0\" encoding=\"UTF-8\"?>\n<r>caf\xC3\xA9</r>"},
        {"comment first", "<!--c--><r/>",
         "<?xml version = \"1.0\" encoding=\"UTF-8\"?>\n<!--c-->\n<r/>", true},
    };
    std::wstring url = L"file:///" + path;
    std::replace(url.begin(), url.end(), L'\\', L'/');
    for (const SaveCase& row : cases) {
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
