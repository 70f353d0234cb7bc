// String values to tokens and back, through the string leaves and the reader:
// escapes, quote marks, the null token and the expansions applied on reading.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/rtprim.h>

#include <map>
#include <string>

namespace {

// A catalogue that tells a translated message from an untranslated one.
const char* Catalogue(const char* message) {
    static const std::map<std::string, const char*> kEntries = {
        {"Cancel", "Abbrechen"}, {"Red", "Rot"}, {"", "<empty>"}, {"MkTokenString(a,b)", "x|y"}};
    const auto entry = kEntries.find(message);
    return entry != kEntries.end() ? entry->second : nullptr;
}

std::string Quote(const char* value) {
    return HeapText(PTNString("s", value).GetAsString()).get();
}

// The value a token gives, set on a leaf and read on a String line alike.
std::string Unquote(const char* token) {
    PTNString node("s", "old");
    node.SetAsString(token);
    const std::string value = node.GetValue() != nullptr ? node.GetValue() : "<null>";
    PTNSubTree tree("t");
    tree.BuildFromString((std::string("(s String ") + (token ? token : "") + ")").c_str());
    const char* read = tree.GetChildAsString("s");  // null for the null token
    return !token || !read || value == read ? value : "reader differs";
}

TEST(TokenTest, QuotingEscapesOnlyQuoteLineFeedAndBackslash) {
    const char* const cases[][2] = {{nullptr, "\\q\\q"},
                                    {"", "\"\""},
                                    {"say \"hi\"\n\\", "\"say \\qhi\\q\\n\\\\\""},
                                    {"a b\t(c)!#,|\r\xC3\xA9", "\"a b\t(c)!#,|\r\xC3\xA9\""}};
    for (const auto& c : cases) {
        EXPECT_EQ(Quote(c[0]), c[1]);
        EXPECT_EQ(Unquote(c[1]), c[0] ? c[0] : "\"\"");
    }
    // Values of every length around the size a leaf holds inline, with
    // escapes that make the token longer than its value, read back whole.
    for (const std::string fill :
         {"abcdefghijklmnopqrstuvwxyz", "a\"b\\c\nd e", "@\"\"\"\"\"\"\"\"\"\"\"\""}) {
        for (size_t length = 0; length <= 24; ++length) {
            const std::string value = (fill + fill + fill).substr(0, length);
            EXPECT_EQ(Unquote(Quote(value.c_str()).c_str()), value) << fill << " " << length;
        }
    }
}

TEST(TokenTest, UnquotingUndoesEscapesAndExpandsTranslationsAndLists) {
    RTMessageCatalogue previous = RTSetMessageCatalogue(Catalogue);
    const char* const cases[][2] = {
        {"a\"b\"c", "abc"},
        {"\\t\\\\", "t\\"},
        {"abc\\", "abc"},
        {"@@", "<empty>"},
        {"@@Cancel", "Abbrechen"},
        {"\"@menu:Cancel\"", "Abbrechen"},
        {"\"@a b:Cancel\"", "@a b:Cancel"},
        {"@a@b:Cancel", "@a@b:Cancel"},
        {"\" _(Red)\t\"", "Rot"},
        {"\"_( Red )\"", " Red "},  // the message is not trimmed
        {"_(Red", "_(Red"},
        {"MkTokenString(a,b,c)", "a|b|c"},
        {"\"MkTokenString(a, NULL ,b)\"", "a"},
        {"\" MkTokenString ( a ,b) \"", " a |b"},
        {"\"MkTokenString(a,b) x\"", "MkTokenString(a,b) x"},
        {"mktokenstring(a,b)", "mktokenstring(a,b)"},
        {"\"_(Red) MkTokenString\"", "_(Red) MkTokenString"},  // the keyword blocks the call
        {"@@MkTokenString(a,b)", "x|y"},                       // translated, then expanded
        {"\\@@Cancel", "Abbrechen"},                           // an escape may make the '@'
        {"\"\t@@Cancel\"", "\t@@Cancel"}};
    for (const auto& c : cases) {
        EXPECT_EQ(Unquote(c[0]), c[1]) << c[0];
    }
    EXPECT_EQ(Unquote(nullptr), "");
    RTSetMessageCatalogue(previous);
}

}  // namespace
