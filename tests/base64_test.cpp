// The Base64 codec and leaf: RFC 4648 vectors, every short length, all byte
// values, the stop-at-first-invalid rule and the node's own text handling.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>

#include <stdlib.h>
#include <string.h>

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
                                {"abc", "YWJj"},
                                {"ab", "YWI="},
                                {"a", "YQ=="}};
    for (const auto& v : vectors) {
        EXPECT_EQ(Encode(v[0]), v[1]);
        EXPECT_EQ(base64_decode(v[1]), v[0]);
    }
    EXPECT_EQ(base64_encode(nullptr, 3), "");
    EXPECT_EQ(Encode(std::string("\xFB\xFF", 2)), "+/8=");  // the last two letters of the alphabet
}

TEST(Base64Test, EveryLengthUpToEightAndEveryByteRoundTrips) {
    // Bytes 0 and above 127 in every position of every short length.
    const std::string pattern("\x00\xFF\x80\x7F\x01\xFE\x00\xC3\x3F", 9);
    for (size_t length = 0; length <= 8; ++length) {
        for (size_t offset = 0; offset + length <= pattern.size(); ++offset) {
            const std::string bytes = pattern.substr(offset, length);
            const std::string text = Encode(bytes);
            EXPECT_EQ(text.size(), 4 * ((length + 2) / 3));
            EXPECT_EQ(base64_decode(text), bytes);
            // Pad characters are optional on reading.
            EXPECT_EQ(base64_decode(text.substr(0, text.find('='))), bytes);
        }
    }
    std::string all;
    for (int b = 0; b < 256; ++b) {
        all += static_cast<char>(b);
        const std::string single(1, static_cast<char>(b));
        ASSERT_EQ(base64_decode(Encode(single)), single) << b;
    }
    EXPECT_EQ(base64_decode(Encode(all)), all);
}

TEST(Base64Test, DecodingStopsAtTheFirstPadOrForeignByte) {
    const struct {
        std::string text;
        std::string bytes;
    } cases[] = {
        {"Y", ""},
        {"=YWJj", ""},
        {"YWJj\nYWJj", "abc"},
        {"YW Jj", "a"},
        {"YWI", "ab"},
        {"YWI=YWJj", "ab"},
        {"YWJjY", "abc"},  // a final single character gives nothing
        {"YWJjYQ", "abca"},
        {"YWJjYWI", "abcab"},
        {"YWJj-_", "abc"},  // the URL-safe letters are not in the alphabet
        {"YW\xC3\xA9Jj", "a"},
        {std::string("YWJj\0YWJj", 9), "abc"},
        {"YWJ\x80", "ab"},
        {"\xFF", ""},
        {"YR==", "a"},  // surplus bits of an incomplete group are not tested
    };
    for (const auto& c : cases) {
        EXPECT_EQ(base64_decode(c.text), c.bytes) << c.text;
    }
}

TEST(Base64Test, NodeTextAndDecode) {
    const unsigned char bytes[] = {0, 'a', 200, 0};
    PTNBase64 node("b", bytes, 4);
    EXPECT_EQ(Text(node), "AGHIAA==");
    EXPECT_EQ(Decoded(node), std::string("\0a\xC8\0", 4));
    EXPECT_EQ(Decoded(node, "YWJj"), "abc");  // an explicit text, the node unchanged
    EXPECT_EQ(Text(node), "AGHIAA==");

    for (PTNBase64* empty : {new PTNBase64("e", nullptr, 4), new PTNBase64("e", bytes, 0)}) {
        EXPECT_EQ(Text(*empty), "");  // no text renders as the empty text
        EXPECT_EQ(Decoded(*empty), "");
        EXPECT_EQ(Decoded(*empty, ""), "");
        std::unique_ptr<DWXParseTreeNode> copy(empty->Copy());
        EXPECT_EQ(Text(*copy), "");
        delete empty;
    }
    free(node.Decode(nullptr, nullptr));  // the count may be ignored
}

TEST(Base64Test, SetAsStringIsVerbatimAndCopyRecodes) {
    PTNBase64 node("b", nullptr, 0);
    node.SetAsString("YWI");
    EXPECT_EQ(Text(node), "YWI");
    std::unique_ptr<DWXParseTreeNode> copy(node.Copy());
    EXPECT_EQ(Text(*copy), "YWI=");
    EXPECT_STREQ(copy->GetName(), "b");
    EXPECT_EQ(copy->GetParentRef(), nullptr);

    PTNBase64 target("t", nullptr, 0);
    target.SetFrom(&node);
    EXPECT_EQ(Text(target), "YWI=");
    EXPECT_STREQ(target.GetName(), "t");

    node.SetAsString("not base64!");
    EXPECT_EQ(Text(node), "not base64!");
    EXPECT_EQ(Decoded(node), base64_decode("not"));
    node.SetAsString(nullptr);
    EXPECT_EQ(Text(node), "");
}

TEST(Base64Test, SetFromTestsTheClassAndKeepsDataWithItself) {
    const unsigned char bytes[] = {'a', 'b', 'c'};
    PTNBase64 node("b", bytes, 3);
    PTNString text("s", "YWJj");
    node.SetFrom(&text);
    node.SetFrom(nullptr);
    EXPECT_EQ(Text(node), "YWJj");

    node.SetFrom(&node);
    EXPECT_EQ(Decoded(node), "abc");
    node.SetAsString("YWI");
    node.SetFrom(&node);
    EXPECT_EQ(Decoded(node), "ab");

    PTNBase64 empty("e", nullptr, 0);
    node.SetFrom(&empty);
    EXPECT_EQ(Text(node), "");
    PTNBase64 invalid("i", nullptr, 0);
    invalid.SetAsString("=");
    PTNBase64 target("t", bytes, 3);
    target.SetFrom(&invalid);  // 0 bytes leave no text
    EXPECT_EQ(Text(target), "");
}

TEST(Base64Test, CopyConstructionAndAssignmentAreDeep) {
    const unsigned char bytes[] = {1, 2, 3, 4};
    auto source = std::make_unique<PTNBase64>("b", bytes, 4);
    source->SetAsString("AQIDBA");  // kept verbatim by the copy operations
    PTNBase64 copy(*source);
    PTNBase64 assigned("x", bytes, 1);
    assigned = *source;
    const PTNBase64& alias = assigned;
    assigned = alias;
    source.reset();
    EXPECT_EQ(Text(copy), "AQIDBA");
    EXPECT_EQ(Text(assigned), "AQIDBA");
    EXPECT_STREQ(assigned.GetName(), "b");
    EXPECT_EQ(Decoded(copy), std::string("\1\2\3\4"));
}

}  // namespace
