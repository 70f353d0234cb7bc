// The node model and the scalar leaves: class names, value texts, reading
// from text, SetFrom with its class test, and copies.
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/utilhub.h>

#include <float.h>
#include <limits.h>
#include <math.h>
#include <stdio.h>
#include <stdlib.h>

#include <memory>
#include <string>

namespace {

std::string Printed(const char* format, double value) {
    char text[400];
    snprintf(text, sizeof text, format, value);
    return text;
}

TEST(ParseNodeTest, ValueTextsAndClassNames) {
    const std::string longText(100000, 'w');
    const struct {
        std::unique_ptr<DWXParseTreeNode> node;
        const char* className;
        std::string text;
    } cases[] = {
        {std::make_unique<PTNInteger>("i", INT_MIN), "PTNInteger", "-2147483648"},
        {std::make_unique<PTNInteger>("i", INT_MAX), "PTNInteger", "2147483647"},
        {std::make_unique<PTNBool>("b", 0), "PTNBool", "FALSE"},
        {std::make_unique<PTNBool>("b", -1), "PTNBool", "TRUE"},
        {std::make_unique<PTNChar>("c", '\xE9'), "PTNChar", "\xE9"},
        {std::make_unique<PTNChar>("c", 0), "PTNChar", ""},
        {std::make_unique<PTNFloat>("f", -0.25f), "PTNFloat", "-0.250000"},
        {std::make_unique<PTNFloat>("f", 1e30f), "PTNFloat", Printed("%f", 1e30f)},
        {std::make_unique<PTNFloat>("f", 0.0078125f), "PTNFloat", Printed("%f", 0.0078125)},
        {std::make_unique<PTNFloat>("f", -INFINITY), "PTNFloat", Printed("%f", -INFINITY)},
        {std::make_unique<PTNFloat>("f", NAN), "PTNFloat", Printed("%f", NAN)},
        {std::make_unique<PTNDouble>("d", 0.1), "PTNDouble", "0.1"},
        {std::make_unique<PTNDouble>("d", 640), "PTNDouble", "640"},
        {std::make_unique<PTNDouble>("d", -0.0), "PTNDouble", "-0"},
        {std::make_unique<PTNDouble>("d", 1e21), "PTNDouble", MkName(1e21, -1)},
        {std::make_unique<PTNString>("s", nullptr), "PTNString", "\\q\\q"},
        {std::make_unique<PTNString>("s", ""), "PTNString", "\"\""},
        {std::make_unique<PTNString>("s", longText.c_str()), "PTNString", "\"" + longText + "\""},
        {std::make_unique<PTNIntegerList>("l", 0, nullptr), "PTNIntegerList", ""},
        {std::make_unique<PTNInteger32List>("l", -1, nullptr), "PTNInteger32List", ""},
        {std::make_unique<PTNDoubleList>("l", 0, nullptr), "PTNDoubleList", ""},
        {std::make_unique<PTNStringList>("l", nullptr), "PTNStringList", ""},
        {std::make_unique<PTNBase64>("b", nullptr, 0), "PTNBase64", ""},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Text(*c.node), c.text) << c.className;
        EXPECT_STREQ(c.node->GetClassName(), c.className);
    }
    EXPECT_EQ(PTNBool("b", 5).GetValue(), 5);
    EXPECT_EQ(PTNFloat("f", 1e30f).GetValue(), 1e30f);
    // Doubles are written so that they read back exactly.
    for (double value : {1.0 / 3.0, 1e300, 5e-324, -DBL_MAX, (double)INFINITY}) {
        EXPECT_EQ(atof(Text(PTNDouble("d", value)).c_str()), value);
    }
}

TEST(ParseNodeTest, ReadingFromText) {
    const struct {
        const char* text;
        int boolean, integer;
        char character;
        double number;
    } cases[] = {{"TRUE", 1, 0, 'T', 0},  {"true", 1, 0, 't', 0},   {"YES", 0, 0, 'Y', 0},
                 {"1", 0, 1, '1', 1},     {"TRUE ", 0, 0, 'T', 0},  {"12abc", 0, 12, '1', 12},
                 {" -7", 0, -7, ' ', -7}, {"1e3", 0, 1, '1', 1000}, {"", 0, 0, 0, 0},
                 {nullptr, 0, 0, 0, 0}};
    for (const auto& c : cases) {
        PTNBool boolean("b", 9);
        PTNInteger integer("i", 9);
        PTNChar character("c", 'q');
        PTNDouble number("d", 9);
        PTNFloat single("f", 9);
        boolean.SetAsString(c.text);
        integer.SetAsString(c.text);
        character.SetAsString(c.text);
        number.SetAsString(c.text);
        single.SetAsString(c.text);
        const char* label = c.text ? c.text : "(null)";
        EXPECT_EQ(boolean.GetValue(), c.boolean) << label;
        EXPECT_EQ(integer.GetValue(), c.integer) << label;
        EXPECT_EQ(character.GetValue(), c.character) << label;
        EXPECT_EQ(number.GetValue(), c.number) << label;
        EXPECT_EQ(single.GetValue(), static_cast<float>(c.number)) << label;
    }
}

TEST(ParseNodeTest, SetFromTakesValuesOnlyFromTheSameClass) {
    PTNSubTree parent("p");
    auto* integer = new PTNInteger("i", 5);
    parent.AddChild(integer);
    PTNDouble number("d", 7.5);
    PTNBool boolean("b", 1);
    integer->SetFrom(&number);
    integer->SetFrom(&boolean);
    integer->SetFrom(nullptr);
    EXPECT_EQ(integer->GetValue(), 5);
    PTNInteger source("other", 9);
    integer->SetFrom(&source);
    EXPECT_EQ(integer->GetValue(), 9);
    EXPECT_STREQ(integer->GetName(), "i");
    EXPECT_EQ(integer->GetParentRef(), &parent);

    PTNString text("s", "old");
    PTNString nullText("s", nullptr);
    text.SetFrom(&source);
    text.SetFrom(&text);
    EXPECT_STREQ(text.GetValue(), "old");
    text.SetFrom(&nullText);
    EXPECT_EQ(text.GetValue(), nullptr);
}

TEST(ParseNodeTest, CopiesOwnTheirBuffersAndHaveNoParent) {
    auto tree = std::make_unique<PTNSubTree>("tree");
    auto* source = new PTNString("title", "Main window");
    tree->AddChild(source);
    std::unique_ptr<DWXParseTreeNode> copy(source->Copy());
    PTNString constructed(*source);
    PTNString assigned("x", nullptr);
    assigned = *source;
    const PTNString& alias = assigned;
    assigned = alias;
    *source = PTNString("renamed", nullptr);  // assignment keeps the parent
    EXPECT_EQ(source->GetParentRef(), tree.get());
    tree.reset();
    for (const DWXParseTreeNode* node : {copy.get(), static_cast<DWXParseTreeNode*>(&constructed),
                                         static_cast<DWXParseTreeNode*>(&assigned)}) {
        EXPECT_EQ(node->GetParentRef(), nullptr);
        EXPECT_STREQ(node->GetName(), "title");
        EXPECT_EQ(Text(*node), "\"Main window\"");
    }
    // Names and values are own copies, also when set from themselves.
    char name[] = "width";
    PTNString node(name, name);
    name[0] = 'W';
    node.SetName(node.GetName());
    node.SetValue(node.GetValue());
    EXPECT_STREQ(node.GetName(), "width");
    EXPECT_STREQ(node.GetValue(), "width");
}

TEST(ParseNodeTest, NamesOfEveryLengthSurviveRenamesAndCopies) {
    // Short names are kept in the node and longer ones on the heap: every
    // change between the two, and renames from the node's own name or a
    // part of it, keep the text (ASan checks the storage).
    const char* const names[] = {"", "x", "seven77", "eight888", "a much longer name", nullptr};
    for (const char* first : names) {
        for (const char* second : names) {
            PTNInteger node(first, 1);
            EXPECT_STREQ(node.GetName(), first);
            node.SetName(second);
            EXPECT_STREQ(node.GetName(), second);
            PTNInteger copy(node);
            PTNInteger assigned(first, 2);
            assigned = node;
            std::unique_ptr<DWXParseTreeNode> cloned(node.Copy());
            node.SetName("changed after copying");
            for (const DWXParseTreeNode* other :
                 {static_cast<DWXParseTreeNode*>(&copy), static_cast<DWXParseTreeNode*>(&assigned),
                  cloned.get()}) {
                EXPECT_STREQ(other->GetName(), second);
            }
        }
    }
    PTNInteger node("eight888", 1);
    node.SetName(node.GetName() + 1);  // long to short, from inside the old name
    EXPECT_STREQ(node.GetName(), "ight888");
    node.SetName(node.GetName() + 2);  // short to short, overlapping
    EXPECT_STREQ(node.GetName(), "ht888");
    node.SetName(node.GetName());
    EXPECT_STREQ(node.GetName(), "ht888");
}

}  // namespace
