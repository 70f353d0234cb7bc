// The node model and the six scalar leaves: class names, rendered and read
// value texts, copies, SetFrom with its class test, and deep copy operations.
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

TEST(ParseNodeTest, ClassNamesAreTheFileFormatLiterals) {
    int ints[] = {1};
    double doubles[] = {1};
    const std::unique_ptr<DWXParseTreeNode> nodes[] = {
        std::make_unique<PTNBool>("n", 1),
        std::make_unique<PTNChar>("n", 'c'),
        std::make_unique<PTNInteger>("n", 1),
        std::make_unique<PTNFloat>("n", 1.0f),
        std::make_unique<PTNDouble>("n", 1.0),
        std::make_unique<PTNString>("n", "v"),
        std::make_unique<PTNStringList>("n", nullptr),
        std::make_unique<PTNIntegerList>("n", 1, ints),
        std::make_unique<PTNInteger32List>("n", 1, ints),
        std::make_unique<PTNDoubleList>("n", 1, doubles),
        std::make_unique<PTNBase64>("n", nullptr, 0),
        std::make_unique<PTNSubTree>("n"),
    };
    const char* names[] = {"PTNBool",          "PTNChar",       "PTNInteger",    "PTNFloat",
                           "PTNDouble",        "PTNString",     "PTNStringList", "PTNIntegerList",
                           "PTNInteger32List", "PTNDoubleList", "PTNBase64",     "PTNSubTree"};
    for (size_t i = 0; i < sizeof(names) / sizeof(names[0]); ++i) {
        EXPECT_STREQ(nodes[i]->GetClassName(), names[i]);
        std::unique_ptr<DWXParseTreeNode> copy(nodes[i]->Copy());
        EXPECT_STREQ(copy->GetClassName(), names[i]);
    }
}

TEST(ParseNodeTest, RenderedValueTexts) {
    EXPECT_EQ(Text(PTNBool("b", 0)), "FALSE");
    EXPECT_EQ(Text(PTNBool("b", 1)), "TRUE");
    EXPECT_EQ(Text(PTNBool("b", 5)), "TRUE");
    EXPECT_EQ(Text(PTNBool("b", -1)), "TRUE");
    EXPECT_EQ(Text(PTNChar("c", 'A')), "A");
    EXPECT_EQ(Text(PTNChar("c", ' ')), " ");
    EXPECT_EQ(Text(PTNChar("c", 0)), "");
    EXPECT_EQ(Text(PTNChar("c", '\xE9')), "\xE9");
    EXPECT_EQ(Text(PTNInteger("i", 0)), "0");
    EXPECT_EQ(Text(PTNInteger("i", -42)), "-42");
    EXPECT_EQ(Text(PTNInteger("i", INT_MIN)), "-2147483648");
    EXPECT_EQ(Text(PTNInteger("i", INT_MAX)), "2147483647");
    EXPECT_EQ(Text(PTNFloat("f", 1.5f)), "1.500000");
    EXPECT_EQ(Text(PTNFloat("f", -0.25f)), "-0.250000");
    EXPECT_EQ(Text(PTNFloat("f", 0.0f)), "0.000000");
    EXPECT_EQ(Text(PTNFloat("f", 1234567.0f)), "1234567.000000");
    EXPECT_EQ(Text(PTNString("s", "Main window")), "\"Main window\"");
    EXPECT_EQ(Text(PTNString("s", nullptr)), "\\q\\q");
}

TEST(ParseNodeTest, DoubleTextReadsBackExactly) {
    const double values[] = {0.0, 1.0, -2.5, 0.1, 1.0 / 3.0, 1e300, -4.9e-324, 640.0};
    for (double value : values) {
        PTNDouble node("d", value);
        const std::string text = Text(node);
        EXPECT_EQ(atof(text.c_str()), value) << text;
        PTNDouble back("d", 99.0);
        back.SetAsString(text.c_str());
        EXPECT_EQ(back.GetValue(), value) << text;
    }
}

TEST(ParseNodeTest, BoolReadsOnlyTrueInAnyCase) {
    const struct {
        const char* text;
        int value;
    } cases[] = {{"TRUE", 1}, {"true", 1},  {"True", 1},  {"tRuE", 1}, {"YES", 0},   {"1", 0},
                 {"Y", 0},    {"TRUE ", 0}, {" TRUE", 0}, {"", 0},     {"FALSE", 0}, {nullptr, 0}};
    for (const auto& c : cases) {
        PTNBool node("b", 7);
        node.SetAsString(c.text);
        EXPECT_EQ(node.GetValue(), c.value) << (c.text ? c.text : "(null)");
    }
    PTNBool five("b", 5);
    EXPECT_EQ(five.GetValue(), 5);
}

TEST(ParseNodeTest, NumbersAndCharactersReadFromText) {
    const struct {
        const char* text;
        int integer;
        char character;
        double number;
    } cases[] = {
        {"12abc", 12, '1', 12.0}, {"abc", 0, 'a', 0.0},    {" -7", -7, ' ', -7.0},
        {"xyz", 0, 'x', 0.0},     {"", 0, 0, 0.0},         {nullptr, 0, 0, 0.0},
        {"+3.75", 3, '+', 3.75},  {"1e3", 1, '1', 1000.0}, {"\t-0.5x", 0, '\t', -0.5},
    };
    for (const auto& c : cases) {
        const char* label = c.text ? c.text : "(null)";
        PTNInteger integer("i", 99);
        integer.SetAsString(c.text);
        EXPECT_EQ(integer.GetValue(), c.integer) << label;
        PTNChar character("c", 'q');
        character.SetAsString(c.text);
        EXPECT_EQ(character.GetValue(), c.character) << label;
        PTNDouble number("d", 99.0);
        number.SetAsString(c.text);
        EXPECT_EQ(number.GetValue(), c.number) << label;
        PTNFloat single("f", 99.0f);
        single.SetAsString(c.text);
        EXPECT_EQ(single.GetValue(), static_cast<float>(c.number)) << label;
    }
}

TEST(ParseNodeTest, RenderedTextReadsBack) {
    for (int value : {0, 1, -1, 640, INT_MIN, INT_MAX}) {
        PTNInteger node("i", value);
        PTNInteger back("i", 12345);
        back.SetAsString(Text(node).c_str());
        EXPECT_EQ(back.GetValue(), value);
    }
    for (int c = -128; c < 128; ++c) {
        if (c == 0) {
            continue;
        }
        PTNChar node("c", static_cast<char>(c));
        PTNChar back("c", 0);
        back.SetAsString(Text(node).c_str());
        EXPECT_EQ(back.GetValue(), static_cast<char>(c));
    }
    PTNBool bools[] = {PTNBool("b", 0), PTNBool("b", 1), PTNBool("b", 9)};
    const int expected[] = {0, 1, 1};
    for (int i = 0; i < 3; ++i) {
        PTNBool back("b", 3);
        back.SetAsString(Text(bools[i]).c_str());
        EXPECT_EQ(back.GetValue(), expected[i]);
    }
}

TEST(ParseNodeTest, SetFromTakesValuesOnlyFromTheSameClass) {
    PTNInteger integer("i", 5);
    PTNDouble number("d", 7.5);
    PTNBool boolean("b", 1);
    integer.SetFrom(&number);
    integer.SetFrom(&boolean);
    integer.SetFrom(nullptr);
    EXPECT_EQ(integer.GetValue(), 5);

    PTNInteger source("other name", 9);
    PTNSubTree parent("p");
    auto* child = new PTNInteger("i", 1);
    parent.AddChild(child);
    child->SetFrom(&source);
    EXPECT_EQ(child->GetValue(), 9);
    EXPECT_STREQ(child->GetName(), "i");  // name and parent stay
    EXPECT_EQ(child->GetParentRef(), &parent);

    PTNChar character("c", 'a');
    PTNChar otherCharacter("c", 'z');
    character.SetFrom(&otherCharacter);
    EXPECT_EQ(character.GetValue(), 'z');
    PTNFloat single("f", 1.0f);
    PTNFloat otherSingle("f", 2.0f);
    single.SetFrom(&otherSingle);
    single.SetFrom(&number);
    EXPECT_EQ(single.GetValue(), 2.0f);
    number.SetFrom(&single);
    EXPECT_EQ(number.GetValue(), 7.5);

    PTNString text("s", "old");
    PTNString nullText("s", nullptr);
    text.SetFrom(&integer);
    EXPECT_STREQ(text.GetValue(), "old");
    text.SetFrom(&nullText);
    EXPECT_EQ(text.GetValue(), nullptr);
    PTNString fresh("s", "fresh");
    text.SetFrom(&fresh);
    fresh.SetValue("changed");
    EXPECT_STREQ(text.GetValue(), "fresh");
    text.SetFrom(&text);
    EXPECT_STREQ(text.GetValue(), "fresh");
}

TEST(ParseNodeTest, CopyOfAChildIsDetachedAndIndependent) {
    auto tree = std::make_unique<PTNSubTree>("tree");
    auto* source = new PTNString("title", "Main window");
    tree->AddChild(source);
    std::unique_ptr<DWXParseTreeNode> copy(source->Copy());
    EXPECT_EQ(copy->GetParentRef(), nullptr);
    EXPECT_NE(copy->GetName(), source->GetName());
    auto* text = static_cast<PTNString*>(copy.get());
    EXPECT_NE(text->GetValue(), source->GetValue());
    text->SetValue("changed");
    EXPECT_STREQ(source->GetValue(), "Main window");
    tree.reset();  // destroys the source
    EXPECT_STREQ(copy->GetName(), "title");
    EXPECT_STREQ(text->GetValue(), "changed");
}

TEST(ParseNodeTest, NamesAreOwnCopies) {
    char name[] = "width";
    PTNInteger node(name, 1);
    name[0] = 'W';
    EXPECT_STREQ(node.GetName(), "width");
    node.SetName("height");
    EXPECT_STREQ(node.GetName(), "height");
    node.SetName(node.GetName());  // its own buffer
    EXPECT_STREQ(node.GetName(), "height");
    node.SetName(nullptr);
    EXPECT_EQ(node.GetName(), nullptr);

    char value[] = "abc";
    PTNString text("s", value);
    value[0] = 'x';
    EXPECT_STREQ(text.GetValue(), "abc");
    text.SetValue(text.GetValue());
    EXPECT_STREQ(text.GetValue(), "abc");
}

TEST(ParseNodeTest, CopyConstructionAndAssignmentAreDeep) {
    PTNSubTree parent("p");
    auto* original = new PTNString("name", "value");
    parent.AddChild(original);
    PTNString copy(*original);
    EXPECT_EQ(copy.GetParentRef(), nullptr);
    EXPECT_NE(copy.GetValue(), original->GetValue());
    EXPECT_STREQ(copy.GetValue(), "value");

    PTNString assigned("other", nullptr);
    assigned = *original;
    const PTNString& alias = assigned;
    assigned = alias;  // self-assignment changes nothing
    EXPECT_STREQ(assigned.GetName(), "name");
    EXPECT_STREQ(assigned.GetValue(), "value");
    EXPECT_NE(assigned.GetName(), original->GetName());

    *original = PTNString("renamed", nullptr);  // assignment keeps the parent
    EXPECT_EQ(original->GetParentRef(), &parent);
    EXPECT_STREQ(original->GetName(), "renamed");
    EXPECT_EQ(original->GetValue(), nullptr);

    PTNInteger integer("i", 3);
    PTNInteger integerCopy(integer);
    integer.SetName("j");
    EXPECT_STREQ(integerCopy.GetName(), "i");
    EXPECT_EQ(integerCopy.GetValue(), 3);
}

}  // namespace
