// Export macro of the library (libdwxcore). Everything without it stays
// hidden: the library builds with hidden visibility.
#pragma once

#if defined(_WIN32)
#if defined(DWXCORE_BUILDING)
#define DWXCORE_API __declspec(dllexport)
#else
#define DWXCORE_API __declspec(dllimport)
#endif
#else
#define DWXCORE_API __attribute__((visibility("default")))
#endif
