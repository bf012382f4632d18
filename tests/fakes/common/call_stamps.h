// Reading a calls log whose lines the stand-ins stamped (fake::Stamped):
// "<call> @<ms>".
#pragma once

#include <cstdlib>
#include <string>

namespace fake {

// The stamp of the first line that begins with call, or -1.
inline double CallStamp(const std::string& calls, const std::string& call) {
    std::string text = "\n" + calls;
    size_t at = text.find("\n" + call);
    size_t stamp = at == std::string::npos ? at : text.find(" @", at);
    return stamp == std::string::npos ? -1 : atof(text.c_str() + stamp + 2);
}

}  // namespace fake
