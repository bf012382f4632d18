// Time of CCmdLineParser::Parse on Action command lines of the longest length
// Windows passes (32,767 characters), in several shapes. Goal: under 50 ms
// per parse. Usage: parse_bench [repetitions]
#include <windows.h>

#include <cstdio>
#include <string>
#include <vector>

#include "bench/process_timing.h"
#include "app/cmdline_parser.h"
#include "actions/command_info.h"

namespace {

const size_t kCommandLength = 32767;
const double kGoalMs = 50.0;

// head + filler repeated (the last copy cut short) + tail, exactly
// kCommandLength characters.
std::wstring Padded(const std::wstring& head, const std::wstring& filler,
                    const std::wstring& tail) {
    std::wstring text = head;
    size_t room = kCommandLength - head.size() - tail.size();
    while (text.size() - head.size() + filler.size() <= room) {
        text += filler;
    }
    text.append(room - (text.size() - head.size()), L'x');
    return text + tail;
}

// n opening tags, then inner, then the n closing tags; deep nesting of one
// name ("a") or of distinct names ("d0", "d1", ...).
std::wstring Nested(int n, bool distinctNames, const std::wstring& inner) {
    std::wstring open;
    std::wstring close;
    for (int i = 0; i < n; ++i) {
        std::wstring name = distinctNames ? L"d" + std::to_wstring(i) : L"a";
        open += L"<" + name + L">";
        close.insert(0, L"</" + name + L">");
    }
    return open + inner + close;
}

// The deepest nesting (pairs of tags around "x") that fits in the room left.
std::wstring DeepFitting(const std::wstring& head, const std::wstring& tail, bool distinctNames) {
    int low = 1;
    int high = 8000;
    while (low < high) {
        int mid = (low + high + 1) / 2;
        if (head.size() + Nested(mid, distinctNames, L"x").size() + tail.size() <= kCommandLength) {
            low = mid;
        } else {
            high = mid - 1;
        }
    }
    return Padded(head + Nested(low, distinctNames, L"x"), L" ", tail);
}

struct Shape {
    const char* name;
    std::wstring text;
    int expectedAction;  // what Parse must find (0: must fail)
};

std::vector<Shape> Shapes() {
    const std::wstring cmd = L"<CmdLine>";
    const std::wstring end = L"</CmdLine>";
    const std::wstring join = L"<Action>JoinMeeting</Action>";
    std::vector<Shape> shapes;
    shapes.push_back(
        {"JoinMeeting, one long URL",
         Padded(cmd + join + L"<Client>OI</Client><hWnd>65812</hWnd><URL>https://meet.example/j?",
                L"k=v&amp;", L"</URL>" + end),
         kActionJoinMeeting});
    shapes.push_back({"CommonLogin, one long CDATA e-mail",
                      Padded(cmd + L"<Action>CommonLogin</Action><SiteUrl>https://site.example"
                                   L"</SiteUrl><Username>someone</Username><Editable>1</Editable>"
                                   L"<Email>\r\n<![CDATA[",
                             L"someone@example.com;", L"]]>\r\n</Email>" + end),
                      kActionCommonLogin});
    shapes.push_back({"flat, thousands of small elements",
                      Padded(cmd + join, L"<Param>v</Param>", L"<Z></Z>" + end),
                      kActionJoinMeeting});
    shapes.push_back({"flat, minimal elements <a></a>",
                      Padded(cmd + join, L"<a></a>", L"<Z></Z>" + end), kActionJoinMeeting});
    shapes.push_back({"flat, elements with one child each",
                      Padded(cmd + join, L"<b><c>1</c></b>", L"<Z></Z>" + end),
                      kActionJoinMeeting});
    shapes.push_back({"long own text before many elements",
                      Padded(cmd + join + std::wstring(16000, L'.'), L"<a></a>", L"<Z></Z>" + end),
                      kActionJoinMeeting});
    shapes.push_back({"many elements before long trailing text",
                      Padded(cmd + join, L"<a></a>", L"<Z></Z>" + std::wstring(16000, L'.') + end),
                      kActionJoinMeeting});
    shapes.push_back({"deep nesting, one name",
                      DeepFitting(cmd + join + L"<X>", L"</X>" + end, false), kActionJoinMeeting});
    shapes.push_back({"deep nesting, distinct names",
                      DeepFitting(cmd + join + L"<X>", L"</X>" + end, true), kActionJoinMeeting});
    shapes.push_back({"unbalanced opening tags", Padded(cmd + join + L"<X>", L"<a>", L"</X>" + end),
                      kActionJoinMeeting});
    shapes.push_back({"unbalanced closing tags",
                      Padded(cmd + join + L"<X>", L"</a>", L"</X>" + end), kActionJoinMeeting});
    shapes.push_back({"only \"</\"", Padded(L"", L"</", L""), 0});
    return shapes;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
    int repetitions = argc > 1 ? _wtoi(argv[1]) : 10;
    if (repetitions <= 0) {
        repetitions = 10;
    }
    std::printf("CCmdLineParser::Parse of %u-character command lines, %d repetitions\n",
                static_cast<unsigned>(kCommandLength), repetitions);
    std::printf("%-42s %9s %9s %9s  %s\n", "shape", "min ms", "mean ms", "max ms", "goal < 50 ms");
    bool allMet = true;
    for (const Shape& shape : Shapes()) {
        if (shape.text.size() != kCommandLength) {
            std::printf("%-42s wrong length %u\n", shape.name,
                        static_cast<unsigned>(shape.text.size()));
            return 2;
        }
        CStringEx text(shape.text.c_str());
        double minMs = 1e30;
        double maxMs = 0;
        double totalMs = 0;
        bool resultOk = true;
        for (int i = 0; i < repetitions; ++i) {
            CCmdLineParser parser;
            double start = NowMilliseconds();
            int parsed = parser.Parse(text);
            double elapsed = NowMilliseconds() - start;
            CommandInfo info;
            int action = parser.GetCommandInfo(info) ? info.nAction : 0;
            resultOk = resultOk && (parsed != 0) == (shape.expectedAction != 0) &&
                       action == shape.expectedAction;
            minMs = elapsed < minMs ? elapsed : minMs;
            maxMs = elapsed > maxMs ? elapsed : maxMs;
            totalMs += elapsed;
        }
        double meanMs = totalMs / repetitions;
        bool met = maxMs < kGoalMs;
        allMet = allMet && met;
        std::printf("%-42s %9.2f %9.2f %9.2f  %s%s\n", shape.name, minMs, meanMs, maxMs,
                    met ? "met" : "MISSED", resultOk ? "" : "  (unexpected parse result)");
        if (!resultOk) {
            allMet = false;
        }
    }
    std::printf("overall: %s\n", allMet ? "goal met for every shape" : "goal MISSED");
    return allMet ? 0 : 1;
}
