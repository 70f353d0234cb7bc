// Runs a fuzz target over files and directories of inputs, once each, so that
// every corpus also runs as an ordinary test under any compiler. A broken
// property aborts, which fails the test.
#include <stddef.h>
#include <stdint.h>
#include <stdio.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size);
extern "C" int LLVMFuzzerInitialize(int* argc, char*** argv) __attribute__((weak));

int main(int argc, char** argv) {
    namespace fs = std::filesystem;
    // Absolute paths first: a target's initialisation may change directory.
    std::vector<fs::path> arguments(argv + 1, argv + argc), files;
    for (fs::path& path : arguments) {
        path = fs::absolute(path);
    }
    if (LLVMFuzzerInitialize) {
        LLVMFuzzerInitialize(&argc, &argv);
    }
    for (const fs::path& path : arguments) {
        if (!fs::is_directory(path)) {
            files.push_back(path);
            continue;
        }
        for (const auto& entry : fs::recursive_directory_iterator(path)) {
            if (entry.is_regular_file()) {
                files.push_back(entry.path());
            }
        }
    }
    std::sort(files.begin(), files.end());
    for (const fs::path& file : files) {
        std::ifstream stream(file, std::ios::binary);
        if (!stream) {
            fprintf(stderr, "cannot read %s\n", file.c_str());
            return 1;
        }
        // Exactly the input's size, so that reading past it is caught by the
        // sanitizers as it is under libFuzzer.
        std::vector<uint8_t> exact(fs::file_size(file));
        stream.read(reinterpret_cast<char*>(exact.data()),
                    static_cast<std::streamsize>(exact.size()));
        static uint8_t none;
        LLVMFuzzerTestOneInput(exact.empty() ? &none : exact.data(), exact.size());
    }
    printf("%zu inputs ran\n", files.size());
    return files.empty() ? 1 : 0;
}
