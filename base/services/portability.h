// Case-insensitive comparisons under their Windows names. Comparison is ASCII
// only and byte-wise, so results do not depend on the locale.
#pragma once

#if defined(_WIN32)
#include <string.h>
#else
#include <strings.h>

inline int _stricmp(const char* a, const char* b) {
    return strcasecmp(a, b);
}
inline int _strnicmp(const char* a, const char* b, unsigned long n) {
    return strncasecmp(a, b, n);
}
#endif
