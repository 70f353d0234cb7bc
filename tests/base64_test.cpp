// The Base64 codec and leaf: RFC 4648 vectors, every short length and byte
// value, the stop-at-first-invalid rule, and the node's text handling.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>

#include <stdlib.h>

#include <memory>
#include <string>

namespace {

std::string Encode(const std::string& bytes) {
    return base64_encode(reinterpret_cast<const unsigned char*>(bytes.data()),
                         static_cast<unsigned int>(bytes.size()));
}

std::string Text(const DWXParseTreeNode& node) {
    char* text = node.GetAsString();
    std::string result(text);
    free(text);
    return result;
}

std::string Decoded(const PTNBase64& node, const char* text = nullptr) {
    unsigned int length = 12345;
    unsigned char* bytes = node.Decode(text, &length);
    EXPECT_NE(bytes, nullptr);
    std::string result(reinterpret_cast<char*>(bytes), length);
    free(bytes);
    return result;
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
                                    {std::string("YWJj\0YWJj", 9), "abc"},
                                    {"YR==", "a"}};
    for (const auto& c : cases) {
        EXPECT_EQ(base64_decode(c[0]), c[1]) << c[0];
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
    EXPECT_EQ(Text(empty), "");
    EXPECT_EQ(Decoded(empty), "");  // a block free() accepts, and a count of 0
    EXPECT_EQ(Text(*std::unique_ptr<DWXParseTreeNode>(empty.Copy())), "");
    EXPECT_EQ(Text(PTNBase64("e", nullptr, 3)), "");

    node.SetAsString("YWI");  // verbatim; Copy and SetFrom encode afresh
    EXPECT_EQ(Text(node), "YWI");
    EXPECT_EQ(Text(*std::unique_ptr<DWXParseTreeNode>(node.Copy())), "YWI=");
    PTNBase64 target("t", nullptr, 0);
    target.SetFrom(&node);
    EXPECT_EQ(Text(target), "YWI=");
    node.SetFrom(&node);  // with itself the data stays
    EXPECT_EQ(Decoded(node), "ab");
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
