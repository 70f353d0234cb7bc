// The Base64 codec and leaf: decoding any text matches a plain reference
// decoder (the valid prefix, up to the first '=' or byte outside the
// alphabet), encoding any bytes decodes back to them, and the leaf's Decode,
// Copy and SetFrom agree with the free functions.
#include <dwxcore/dwxparse.h>

#include "fuzz_input.h"

#include <ctype.h>
#include <stdlib.h>
#include <string.h>

#include <string>

namespace {

const char kAlphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

std::string ReferenceDecode(const std::string& text) {
    std::string bytes;
    unsigned bits = 0;
    int held = 0;
    for (unsigned char c : text) {
        if (c == '=' || !(isalnum(c) || c == '+' || c == '/')) {
            break;
        }
        bits = (bits << 6) | static_cast<unsigned>(strchr(kAlphabet, c) - kAlphabet);
        held += 6;
        if (held >= 8) {
            held -= 8;
            bytes += static_cast<char>((bits >> held) & 0xff);
        }
    }
    return bytes;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    const std::string text = input.Text(1024);
    const std::string decoded = base64_decode(text);
    FUZZ_CHECK(decoded == ReferenceDecode(text));

    const std::string bytes = input.Rest();
    const auto* raw = reinterpret_cast<const unsigned char*>(bytes.data());
    const std::string encoded = base64_encode(raw, static_cast<unsigned>(bytes.size()));
    FUZZ_CHECK(encoded.size() == (bytes.size() + 2) / 3 * 4);
    FUZZ_CHECK(encoded.find_first_not_of(std::string(kAlphabet) + "=") == std::string::npos);
    FUZZ_CHECK(base64_decode(encoded) == bytes);

    // The leaf keeps its text verbatim and decodes it as the codec does.
    const std::string cText(text.c_str());
    PTNBase64 node("data", raw, static_cast<unsigned>(bytes.size()));
    node.SetAsString(cText.c_str());
    char* kept = node.GetAsString();
    FUZZ_CHECK(cText == kept);
    free(kept);
    unsigned length = 12345;
    unsigned char* out = node.Decode(nullptr, &length);
    FUZZ_CHECK(std::string(reinterpret_cast<char*>(out), length) == ReferenceDecode(cText));
    free(out);

    DWXParseTreeNode* copy = node.Copy();
    char* canonical = copy->GetAsString();
    const std::string expected =
        base64_encode(reinterpret_cast<const unsigned char*>(ReferenceDecode(cText).data()),
                      static_cast<unsigned>(ReferenceDecode(cText).size()));
    FUZZ_CHECK(expected == canonical);
    free(canonical);
    copy->SetFrom(&node);
    copy->SetFrom(copy);
    delete copy;
    return 0;
}
