// The writer: exact line formats and indents, as lists, a buffer and a stream.
#include <dwxcore/dwxparse.h>
#include <gtest/gtest.h>
#include <services/utilhub.h>

#include <stdio.h>
#include <stdlib.h>

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

}  // namespace
