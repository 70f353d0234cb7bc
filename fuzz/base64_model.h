// A plain Base64 codec, one bit at a time, shared by the fuzz target and the
// unit test. Decoding takes the text up to the first '=' or byte outside the
// alphabet; a last lone character gives nothing, surplus bits are ignored.
#pragma once

#include <string.h>

#include <string>

namespace base64_model {

const char kAlphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

inline std::string Encode(const std::string& bytes) {
    std::string text;
    unsigned bits = 0;
    int held = 0;
    for (unsigned char byte : bytes) {
        bits = (bits << 8) | byte;
        for (held += 8; held >= 6; held -= 6) {
            text += kAlphabet[(bits >> (held - 6)) & 63];
        }
    }
    if (held > 0) {
        text += kAlphabet[(bits << (6 - held)) & 63];
    }
    return text + std::string((4 - text.size() % 4) % 4, '=');
}

inline std::string Decode(const std::string& text) {
    std::string bytes;
    unsigned bits = 0;
    int held = 0;
    for (char c : text) {
        const char* at = c != '\0' ? strchr(kAlphabet, c) : nullptr;
        if (at == nullptr) {
            break;
        }
        bits = (bits << 6) | static_cast<unsigned>(at - kAlphabet);
        if ((held += 6) >= 8) {
            held -= 8;
            bytes += static_cast<char>((bits >> held) & 0xff);
        }
    }
    return bytes;
}

}  // namespace base64_model
