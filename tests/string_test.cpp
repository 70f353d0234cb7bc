#include "../fuzz/string_model.h"

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

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

// Each run ends with single-character appends across several block moves, from
// whatever the run left. Zero bytes are common, so NULs, empty texts and the
// lowest indexes come often.
TEST(DWXString, MatchesTheModelOverSeededRuns) {
    std::mt19937 random(19);
    for (int run = 0; run < 2000; ++run) {
        std::vector<uint8_t> bytes(4096);
        for (uint8_t& byte : bytes) {
            byte = random() % 4 ? static_cast<uint8_t>(random()) : 0;
        }
        FuzzInput input(bytes.data(), bytes.size());
        StringModel model;
        model.Run(input, 64);
        for (int i = 0; i < 100; ++i) {
            model.Apply(StringModel::kAppendChar, input);
            model.Check(input);
        }
    }
}

// Empty strings share chNil, which nothing writes; a null C string reads as "".
TEST(DWXString, EmptyAndNullStrings) {
    DWXString abc("abc"), emptied("abc");
    emptied.Empty();
    const char* none = nullptr;
    for (const DWXString& s :
         {DWXString(), DWXString(DWXString()), DWXString(""), DWXString(none), DWXString(none, 4),
          DWXString('x', -3), emptied, abc.Left(-1), abc.Mid(4, 1), DWXFormat("%s", ""),
          DWXFormat("%c", 0), DWXString() + DWXString(), none + DWXString()}) {
        EXPECT_TRUE(OnNil(s) && s.GetLength() == 0 && !s);
    }
    DWXString empty;
    empty.MakeUpper().SetLength(-1);
    empty[empty.GetLength()] = '\0';  // the terminator of chNil is written elsewhere
    EXPECT_TRUE(OnNil(empty));

    EXPECT_STREQ("abcabc", (abc + none) + (none + abc));
    abc += none;
    EXPECT_TRUE(abc.Compare(none) == 1 && abc.Find(none) == 0 && abc.CompareNoCase(none) > 0);
    EXPECT_TRUE(abc.CompareNoCase("ABC") == 0 && abc.CompareNoCase("ABD") < 0);
    abc.Format(nullptr);
    EXPECT_TRUE(OnNil(abc) || Bytes(abc).empty());
}

// A block made to size holds one byte more than the text; one grown holds
// twice the need; shrinking keeps the block.
TEST(DWXString, CapacitiesFollowTheGrowthRule) {
    struct {
        DWXString s;
        int capacity;
    } cases[] = {
        {DWXString("abc"), 4},
        {DWXString('-', 2), 3},
        {DWXString("ab") + "cd", 8},
        {DWXFormat("%d", 1234), 8},
        {DWXString("abcdefgh").Mid(2, 3), 6},
    };
    for (auto& c : cases) {
        EXPECT_EQ(c.capacity, ProbeCapacity(c.s)) << c.capacity;
    }
    DWXString assigned, single, appended("abc"), truncated("abc"), cut("previous");
    assigned = "abcde";
    single = 'z';
    appended += 'd';
    truncated.SetLength(1);
    cut.Format("%s%c%s", std::string(300, 'a').c_str(), 0, "tail");  // sized for the kept text
    EXPECT_EQ(10, ProbeCapacity(assigned));
    EXPECT_EQ(2, ProbeCapacity(single));
    EXPECT_EQ(8, ProbeCapacity(appended));
    EXPECT_EQ(4, ProbeCapacity(truncated));
    EXPECT_EQ(600, ProbeCapacity(cut));
}

// Texts longer than any stack scratch, into a new block or the string's own.
TEST(DWXString, FormatHandlesLongText) {
    const std::string text(100000, 'x');
    DWXString made = DWXFormat("%s|%d", text.c_str(), 7), s("previous text");
    s.Format("%s|%d", text.c_str(), 7);
    EXPECT_EQ(text + "|7", Bytes(made));
    EXPECT_EQ(text + "|7", Bytes(s));
    s.Format("%.500s!", static_cast<const char*>(s) + 1000);  // fits the block it reads
    EXPECT_EQ(std::string(500, 'x') + "!", Bytes(s));
    EXPECT_DOUBLE_EQ(12.0, DWXString("12.5", 2).ToDouble());  // stops at the length
}

}  // namespace
