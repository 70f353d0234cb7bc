// The list leaves: rendered texts, reading from text and tokens, copies and
// the SetFrom rules that differ between numeric and string lists.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/utilhub.h>

#include <limits.h>
#include <stdlib.h>

#include <memory>
#include <string>
#include <vector>

namespace {

std::string Text(const DWXParseTreeNode& node) {
    char* text = node.GetAsString();
    std::string result(text);
    free(text);
    return result;
}

template <class List, class T>
std::vector<T> Elements(const List& list) {
    int count = -1;
    T* values = list.GetValue(&count);
    EXPECT_EQ(list.GetValue(nullptr), values);
    return values != nullptr ? std::vector<T>(values, values + count) : std::vector<T>();
}

std::vector<int> Ints(const PTNIntegerList& l) {
    return Elements<PTNIntegerList, int>(l);
}
std::vector<int> Ints(const PTNInteger32List& l) {
    return Elements<PTNInteger32List, int>(l);
}
std::vector<double> Doubles(const PTNDoubleList& l) {
    return Elements<PTNDoubleList, double>(l);
}

TEST(ParseListTest, NumericListTexts) {
    const int ints[] = {1, -2, 30};
    const int seven[] = {7};
    const int extremes[] = {INT_MIN, INT_MAX};
    const double doubles[] = {1.5, -0.1, 640, 1e300};
    EXPECT_EQ(Text(PTNIntegerList("l", 3, ints)), "1 -2 30");
    EXPECT_EQ(Text(PTNInteger32List("l", 3, ints)), "1.000000 -2.000000 30.000000");
    EXPECT_EQ(Text(PTNIntegerList("l", 1, seven)), "7");
    EXPECT_EQ(Text(PTNInteger32List("l", 1, seven)), "7.000000");
    EXPECT_EQ(Text(PTNIntegerList("l", 2, extremes)), "-2147483648 2147483647");
    EXPECT_EQ(Text(PTNInteger32List("l", 2, extremes)), "-2147483648.000000 2147483647.000000");
    EXPECT_EQ(Text(PTNIntegerList("l", 0, ints)), "");
    EXPECT_EQ(Text(PTNInteger32List("l", 0, nullptr)), "");
    EXPECT_EQ(Text(PTNDoubleList("l", 0, doubles)), "");

    PTNDoubleList list("l", 4, doubles);
    PTNDoubleList back("l", 0, nullptr);
    back.SetAsString(Text(list).c_str());
    EXPECT_EQ(Doubles(back), Doubles(list));
}

TEST(ParseListTest, StringListTexts) {
    char* entries[] = {const_cast<char*>("x"), const_cast<char*>("y z"), nullptr};
    char* awkward[] = {const_cast<char*>(""), const_cast<char*>("say \"a\"\\"),
                       const_cast<char*>("l1\nl2"), nullptr};
    char* none[] = {nullptr};
    EXPECT_EQ(Text(PTNStringList("l", entries)), "\"x\" \"y z\"");
    EXPECT_EQ(Text(PTNStringList("l", awkward)), "\"\" \"say \\qa\\q\\\\\" \"l1\\nl2\"");
    EXPECT_EQ(Text(PTNStringList("l", none)), "");
    EXPECT_EQ(Text(PTNStringList("l", nullptr)), "");
}

TEST(ParseListTest, NumericListsReadWordsFromText) {
    const struct {
        const char* text;
        std::vector<int> integers;
        std::vector<int> truncated;
        std::vector<double> doubles;
    } cases[] = {
        {"1e3 2.9 -2.9", {1, 2, -2}, {1000, 2, -2}, {1000, 2.9, -2.9}},
        {"4 x 5", {4, 0, 5}, {4, 0, 5}, {4, 0, 5}},
        {"  7\t\n8  ", {7, 8}, {7, 8}, {7, 8}},
        {"", {}, {}, {}},
        {"   ", {}, {}, {}},
        {nullptr, {}, {}, {}},
    };
    for (const auto& c : cases) {
        const char* label = c.text ? c.text : "(null)";
        const int old[] = {42, 43};
        const double oldDoubles[] = {4.2};
        PTNIntegerList integers("l", 2, old);
        PTNInteger32List truncated("l", 2, old);
        PTNDoubleList doubles("l", 1, oldDoubles);
        integers.SetAsString(c.text);
        truncated.SetAsString(c.text);
        doubles.SetAsString(c.text);
        EXPECT_EQ(Ints(integers), c.integers) << label;
        EXPECT_EQ(Ints(truncated), c.truncated) << label;
        EXPECT_EQ(Doubles(doubles), c.doubles) << label;
    }
}

TEST(ParseListTest, Integer32ListClampsWordsBeyondTheRangeOfInt) {
    PTNInteger32List list("l", 0, nullptr);
    list.SetAsString("1e20 -1e20 nan 2147483647.9 -2147483648.9");
    EXPECT_EQ(Ints(list), (std::vector<int>{INT_MAX, INT_MIN, 0, INT_MAX, INT_MIN}));
}

TEST(ParseListTest, ValuesAreCopiesOfTheCallersArrays) {
    int values[] = {1, 2, 3};
    double doubles[] = {0.5};
    PTNIntegerList list("l", 3, values);
    PTNDoubleList doubleList("d", 1, doubles);
    values[0] = 99;
    doubles[0] = 99;
    EXPECT_EQ(Ints(list), (std::vector<int>{1, 2, 3}));
    EXPECT_EQ(Doubles(doubleList), (std::vector<double>{0.5}));
    list.SetValue(2, values);
    values[1] = 98;
    EXPECT_EQ(Ints(list), (std::vector<int>{99, 2}));
    int* own = list.GetValue(nullptr);
    list.SetValue(1, own);  // its own array
    EXPECT_EQ(Ints(list), (std::vector<int>{99}));
    list.SetValue(0, values);
    EXPECT_EQ(Ints(list), std::vector<int>{});
    list.SetValue(-3, values);  // a negative count empties the list
    EXPECT_EQ(Ints(list), std::vector<int>{});
    PTNIntegerList negative("l", -1, values);
    EXPECT_EQ(negative.GetValue(nullptr), nullptr);

    char a[] = "a";
    char* entries[] = {a, nullptr};
    PTNStringList strings("s", entries);
    a[0] = 'b';
    EXPECT_STREQ(strings.GetValue()[0], "a");
    strings.SetValue(strings.GetValue());
    EXPECT_STREQ(strings.GetValue()[0], "a");
    strings.SetValue(nullptr);
    EXPECT_EQ(strings.GetValue(), nullptr);
}

TEST(ParseListTest, SetAsStringListUnquotesEveryToken) {
    char* tokens[] = {const_cast<char*>("\"y z\""), const_cast<char*>("\"\""),
                      const_cast<char*>("a\\nb"), nullptr};
    char* empty[] = {nullptr};
    PTNStringList list("l", nullptr);
    list.SetAsStringList(tokens);
    ASSERT_EQ(CountStringList(list.GetValue()), 3);
    EXPECT_STREQ(list.GetValue()[0], "y z");
    EXPECT_STREQ(list.GetValue()[1], "");
    EXPECT_STREQ(list.GetValue()[2], "a\nb");
    EXPECT_EQ(Text(list), "\"y z\" \"\" \"a\\nb\"");
    list.SetAsStringList(empty);
    ASSERT_NE(list.GetValue(), nullptr);
    EXPECT_EQ(CountStringList(list.GetValue()), 0);
    EXPECT_EQ(Text(list), "");
}

TEST(ParseListTest, NumericSetFromNeverEmptiesAndTestsTheClass) {
    const int old[] = {1, 2};
    const int fresh[] = {5, 6, 7};
    const double doubles[] = {9.5};
    PTNIntegerList list("l", 2, old);
    PTNIntegerList empty("e", 0, nullptr);
    PTNInteger32List other32("o", 3, fresh);
    PTNDoubleList otherDoubles("d", 1, doubles);
    list.SetFrom(&empty);
    list.SetFrom(&other32);
    list.SetFrom(&otherDoubles);
    list.SetFrom(nullptr);
    EXPECT_EQ(Ints(list), (std::vector<int>{1, 2}));

    PTNIntegerList source("s", 3, fresh);
    list.SetFrom(&source);
    source.SetValue(1, old);
    EXPECT_EQ(Ints(list), (std::vector<int>{5, 6, 7}));
    EXPECT_STREQ(list.GetName(), "l");

    PTNInteger32List list32("l", 2, old);
    list32.SetFrom(&other32);
    EXPECT_EQ(Ints(list32), (std::vector<int>{5, 6, 7}));
    PTNDoubleList doubleList("l", 0, nullptr);
    doubleList.SetFrom(&otherDoubles);
    doubleList.SetFrom(&doubleList);
    EXPECT_EQ(Doubles(doubleList), (std::vector<double>{9.5}));
}

TEST(ParseListTest, StringSetFromCopiesWhateverTheSourceHolds) {
    char* entries[] = {const_cast<char*>("keep"), nullptr};
    char* none[] = {nullptr};
    PTNStringList list("l", entries);
    PTNStringList empty("e", none);
    PTNStringList absent("n", nullptr);
    const int ints[] = {1};
    PTNIntegerList numbers("i", 1, ints);
    list.SetFrom(&numbers);
    EXPECT_STREQ(list.GetValue()[0], "keep");
    list.SetFrom(&list);
    EXPECT_STREQ(list.GetValue()[0], "keep");
    list.SetFrom(&empty);
    ASSERT_NE(list.GetValue(), nullptr);
    EXPECT_EQ(CountStringList(list.GetValue()), 0);
    list.SetFrom(&absent);
    EXPECT_EQ(list.GetValue(), nullptr);
}

TEST(ParseListTest, CopiesAreDeep) {
    const int ints[] = {3, 4};
    const double doubles[] = {1.25, 2.5};
    char* entries[] = {const_cast<char*>("a"), const_cast<char*>("b c"), nullptr};
    auto integers = std::make_unique<PTNIntegerList>("i", 2, ints);
    auto integers32 = std::make_unique<PTNInteger32List>("j", 2, ints);
    auto doubleList = std::make_unique<PTNDoubleList>("d", 2, doubles);
    auto strings = std::make_unique<PTNStringList>("s", entries);
    std::unique_ptr<DWXParseTreeNode> copies[] = {
        std::unique_ptr<DWXParseTreeNode>(integers->Copy()),
        std::unique_ptr<DWXParseTreeNode>(integers32->Copy()),
        std::unique_ptr<DWXParseTreeNode>(doubleList->Copy()),
        std::unique_ptr<DWXParseTreeNode>(strings->Copy()),
    };
    PTNIntegerList constructed(*integers);
    PTNInteger32List constructed32(*integers32);
    PTNDoubleList constructedDoubles(*doubleList);
    PTNStringList constructedStrings(*strings);
    PTNIntegerList assigned("x", 0, nullptr);
    assigned = *integers;
    PTNStringList assignedStrings("x", nullptr);
    assignedStrings = *strings;
    const PTNStringList& alias = assignedStrings;
    assignedStrings = alias;
    const std::string texts[] = {Text(*integers), Text(*integers32), Text(*doubleList),
                                 Text(*strings)};
    integers.reset();
    integers32.reset();
    doubleList.reset();
    strings.reset();
    for (int i = 0; i < 4; ++i) {
        EXPECT_EQ(Text(*copies[i]), texts[i]);
    }
    EXPECT_EQ(Text(constructed), texts[0]);
    EXPECT_EQ(Text(assigned), texts[0]);
    EXPECT_STREQ(assigned.GetName(), "i");
    EXPECT_EQ(Text(constructed32), texts[1]);
    EXPECT_EQ(Text(constructedDoubles), texts[2]);
    EXPECT_EQ(Text(constructedStrings), texts[3]);
    EXPECT_EQ(Text(assignedStrings), texts[3]);

    PTNIntegerList emptyList("e", 0, nullptr);
    std::unique_ptr<DWXParseTreeNode> emptyCopy(emptyList.Copy());
    EXPECT_EQ(static_cast<PTNIntegerList*>(emptyCopy.get())->GetValue(nullptr), nullptr);
}

}  // namespace
