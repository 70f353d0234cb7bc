// The list leaves: texts, reading from text and tokens, SetFrom rules, copies.
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/utilhub.h>

#include <limits.h>
#include <stdlib.h>

#include <memory>
#include <string>
#include <type_traits>
#include <vector>

namespace {

template <class List>
auto Elements(const List& list) {
    int count = -1;
    auto* values = list.GetValue(&count);
    using T = std::remove_pointer_t<decltype(values)>;
    return values != nullptr ? std::vector<T>(values, values + count) : std::vector<T>();
}

TEST(ParseListTest, Texts) {
    const int ints[] = {1, -2, 30};
    const double doubles[] = {1.5, -0.1, 640};
    char* entries[] = {const_cast<char*>("x"), const_cast<char*>("y z"), const_cast<char*>("\"\n"),
                       const_cast<char*>(""), nullptr};
    char* none[] = {nullptr};
    EXPECT_EQ(Text(PTNIntegerList("l", 3, ints)), "1 -2 30");
    EXPECT_EQ(Text(PTNInteger32List("l", 3, ints)), "1.000000 -2.000000 30.000000");
    EXPECT_EQ(Text(PTNDoubleList("l", 3, doubles)), "1.5 -0.1 640");
    EXPECT_EQ(Text(PTNStringList("l", entries)), "\"x\" \"y z\" \"\\q\\n\" \"\"");
    EXPECT_EQ(Text(PTNStringList("l", none)), "");
}

TEST(ParseListTest, NumericListsReadOneElementPerWord) {
    const struct {
        const char* text;
        std::vector<int> integers, truncated;
        std::vector<double> doubles;
    } cases[] = {{"1e3 2.9 -2.9", {1, 2, -2}, {1000, 2, -2}, {1000, 2.9, -2.9}},
                 {" 4\tx\n5 ", {4, 0, 5}, {4, 0, 5}, {4, 0, 5}},
                 {"", {}, {}, {}},
                 {nullptr, {}, {}, {}}};
    for (const auto& c : cases) {
        const int old[] = {42};
        PTNIntegerList integers("l", 1, old);
        PTNInteger32List truncated("l", 1, old);
        PTNDoubleList doubles("l", 0, nullptr);
        integers.SetAsString(c.text);
        truncated.SetAsString(c.text);
        doubles.SetAsString(c.text);
        EXPECT_EQ(Elements(integers), c.integers);
        EXPECT_EQ(Elements(truncated), c.truncated);
        EXPECT_EQ(Elements(doubles), c.doubles);
    }
    // Beyond the range of int, truncation clamps instead of being undefined.
    PTNInteger32List list("l", 0, nullptr);
    list.SetAsString("1e20 -1e20 nan");
    EXPECT_EQ(Elements(list), (std::vector<int>{INT_MAX, INT_MIN, 0}));
}

TEST(ParseListTest, StringListReadsTokensAndKeepsNull) {
    char* tokens[] = {const_cast<char*>("\"y z\""), const_cast<char*>("a\\nb"), nullptr};
    char* none[] = {nullptr};
    PTNStringList list("l", nullptr);
    EXPECT_EQ(list.GetValue(), nullptr);
    list.SetAsStringList(tokens);
    ASSERT_EQ(CountStringList(list.GetValue()), 2);
    EXPECT_STREQ(list.GetValue()[0], "y z");
    EXPECT_STREQ(list.GetValue()[1], "a\nb");
    list.SetAsStringList(none);
    ASSERT_NE(list.GetValue(), nullptr);
    EXPECT_EQ(CountStringList(list.GetValue()), 0);
    list.SetValue(nullptr);
    EXPECT_EQ(list.GetValue(), nullptr);
}

TEST(ParseListTest, SetFromRules) {
    const int old[] = {1, 2};
    const int fresh[] = {5, 6, 7};
    const double doubles[] = {9.5};
    PTNIntegerList list("l", 2, old);
    PTNIntegerList empty("e", 0, nullptr);
    PTNInteger32List other32("o", 3, fresh);
    PTNDoubleList otherDoubles("d", 1, doubles);
    for (DWXParseTreeNode* other : std::initializer_list<DWXParseTreeNode*>{
             &empty, &other32, &otherDoubles, nullptr, &list}) {
        list.SetFrom(other);  // a numeric list never empties, nor takes another class
    }
    EXPECT_EQ(Elements(list), (std::vector<int>{1, 2}));
    PTNIntegerList source("s", 3, fresh);
    list.SetFrom(&source);
    source.SetValue(1, old);
    EXPECT_EQ(Elements(list), (std::vector<int>{5, 6, 7}));

    char* entries[] = {const_cast<char*>("keep"), nullptr};
    char* none[] = {nullptr};
    PTNStringList strings("l", entries);
    PTNStringList emptyStrings("e", none);
    PTNStringList nullStrings("n", nullptr);
    strings.SetFrom(&list);
    strings.SetFrom(&strings);
    EXPECT_STREQ(strings.GetValue()[0], "keep");
    strings.SetFrom(&emptyStrings);  // a string list does empty
    EXPECT_EQ(CountStringList(strings.GetValue()), 0);
    strings.SetFrom(&nullStrings);
    EXPECT_EQ(strings.GetValue(), nullptr);
}

TEST(ParseListTest, CopiesAreDeep) {
    int ints[] = {3, 4};
    double doubles[] = {1.25, 2.5};
    char* entries[] = {const_cast<char*>("a"), const_cast<char*>("b c"), nullptr};
    auto integers = std::make_unique<PTNIntegerList>("i", 2, ints);
    auto doubleList = std::make_unique<PTNDoubleList>("d", 2, doubles);
    auto strings = std::make_unique<PTNStringList>("s", entries);
    ints[0] = doubles[0] = 99;  // the caller's arrays were copied
    std::unique_ptr<DWXParseTreeNode> copies[] = {
        std::unique_ptr<DWXParseTreeNode>(integers->Copy()),
        std::unique_ptr<DWXParseTreeNode>(doubleList->Copy()),
        std::unique_ptr<DWXParseTreeNode>(strings->Copy()),
        std::make_unique<PTNInteger32List>(PTNInteger32List("j", 2, ints)),
        std::make_unique<PTNDoubleList>(*doubleList),
        std::make_unique<PTNStringList>(*strings)};
    PTNIntegerList assigned("x", 0, nullptr);
    assigned = *integers;
    integers->SetValue(1, integers->GetValue(nullptr));  // from its own array
    EXPECT_EQ(Elements(*integers), std::vector<int>{3});
    integers.reset();
    doubleList.reset();
    strings.reset();
    std::string texts = Text(assigned);
    for (const auto& copy : copies) {
        texts += "|" + Text(*copy);
    }
    EXPECT_EQ(texts, "3 4|3 4|1.25 2.5|\"a\" \"b c\"|99.000000 4.000000|1.25 2.5|\"a\" \"b c\"");
}

}  // namespace
