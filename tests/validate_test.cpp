// PTNValidateFile: does a stream hold a tree of a given name?
#include <dwxcore/dwxparse.h>

#include <gtest/gtest.h>

#include <stdio.h>
#include <string.h>

namespace {

// A stream holding `text`, positioned at its end as after writing.
FILE* StreamOf(const char* text) {
    FILE* stream = tmpfile();
    fputs(text, stream);
    return stream;
}

int Validate(const char* text, const char* name) {
    FILE* stream = StreamOf(text);
    int answer = PTNSubTree::PTNValidateFile(stream, name);
    // Left at its start whatever the answer.
    EXPECT_EQ(ftell(stream), 0) << text;
    fclose(stream);
    return answer;
}

TEST(ValidateTest, Answers) {
    struct Row {
        const char* text;
        const char* name;
        int answer;
    } rows[] = {
        {"(config SubTree\n)\n", "config", 1},
        {"(config SubTree\n)\n", "CONFIG", 1},
        {"(config subtree\n", "config", 1},
        {"(config\tSUBTREEx\n", "config", 1},
        {"(config SubTree\n", "conf", 0},
        {"(config SubTree\n", "configuration", 0},
        {"(config\n(x SubTree\n", "config", 0},
        {"(config\n", "config", 0},
        {"\n   \n! comment\n  # more\n  (config SubTree\n", "config", 1},
        {"(config Integer 1)\n(config SubTree\n", "config", 0},
        {"( \tconfig SubTree\n", "config", 1},
        {"config SubTree\n", "config", 0},
        {"! only comments\n\n", "config", 0},
        {"", "config", 0},
        // A UTF-8 byte order mark starts the first line only, as for the reader.
        {"\xEF\xBB\xBF(config SubTree\n", "config", 1},
        {"\xEF\xBB\xBF\n# c\n(config SubTree\n", "config", 1},
        {"\xEF\xBB\xBF", "config", 0},
        {"\n\xEF\xBB\xBF(config SubTree\n", "config", 0},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(Validate(row.text, row.name), row.answer) << row.text << " / " << row.name;
    }
    FILE* stream = StreamOf("(config SubTree\n");
    EXPECT_EQ(PTNSubTree::PTNValidateFile(stream, nullptr), 0);
    EXPECT_EQ(PTNSubTree::PTNValidateFile(nullptr, "config"), 0);
    fclose(stream);
}

TEST(ValidateTest, WrittenTreeValidatesAndReadsOnFromTheStart) {
    FILE* stream = tmpfile();
    PTNSubTree config("config");
    config.AddChild(new PTNInteger("width", 640));
    config.WriteToFile(stream);
    EXPECT_EQ(PTNSubTree::PTNValidateFile(stream, "Config"), 1);
    PTNSubTree root("root");
    root.BuildFromFile(stream);
    fclose(stream);
    auto* back = dynamic_cast<PTNSubTree*>(root.GetChild("config"));
    ASSERT_NE(back, nullptr);
    EXPECT_EQ(back->GetChildAsInteger("width"), 640);
}

}  // namespace
