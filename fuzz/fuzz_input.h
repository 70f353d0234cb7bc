// A reader of fuzzer input: small numbers and texts taken from the front of
// the byte buffer, zeros once it runs out. Shared by the fuzz targets, which
// build with libFuzzer under clang and with the replay main under any compiler.
#pragma once

#include <stddef.h>
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>

#include <algorithm>
#include <string>

class FuzzInput {
  public:
    FuzzInput(const uint8_t* data, size_t size) : pData(data), nSize(size) {}

    bool Empty() const { return nSize == 0; }
    uint8_t Byte() { return nSize == 0 ? 0 : (--nSize, *pData++); }
    // A value in [low, high], from as few bytes as the range needs.
    int Range(int low, int high) {
        uint64_t span = static_cast<uint64_t>(static_cast<int64_t>(high) - low) + 1;
        uint64_t value = 0;
        for (uint64_t seen = 1; seen < span; seen <<= 8) {
            value = (value << 8) | Byte();
        }
        return static_cast<int>(low + static_cast<int64_t>(value % span));
    }
    // Any int, from four bytes.
    int Int() {
        const uint32_t high = static_cast<uint32_t>(Range(0, 0xFFFF));
        return static_cast<int>(high << 16 | static_cast<uint32_t>(Range(0, 0xFFFF)));
    }
    bool Flag() { return Byte() & 1; }
    // A length byte, then that many bytes (fewer when the input runs out).
    std::string Text(size_t maxLength = 255) { return Take(Byte() % (maxLength + 1)); }
    // The text up to the next NUL byte (consumed) or the end of the input.
    std::string CString() {
        std::string text;
        for (char c; nSize > 0 && (c = static_cast<char>(Byte())) != '\0';) {
            text += c;
        }
        return text;
    }
    std::string Rest() { return Take(nSize); }

  private:
    std::string Take(size_t length) {
        length = std::min(length, nSize);
        std::string text(reinterpret_cast<const char*>(pData), length);
        pData += length;
        nSize -= length;
        return text;
    }

    const uint8_t* pData;
    size_t nSize;
};

// Ends the run with a message on a broken property: under libFuzzer the
// abort becomes a crash report with the input saved, in replay a failed test.
#define FUZZ_CHECK(condition)                                                             \
    do {                                                                                  \
        if (!(condition)) {                                                               \
            fprintf(stderr, "%s:%d: check failed: %s\n", __FILE__, __LINE__, #condition); \
            abort();                                                                      \
        }                                                                                 \
    } while (0)
