// The writer: exact line formats and indents of every node class, as string
// lists, as one buffer and on a stream.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/utilhub.h>

#include <stdio.h>
#include <stdlib.h>

#include <string>
#include <vector>

namespace {

std::vector<std::string> Lines(const PTNSubTree& tree, int level = 0) {
    char** list = tree.GetAsStringList(level);
    std::vector<std::string> lines;
    for (char** line = list; line != nullptr && *line != nullptr; ++line) {
        lines.emplace_back(*line);
    }
    DestroyStringList(list);
    return lines;
}

PTNSubTree* Config() {
    auto* config = new PTNSubTree("config");
    auto* colors = new PTNSubTree("colors");
    config->AddChild(new PTNInteger("width", 640));
    config->AddChild(new PTNString("title", "Main window"));
    config->AddChild(colors);
    colors->AddChild(new PTNString("fg", "red"));
    return config;
}

const std::vector<std::string> kConfigLines = {
    "(config SubTree",
    "  (width Integer 640)",
    "  (title String \"Main window\")",
    "  (colors SubTree",
    "    (fg String \"red\")",
    "  )",
    ")",
};

TEST(WriterTest, EmptySubtreeIsTwoLines) {
    PTNSubTree empty("empty");
    EXPECT_EQ(Lines(empty), (std::vector<std::string>{"(empty SubTree", ")"}));
}

TEST(WriterTest, NestedSubtreesAreIndentedTwoBlanksPerLevel) {
    PTNSubTree* config = Config();
    EXPECT_EQ(Lines(*config), kConfigLines);
    std::vector<std::string> shifted;
    for (const std::string& line : kConfigLines) {
        shifted.push_back("    " + line);
    }
    EXPECT_EQ(Lines(*config, 2), shifted);
    EXPECT_EQ(Lines(*config, -1), kConfigLines);  // a negative level counts as 0
    delete config;
}

TEST(WriterTest, EveryLeafClassWritesItsKeywordAndValueText) {
    const int ints[] = {1, -2};
    const double doubles[] = {1.5, -2};
    const unsigned char bytes[] = {'a', 'b'};
    char* entries[] = {const_cast<char*>("x"), const_cast<char*>("y z"), nullptr};
    PTNSubTree tree("t");
    tree.AddChild(new PTNBool("b", 3));
    tree.AddChild(new PTNChar("c", 'Q'));
    tree.AddChild(new PTNInteger("i", -5));
    tree.AddChild(new PTNFloat("f", 0.5f));
    tree.AddChild(new PTNDouble("d", 0.1));
    tree.AddChild(new PTNString("s", "a\"b"));
    tree.AddChild(new PTNString("n", nullptr));
    tree.AddChild(new PTNStringList("sl", entries));
    tree.AddChild(new PTNIntegerList("il", 2, ints));
    tree.AddChild(new PTNInteger32List("i32", 2, ints));
    tree.AddChild(new PTNDoubleList("dl", 2, doubles));
    tree.AddChild(new PTNBase64("b64", bytes, 2));
    EXPECT_EQ(Lines(tree), (std::vector<std::string>{
                               "(t SubTree",
                               "  (b Bool TRUE)",
                               "  (c Char Q)",
                               "  (i Integer -5)",
                               "  (f Float 0.500000)",
                               "  (d Double 0.1)",
                               "  (s String \"a\\qb\")",
                               "  (n String \\q\\q)",
                               "  (sl StringList \"x\" \"y z\")",
                               "  (il IntegerList 1 -2)",
                               "  (i32 Integer32List 1.000000 -2.000000)",
                               "  (dl DoubleList 1.5 -2)",
                               "  (b64 Base64 YWI=)",
                               ")",
                           }));
}

TEST(WriterTest, EmptyValuesAndNullNamesLeaveEmptyFields) {
    PTNSubTree tree(nullptr);
    tree.AddChild(new PTNChar("c", 0));
    tree.AddChild(new PTNDoubleList("dl", 0, nullptr));
    tree.AddChild(new PTNStringList("sl", nullptr));
    tree.AddChild(new PTNBase64("b64", nullptr, 0));
    tree.AddChild(new PTNInteger(nullptr, 1));
    tree.AddChild(new PTNSubTree(nullptr));
    EXPECT_EQ(Lines(tree), (std::vector<std::string>{
                               "( SubTree",
                               "  (c Char )",
                               "  (dl DoubleList )",
                               "  (sl StringList )",
                               "  (b64 Base64 )",
                               "  ( Integer 1)",
                               "  ( SubTree",
                               "  )",
                               ")",
                           }));
}

TEST(WriterTest, GetAsStringAndWriteToFileGiveTheSameLines) {
    PTNSubTree* config = Config();
    std::string expected;
    for (const std::string& line : kConfigLines) {
        expected += line + "\n";
    }
    char* text = config->GetAsString();
    EXPECT_EQ(std::string(text), expected);
    free(text);

    char* buffer = nullptr;
    size_t size = 0;
    FILE* stream = open_memstream(&buffer, &size);
    fputs("before\n", stream);
    config->WriteToFile(stream);
    config->WriteToFile(nullptr);
    fclose(stream);
    EXPECT_EQ(std::string(buffer, size), "before\n" + expected);
    free(buffer);
    delete config;
}

TEST(WriterTest, DeepTreesKeepTheirShape) {
    PTNSubTree root("level0");
    PTNSubTree* current = &root;
    for (int level = 1; level <= 4; ++level) {
        current->AddChild(new PTNInteger("before", level));
        auto* next = new PTNSubTree(("level" + std::to_string(level)).c_str());
        current->AddChild(next);
        current->AddChild(new PTNInteger("after", level));
        current = next;
    }
    const std::vector<std::string> lines = Lines(root);
    ASSERT_EQ(lines.size(), 18u);
    EXPECT_EQ(lines[7], "        (before Integer 4)");
    EXPECT_EQ(lines[8], "        (level4 SubTree");
    EXPECT_EQ(lines[9], "        )");
    EXPECT_EQ(lines[10], "        (after Integer 4)");
    EXPECT_EQ(lines[11], "      )");
    EXPECT_EQ(lines[17], ")");
}

}  // namespace
