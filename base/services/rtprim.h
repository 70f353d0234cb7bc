// Low-level primitives: heap blocks, string copies, formatted text, message
// translation, case conversion, number scanning and sorting.
//
// Every block handed out here comes from malloc and is released with free().
// Allocation failure is not reported to callers: the process ends with a
// message on stderr.
#pragma once

#include <services/portability.h>
#include <services/services_export.h>

#include <stddef.h>
#include <stdlib.h>

#include <memory>

// Releases with free() a block handed out here (or by any malloc).
struct FreeDeleter {
    void operator()(void* block) const { free(block); }
};
// A heap block its holder releases with free(): HeapPtr<char> holds a text.
template <typename T>
using HeapPtr = std::unique_ptr<T, FreeDeleter>;
using HeapText = HeapPtr<char>;

// A block of at least `size` bytes; size 0 gives a valid block. Caller frees with free().
DWXSERVICES_API void* HMalloc(size_t size);
// A zero-filled block of a * b bytes. Caller frees with free().
DWXSERVICES_API void* HCalloc(size_t a, size_t b);
// Resizes `block` (null allocates), keeping its contents; continue with the result.
DWXSERVICES_API void* HRealloc(void* block, size_t size);
// Asks the system to back the whole pages inside the block with memory now,
// in one call, instead of in one page fault per page as they are first
// written. Only a hint: the contents and every other effect stay as they
// are, and it does nothing where the system has no such call.
DWXSERVICES_API void HPrefault(void* block, size_t size);
// A heap copy of `text`; null for a null `text`. Caller frees with free().
DWXSERVICES_API char* HString(const char* text);

// printf-style formatting into a ring of 32 per-thread buffers. Borrowed: the
// text stays valid for the next 31 MkName calls of the same thread; never free it.
DWXSERVICES_API char* MkName(const char* format, ...)
#if defined(__GNUC__)
    __attribute__((format(printf, 1, 2)))
#endif
    ;
// The text of a double. With digits < 0, the shortest text that reads back to
// the same double with atof; otherwise "%.*f" with that many digits. Always
// with a point, whatever the locale. Same ownership as the formatting MkName.
DWXSERVICES_API char* MkName(double value, int digits);

// The message in the user's language, or the message itself when no catalogue
// is installed or it has no entry. Never null (null gives ""); never freed.
DWXSERVICES_API const char* _(const char* message);

// A message catalogue: returns the translation of `message`, or null when it has none.
typedef const char* (*RTMessageCatalogue)(const char* message);
// Installs a catalogue for `_` (null removes it); returns the previous one.
DWXSERVICES_API RTMessageCatalogue RTSetMessageCatalogue(RTMessageCatalogue catalogue);

// ASCII case conversion in place; returns `text` (null is accepted).
DWXSERVICES_API char* UCaseString(char* text);
DWXSERVICES_API char* LCaseString(char* text);

// Numbers read exactly as the "C" locale reads them, whatever locale the host
// has set: the rules of strtod, strtol, strtoll, atof and atoi otherwise (leading
// white space, sign, exponent, the longest valid prefix). Null reads as "".
DWXSERVICES_API double TZN_strtod(const char* text, char** end);
DWXSERVICES_API long TZN_strtol(const char* text, char** end, int base);
DWXSERVICES_API long long TZN_strtoll(const char* text, char** end, int base);
DWXSERVICES_API double TZN_atof(const char* text);
DWXSERVICES_API int TZN_atoi(const char* text);

// The number at the start of the first `length` characters of `text` (strtod
// syntax in the "C" locale, leading white space allowed); 0.0 when there is none.
DWXSERVICES_API double ScanDouble(const char* text, int length);

// An in-place sort with the contract of qsort.
DWXSERVICES_API void TZN_qsort(void* base, size_t count, size_t size,
                               int (*compare)(const void*, const void*));
