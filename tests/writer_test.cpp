// The writer: exact line formats and indents, as lists, a buffer and a stream.
#include "container_test_util.h"
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <memory>
#include <string>

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
    EXPECT_EQ(Text(config), expected);
    EXPECT_EQ(Captured([&](FILE* f) { fputs("before\n", f), config.WriteToFile(f); }),
              "before\n" + expected);

    // A child deleted by hand leaves an empty slot behind, which writes nothing.
    delete config.GetChild("title");
    const std::string title = "  (title String \"Main window\")\n";
    EXPECT_EQ(Text(config), expected.erase(expected.find(title), title.size()));
}

TEST(WriterTest, EveryLeafClassAndEmptyFields) {
    const int ints[] = {1, -2};
    const double doubles[] = {1.5, -2};
    const unsigned char bytes[] = {'a', 'b'};
    char* entries[] = {const_cast<char*>("x"), const_cast<char*>("y z"), nullptr};
    PTNSubTree tree(nullptr);
    for (DWXParseTreeNode* node : std::initializer_list<DWXParseTreeNode*>{
             new PTNBool("b", 3), new PTNChar("c", 'Q'), new PTNFloat("f", 0.5f),
             new PTNDouble("d", 0.1), new PTNString("s", "a\"b"), new PTNString("n", nullptr),
             new PTNStringList("sl", entries), new PTNIntegerList("il", 2, ints),
             new PTNInteger32List("i32", 2, ints), new PTNDoubleList("dl", 2, doubles),
             new PTNBase64("b64", bytes, 2), new PTNChar("c0", 0),
             new PTNStringList("sl0", nullptr), new PTNBase64("b0", nullptr, 0),
             new PTNInteger(nullptr, 1)}) {
        tree.AddChild(node);
    }
    EXPECT_EQ(Lines(tree),
              "( SubTree|  (b Bool TRUE)|  (c Char Q)|  (f Float 0.500000)|  (d Double 0.1)|"
              "  (s String \"a\\qb\")|  (n String \\q\\q)|  (sl StringList \"x\" \"y z\")|"
              "  (il IntegerList 1 -2)|  (i32 Integer32List 1.000000 -2.000000)|"
              "  (dl DoubleList 1.5 -2)|  (b64 Base64 YWI=)|  (c0 Char )|  (sl0 StringList )|"
              "  (b0 Base64 )|  ( Integer 1)|)|");
    // Copies keep every class.
    EXPECT_EQ(Lines(*std::unique_ptr<PTNSubTree>(tree.DeepCopy())), Lines(tree));
}

// Subclasses render through their own GetClassName and GetAsString, exact
// library classes or not; only real subtrees named PTNSubTree nest.
struct Celsius : PTNInteger {
    Celsius() : PTNInteger("temp", 21) {}
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
    tree.AddChild(new Celsius());
    tree.AddChild(new Quiet());
    tree.AddChild(new Group());
    tree.AddChild(new Impostor());
    tree.AddChild(new Folder());
    EXPECT_EQ(Lines(tree),
              "(t SubTree|  (temp Celsius 21 C)|  (q String )|"
              "  (g Group (g Group\n  (in Integer 1)\n)\n)|  (fake subtree TRUE)|"
              "  (folder SUBTREE|    (nl Char \n)|  )|)|");
}

// Each kind: the class PTNKindOf names, the keyword its line carries, and
// whether reading that line builds the same kind again (Float and the
// integer lists are written but never read).
TEST(WriterTest, KindsKeywordsAndReadingAgree) {
    const int ints[] = {1, 2};
    const double doubles[] = {0.5};
    char entry[] = "a";
    char* strings[] = {entry, nullptr};
    const unsigned char bytes[] = {1, 2, 3};
    const struct {
        DWXParseTreeNode* node;
        PTNKind kind;
        const char* keyword;
        bool read;
    } rows[] = {
        {new PTNSubTree("n"), PTNKind::kSubTree, "SubTree", true},
        {new PTNString("n", "v"), PTNKind::kString, "String", true},
        {new PTNStringList("n", strings), PTNKind::kStringList, "StringList", true},
        {new PTNInteger("n", 7), PTNKind::kInteger, "Integer", true},
        {new PTNChar("n", 'c'), PTNKind::kChar, "Char", true},
        {new PTNBool("n", 1), PTNKind::kBool, "Bool", true},
        {new PTNFloat("n", 1.5f), PTNKind::kFloat, "Float", false},
        {new PTNDouble("n", 2.5), PTNKind::kDouble, "Double", true},
        {new PTNDoubleList("n", 1, doubles), PTNKind::kDoubleList, "DoubleList", true},
        {new PTNIntegerList("n", 2, ints), PTNKind::kIntegerList, "IntegerList", false},
        {new PTNInteger32List("n", 2, ints), PTNKind::kInteger32List, "Integer32List", false},
        {new PTNBase64("n", bytes, 3u), PTNKind::kBase64, "Base64", true},
    };
    for (const auto& row : rows) {
        PTNSubTree tree("t");
        tree.AddChild(row.node);
        EXPECT_EQ(PTNKindOf(row.node), row.kind) << row.keyword;
        EXPECT_STREQ(PTNTypeKeyword(row.node->GetClassName()), row.keyword);
        HeapText text(tree.GetAsString());
        EXPECT_NE(strstr(text.get(), (std::string("(n ") + row.keyword).c_str()), nullptr)
            << text.get();
        PTNSubTree back("b");
        back.BuildFromString(text.get());
        DWXParseTreeNode* again = back.Find("t/n");
        EXPECT_EQ(again != nullptr, row.read) << row.keyword;
        if (again != nullptr) {
            EXPECT_EQ(PTNKindOf(again), row.kind) << row.keyword;
        }
    }
    // A host's subclass is no kind of the library's, whatever its name says.
    Folder folder;
    EXPECT_EQ(PTNKindOf(&folder), PTNKind::kOther);
    EXPECT_EQ(PTNKindOf(nullptr), PTNKind::kOther);
    EXPECT_STREQ(PTNTypeKeyword(nullptr), "");
    EXPECT_STREQ(PTNTypeKeyword("Ab"), "Ab");
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
    char** list = tree.GetAsStringList(0);
    HeapText joined(StringListToBuffer(list));
    EXPECT_EQ(CountStringList(list), 3 * 3000 + 2 + 3000 * 2 + 1);
    DestroyStringList(list);
    EXPECT_EQ(Captured([&](FILE* f) { tree.WriteToFile(f); }), joined.get());
    EXPECT_EQ(Text(tree), joined.get());
}

}  // namespace
