// The leaves: reading values from text, SetFrom with its class test, and
// copies that own their names and values.
#include "tree_test_util.h"

#include <tuple>

namespace {

// Each text set on a Bool, Integer, Char, Double, Float, IntegerList, Integer32List
// and DoubleList, and what they then write, joined with '|': a list takes one
// element per word, and the Integer32List reads doubles and truncates them.
TEST(ParseNodeTest, ReadingFromText) {
    const char* const cases[][2] = {
        {"TRUE", "|TRUE|0|T|0|0.000000|0|0.000000|0"},
        {"true", "|TRUE|0|t|0|0.000000|0|0.000000|0"},
        {"TRUE ", "|FALSE|0|T|0|0.000000|0|0.000000|0"},
        {"12abc", "|FALSE|12|1|12|12.000000|12|12.000000|12"},
        {" -7", "|FALSE|-7| |-7|-7.000000|-7|-7.000000|-7"},
        {"1e3 2.9 -2.9",
         "|FALSE|1|1|1000|1000.000000|1 2 -2|1000.000000 2.000000 -2.000000|1000 2.9 -2.9"},
        {" 4\tx\n5 ", "|FALSE|4| |4|4.000000|4 0 5|4.000000 0.000000 5.000000|4 0 5"},
        {"1", "|FALSE|1|1|1|1.000000|1|1.000000|1"},
        {"", "|FALSE|0||0|0.000000|||"},
        {nullptr, "|FALSE|0||0|0.000000|||"},
        {"1e20 -1e20 nan",
         "|FALSE|1|1|1e+20|100000002004087734272.000000|1 -1 0|2147483647.000000 "
         "-2147483648.000000 0.000000|1e+20 -1e+20 nan"}};  // clamped, not undefined, beyond the
                                                            // range of int
    for (const auto& c : cases) {
        const int old[] = {42};
        std::string values;
        auto read = [&](auto&& node) { node.SetAsString(c[0]), values += "|" + Text(node); };
        read(PTNBool("b", 9)), read(PTNInteger("i", 9)), read(PTNChar("c", 'q'));
        read(PTNDouble("d", 9)), read(PTNFloat("f", 9)), read(PTNIntegerList("l", 1, old));
        read(PTNInteger32List("l", 1, old)), read(PTNDoubleList("l", 0, nullptr));
        EXPECT_EQ(values, c[1]) << (c[0] ? c[0] : "(null)");
    }
}

// In reading order: a numeric leaf or list takes values only from its own class and
// never empties; a string or string list does empty, and may become null.
TEST(ParseNodeTest, SetFromTakesValuesOnlyFromTheSameClass) {
    int old[] = {1, 2};
    const int fresh[] = {5, 6, 7};
    const double doubles[] = {9.5};
    char* entries[] = {const_cast<char*>("keep"), nullptr};
    char* none[] = {nullptr};
    PTNSubTree parent("p");
    auto* integer = new PTNInteger("i", 5);
    auto* list = new PTNIntegerList("l", 2, old);
    parent.AddChild(integer), parent.AddChild(list);
    old[0] = 9;  // the list copied the caller's array
    PTNInteger source("other", 9);
    PTNDouble number("d", 7.5);
    PTNIntegerList empty("e", 0, nullptr), same("s", 3, fresh);
    PTNInteger32List other32("o", 3, fresh);
    PTNDoubleList someDoubles("d", 1, doubles), noDoubles("e", 0, nullptr);
    PTNStringList strings("l", entries), noStrings("e", none), nullStrings("n", nullptr);
    PTNString text("s", "old"), nullText("s", nullptr);
    const std::tuple<DWXParseTreeNode*, DWXParseTreeNode*, const char*> steps[] = {
        {integer, &number, "5"},          {integer, nullptr, "5"},
        {integer, &source, "9"},          {list, &empty, "1 2"},
        {list, &other32, "1 2"},          {list, list, "1 2"},
        {list, &same, "5 6 7"},           {&someDoubles, &noDoubles, "9.5"},
        {&someDoubles, list, "9.5"},      {&strings, list, "\"keep\""},
        {&strings, &strings, "\"keep\""}, {&strings, &noStrings, ""},
        {&text, &source, "\"old\""},      {&text, &text, "\"old\""},
        {&text, &nullText, "\\q\\q"}};
    for (const auto& [node, from, expected] : steps) {
        node->SetFrom(from);
        EXPECT_EQ(Text(*node), expected) << node->GetName() << " " << expected;
    }
    same.SetValue(1, old);  // the list copied this one too
    PTNIntegerList assigned("x", 0, nullptr);
    assigned = *list;
    *list = PTNIntegerList("renamed", 0, nullptr);
    EXPECT_EQ(Text(assigned), "5 6 7");
    assigned.SetValue(1, assigned.GetValue(nullptr));  // from its own array
    EXPECT_EQ(Text(assigned), "5");
    EXPECT_STREQ(integer->GetName(), "i");
    EXPECT_EQ(integer->GetParentRef(), &parent);
    EXPECT_EQ(list->GetParentRef(), &parent);  // also after an assignment
    strings.SetFrom(&nullStrings);
    EXPECT_EQ(strings.GetValue(), nullptr);
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
            for (const PTNString* other :
                 {&constructed, &assigned, dynamic_cast<PTNString*>(copy.get())}) {
                EXPECT_EQ(other->GetName() + (" " + Text(*other)), value + " \"" + value + "\"");
            }
        }
    }
}

}  // namespace
