// What the fuzz target's model of the syntax leaves out (its corpus replay
// checks the argument shapes, in vectors and commands): null and empty input,
// the parser's own copies of its arguments, self-assignment.
#include "../fuzz/cmdline_model.h"

#include <gtest/gtest.h>

using cmdline_model::Mismatch;
using cmdline_model::Model;

TEST(DWXCmdLine, NullInputOwnCopiesAndSelfAssignment) {
    char value[] = "1";
    const char* arguments[] = {"prog", "-x", nullptr, value};
    DWXCmdLine line(4, arguments);
    value[0] = '9';
    const DWXCmdLine& alias = line;
    line = alias;
    EXPECT_EQ(Mismatch(line, Model({"prog", "-x", "", "1"}), "-X"), "");
    for (const DWXCmdLine& empty : {DWXCmdLine(0, arguments), DWXCmdLine(1, nullptr),
                                    DWXCmdLine("  "), DWXCmdLine(nullptr)}) {
        EXPECT_EQ(Mismatch(empty, {}, "prog"), "");
    }
}
