// The floor for a line-oriented reader: read the file line by line and count
// the lines, building nothing.
#include "driver_common.h"

#include <stdlib.h>

int main(int argc, char** argv) {
    if (argc != 2) {
        fprintf(stderr, "usage: %s FILE\n", argv[0]);
        return 2;
    }
    auto read = [](const char* path) -> long {
        FILE* stream = fopen(path, "r");
        if (!stream) {
            return -1;
        }
        char* line = nullptr;
        size_t capacity = 0;
        long lines = 0;
        while (getline(&line, &capacity, stream) != -1) {
            ++lines;
        }
        free(line);
        fclose(stream);
        return lines;
    };
    return dwxbench::RunDriver(
        "floor", argv[1], read, [] {}, [] {});
}
