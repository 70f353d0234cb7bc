// The parser against the model of the syntax it shares with the fuzz target,
// from vectors and from commands (extra blanks between words); then what the
// model leaves out: null input, own copies of the arguments, self-assignment.
#include "../fuzz/cmdline_model.h"

#include <gtest/gtest.h>

using cmdline_model::Mismatch;
using cmdline_model::Model;

TEST(DWXCmdLine, VectorsAndCommandsParseAsTheModel) {
    const std::vector<std::vector<std::string>> cases = {
        {"prog", "a", "b", "-x", "1", "2", "-Y", "-f", "one", "-F", "two"},
        {"prog", "-n", "--2.5", "--5", "-5", "--", "-", "a"},
        {"prog", "-l", "a||b|", "c", "", "|", "-e"},
        {"-x", "x"},
    };
    for (const auto& args : cases) {
        std::vector<const char*> vector;
        std::string command;
        for (const std::string& arg : args) {
            vector.push_back(arg.c_str());
            command += "  " + arg;
        }
        for (const char* probe : {"PROG", "-y", "x"}) {
            EXPECT_EQ(Mismatch(DWXCmdLine(int(vector.size()), vector.data()), Model(args), probe),
                      "");
            EXPECT_EQ(Mismatch(DWXCmdLine(command.c_str()),
                               Model(cmdline_model::Split(command, ' ')), probe),
                      "");
        }
    }
}

TEST(DWXCmdLine, NullInputOwnCopiesAndSelfAssignment) {
    char value[] = "1";
    const char* arguments[] = {"prog", "-x", nullptr, value};
    DWXCmdLine line(4, arguments);
    value[0] = '9';
    const DWXCmdLine& alias = line;
    line = alias;
    EXPECT_EQ(Mismatch(line, Model({"prog", "-x", "", "1"}), "-x"), "");
    for (const DWXCmdLine& empty : {DWXCmdLine(0, arguments), DWXCmdLine(1, nullptr),
                                    DWXCmdLine("  "), DWXCmdLine(nullptr)}) {
        EXPECT_EQ(Mismatch(empty, {}, "prog"), "");
    }
}
