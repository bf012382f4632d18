// Building a trace record's text and cutting it into the pieces the trace
// library accepts. Pure functions, shared by the trace log and its tests.
#pragma once

#include <string>
#include <vector>

#include "base/trace_value.h"

// Pieces are at most this long, so the library never gets more than 2048
// bytes with the terminator.
constexpr size_t kTracePieceLength = 2047;

// prefix (when not null) and a blank, then each parameter up to the first null
// ("name=" when named, "value," when a value is present, else ","), then "\n".
std::string BuildTraceText(const char* prefix, const TraceParam* const* params, int maxParams);

// While 2048 or more characters remain, the next piece is the first 2047 of
// them; the shorter rest is the last piece.
std::vector<std::string> SplitTracePieces(const std::string& text);
