// Small text helpers: keywords and property names compare without regard to
// case; group names and TSids compare exactly.
#pragma once

#include <cstddef>

namespace tsd_detail {

inline char lowerAscii(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c;
}

// Equal without regard to ASCII case; null equals nothing.
inline bool equalsNoCase(const char* a, const char* b) {
    if (a == nullptr || b == nullptr)
        return false;
    for (; *a != 0 && *b != 0; ++a, ++b)
        if (lowerAscii(*a) != lowerAscii(*b))
            return false;
    return *a == *b;
}

// `text` begins with `prefix`, without regard to ASCII case.
inline bool startsWithNoCase(const char* text, const char* prefix) {
    if (text == nullptr || prefix == nullptr)
        return false;
    for (; *prefix != 0; ++text, ++prefix)
        if (*text == 0 || lowerAscii(*text) != lowerAscii(*prefix))
            return false;
    return true;
}

} // namespace tsd_detail
