#include "base/trace_text.h"

std::string BuildTraceText(const char* prefix, const TraceParam* const* params, int maxParams) {
    std::string text;
    if (prefix != nullptr) {
        text += prefix;
        text += ' ';
    }
    for (int i = 0; params != nullptr && i < maxParams && params[i] != nullptr; ++i) {
        const TraceParam& param = *params[i];
        if (param.name != nullptr) {
            text += param.name;
            text += '=';
        }
        if (param.value != nullptr) {
            text += param.value->Text();
        }
        text += ',';
    }
    text += '\n';
    return text;
}

std::vector<std::string> SplitTracePieces(const std::string& text) {
    std::vector<std::string> pieces;
    size_t offset = 0;
    while (text.size() - offset >= kTracePieceLength + 1) {
        pieces.push_back(text.substr(offset, kTracePieceLength));
        offset += kTracePieceLength;
    }
    pieces.push_back(text.substr(offset));
    return pieces;
}
