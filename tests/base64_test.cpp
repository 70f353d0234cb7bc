// The Base64 codec against the RFC 4648 vectors and the plain codec shared
// with the fuzz target, where the block code (SSSE3, or the portable code in
// base64_test_portable) hands over to the rest; then the leaf's edges.
#include "tree_test_util.h"

#include "../fuzz/base64_model.h"

namespace {

std::string Encode(const std::string& bytes) {
    return base64_encode(reinterpret_cast<const unsigned char*>(bytes.data()),
                         static_cast<unsigned int>(bytes.size()));
}

// The vectors anchor both codecs; the fuzz corpus compares them at the
// lengths around each block size.
TEST(Base64Test, Rfc4648Vectors) {
    std::string encoded;
    for (const std::string plain : {"", "f", "fo", "foo", "foob", "fooba", "foobar", "\xFB\xFF"}) {
        encoded += Encode(plain) + "|";
        EXPECT_TRUE(base64_model::Encode(plain) == Encode(plain) &&
                    base64_decode(Encode(plain)) == plain);
    }
    EXPECT_EQ(encoded, "|Zg==|Zm8=|Zm9v|Zm9vYg==|Zm9vYmE=|Zm9vYmFy|+/8=|");
    EXPECT_EQ(base64_encode(nullptr, 3), "");
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

// What the fuzz target leaves out: no length wanted, an empty leaf, other
// kinds of node to set from.
TEST(Base64Test, LeafEdges) {
    const unsigned char bytes[] = {0, 'a', 200};
    PTNBase64 node("b", bytes, 3), empty("e", bytes, 0);
    free(node.Decode(nullptr, nullptr));
    unsigned int length = 12345;
    HeapPtr<unsigned char> none(empty.Decode(nullptr, &length));
    EXPECT_TRUE(none != nullptr && length == 0);  // a block free() accepts
    EXPECT_EQ(Text(PTNBase64("e", nullptr, 3)), "");
    PTNString other("s", "YWJj");
    node.SetFrom(&other);
    node.SetFrom(nullptr);
    EXPECT_EQ(Text(node), "AGHI");
}

}  // namespace
