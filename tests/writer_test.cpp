// The writer: exact line formats and indents, as lists, a buffer and a stream.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/utilhub.h>

#include <math.h>
#include <services/rtprim.h>
#include <stdio.h>
#include <stdlib.h>

#include <climits>
#include <memory>
#include <string>
#include <vector>

namespace {

std::string Lines(const PTNSubTree& tree, int level = 0) {
    char** list = tree.GetAsStringList(level);
    std::string lines;
    for (char** line = list; *line != nullptr; ++line) {
        lines += std::string(*line) + "|";
    }
    DestroyStringList(list);
    return lines;
}

TEST(WriterTest, SubtreesAndIndents) {
    PTNSubTree config("config");
    auto* colors = new PTNSubTree("colors");
    config.AddChild(new PTNInteger("width", 640));
    config.AddChild(new PTNString("title", "Main window"));
    config.AddChild(colors);
    colors->AddChild(new PTNString("fg", "red"));
    colors->AddChild(new PTNSubTree("empty"));
    const std::string lines =
        "(config SubTree|  (width Integer 640)|  (title String \"Main window\")|"
        "  (colors SubTree|    (fg String \"red\")|    (empty SubTree|    )|  )|)|";
    EXPECT_EQ(Lines(config), lines);
    EXPECT_EQ(Lines(config, -1), lines);
    EXPECT_EQ(Lines(*colors, 2),
              "    (colors SubTree|      (fg String \"red\")|"
              "      (empty SubTree|      )|    )|");
    EXPECT_EQ(Lines(PTNSubTree("empty")), "(empty SubTree|)|");

    std::string expected = lines;
    for (char& c : expected) {
        c = c == '|' ? '\n' : c;
    }
    char* text = config.GetAsString();
    EXPECT_EQ(text, expected);
    free(text);
    char* buffer = nullptr;
    size_t size = 0;
    FILE* stream = open_memstream(&buffer, &size);
    fputs("before\n", stream);
    config.WriteToFile(stream);
    fclose(stream);
    EXPECT_EQ(std::string(buffer, size), "before\n" + expected);
    free(buffer);
}

TEST(WriterTest, EveryLeafClassAndEmptyFields) {
    const int ints[] = {1, -2};
    const double doubles[] = {1.5, -2};
    const unsigned char bytes[] = {'a', 'b'};
    char* entries[] = {const_cast<char*>("x"), const_cast<char*>("y z"), nullptr};
    PTNSubTree tree(nullptr);
    tree.AddChild(new PTNBool("b", 3));
    tree.AddChild(new PTNChar("c", 'Q'));
    tree.AddChild(new PTNFloat("f", 0.5f));
    tree.AddChild(new PTNDouble("d", 0.1));
    tree.AddChild(new PTNString("s", "a\"b"));
    tree.AddChild(new PTNString("n", nullptr));
    tree.AddChild(new PTNStringList("sl", entries));
    tree.AddChild(new PTNIntegerList("il", 2, ints));
    tree.AddChild(new PTNInteger32List("i32", 2, ints));
    tree.AddChild(new PTNDoubleList("dl", 2, doubles));
    tree.AddChild(new PTNBase64("b64", bytes, 2));
    tree.AddChild(new PTNChar("c0", 0));
    tree.AddChild(new PTNStringList("sl0", nullptr));
    tree.AddChild(new PTNBase64("b0", nullptr, 0));
    tree.AddChild(new PTNInteger(nullptr, 1));
    EXPECT_EQ(Lines(tree),
              "( SubTree|  (b Bool TRUE)|  (c Char Q)|  (f Float 0.500000)|  (d Double 0.1)|"
              "  (s String \"a\\qb\")|  (n String \\q\\q)|  (sl StringList \"x\" \"y z\")|"
              "  (il IntegerList 1 -2)|  (i32 Integer32List 1.000000 -2.000000)|"
              "  (dl DoubleList 1.5 -2)|  (b64 Base64 YWI=)|  (c0 Char )|  (sl0 StringList )|"
              "  (b0 Base64 )|  ( Integer 1)|)|");
    // Copies keep every class; every class name carries the PTN prefix.
    EXPECT_EQ(Lines(*std::unique_ptr<PTNSubTree>(tree.DeepCopy())), Lines(tree));
    DWXIter iter(tree.GetChildren());
    for (DWXObject* child = iter.Current(); child != nullptr; child = iter.Next()) {
        EXPECT_EQ(std::string(child->GetClassName(), 3), "PTN");
    }
}

std::string Printed(const char* format, double value) {
    char text[400];
    snprintf(text, sizeof text, format, value);
    return text;
}

std::string Text(const DWXParseTreeNode& node) {
    char* text = node.GetAsString();
    std::string result(text != nullptr ? text : "(null)");
    free(text);
    return result;
}

// Every leaf line holds what the leaf's GetAsString renders, and the numbers
// are the printf texts that define them.
TEST(WriterTest, LeafValuesMatchGetAsStringAndPrintf) {
    struct Case {
        DWXParseTreeNode* node;
        std::string value;
    };
    const std::string longText(100000, 'w');
    const std::vector<Case> cases = {
        {new PTNInteger("i", 0), "0"},
        {new PTNInteger("i", INT_MIN), "-2147483648"},
        {new PTNInteger("i", INT_MAX), "2147483647"},
        {new PTNBool("b", 0), "FALSE"},
        {new PTNBool("b", -1), "TRUE"},
        {new PTNChar("c", '\xE9'), "\xE9"},
        {new PTNChar("c", 0), ""},
        {new PTNFloat("f", -0.25f), "-0.250000"},
        {new PTNFloat("f", 1e30f), Printed("%f", 1e30f)},
        {new PTNFloat("f", 0.0078125f), Printed("%f", 0.0078125)},  // a tie, rounded to even
        {new PTNFloat("f", -INFINITY), Printed("%f", -INFINITY)},
        {new PTNFloat("f", NAN), Printed("%f", NAN)},
        {new PTNDouble("d", 0.1), MkName(0.1, -1)},
        {new PTNDouble("d", -1.7976931348623157e308), MkName(-1.7976931348623157e308, -1)},
        {new PTNDouble("d", 5e-324), MkName(5e-324, -1)},
        {new PTNDouble("d", 1e21), MkName(1e21, -1)},
        {new PTNDouble("d", -0.0), "-0"},
        {new PTNDouble("d", INFINITY), MkName(INFINITY, -1)},
        {new PTNString("s", nullptr), "\\q\\q"},
        {new PTNString("s", ""), "\"\""},
        {new PTNString("s", "a\"b\\c\nd"), "\"a\\qb\\\\c\\nd\""},
        {new PTNString("s", longText.c_str()), "\"" + longText + "\""},
    };
    PTNSubTree tree("t");
    std::string expected = "(t SubTree\n";
    for (const Case& c : cases) {
        tree.AddChild(c.node);
        EXPECT_EQ(Text(*c.node), c.value) << c.node->GetClassName();
        expected += std::string("  (") + c.node->GetName() + " " + (c.node->GetClassName() + 3) +
                    " " + c.value + ")\n";
    }
    expected += ")\n";
    EXPECT_EQ(Text(tree), expected);
    EXPECT_EQ(PTNFloat("f", 1e30f).GetValue(), 1e30f);
}

// Subclasses render through their own GetClassName and GetAsString, exact
// library classes or not; only real subtrees named PTNSubTree nest.
struct Celsius : PTNInteger {
    Celsius(const char* name, int value) : PTNInteger(name, value) {}
    const char* GetClassName() const override { return "PTNCelsius"; }
    char* GetAsString() const override { return HSPrintf("%d C", GetValue()); }
};
struct Quiet : PTNString {
    Quiet() : PTNString("q", "secret") {}
    char* GetAsString() const override { return nullptr; }
};
struct Group : PTNSubTree {
    Group() : PTNSubTree("g") { AddChild(new PTNInteger("in", 1)); }
    const char* GetClassName() const override { return "PTNGroup"; }
};
struct Impostor : PTNBool {
    Impostor() : PTNBool("fake", 1) {}
    const char* GetClassName() const override { return "ptnsubtree"; }
};
struct Folder : PTNSubTree {
    Folder() : PTNSubTree("folder") { AddChild(new PTNChar("nl", '\n')); }
    const char* GetClassName() const override { return "PTNSUBTREE"; }
};

TEST(WriterTest, HostSubclassesRenderThemselves) {
    PTNSubTree tree("t");
    tree.AddChild(new Celsius("temp", 21));
    tree.AddChild(new Quiet());
    tree.AddChild(new Group());
    tree.AddChild(new Impostor());
    tree.AddChild(new Folder());
    EXPECT_EQ(Lines(tree),
              "(t SubTree|  (temp Celsius 21 C)|  (q String )|"
              "  (g Group (g Group\n  (in Integer 1)\n)\n)|  (fake subtree TRUE)|"
              "  (folder SUBTREE|    (nl Char \n)|  )|)|");
}

// A file receives the text in blocks; what arrives is the text, whatever the
// sizes of the lines and of the whole.
TEST(WriterTest, LargeTreesReachTheFileWhole) {
    PTNSubTree tree("big");
    for (int i = 0; i < 3000; ++i) {
        auto* item = new PTNSubTree("item");
        tree.AddChild(item);
        item->AddChild(new PTNInteger("id", i));
        item->AddChild(new PTNDouble("scale", i / 8.0));
        item->AddChild(new PTNString("label", std::string(i % 97 * 7, 'x').c_str()));
    }
    tree.AddChild(new PTNString("huge", std::string(200000, 'h').c_str()));
    char* buffer = nullptr;
    size_t size = 0;
    FILE* stream = open_memstream(&buffer, &size);
    tree.WriteToFile(stream);
    fclose(stream);
    char** list = tree.GetAsStringList(0);
    char* joined = StringListToBuffer(list);
    EXPECT_EQ(CountStringList(list), 3 * 3000 + 2 + 3000 * 2 + 1);
    EXPECT_EQ(std::string(buffer, size), joined);
    EXPECT_EQ(Text(tree), joined);
    free(joined);
    DestroyStringList(list);
    free(buffer);
}

}  // namespace
