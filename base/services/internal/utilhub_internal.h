// Helpers shared by the utilhub sources; not part of the public interface.
#pragma once

#include <stdarg.h>
#include <stddef.h>
#include <stdio.h>
#include <string.h>

#include <string>

namespace dwxservices::internal {

// The white-space set of the utility layer: space, tab, LF, VT, FF, CR.
inline bool IsWhite(unsigned char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

// The line that starts at `text`, which lies before `end`: stores its length
// without its line end (LF, and a CR before it or at the very end) and
// returns where the next line starts.
inline const char* LineAt(const char* text, const char* end, size_t* length) {
    const char* lineEnd =
        static_cast<const char*>(memchr(text, '\n', static_cast<size_t>(end - text)));
    const char* next = lineEnd ? lineEnd + 1 : end;
    size_t size = static_cast<size_t>((lineEnd ? lineEnd : end) - text);
    if (size && text[size - 1] == '\r') {
        --size;
    }
    *length = size;
    return next;
}

// The UTF-8 byte order mark that a text may begin with; it is no part of any line.
inline bool StartsWithBom(const char* text, size_t length) {
    return length >= 3 && memcmp(text, "\xEF\xBB\xBF", 3) == 0;
}

// Opens `path` for reading when it is a regular file or the null device (an
// empty file: the usual way to switch an include off); null for anything
// else. FIFOs, sockets, directories and other devices are refused without
// being opened, and the open itself never waits for a FIFO's writer, even
// when the path is swapped for one after the check. Caller closes with fclose.
FILE* OpenReadableFile(const char* path);

// printf-style formatting of `args` into a string of the right size; an
// empty text for a null or unusable format.
std::string FormatV(const char* format, va_list args);

}  // namespace dwxservices::internal
