// What a writer callback writes to a stream, read back as a host reads it;
// shared by the fuzz targets' models and the unit tests.
#pragma once

#include <stdio.h>
#include <stdlib.h>

#include <string>

// What `write` writes to a stream, read back through open_memstream.
template <typename Writer>
std::string Captured(Writer write) {
    char* buffer = nullptr;
    size_t length = 0;
    FILE* stream = open_memstream(&buffer, &length);
    write(stream);
    fclose(stream);
    std::string text(buffer, length);
    free(buffer);
    return text;
}
