#include "cleanup/packed_guid.h"

#include <wchar.h>

namespace {

// Packed digit index for each braced position, hyphens as -1.
const int kOrder[] = {7,  6,  5,  4,  3,  2,  1,  0,  -1, 11, 10, 9,  8,  -1, 15, 14, 13, 12,
                      -1, 17, 16, 19, 18, -1, 21, 20, 23, 22, 25, 24, 27, 26, 29, 28, 31, 30};
const size_t kBracedChars = 38;

}  // namespace

bool PackedGuidToGuid(const wchar_t* packed, wchar_t* out, size_t outChars) {
    if (out == nullptr || outChars <= kBracedChars) {
        return false;
    }
    size_t available = packed == nullptr ? 0 : wcsnlen(packed, 32);
    size_t n = 0;
    out[n++] = L'{';
    for (int index : kOrder) {
        if (index < 0) {
            out[n++] = L'-';
        } else if (static_cast<size_t>(index) < available) {
            out[n++] = packed[index];
        }
    }
    out[n++] = L'}';
    out[n] = L'\0';
    return true;
}

bool PackedGuidStringToGuid(const wchar_t* packed, wchar_t* out, size_t outChars) {
    if (out != nullptr && outChars > 0) {
        out[0] = L'\0';
    }
    if (packed == nullptr || wcslen(packed) != 32) {
        return false;
    }
    return PackedGuidToGuid(packed, out, outChars);
}
