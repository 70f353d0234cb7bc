// The node model and the scalar leaves: class names, value texts, reading
// from text, SetFrom with its class test, and copies.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>

#include <limits.h>
#include <stdlib.h>

#include <memory>
#include <string>

namespace {

std::string Text(const DWXParseTreeNode& node) {
    char* text = node.GetAsString();
    std::string result(text);
    free(text);
    return result;
}

TEST(ParseNodeTest, ValueTexts) {
    EXPECT_EQ(Text(PTNBool("b", 0)), "FALSE");
    EXPECT_EQ(Text(PTNBool("b", 5)), "TRUE");
    EXPECT_EQ(PTNBool("b", 5).GetValue(), 5);
    EXPECT_EQ(Text(PTNChar("c", 'A')), "A");
    EXPECT_EQ(Text(PTNChar("c", 0)), "");
    EXPECT_EQ(Text(PTNChar("c", '\xE9')), "\xE9");
    EXPECT_EQ(Text(PTNInteger("i", -42)), "-42");
    EXPECT_EQ(Text(PTNInteger("i", INT_MIN)), "-2147483648");
    EXPECT_EQ(Text(PTNFloat("f", 1.5f)), "1.500000");
    EXPECT_EQ(Text(PTNFloat("f", -0.25f)), "-0.250000");
    for (double value : {0.1, -2.5, 1.0 / 3.0, 1e300, 640.0}) {
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
    EXPECT_STREQ(text.GetValue(), "old");
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
}

TEST(ParseNodeTest, NamesAndValuesAreOwnCopies) {
    char name[] = "width";
    PTNString node(name, name);
    name[0] = 'W';
    EXPECT_STREQ(node.GetName(), "width");
    EXPECT_STREQ(node.GetValue(), "width");
    node.SetName(node.GetName());
    node.SetValue(node.GetValue());
    EXPECT_STREQ(node.GetName(), "width");
    EXPECT_STREQ(node.GetValue(), "width");
}

}  // namespace
