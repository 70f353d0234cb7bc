// The Base64 codec and leaf: decoding any text and encoding any bytes match
// the plain codec of base64_model.h; the leaf keeps a text verbatim, decodes
// it (or a text it is given) as the codec does, and writes it afresh when
// copied or set from another; copy construction and assignment are deep.
#include <dwxcore/dwxparse.h>
#include <services/rtprim.h>

#include "base64_model.h"
#include "fuzz_input.h"

#include <memory>

namespace {

std::string TextOf(const DWXParseTreeNode& node) {
    return HeapText(node.GetAsString()).get();
}

std::string Decoded(const PTNBase64& node, const char* text) {
    unsigned length = 12345;
    HeapPtr<unsigned char> bytes(node.Decode(text, &length));
    return std::string(reinterpret_cast<char*>(bytes.get()), length);
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
    auto node = std::make_unique<PTNBase64>("data", raw, static_cast<unsigned>(bytes.size()));
    FUZZ_CHECK(Decoded(*node, nullptr) == bytes && Decoded(*node, cText.c_str()) == decoded);
    node->SetAsString(cText.c_str());
    FUZZ_CHECK(TextOf(*node) == cText && Decoded(*node, nullptr) == decoded);

    std::unique_ptr<DWXParseTreeNode> copy(node->Copy());
    PTNBase64 target("target", raw, static_cast<unsigned>(bytes.size()));
    target.SetFrom(node.get());
    target.SetFrom(&target);
    PTNBase64 copied(*node), assigned("assigned", nullptr, 0);
    assigned = *node;
    node.reset();
    FUZZ_CHECK(TextOf(*copy) == base64_model::Encode(decoded));
    FUZZ_CHECK(TextOf(target) == base64_model::Encode(decoded));
    FUZZ_CHECK(TextOf(copied) == cText && TextOf(assigned) == cText);
    return 0;
}
