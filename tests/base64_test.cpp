// The Base64 codec and leaf: RFC 4648 vectors, every short length and byte
// value, the stop-at-first-invalid rule, and the node's text handling.
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/rtprim.h>

#include <ctype.h>
#include <stdint.h>
#include <stdlib.h>

#include <memory>
#include <string>

namespace {

std::string Encode(const std::string& bytes) {
    return base64_encode(reinterpret_cast<const unsigned char*>(bytes.data()),
                         static_cast<unsigned int>(bytes.size()));
}

// The codec applied to pieces short enough for the plain path: groups of three
// bytes or four characters, each checked by the vectors below.
std::string PiecewiseEncode(const std::string& bytes) {
    std::string text;
    for (size_t i = 0; i < bytes.size(); i += 3) {
        text += Encode(bytes.substr(i, 3));
    }
    return text;
}

// What a decoder gives: the text up to the first pad or foreign byte, decoded.
std::string PiecewiseDecode(const std::string& text) {
    size_t stop = 0;
    while (stop < text.size() && (isalnum(static_cast<unsigned char>(text[stop])) ||
                                  text[stop] == '+' || text[stop] == '/')) {
        ++stop;
    }
    std::string bytes;
    for (size_t i = 0; i < stop; i += 4) {
        bytes += base64_decode(text.substr(i, stop - i < 4 ? stop - i : 4));
    }
    return bytes;
}

std::string Decoded(const PTNBase64& node, const char* text = nullptr) {
    unsigned int length = 12345;
    HeapPtr<unsigned char> bytes(node.Decode(text, &length));
    EXPECT_NE(bytes, nullptr);
    return std::string(reinterpret_cast<char*>(bytes.get()), length);
}

TEST(Base64Test, Rfc4648Vectors) {
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
        EXPECT_EQ(base64_decode(v[1]), v[0]);
    }
    EXPECT_EQ(base64_encode(nullptr, 3), "");
}

TEST(Base64Test, EveryLengthUpToEightAndEveryByteRoundTrip) {
    const std::string pattern("\x00\xFF\x80\x7F\x01\xFE\x00\xC3\x3F", 9);
    for (size_t length = 0; length <= 8; ++length) {
        for (size_t offset = 0; offset + length <= pattern.size(); ++offset) {
            const std::string bytes = pattern.substr(offset, length);
            const std::string text = Encode(bytes);
            EXPECT_EQ(text.size(), 4 * ((length + 2) / 3));
            EXPECT_EQ(base64_decode(text), bytes);
            EXPECT_EQ(base64_decode(text.substr(0, text.find('='))), bytes);  // pads optional
        }
    }
    std::string all;
    for (int b = 0; b < 256; ++b) {
        all += static_cast<char>(b);
    }
    EXPECT_EQ(base64_decode(Encode(all)), all);
}

TEST(Base64Test, DecodingStopsAtTheFirstPadOrForeignByte) {
    const std::string cases[][2] = {{"Y", ""},
                                    {"=YWJj", ""},
                                    {"YWJj\nYWJj", "abc"},
                                    {"YW Jj", "a"},
                                    {"YWI=YWJj", "ab"},
                                    {"YWJjY", "abc"},
                                    {"YWJjYWI", "abcab"},
                                    {"YWJj-_", "abc"},
                                    {"YW\xC3\xA9", "a"},
                                    {"YR==", "a"},
                                    {std::string("YWJj\0YWJj", 9), "abc"}};
    for (const auto& c : cases) {
        EXPECT_EQ(base64_decode(c[0]), c[1]) << c[0];
    }
}

// Lengths around every block size the codec may use, with every byte value.
TEST(Base64Test, LongInputsMatchThePlainPath) {
    std::string bytes;
    uint32_t state = 12345;
    for (int i = 0; i < 5000; ++i) {
        state = state * 1103515245u + 12345u;
        bytes += static_cast<char>(state >> 23);
    }
    for (size_t length : {15, 16, 17, 23, 24, 25, 47, 48, 49, 100, 1000, 4099, 5000}) {
        const std::string input = bytes.substr(bytes.size() - length);
        const std::string text = Encode(input);
        EXPECT_EQ(text, PiecewiseEncode(input)) << length;
        EXPECT_EQ(base64_decode(text), input) << length;
    }
}

// A foreign byte or pad anywhere in a long text ends the decoding exactly
// there, whatever the byte; a byte of the alphabet is decoded as such.
TEST(Base64Test, EveryByteValueAtEveryPlaceOfABlock) {
    const std::string valid = Encode(std::string(61, '\xA7') + "+/+/?>?>") + "AAAA";
    ASSERT_EQ(valid.size(), 96u);
    for (int b = 0; b < 256; ++b) {
        for (size_t at : {0, 5, 15, 16, 30, 47, 63, 70, 95}) {
            std::string text = valid;
            text[at] = static_cast<char>(b);
            ASSERT_EQ(base64_decode(text), PiecewiseDecode(text)) << b << " at " << at;
        }
    }
    for (size_t at = 0; at < valid.size(); ++at) {
        std::string text = valid;
        text[at] = '=';
        ASSERT_EQ(base64_decode(text), PiecewiseDecode(text)) << at;
    }
}

TEST(Base64Test, NodeKeepsItsTextAndDecodesOnDemand) {
    const unsigned char bytes[] = {0, 'a', 200};
    PTNBase64 node("b", bytes, 3);
    EXPECT_EQ(Text(node), "AGHI");
    EXPECT_EQ(Decoded(node), std::string("\0a\xC8", 3));
    EXPECT_EQ(Decoded(node, "YWJj"), "abc");
    EXPECT_EQ(Text(node), "AGHI");
    free(node.Decode(nullptr, nullptr));

    PTNBase64 empty("e", bytes, 0);
    EXPECT_EQ(Decoded(empty), "");  // a block free() accepts, and a count of 0
    EXPECT_EQ(Text(empty) + Text(*std::unique_ptr<DWXParseTreeNode>(empty.Copy())) +
                  Text(PTNBase64("e", nullptr, 3)),
              "");

    node.SetAsString("YWI");  // verbatim; Copy and SetFrom encode afresh
    EXPECT_EQ(Text(node), "YWI");
    EXPECT_EQ(Text(*std::unique_ptr<DWXParseTreeNode>(node.Copy())), "YWI=");
    PTNBase64 target("t", nullptr, 0);
    target.SetFrom(&node);
    EXPECT_EQ(Text(target), "YWI=");
    node.SetFrom(&node);  // with itself the data stays
    PTNString other("s", "YWJj");
    node.SetFrom(&other);
    node.SetFrom(nullptr);
    EXPECT_EQ(Decoded(node), "ab");
    target.SetFrom(&empty);
    EXPECT_EQ(Text(target), "");
}

TEST(Base64Test, CopyConstructionAndAssignmentAreDeep) {
    auto source = std::make_unique<PTNBase64>("b", nullptr, 0);
    source->SetAsString("AQIDBA");
    PTNBase64 copy(*source);
    PTNBase64 assigned("x", nullptr, 0);
    assigned = *source;
    const PTNBase64& alias = assigned;
    assigned = alias;
    source.reset();
    EXPECT_EQ(Text(copy) + Text(assigned), "AQIDBAAQIDBA");
    EXPECT_STREQ(assigned.GetName(), "b");
}

}  // namespace
