// PTNValidateFile: does a stream hold a tree of a given name?
#include <dwxcore/dwxparse.h>

#include <gtest/gtest.h>

#include <stdio.h>

namespace {

TEST(ValidateTest, Answers) {
    struct Row {
        const char* text;
        const char* name;
        int answer;
    } rows[] = {
        {"(config SubTree\n)\n", "CONFIG", 1},
        {"(config\tSUBTREEx\n", "config", 1},
        {"(config SubTree\n", "conf", 0},
        {"(config SubTree\n", "configuration", 0},
        {"(config\n(x SubTree\n", "config", 0},
        {"\n   \n! comment\n  # more\n  ( \tconfig SubTree\n", "config", 1},
        {"(config Integer 1)\n(config SubTree\n", "config", 0},
        {"config SubTree\n", "config", 0},
        {"! only comments\n\n", "config", 0},
        {"(config SubTree\n", nullptr, 0},
        // A UTF-8 byte order mark starts the first line only, as for the reader.
        {"\xEF\xBB\xBF\n# c\n(config SubTree\n", "config", 1},
        {"\n\xEF\xBB\xBF(config SubTree\n", "config", 0},
    };
    for (const Row& row : rows) {
        FILE* stream = tmpfile();
        fputs(row.text, stream);  // left at its end, as after writing
        EXPECT_EQ(PTNSubTree::PTNValidateFile(stream, row.name), row.answer) << row.text;
        // Left at its start, whatever the answer, for the read that follows.
        EXPECT_TRUE(ftell(stream) == 0 || !row.name) << row.text;
        fclose(stream);
    }
    EXPECT_EQ(PTNSubTree::PTNValidateFile(nullptr, "config"), 0);
}

}  // namespace
