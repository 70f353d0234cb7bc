// The Base64 codec and leaf: decoding any text and encoding any bytes match
// the plain codec of base64_model.h; the leaf keeps a text verbatim, decodes
// it as the codec does, and writes it afresh when copied or set from another.
#include <dwxcore/dwxparse.h>

#include "base64_model.h"
#include "fuzz_input.h"

#include <stdlib.h>

namespace {

std::string TextOf(const DWXParseTreeNode& node) {
    char* text = node.GetAsString();
    const std::string copy(text);
    free(text);
    return copy;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    const std::string text = input.Text(1024);
    FUZZ_CHECK(base64_decode(text) == base64_model::Decode(text));

    const std::string bytes = input.Rest();
    const auto* raw = reinterpret_cast<const unsigned char*>(bytes.data());
    const std::string encoded = base64_encode(raw, static_cast<unsigned>(bytes.size()));
    FUZZ_CHECK(encoded == base64_model::Encode(bytes));
    FUZZ_CHECK(base64_decode(encoded) == bytes);

    const std::string cText(text.c_str());
    const std::string decoded = base64_model::Decode(cText);
    PTNBase64 node("data", raw, static_cast<unsigned>(bytes.size()));
    node.SetAsString(cText.c_str());
    FUZZ_CHECK(TextOf(node) == cText);
    unsigned length = 12345;
    unsigned char* out = node.Decode(nullptr, &length);
    FUZZ_CHECK(std::string(reinterpret_cast<char*>(out), length) == decoded);
    free(out);

    DWXParseTreeNode* copy = node.Copy();
    FUZZ_CHECK(TextOf(*copy) == base64_model::Encode(decoded));
    PTNBase64 target("target", raw, static_cast<unsigned>(bytes.size()));
    target.SetFrom(&node);
    target.SetFrom(&target);
    FUZZ_CHECK(TextOf(target) == base64_model::Encode(decoded));
    delete copy;
    return 0;
}
