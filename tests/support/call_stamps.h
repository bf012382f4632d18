// Reading the calls log of a stand-in that stamps its calls (fake::Stamped):
// lines "<call> @<ms>".
#pragma once

#include <cstdlib>
#include <string>

// The stamp of the first line that begins with call, or -1.
inline double CallStamp(const std::string& calls, const std::string& call) {
    std::string text = "\n" + calls;
    size_t at = text.find("\n" + call);
    if (at == std::string::npos) {
        return -1;
    }
    size_t stamp = text.find(" @", at);
    return stamp == std::string::npos ? -1 : atof(text.c_str() + stamp + 2);
}
