#include "../fuzz/string_model.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace {

bool OnNil(const DWXString& s) {
    return static_cast<const char*>(s) == &DWXString::chNil;
}

// Each run ends with single-character appends across several block moves, from
// whatever the run left. Zero bytes are common, so NULs, empty and null texts
// and the lowest indexes come often.
TEST(DWXString, MatchesTheModelOverSeededRuns) {
    std::mt19937 random(19);
    for (int run = 0; run < 2000; ++run) {
        std::vector<uint8_t> bytes(4096);
        std::generate(bytes.begin(), bytes.end(), [&] { return random() % 4 ? random() : 0; });
        FuzzInput input(bytes.data(), bytes.size());
        StringModel model;
        model.Run(input, 64);
        for (int i = 0; i < 100; ++i) {
            model.Apply(StringModel::kAppendChar, input);
            model.Check(input);
        }
    }
}

// Empty strings share chNil, which nothing writes.
TEST(DWXString, EmptyStringsShareNil) {
    DWXString abc("abc"), emptied("abc"), empty;
    emptied.Empty();
    for (const DWXString& s :
         {DWXString(), DWXString(""), DWXString(nullptr, 4), DWXString('x', -3), emptied,
          abc.Left(-1), abc.Mid(4, 1), DWXFormat("%c", 0), DWXString() + DWXString()}) {
        EXPECT_TRUE(OnNil(s) && s.GetLength() == 0 && !s);
    }
    empty.MakeUpper().MakeLower().SetLength(-1);
    empty[empty.GetLength()] = '\0';  // the terminator of chNil is written elsewhere
    EXPECT_TRUE(OnNil(empty));
    EXPECT_TRUE(abc.CompareNoCase("ABC") == 0 && abc.CompareNoCase("ABD") < 0);
    EXPECT_STREQ("ABC", abc.MakeUpper());
}

// A block made to size holds one byte more than the text; one grown holds
// twice the need; shrinking keeps the block. The capacity shows as the length
// at which appending one more character moves the string to a new block.
TEST(DWXString, CapacitiesFollowTheGrowthRule) {
    DWXString made("abc"), repeated('-', 2), added = DWXString("ab") + "cd";
    DWXString formatted = DWXFormat("%d", 1234), mid = DWXString("abcdefgh").Mid(2, 3);
    DWXString assigned, single, appended("abc"), truncated("abc"), cut('-', 304);
    assigned = "abcde";
    single = 'z';
    appended += 'd';
    truncated.SetLength(1);
    // The formatted text fills the block exactly, but only 300 bytes are kept: a
    // block sized for those.
    cut.Format("%s%c%s", std::string(300, 'a').c_str(), 0, "tail");
    const std::pair<DWXString*, int> cases[] = {
        {&made, 4},      {&repeated, 3}, {&added, 8},    {&formatted, 8}, {&mid, 6},
        {&assigned, 10}, {&single, 2},   {&appended, 8}, {&truncated, 4}, {&cut, 600}};
    for (const auto& [s, capacity] : cases) {
        for (const char* block = *s; block == static_cast<const char*>(*s);) {
            *s += 'x';
        }
        EXPECT_EQ(capacity, s->GetLength()) << capacity;
    }
}

// Texts longer than any stack scratch, into a new block or the string's own.
TEST(DWXString, FormatHandlesLongText) {
    const std::string text(100000, 'x');
    DWXString s("previous text");
    s.Format("%s|%d", text.c_str(), 7);
    EXPECT_TRUE(s.GetLength() == 100002 && text + "|7" == static_cast<const char*>(s));
    s.Format("%.500s!", static_cast<const char*>(s) + 1000);  // fits the block it reads
    EXPECT_EQ(std::string(500, 'x') + "!", static_cast<const char*>(s));
    EXPECT_DOUBLE_EQ(12.0, DWXString("12.5", 2).ToDouble());  // stops at the length
}

}  // namespace
