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

// Model input with many zero bytes, so that NULs, empty texts and the lowest
// indexes come often.
std::vector<uint8_t> SeededBytes(std::mt19937& random, size_t size) {
    std::vector<uint8_t> bytes(size);
    for (uint8_t& byte : bytes) {
        byte = random() % 4 ? static_cast<uint8_t>(random()) : 0;
    }
    return bytes;
}

TEST(DWXString, MatchesTheModelOverSeededRuns) {
    std::mt19937 random(19);
    for (int run = 0; run < 2000; ++run) {
        const std::vector<uint8_t> bytes = SeededBytes(random, 1024);
        FuzzInput input(bytes.data(), bytes.size());
        StringModel().Run(input, 64);
    }
}

// Strings left by every operation, NULs and spare room included, take 300
// single-character appends across several block moves.
TEST(DWXString, CharAppendsAfterEveryOperation) {
    std::mt19937 random(5);
    for (int operation = 0; operation < StringModel::kOperations; ++operation) {
        const std::vector<uint8_t> bytes = SeededBytes(random, 8192);
        FuzzInput input(bytes.data(), bytes.size());
        StringModel model;
        model.Apply(0, input);
        model.Apply(operation, input);
        for (int i = 0; i < 300; ++i) {
            model.Apply(StringModel::kAppendChar, input);
            model.Check(input);
        }
    }
}

TEST(DWXString, EmptyStringsShareNilAndNeverWriteIt) {
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
}

// A null C string reads as "".
TEST(DWXString, NullTextIsEmpty) {
    const char* none = nullptr;
    DWXString ab("ab");
    EXPECT_STREQ("abab", (ab + none) + (none + ab));
    ab += none;
    EXPECT_TRUE(ab.Compare(none) == 1 && ab.Find(none) == 0 && ab.CompareNoCase(none) > 0);
    ab.Format(nullptr);
    EXPECT_EQ("", Bytes(ab));
}

// A new block holds one byte more than the text when made to size, twice the
// need when grown; shrinking keeps the block.
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
