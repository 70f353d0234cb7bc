// String values to tokens and back, through the string leaves: escapes, quote
// marks, the null token and the expansions applied on reading.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/rtprim.h>

#include <stdlib.h>
#include <string.h>

#include <string>

namespace {

// A catalogue that tells a translated message from an untranslated one.
const char* Catalogue(const char* message) {
    static const char* const kEntries[][2] = {{"Cancel", "Abbrechen"},
                                              {"Red", "Rot"},
                                              {"Blue", "Blau"},
                                              {"", "<empty>"},
                                              {"MkTokenString(a,b)", "MkTokenString(x,y)"}};
    for (const auto& entry : kEntries) {
        if (strcmp(entry[0], message) == 0) {
            return entry[1];
        }
    }
    return nullptr;
}

std::string Quote(const char* value) {
    char* token = PTNString("s", value).GetAsString();
    std::string result(token);
    free(token);
    return result;
}

std::string Unquote(const char* token) {
    PTNString node("s", "old");
    node.SetAsString(token);
    return node.GetValue() != nullptr ? node.GetValue() : "<null>";
}

struct Case {
    const char* in;
    const char* out;
};

TEST(TokenTest, QuotingEscapesOnlyQuoteLineFeedAndBackslash) {
    const Case cases[] = {{nullptr, "\\q\\q"},
                          {"", "\"\""},
                          {"say \"hi\"\n\\", "\"say \\qhi\\q\\n\\\\\""},
                          {"a b\t(c)!#@,|\r\xC3\xA9", "\"a b\t(c)!#@,|\r\xC3\xA9\""}};
    for (const Case& c : cases) {
        EXPECT_EQ(Quote(c.in), c.out);
        if (c.in != nullptr) {
            EXPECT_EQ(Unquote(Quote(c.in).c_str()), c.in);
        }
    }
}

TEST(TokenTest, UnquotingUndoesEscapesAndDropsQuoteMarks) {
    const Case cases[] = {{"abc", "abc"},     {"\"abc\"", "abc"}, {"a\"b\"c", "abc"},
                          {"\\q\\q", "\"\""}, {"\\t\\\\", "t\\"}, {"abc\\", "abc"},
                          {"\"\"", ""},       {nullptr, ""}};
    for (const Case& c : cases) {
        EXPECT_EQ(Unquote(c.in), c.out) << (c.in ? c.in : "(null)");
    }
}

// The reader keeps short values in the leaf and unquotes them there; values
// of every length around that size, with escapes that make the token longer
// than its value, come back as they were written.
TEST(TokenTest, ReaderReadsBackValuesOfEveryLengthAroundTheInlineSize) {
    const char* const kFills[] = {"abcdefghijklmnopqrstuvwxyz", "a\"b\\c\nd e",
                                  "@\"\"\"\"\"\"\"\"\"\"\"\"\""};
    for (const char* fill : kFills) {
        for (size_t length = 0; length <= 24; ++length) {
            std::string value;
            for (size_t i = 0; i < length; ++i) {
                value += fill[i % strlen(fill)];
            }
            PTNSubTree tree("t");
            tree.BuildFromString(("(s String " + Quote(value.c_str()) + ")").c_str());
            EXPECT_EQ(tree.GetChildAsString("s"), value) << fill << " " << length;
        }
    }
}

TEST(TokenTest, ReadingExpandsTranslationsAndListForms) {
    RTMessageCatalogue previous = RTSetMessageCatalogue(Catalogue);
    const Case cases[] = {
        {"@@Cancel", "Abbrechen"},
        {"\"@menu:Cancel\"", "Abbrechen"},
        {"@@", "<empty>"},
        {"\"@menu Cancel\"", "@menu Cancel"},
        {"@a@b:Cancel", "@a@b:Cancel"},
        {"@menu", "@menu"},
        {"@", "@"},
        {"\" _(Red)\t\"", "Rot"},
        {"\"_( Red )\"", " Red "},  // the message is not trimmed
        {"_()", "<empty>"},
        {"x_(Red)", "x_(Red)"},
        {"_(Red", "_(Red"},
        {"MkTokenString(a,b,c)", "a|b|c"},
        {"\"MkTokenString(a, NULL ,b)\"", "a"},
        {"MkTokenString(_(Red),_(Blue))", "Rot|Blau"},
        {"\" MkTokenString ( a ,b) \"", " a |b"},
        {"MkTokenString()", ""},
        {"xMkTokenString(a,b)", "xMkTokenString(a,b)"},
        {"\"MkTokenString(a,b) x\"", "MkTokenString(a,b) x"},
        {"mktokenstring(a,b)", "mktokenstring(a,b)"},
        {"\"_(Red) MkTokenString\"", "_(Red) MkTokenString"},  // the keyword blocks the call
        {"@@MkTokenString(a,b)", "x|y"},                       // translated, then expanded
        {"\\@@Cancel", "Abbrechen"},                           // an escape may make the '@'
        {"\\_(Red)", "Rot"},
        {"\"\t@@Cancel\"", "\t@@Cancel"},
        {"Main", "Main"},
        {"\xC3\xA9_(Red)", "\xC3\xA9_(Red)"},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(Unquote(c.in), c.out) << c.in;
        // The reader unquotes its String lines the same way.
        PTNSubTree tree("t");
        tree.BuildFromString((std::string("(s String ") + c.in + ")").c_str());
        EXPECT_STREQ(tree.GetChildAsString("s"), c.out) << c.in;
    }
    RTSetMessageCatalogue(previous);
}

}  // namespace
