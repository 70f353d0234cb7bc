#include <dwxcore/dwxstring.h>

#include <gtest/gtest.h>

#include <string.h>

#include <string>

namespace {

bool OnNil(const DWXString& s) {
    return static_cast<const char*>(s) == &DWXString::chNil;
}

// The capacity, observed from outside: the length at which appending one more
// character first has to move the string to a new block. Changes `s`.
int ProbeCapacity(DWXString& s) {
    if (OnNil(s)) {
        return 0;
    }
    const char* block = s;
    while (static_cast<const char*>(s) == block) {
        s += 'x';
    }
    return s.GetLength();
}

std::string Bytes(const DWXString& s) {
    return std::string(static_cast<const char*>(s), static_cast<size_t>(s.GetLength()));
}

TEST(DWXString, EmptyStringsShareNilAndOwnNoBlock) {
    const char* nullText = nullptr;
    DWXString filled("abc");
    DWXString emptied("abc");
    emptied.Empty();
    DWXString empties[] = {
        DWXString(),         DWXString(DWXString()), DWXString(""),
        DWXString(nullText), DWXString(nullText, 4), DWXString("abc", 0),
        DWXString('x', 0),   DWXString('x', -3),     emptied,
        filled.Left(-1),     filled.Mid(4, 1),       DWXString() + DWXString(),
        DWXString() + "",    DWXFormat("%s", ""),
    };
    for (const DWXString& s : empties) {
        EXPECT_TRUE(OnNil(s));
        EXPECT_EQ(0, s.GetLength());
        EXPECT_EQ(1, s.IsEmpty());
        EXPECT_EQ(1, !s);
        EXPECT_STREQ("", s);
    }
    EXPECT_TRUE(OnNil(emptied));
    EXPECT_EQ(0, filled.IsEmpty());
}

TEST(DWXString, CapacitiesFollowTheGrowthRule) {
    DWXString built("abc");
    DWXString copy(built);
    DWXString concatenated = DWXString("ab") + "cd";
    DWXString assigned;
    assigned = "abcde";
    DWXString single;
    single = 'z';
    DWXString formatted = DWXFormat("%d", 1234);
    DWXString sub = DWXString("abcdefgh").Mid(2, 3);
    DWXString repeated('-', 5);

    struct Case {
        DWXString* s;
        const char* text;
        int capacity;
    } cases[] = {
        {&built, "abc", 4},       {&copy, "abc", 4},       {&concatenated, "abcd", 8},
        {&assigned, "abcde", 10}, {&single, "z", 2},       {&formatted, "1234", 8},
        {&sub, "cde", 6},         {&repeated, "-----", 6},
    };
    for (Case& c : cases) {
        EXPECT_STREQ(c.text, *c.s);
        EXPECT_EQ(c.capacity, ProbeCapacity(*c.s)) << c.text;
    }
}

TEST(DWXString, AppendingDoublesOnlyWhenFull) {
    DWXString s("abc");
    const char* first = s;
    s += 'd';  // needs 4 characters in a 4-byte block: a block of 8
    const char* second = s;
    EXPECT_NE(first, second);
    s += 'e';
    EXPECT_EQ(second, static_cast<const char*>(s));
    EXPECT_STREQ("abcde", s);
    EXPECT_EQ(8, ProbeCapacity(s));

    // Shorter assignments and truncation keep the block.
    DWXString t("abcdef");
    const char* block = t;
    t = "xy";
    t.SetLength(1);
    t = 'q';
    EXPECT_EQ(block, static_cast<const char*>(t));
    EXPECT_STREQ("q", t);
    EXPECT_EQ(7, ProbeCapacity(t));
}

TEST(DWXString, RepeatedAppendsMoveTheBlockLogarithmicallyOften) {
    DWXString s;
    int moves = 0;
    const char* block = s;
    for (int i = 0; i < 100000; ++i) {
        s += static_cast<char>('a' + i % 26);
        if (static_cast<const char*>(s) != block) {
            ++moves;
            block = s;
        }
    }
    EXPECT_EQ(100000, s.GetLength());
    EXPECT_LE(moves, 20);
    EXPECT_EQ('a' + 99999 % 26, s.GetAt(99999));
}

TEST(DWXString, EmbeddedNulsSurviveCopiesAndConcatenation) {
    DWXString s("a\0b", 3);
    DWXString copy(s);
    DWXString assigned;
    assigned = s;
    EXPECT_EQ(std::string("a\0b", 3), Bytes(copy));
    EXPECT_EQ(std::string("a\0b", 3), Bytes(assigned));
    EXPECT_EQ(std::string("a\0ba\0b", 6), Bytes(s + s));
    EXPECT_EQ(std::string("a\0bc", 4), Bytes(s + 'c'));
    EXPECT_EQ(std::string("xa\0b", 4), Bytes('x' + s));
    EXPECT_EQ(std::string("a\0b", 3), Bytes(s.Mid(0, 3)));
    EXPECT_EQ(std::string("\0b", 2), Bytes(s.Right(2)));
    s += s;
    EXPECT_EQ(std::string("a\0ba\0b", 6), Bytes(s));

    // C-string operations stop at the first NUL.
    EXPECT_EQ(1, s.Find('\0'));
    EXPECT_EQ(-1, s.Find('b'));
    EXPECT_EQ(0, s.Compare("a"));
}

TEST(DWXString, SelfAssignmentAndSelfAppending) {
    DWXString s("abc");
    DWXString& alias = s;
    s = alias;
    EXPECT_STREQ("abc", s);
    s += alias;  // the source lies in the block being replaced
    EXPECT_STREQ("abcabc", s);
    s += static_cast<const char*>(s) + 4;
    EXPECT_STREQ("abcabcbc", s);
    s = static_cast<const char*>(s) + 2;  // overlapping assignment
    EXPECT_STREQ("cabcbc", s);
}

TEST(DWXString, ConcatenationFormsAndNullTexts) {
    const char* none = nullptr;
    DWXString ab("ab");
    EXPECT_STREQ("abab", ab + ab);
    EXPECT_STREQ("abc", ab + 'c');
    EXPECT_STREQ("abcd", ab + "cd");
    EXPECT_STREQ("cab", 'c' + ab);
    EXPECT_STREQ("cdab", "cd" + ab);
    EXPECT_STREQ("ab", ab + none);
    EXPECT_STREQ("ab", none + ab);

    DWXString s("x");
    s += none;
    s += DWXString();
    EXPECT_STREQ("x", s);
    s = none;
    EXPECT_STREQ("", s);
}

TEST(DWXString, ComparisonsUseUnsignedBytes) {
    struct {
        const char* a;
        const char* b;
        int expected;
    } cases[] = {
        {"a", "b", -1},       {"a", "a", 0},         {"c", "b", 1},      {"\xc8", "\x64", 1},
        {"\x64", "\xc8", -1}, {"a\xc8", "a\x64", 1}, {"ab", "a", 1},     {"", "a", -1},
        {"", nullptr, 0},     {"a", nullptr, 1},     {"abc", "abd", -1},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(c.expected, DWXString(c.a).Compare(c.b)) << c.a << " / " << (c.b ? c.b : "null");
    }

    DWXString upper("ABC");
    EXPECT_EQ(0, upper.CompareNoCase("abc"));
    EXPECT_EQ(0, upper.Collate("abc"));
    EXPECT_LT(upper.CompareNoCase("abd"), 0);
    EXPECT_GT(upper.Collate("ab"), 0);
    EXPECT_GT(upper.CompareNoCase(nullptr), 0);
}

TEST(DWXString, Searches) {
    DWXString path("a/b/c");
    EXPECT_EQ(1, path.Find('/'));
    EXPECT_EQ(3, path.ReverseFind('/'));
    EXPECT_EQ(-1, path.Find('x'));
    EXPECT_EQ(-1, path.ReverseFind('x'));
    EXPECT_EQ(5, path.Find('\0'));
    EXPECT_EQ(2, path.Find("b/"));
    EXPECT_EQ(-1, path.Find("c/"));
    EXPECT_EQ(0, path.Find(""));
    EXPECT_EQ(0, path.Find(static_cast<const char*>(nullptr)));
    EXPECT_EQ(0, DWXString().Find(""));
    EXPECT_EQ(-1, DWXString().Find('a'));
}

TEST(DWXString, Substrings) {
    DWXString abc("abc");
    DWXString abcd("abcd");
    struct {
        DWXString result;
        const char* expected;
    } cases[] = {
        {abc.Left(10), "abc"},   {abc.Left(2), "ab"},      {abc.Left(0), ""},
        {abc.Left(-1), ""},      {abc.Right(10), "abc"},   {abc.Right(2), "bc"},
        {abc.Right(-5), ""},     {abcd.Mid(1, -1), "bcd"}, {abcd.Mid(1), "bcd"},
        {abcd.Mid(2, 10), "cd"}, {abcd.Mid(1, 2), "bc"},   {abcd.Mid(4, 1), ""},
        {abcd.Mid(5, 1), ""},    {abcd.Mid(-2, 2), "ab"},  {abcd.Mid(-2, -1), "abcd"},
        {abcd.Mid(1, -2), ""},   {abcd.Mid(0, 0), ""},
    };
    for (const auto& c : cases) {
        EXPECT_STREQ(c.expected, c.result);
        EXPECT_EQ(static_cast<int>(strlen(c.expected)), c.result.GetLength());
    }
}

TEST(DWXString, SetLengthSetAtAndGetAt) {
    DWXString s("ab");
    s.SetLength(5);
    EXPECT_STREQ("ab   ", s);
    EXPECT_EQ(5, s.GetLength());

    DWXString t("abc");
    t.SetLength(1);
    EXPECT_STREQ("a", t);
    EXPECT_EQ(4, ProbeCapacity(t));

    DWXString u("abc");
    u.SetLength(-4);
    EXPECT_STREQ("", u);
    EXPECT_EQ(0, u.GetLength());

    DWXString empty;
    empty.SetLength(0);
    empty.SetLength(-1);
    EXPECT_TRUE(OnNil(empty));
    empty.SetLength(2);
    EXPECT_STREQ("  ", empty);

    DWXString v("abc");
    v.SetAt(3, 'd');
    EXPECT_STREQ("abcd", v);
    v.SetAt(0, 'A');
    v.SetAt(-1, 'x');
    v.SetAt(9, 'x');
    EXPECT_STREQ("Abcd", v);
    EXPECT_EQ(4, v.GetLength());
    EXPECT_EQ('A', v.GetAt(0));
    EXPECT_EQ('\0', v.GetAt(4));
    EXPECT_EQ('\0', v.GetAt(5));
    EXPECT_EQ('\0', v.GetAt(-1));
    v[1] = 'B';
    EXPECT_EQ('B', v[1]);

    DWXString w;
    w.SetAt(0, 'q');
    EXPECT_STREQ("q", w);
}

TEST(DWXString, CaseChangesAndNumbers) {
    DWXString s("MiXed 1");
    EXPECT_STREQ("MIXED 1", s.MakeUpper());
    EXPECT_STREQ("mixed 1", s.MakeLower().MakeLower());
    DWXString empty;
    empty.MakeUpper().MakeLower();  // chNil is read-only; nothing may be written
    EXPECT_TRUE(OnNil(empty));

    EXPECT_EQ(42, DWXString("42abc").ToInt());
    EXPECT_EQ(-7, DWXString(" -7").ToInt());
    EXPECT_EQ(0, DWXString().ToInt());
    EXPECT_DOUBLE_EQ(2.5, DWXString("2.5x").ToDouble());
    EXPECT_DOUBLE_EQ(0.0, DWXString().ToDouble());
    EXPECT_DOUBLE_EQ(12.0, DWXString("12.5", 2).ToDouble());
}

TEST(DWXString, FormatHandlesTextOfAnyLength) {
    for (int length : {1, 255, 256, 30999, 31000, 31001, 100000}) {
        std::string expected(static_cast<size_t>(length), 'x');
        expected += "|7";
        DWXString made =
            DWXFormat("%s|%d", std::string(static_cast<size_t>(length), 'x').c_str(), 7);
        EXPECT_EQ(expected, Bytes(made)) << length;

        DWXString replaced("old text that is longer than nothing");
        replaced.Format("%s|%d", std::string(static_cast<size_t>(length), 'x').c_str(), 7);
        EXPECT_EQ(expected, Bytes(replaced)) << length;
    }

    DWXString s("abc");
    s.Format("%s", "");
    EXPECT_STREQ("", s);
    s.Format(nullptr);
    EXPECT_STREQ("", s);
    EXPECT_TRUE(OnNil(DWXFormat(nullptr)));
}

TEST(DWXString, FormatMayReadItsOwnBuffer) {
    DWXString s("abc");
    s.Format("%s-%s", static_cast<const char*>(s), static_cast<const char*>(s));  // grows
    EXPECT_STREQ("abc-abc", s);
    s.Format("<%s>", static_cast<const char*>(s) + 4);  // fits the block
    EXPECT_STREQ("<abc>", s);
    std::string big(1000, 'y');
    s.Format("%s", big.c_str());
    s.Format("%s%s", static_cast<const char*>(s) + 500, "!");  // fits, above the stack scratch
    EXPECT_EQ(std::string(500, 'y') + "!", Bytes(s));
}

}  // namespace
