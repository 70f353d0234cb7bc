// The Base64 codec against the RFC 4648 vectors and the plain codec shared
// with the fuzz target, where the block code (SSSE3, or the portable code in
// base64_test_portable) hands over to the rest; then the leaf's own text.
#include "tree_test_util.h"

#include "../fuzz/base64_model.h"

#include <stdint.h>

namespace {

std::string Encode(const std::string& bytes) {
    return base64_encode(reinterpret_cast<const unsigned char*>(bytes.data()),
                         static_cast<unsigned int>(bytes.size()));
}

std::string Decoded(const PTNBase64& node, const char* text = nullptr) {
    unsigned int length = 12345;
    HeapPtr<unsigned char> bytes(node.Decode(text, &length));
    EXPECT_NE(bytes, nullptr);
    return std::string(reinterpret_cast<char*>(bytes.get()), length);
}

// The vectors, then every short length and the lengths around each block
// size, with every byte value; pads are optional.
TEST(Base64Test, EncodesAsTheVectorsAndTheModel) {
    const char* vectors[][2] = {{"", ""},
                                {"f", "Zg=="},
                                {"fo", "Zm8="},
                                {"foo", "Zm9v"},
                                {"foob", "Zm9vYg=="},
                                {"fooba", "Zm9vYmE="},
                                {"foobar", "Zm9vYmFy"},
                                {"\xFB\xFF", "+/8="}};
    for (const auto& v : vectors) {
        EXPECT_EQ(Encode(v[0]), v[1]);
        EXPECT_EQ(base64_model::Encode(v[0]), v[1]);
        EXPECT_EQ(base64_decode(v[1]), v[0]);
    }
    EXPECT_EQ(base64_encode(nullptr, 3), "");

    std::string bytes;
    for (uint32_t i = 0, state = 12345; i < 5000; ++i) {
        state = state * 1103515245u + 12345u;
        bytes += static_cast<char>(state >> 23);
    }
    for (size_t length :
         {0, 1, 2, 3, 4, 5, 6, 7, 8, 15, 16, 17, 23, 24, 25, 47, 48, 49, 100, 1000, 4099, 5000}) {
        const std::string input = bytes.substr(bytes.size() - length);
        const std::string text = Encode(input);
        EXPECT_EQ(text, base64_model::Encode(input)) << length;
        EXPECT_EQ(base64_decode(text), input) << length;
        EXPECT_EQ(base64_decode(text.substr(0, text.find('='))), input) << length;
    }
}

// Decoding ends exactly at the end, the first pad or the first foreign byte,
// whatever the byte and wherever it stands in a block.
TEST(Base64Test, DecodingStopsAtTheFirstPadOrForeignByte) {
    const std::string valid = Encode(std::string(61, '\xA7') + "+/+/?>?>") + "AAAA";
    for (size_t cut = 0; cut <= valid.size(); ++cut) {
        const std::string prefix = valid.substr(0, cut);
        ASSERT_EQ(base64_decode(prefix), base64_model::Decode(prefix)) << cut;
        for (int b = 0; b < 256; ++b) {
            const std::string text = prefix + static_cast<char>(b) + valid.substr(cut, 40);
            ASSERT_EQ(base64_decode(text), base64_model::Decode(text)) << b << " at " << cut;
        }
    }
}

TEST(Base64Test, LeafDecodesOnDemandAndCopiesDeeply) {
    const unsigned char bytes[] = {0, 'a', 200};
    PTNBase64 node("b", bytes, 3);
    EXPECT_EQ(Decoded(node), std::string("\0a\xC8", 3));
    EXPECT_EQ(Decoded(node, "YWJj"), "abc");  // a text of the caller's
    free(node.Decode(nullptr, nullptr));
    EXPECT_EQ(Decoded(PTNBase64("e", bytes, 0)), "");  // a block free() accepts, and 0
    EXPECT_EQ(Text(PTNBase64("e", nullptr, 3)), "");
    PTNString other("s", "YWJj");
    node.SetFrom(&other);  // only another Base64 leaf is taken
    node.SetFrom(nullptr);

    auto source = std::make_unique<PTNBase64>("b", nullptr, 0);
    source->SetAsString("AQIDBA");
    PTNBase64 copy(*source), assigned("x", nullptr, 0);
    assigned = *source;
    const PTNBase64& alias = assigned;
    assigned = alias;
    source.reset();
    EXPECT_EQ(Text(copy) + Text(assigned) + Text(node), "AQIDBAAQIDBAAGHI");
}

}  // namespace
