// The leaves: reading values from text, SetFrom with its class test, and
// copies that own their names and values.
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/utilhub.h>

#include <float.h>
#include <limits.h>
#include <math.h>
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

TEST(ParseNodeTest, ReadingFromText) {
    const struct {
        const char* text;
        int boolean, integer;
        char character;
        double number;
        std::vector<int> integers, truncated;  // one element per word
    } cases[] = {{"TRUE", 1, 0, 'T', 0, {0}, {0}},
                 {"true", 1, 0, 't', 0, {0}, {0}},
                 {"TRUE ", 0, 0, 'T', 0, {0}, {0}},
                 {"12abc", 0, 12, '1', 12, {12}, {12}},
                 {" -7", 0, -7, ' ', -7, {-7}, {-7}},
                 {"1e3 2.9 -2.9", 0, 1, '1', 1000, {1, 2, -2}, {1000, 2, -2}},
                 {" 4\tx\n5 ", 0, 4, ' ', 4, {4, 0, 5}, {4, 0, 5}},
                 {"1", 0, 1, '1', 1, {1}, {1}},
                 {"", 0, 0, 0, 0, {}, {}},
                 {nullptr, 0, 0, 0, 0, {}, {}}};
    for (const auto& c : cases) {
        const int old[] = {42};
        PTNBool boolean("b", 9);
        PTNInteger integer("i", 9);
        PTNChar character("c", 'q');
        PTNDouble number("d", 9);
        PTNFloat single("f", 9);
        PTNIntegerList integers("l", 1, old);
        PTNInteger32List truncated("l", 1, old);
        boolean.SetAsString(c.text), integer.SetAsString(c.text), character.SetAsString(c.text);
        number.SetAsString(c.text), single.SetAsString(c.text);
        integers.SetAsString(c.text), truncated.SetAsString(c.text);
        const char* label = c.text ? c.text : "(null)";
        EXPECT_EQ(boolean.GetValue(), c.boolean) << label;
        EXPECT_EQ(integer.GetValue(), c.integer) << label;
        EXPECT_EQ(character.GetValue(), c.character) << label;
        EXPECT_EQ(number.GetValue(), c.number) << label;
        EXPECT_EQ(single.GetValue(), static_cast<float>(c.number)) << label;
        EXPECT_EQ(Elements(integers), c.integers) << label;
        EXPECT_EQ(Elements(truncated), c.truncated) << label;
    }
    // Beyond the range of int, truncation clamps instead of being undefined.
    PTNInteger32List list("l", 0, nullptr);
    list.SetAsString("1e20 -1e20 nan");
    EXPECT_EQ(Elements(list), (std::vector<int>{INT_MAX, INT_MIN, 0}));
    PTNDoubleList doubles("l", 0, nullptr);
    doubles.SetAsString("1e3 x -2.5");
    EXPECT_EQ(Elements(doubles), (std::vector<double>{1000, 0, -2.5}));
    // Doubles are written so that they read back exactly.
    for (double value : {1.0 / 3.0, 1e300, 5e-324, -DBL_MAX, static_cast<double>(INFINITY)}) {
        EXPECT_EQ(atof(Text(PTNDouble("d", value)).c_str()), value);
    }
}

TEST(ParseNodeTest, SetFromTakesValuesOnlyFromTheSameClass) {
    PTNSubTree parent("p");
    auto* integer = new PTNInteger("i", 5);
    parent.AddChild(integer);
    PTNDouble number("d", 7.5);
    PTNInteger source("other", 9);
    integer->SetFrom(&number);
    integer->SetFrom(nullptr);
    EXPECT_EQ(integer->GetValue(), 5);
    integer->SetFrom(&source);
    EXPECT_EQ(integer->GetValue(), 9);
    EXPECT_STREQ(integer->GetName(), "i");
    EXPECT_EQ(integer->GetParentRef(), &parent);

    // A numeric list never empties, nor takes another class.
    const int old[] = {1, 2}, fresh[] = {5, 6, 7};
    const double doubles[] = {9.5};
    PTNIntegerList list("l", 2, old), empty("e", 0, nullptr), same("s", 3, fresh);
    PTNInteger32List other32("o", 3, fresh);
    PTNDoubleList otherDoubles("d", 1, doubles), emptyDoubles("e", 0, nullptr);
    for (DWXParseTreeNode* other : std::initializer_list<DWXParseTreeNode*>{
             &empty, &other32, &otherDoubles, nullptr, &list}) {
        list.SetFrom(other);
    }
    EXPECT_EQ(Elements(list), (std::vector<int>{1, 2}));
    list.SetFrom(&same);
    same.SetValue(1, old);
    EXPECT_EQ(Elements(list), (std::vector<int>{5, 6, 7}));
    otherDoubles.SetFrom(&emptyDoubles);
    EXPECT_EQ(Elements(otherDoubles), std::vector<double>{9.5});

    // A string or string list does empty, and may become null.
    char* entries[] = {const_cast<char*>("keep"), nullptr};
    char* none[] = {nullptr};
    PTNStringList strings("l", entries), emptyStrings("e", none), nullStrings("n", nullptr);
    strings.SetFrom(&list);
    strings.SetFrom(&strings);
    EXPECT_STREQ(strings.GetValue()[0], "keep");
    strings.SetFrom(&emptyStrings);
    EXPECT_EQ(CountStringList(strings.GetValue()), 0);
    strings.SetFrom(&nullStrings);
    EXPECT_EQ(strings.GetValue(), nullptr);
    PTNString text("s", "old"), nullText("s", nullptr);
    text.SetFrom(&source);
    text.SetFrom(&text);
    EXPECT_STREQ(text.GetValue(), "old");
    text.SetFrom(&nullText);
    EXPECT_EQ(text.GetValue(), nullptr);
}

// Short names and values are kept in the node and longer ones on the heap:
// every change between the two, from the node's own text or a part of it,
// and every copy keep the text (ASan checks the storage).
TEST(ParseNodeTest, CopiesOwnNamesAndValuesOfEveryLength) {
    for (size_t first = 0; first < 40; first += 3) {
        for (size_t second = 0; second < 40; second += 5) {
            const std::string name(first, 'n'), value(second, 'v');
            PTNString node(name.c_str(), name.c_str());
            node.SetName(value.c_str());
            node.SetValue(value.c_str());
            PTNString constructed(node), assigned("x", "y");
            assigned = node;
            std::unique_ptr<DWXParseTreeNode> copy(node.Copy());
            node.SetName(node.GetName() + (second > 0));  // a tail of its own name
            node.SetValue(node.GetValue() + (second > 0));
            EXPECT_EQ(node.GetName() + std::string("|") + node.GetValue(),
                      value.substr(second > 0) + "|" + value.substr(second > 0));
            for (const DWXParseTreeNode* other :
                 {static_cast<DWXParseTreeNode*>(&constructed),
                  static_cast<DWXParseTreeNode*>(&assigned), copy.get()}) {
                EXPECT_EQ(other->GetName() + (" " + Text(*other)), value + " \"" + value + "\"");
            }
        }
    }
    // Lists copy the caller's arrays, and their own; copies have no parent.
    int ints[] = {3, 4};
    char* entries[] = {const_cast<char*>("a"), const_cast<char*>("b c"), nullptr};
    auto tree = std::make_unique<PTNSubTree>("t");
    auto* integers = new PTNIntegerList("i", 2, ints);
    auto* strings = new PTNStringList("s", entries);
    tree->AddChild(integers);
    tree->AddChild(strings);
    ints[0] = 99;
    std::unique_ptr<DWXParseTreeNode> copies[] = {
        std::unique_ptr<DWXParseTreeNode>(integers->Copy()),
        std::make_unique<PTNStringList>(*strings)};
    PTNIntegerList assigned("x", 0, nullptr);
    assigned = *integers;
    *integers = PTNIntegerList("renamed", 0, nullptr);  // assignment keeps the parent
    EXPECT_EQ(integers->GetParentRef(), tree.get());
    integers->SetValue(1, assigned.GetValue(nullptr));
    assigned.SetValue(1, assigned.GetValue(nullptr));  // from its own array
    tree.reset();
    EXPECT_EQ(Text(*copies[0]) + "|" + Text(*copies[1]) + "|" + Text(assigned),
              "3 4|\"a\" \"b c\"|3");
    EXPECT_EQ(copies[0]->GetParentRef(), nullptr);
}

}  // namespace
