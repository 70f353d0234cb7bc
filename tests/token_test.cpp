// String values to tokens and back, seen through the string leaves: escapes,
// quote marks, the null token, the '@' translation forms, _(...) calls and
// the MkTokenString list form.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <stdlib.h>
#include <string.h>

#include <string>

namespace {

// A small catalogue, so that a translated message is told from an untranslated one.
const char* TestCatalogue(const char* message) {
    static const char* const kEntries[][2] = {
        {"Cancel", "Abbrechen"}, {"Hello", "Hallo"}, {"Red", "Rot"},
        {"Blue", "Blau"},        {"", "<empty>"},    {"MkTokenString(a,b)", "MkTokenString(x,y)"},
    };
    for (const auto& entry : kEntries) {
        if (strcmp(entry[0], message) == 0) {
            return entry[1];
        }
    }
    return nullptr;
}

class TokenTest : public ::testing::Test {
  protected:
    void SetUp() override { previous = RTSetMessageCatalogue(TestCatalogue); }
    void TearDown() override { RTSetMessageCatalogue(previous); }

    static std::string Quote(const char* value) {
        PTNString node("s", value);
        char* token = node.GetAsString();
        std::string result(token);
        free(token);
        return result;
    }
    // Unquotes through SetAsString; "<null>" marks a null value.
    static std::string Unquote(const char* token) {
        PTNString node("s", "previous");
        node.SetAsString(token);
        return node.GetValue() != nullptr ? node.GetValue() : "<null>";
    }

    RTMessageCatalogue previous = nullptr;
};

TEST_F(TokenTest, QuotingEscapesExactlyQuoteLineFeedAndBackslash) {
    const struct {
        const char* value;
        const char* token;
    } cases[] = {
        {nullptr, "\\q\\q"},
        {"", "\"\""},
        {"abc", "\"abc\""},
        {"say \"hi\"", "\"say \\qhi\\q\""},
        {"two\nlines", "\"two\\nlines\""},
        {"C:\\dir\\", "\"C:\\\\dir\\\\\""},
        {"a b\t(c)!#@,|\r", "\"a b\t(c)!#@,|\r\""},
        {"\xC3\xA9\x7F", "\"\xC3\xA9\x7F\""},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Quote(c.value), c.token) << (c.value ? c.value : "(null)");
    }
}

TEST_F(TokenTest, UnquotingUndoesEscapesAndDropsQuoteMarks) {
    const struct {
        const char* token;
        const char* value;
    } cases[] = {
        {"abc", "abc"},
        {"\"abc\"", "abc"},
        {"a\"b\"c", "abc"},
        {"\"\"", ""},
        {"\\q\\q", "\"\""},        // the null token reads back as two quotes
        {"\"\\qx\\q\"", "\"x\""},  // \q is a quote
        {"\"a\\nb\"", "a\nb"},
        {"\\\\", "\\"},
        {"\\t\\x", "tx"},  // any other escaped character stands for itself
        {"abc\\", "abc"},  // a lone final backslash stands for nothing
        {"\\", ""},
        {"\"Main window\"", "Main window"},
        {"\xFF\x80", "\xFF\x80"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Unquote(c.token), c.value) << c.token;
    }
    EXPECT_EQ(Unquote(nullptr), "");  // null gives an empty value, not null
}

TEST_F(TokenTest, QuotedValuesReadBackUnchanged) {
    const char* values[] = {"",        " ",     "plain",    "\"",  "\\", "\n",
                            "\\q",     "a\\nb", "\"\\\n\"", "x@y", "_",  "MkTokenStrin(a)",
                            "\x01\xFE"};
    for (const char* value : values) {
        EXPECT_EQ(Unquote(Quote(value).c_str()), value) << value;
    }
}

TEST_F(TokenTest, TranslationPrefixForms) {
    const struct {
        const char* token;
        const char* value;
    } cases[] = {
        {"@@Cancel", "Abbrechen"},
        {"@menu:Cancel", "Abbrechen"},
        {"@:Cancel", "Abbrechen"},
        {"\"@menu:Cancel\"", "Abbrechen"},  // the forms apply after unquoting
        {"@@Unknown", "Unknown"},
        {"@@", "<empty>"},
        {"@menu:", "<empty>"},
        {"@menu Cancel", "@menu Cancel"},  // a blank before any colon
        {"@a@b:Cancel", "@a@b:Cancel"},    // an '@' before any colon
        {"@menu", "@menu"},
        {"@", "@"},
        {"x@@Cancel", "x@@Cancel"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Unquote(c.token), c.value) << c.token;
    }
}

TEST_F(TokenTest, TranslationCalls) {
    const struct {
        const char* token;
        const char* value;
    } cases[] = {
        {"_(Hello)", "Hallo"},
        {"\"  _(Hello)\t \"", "Hallo"},  // surrounding white space goes with the call
        {"\"_( Hello )\"", " Hello "},   // the message is not trimmed
        {"_()", "<empty>"},
        {"x_(Hello)", "x_(Hello)"},
        {"_(Hello", "_(Hello"},
        {"\"_(Hello) x\"", "_(Hello) x"},
        {"_Hello)", "_Hello)"},
        {"_(", "_("},
        {"\"   \"", "   "},
        {"@@_(Hello)", "Hallo"},  // the translated text is expanded in turn
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Unquote(c.token), c.value) << c.token;
    }
}

TEST_F(TokenTest, MkTokenStringListForm) {
    const struct {
        const char* token;
        const char* value;
    } cases[] = {
        {"MkTokenString(a,b,c)", "a|b|c"},
        {"MkTokenString(a,NULL,b)", "a"},
        {"\"MkTokenString(a, NULL ,b)\"", "a"},
        {"\"MkTokenString(NULLx,b)\"", "NULLx|b"},
        {"MkTokenString(null,b)", "null|b"},
        {"MkTokenString(_(Red),_(Blue))", "Rot|Blau"},
        {"\"  MkTokenString ( a , _(Red) )  \"", " a |Rot"},  // item blanks kept
        {"MkTokenString(a,,b)", "a|b"},
        {"MkTokenString()", ""},
        {"MkTokenString(NULL)", ""},
        {"MkTokenString(single)", "single"},
        {"xMkTokenString(a,b)", "xMkTokenString(a,b)"},
        {"\"MkTokenString(a,b) x\"", "MkTokenString(a,b) x"},
        {"MkTokenString", "MkTokenString"},
        {"MkTokenString[a,b]", "MkTokenString[a,b]"},
        {"mktokenstring(a,b)", "mktokenstring(a,b)"},  // the keyword is case-sensitive
        // A keyword later in the value blocks the translation call as well.
        {"\"_(Hello) MkTokenString(a)\"", "_(Hello) MkTokenString(a)"},
        {"@@MkTokenString(a,b)", "x|y"},  // translated first, then expanded
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Unquote(c.token), c.value) << c.token;
    }
}

TEST_F(TokenTest, StringListEntriesUseTheSameRules) {
    char* tokens[] = {const_cast<char*>("\"a b\""), const_cast<char*>("@@Cancel"),
                      const_cast<char*>("\\q\\q"), const_cast<char*>("MkTokenString(p,q)"),
                      nullptr};
    PTNStringList list("l", nullptr);
    list.SetAsStringList(tokens);
    char** value = list.GetValue();
    ASSERT_EQ(CountStringList(value), 4);
    EXPECT_STREQ(value[0], "a b");
    EXPECT_STREQ(value[1], "Abbrechen");
    EXPECT_STREQ(value[2], "\"\"");
    EXPECT_STREQ(value[3], "p|q");
    EXPECT_STREQ(tokens[0], "\"a b\"");  // the tokens themselves are untouched
}

}  // namespace
