// Case-insensitive comparisons under their Windows names. Only the ASCII
// letters A-Z and a-z are folded, byte by byte; every other byte (0x80 and up
// included) equals only itself. The host's locale never changes an answer.
#pragma once

#include <stddef.h>

// The byte with A-Z folded to a-z; every other byte unchanged.
inline unsigned char AsciiLower(unsigned char c) {
    return (c >= 'A' && c <= 'Z') ? static_cast<unsigned char>(c - 'A' + 'a') : c;
}

inline int _strnicmp(const char* a, const char* b, size_t n) {
    const unsigned char* x = reinterpret_cast<const unsigned char*>(a);
    const unsigned char* y = reinterpret_cast<const unsigned char*>(b);
    for (; n > 0; --n, ++x, ++y) {
        const int d = AsciiLower(*x) - AsciiLower(*y);
        if (d != 0 || *x == '\0') {
            return d;
        }
    }
    return 0;
}

inline int _stricmp(const char* a, const char* b) {
    return _strnicmp(a, b, static_cast<size_t>(-1));
}
