// Line-by-line reading of text files and buffers through one reused buffer.
#include <services/utilhub.h>

#include "internal/utilhub_internal.h"

#include <errno.h>
#include <stdlib.h>
#include <string.h>

using dwxservices::internal::LineAt;
using dwxservices::internal::StartsWithBom;

namespace {

// The size of a block read from a file: large enough that reads are few,
// small enough to stay in cache and to be touched once, not once per file.
constexpr size_t kBlockSize = size_t{128} * 1024;

}  // namespace

TextLineReader::TextLineReader()
    : poFile(nullptr),
      pcBuffer(nullptr),
      nCapacity(0),
      nBegin(0),
      nScanned(0),
      nFilled(0),
      pcText(nullptr),
      pcTextEnd(nullptr),
      bEnd(true),
      bFailed(false),
      bNul(false),
      nError(0) {}

TextLineReader::~TextLineReader() {
    Close();
    free(pcBuffer);
}

void TextLineReader::Close() {
    if (poFile) {
        fclose(poFile);
        poFile = nullptr;
    }
    nBegin = nScanned = nFilled = 0;
    pcText = pcTextEnd = nullptr;
    bEnd = true;
    bFailed = bNul = false;
    nError = 0;
}

void TextLineReader::Reserve(size_t size) {
    if (pcBuffer && size <= nCapacity) {
        return;
    }
    size_t capacity = nCapacity ? nCapacity : kBlockSize;
    while (capacity < size) {
        capacity *= 2;
    }
    pcBuffer = static_cast<char*>(HRealloc(pcBuffer, capacity + 1));
    nCapacity = capacity;
}

int TextLineReader::OpenFile(const char* path) {
    Close();
    poFile = dwxservices::internal::OpenReadableFile(path);
    if (!poFile) {
        return 0;
    }
    // The blocks go straight into our buffer; a stdio buffer would copy them once more.
    setvbuf(poFile, nullptr, _IONBF, 0);
    Reserve(kBlockSize);
    bEnd = false;
    // The byte order mark is decided on the first three bytes, however the
    // first reads split them.
    while (nFilled < 3 && Fill()) {
    }
    if (StartsWithBom(pcBuffer, nFilled)) {
        nBegin = nScanned = 3;
    }
    return 1;
}

void TextLineReader::OpenBuffer(const char* buffer) {
    Close();
    if (!buffer) {
        return;
    }
    pcText = buffer;
    pcTextEnd = buffer + strlen(buffer);
    if (StartsWithBom(pcText, static_cast<size_t>(pcTextEnd - pcText))) {
        pcText += 3;
    }
}

// Reads the next block behind the bytes still to be handed out; false at the
// end of the file or on a read error.
bool TextLineReader::Fill() {
    if (bEnd) {
        return false;
    }
    if (nBegin > 0) {
        memmove(pcBuffer, pcBuffer + nBegin, nFilled - nBegin);
        nFilled -= nBegin;
        nScanned -= nBegin;
        nBegin = 0;
    }
    if (nCapacity - nFilled < kBlockSize / 2) {
        Reserve(nFilled + kBlockSize);  // a line longer than a block
    }
    errno = 0;
    size_t got = fread(pcBuffer + nFilled, 1, nCapacity - nFilled, poFile);
    // A failed read ends the file; the bytes read before the failure stay.
    if (ferror(poFile)) {
        bEnd = bFailed = true;
        nError = errno ? errno : EIO;
    } else if (got == 0) {
        bEnd = true;
    }
    if (got == 0) {
        return false;
    }
    if (!bNul && memchr(pcBuffer + nFilled, '\0', got)) {
        bNul = true;
    }
    nFilled += got;
    return true;
}

char* TextLineReader::NextFromBuffer(size_t* size) {
    if (pcText >= pcTextEnd) {
        return nullptr;
    }
    const char* start = pcText;
    pcText = LineAt(start, pcTextEnd, size);
    Reserve(*size);
    memcpy(pcBuffer, start, *size);
    return pcBuffer;
}

char* TextLineReader::NextFromFile(size_t* size) {
    if (!poFile) {
        return nullptr;
    }
    // Line ends are searched for once: a block read behind a partial
    // line is scanned from where the last search stopped.
    const char* lineEnd;
    for (;;) {
        lineEnd = static_cast<const char*>(memchr(pcBuffer + nScanned, '\n', nFilled - nScanned));
        if (lineEnd || bEnd) {
            break;
        }
        nScanned = nFilled;
        Fill();
    }
    // Bytes after the last line end are a last line without a line
    // end, unless a read error cut them off: a half line read as a whole
    // one would give a wrong value.
    if (!lineEnd && (nBegin == nFilled || bFailed)) {
        nBegin = nScanned = nFilled;
        return nullptr;
    }
    char* line = pcBuffer + nBegin;
    size_t next = lineEnd ? static_cast<size_t>(lineEnd - pcBuffer) + 1 : nFilled;
    size_t length = (lineEnd ? static_cast<size_t>(lineEnd - pcBuffer) : nFilled) - nBegin;
    if (length && line[length - 1] == '\r') {
        --length;  // before a line end, or at the very end of the file
    }
    nBegin = nScanned = next;
    if (bNul) {
        length = strnlen(line, length);
    }
    *size = length;
    return line;
}

char* TextLineReader::Next(size_t* length) {
    size_t size = 0;
    char* line = pcText ? NextFromBuffer(&size) : NextFromFile(&size);
    if (!line) {
        return nullptr;
    }
    line[size] = '\0';
    if (length) {
        *length = size;
    }
    return line;
}
