#include <dwxcore/dwxstring.h>

#include <gtest/gtest.h>

#include <string>

namespace {

bool OnNil(const DWXString& s) {
    return static_cast<const char*>(s) == &DWXString::chNil;
}

// The capacity, observed from outside: the length at which appending one more
// character first moves the string to a new block. Changes `s`.
int ProbeCapacity(DWXString& s) {
    const char* block = s;
    while (!OnNil(s) && static_cast<const char*>(s) == block) {
        s += 'x';
    }
    return OnNil(s) ? 0 : s.GetLength();
}

std::string Bytes(const DWXString& s) {
    return std::string(static_cast<const char*>(s), static_cast<size_t>(s.GetLength()));
}

TEST(DWXString, EmptyStringsShareNilAndOwnNoBlock) {
    DWXString abc("abc"), emptied("abc");
    emptied.Empty();
    const char* none = nullptr;
    for (const DWXString& s :
         {DWXString(), DWXString(DWXString()), DWXString(""), DWXString(none), DWXString(none, 4),
          DWXString('x', -3), emptied, abc.Left(-1), abc.Mid(4, 1), DWXFormat("%s", "")}) {
        EXPECT_TRUE(OnNil(s));
        EXPECT_EQ(0, s.GetLength());
        EXPECT_EQ(1, !s);
    }
    DWXString empty;
    empty.MakeUpper().SetLength(-1);  // nothing may be written into chNil
    EXPECT_TRUE(OnNil(empty));
}

TEST(DWXString, CapacitiesFollowTheGrowthRule) {
    DWXString assigned, single, appended("abc");
    assigned = "abcde";
    single = 'z';
    appended += 'd';  // 4 characters do not fit the 4-byte block: 8 bytes, kept for 'e'
    appended += 'e';
    DWXString truncated("abc");
    truncated.SetLength(1);

    struct {
        DWXString s;
        const char* text;
        int capacity;
    } cases[] = {
        {DWXString("abc"), "abc", 4},       {DWXString(appended), "abcde", 6},
        {DWXString('-', 2), "--", 3},       {DWXString("ab") + "cd", "abcd", 8},
        {DWXFormat("%d", 1234), "1234", 8}, {DWXString("abcdefgh").Mid(2, 3), "cde", 6},
    };
    for (auto& c : cases) {
        EXPECT_EQ(c.text, Bytes(c.s));
        EXPECT_EQ(c.capacity, ProbeCapacity(c.s)) << c.text;
    }
    EXPECT_EQ(8, ProbeCapacity(appended));
    EXPECT_EQ(10, ProbeCapacity(assigned));
    EXPECT_EQ(2, ProbeCapacity(single));
    EXPECT_EQ(4, ProbeCapacity(truncated));
}

TEST(DWXString, RepeatedAppendsMoveTheBlockLogarithmicallyOften) {
    DWXString s;
    int moves = 0;
    for (int i = 0; i < 100000; ++i) {
        const char* block = s;
        s += static_cast<char>('a' + i % 26);
        moves += static_cast<const char*>(s) != block;
    }
    EXPECT_EQ(100000, s.GetLength());
    EXPECT_LE(moves, 18);
}

TEST(DWXString, EmbeddedNulsSurviveCopiesAndConcatenation) {
    DWXString s("a\0b", 3), assigned;
    assigned = s;
    EXPECT_EQ(std::string("a\0b", 3), Bytes(DWXString(s)));
    EXPECT_EQ(std::string("a\0b", 3), Bytes(assigned));
    EXPECT_EQ(std::string("a\0bc", 4), Bytes(s + 'c'));
    EXPECT_EQ(std::string("\0b", 2), Bytes(s.Right(2)));
    s += s;  // appending to itself: the source lies in the block being replaced
    EXPECT_EQ(std::string("a\0ba\0b", 6), Bytes(s));
    EXPECT_EQ(1, s.Find('\0'));  // C-string operations stop at the first NUL
    EXPECT_EQ(0, s.Compare("a"));

    DWXString t("abc");
    t += static_cast<const char*>(t) + 1;
    t = static_cast<const char*>(t) + 1;  // overlapping assignment
    EXPECT_STREQ("bcbc", t);
}

TEST(DWXString, ConcatenationFormsTakeNullAsEmpty) {
    const char* none = nullptr;
    DWXString ab("ab");
    EXPECT_STREQ("abab|abc|abcd|cab|cdab", ab + ab + '|' + (ab + 'c') + "|" + (ab + "cd") + '|' +
                                               ('c' + ab) + "|" + ("cd" + ab));
    EXPECT_STREQ("abab", (ab + none) + (none + ab));
    ab += none;
    EXPECT_STREQ("ab", ab);
}

TEST(DWXString, ComparisonsAndSearches) {
    struct {
        const char *a, *b;
        int expected;
    } cases[] = {{"a", "b", -1},         {"a", "a", 0},  {"c", "b", 1},   {"\xc8", "\x64", 1},
                 {"a\x64", "a\xc8", -1}, {"ab", "a", 1}, {"", nullptr, 0}};
    for (const auto& c : cases) {
        EXPECT_EQ(c.expected, DWXString(c.a).Compare(c.b)) << c.a;
    }
    DWXString upper("ABC");
    EXPECT_EQ(0, upper.CompareNoCase("abc"));
    EXPECT_EQ(0, upper.Collate("abc"));
    EXPECT_LT(upper.CompareNoCase("abd"), 0);

    DWXString path("a/b/c");
    EXPECT_EQ(-1, path.Find('x'));
    EXPECT_EQ(3, path.ReverseFind('/'));
    EXPECT_EQ(2, path.Find("b/"));
    EXPECT_EQ(0, path.Find(""));
    EXPECT_EQ(0, path.Find(static_cast<const char*>(nullptr)));
}

TEST(DWXString, SubstringsAndEdits) {
    DWXString abc("abc"), abcd("abcd");
    struct {
        DWXString result;
        const char* expected;
    } cases[] = {
        {abc.Left(10), "abc"},   {abc.Left(-1), ""},      {abc.Right(10), "abc"},
        {abc.Right(2), "bc"},    {abc.Right(-5), ""},     {abcd.Mid(1, -1), "bcd"},
        {abcd.Mid(2, 10), "cd"}, {abcd.Mid(1, 2), "bc"},  {abcd.Mid(4, 1), ""},
        {abcd.Mid(5, 1), ""},    {abcd.Mid(-2, 2), "ab"}, {abcd.Mid(1, -2), ""},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(c.expected, Bytes(c.result));
    }

    DWXString s("ab");
    s.SetLength(5);
    EXPECT_EQ("ab   ", Bytes(s));
    s.SetLength(-4);
    EXPECT_EQ("", Bytes(s));
    s = "abc";
    s.SetAt(3, 'd');
    s.SetAt(-1, 'x');
    s.SetAt(9, 'x');
    s[0] = 'A';
    EXPECT_EQ("Abcd", Bytes(s));
    EXPECT_EQ('\0', s.GetAt(4));
    EXPECT_EQ('\0', s.GetAt(-1));
    EXPECT_STREQ("ABCD", s.MakeUpper());
    EXPECT_STREQ("abcd", s.MakeLower());

    EXPECT_EQ(42 + DWXString().ToInt(), DWXString("42abc").ToInt());
    EXPECT_DOUBLE_EQ(12.0, DWXString("12.5", 2).ToDouble());  // stops at the length
}

TEST(DWXString, FormatHandlesTextOfAnyLength) {
    for (int length : {255, 256, 30999, 31000, 100000}) {
        std::string text(static_cast<size_t>(length), 'x');
        DWXString made = DWXFormat("%s|%d", text.c_str(), 7);
        DWXString replaced("previous text");
        replaced.Format("%s|%d", text.c_str(), 7);
        EXPECT_EQ(text + "|7", Bytes(made));
        EXPECT_EQ(text + "|7", Bytes(replaced));
    }
    DWXString s("abc");  // formats may read the string's own buffer
    s.Format("%s-%s", static_cast<const char*>(s), static_cast<const char*>(s));  // grows
    s.Format("<%s>", static_cast<const char*>(s) + 4);                            // fits the block
    EXPECT_EQ("<abc>", Bytes(s));
    s = std::string(1000, 'y').c_str();
    s.Format("%s!", static_cast<const char*>(s) + 500);  // fits; longer than a stack scratch
    EXPECT_EQ(std::string(500, 'y') + "!", Bytes(s));
    s.Format(nullptr);
    EXPECT_EQ("", Bytes(s));
}

TEST(DWXString, FormattedTextEndsAtANulAndAnEmptyTerminatorIsWritable) {
    const std::string longText(300, 'a');
    for (const char* previous : {"", "x", "a block larger than the formatted text, by far"}) {
        DWXString s(previous);
        s.Format("a%cb", 0);
        EXPECT_EQ("a", Bytes(s)) << previous;
        s = previous;
        s.Format("%s%c%s", longText.c_str(), 0, "tail");
        EXPECT_EQ(longText, Bytes(s)) << previous;
        EXPECT_EQ(600, ProbeCapacity(s));  // sized for the kept text, by the growth rule
    }
    EXPECT_EQ("ab", Bytes(DWXFormat("%s%c%s", "ab", 0, "cd")));
    EXPECT_TRUE(OnNil(DWXFormat("%c", 0)));

    DWXString e, cut("abc");
    e[e.GetLength()] = '\0';  // chNil is read-only
    cut.SetLength(0);
    cut[cut.GetLength()] = '\0';
    EXPECT_TRUE(OnNil(e));
    EXPECT_EQ("", Bytes(cut));
}

}  // namespace

namespace {

TEST(DWXString, CharAppendsFromEveryKindOfString) {
    DWXString nil, exact("xy"), truncated("abcdef"), formatted = DWXFormat("%d", 42);
    DWXString nuls("a\0b", 3);
    truncated.SetLength(2);  // a block with room to spare
    struct {
        DWXString* s;
        std::string text;
    } cases[] = {{&nil, ""},
                 {&exact, "xy"},
                 {&truncated, "ab"},
                 {&formatted, "42"},
                 {&nuls, std::string("a\0b", 3)}};
    for (auto& c : cases) {
        for (int i = 0; i < 300; ++i) {
            char ch = i % 7 == 0 ? '\0' : static_cast<char>('a' + i % 26);
            *c.s += ch;
            c.text += ch;
            const char* data = *c.s;
            ASSERT_EQ(std::string(data, static_cast<size_t>(c.s->GetLength())), c.text);
            ASSERT_EQ(data[c.s->GetLength()], '\0') << "after " << i + 1 << " appends";
        }
    }
}

}  // namespace
