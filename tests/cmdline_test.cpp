#include <dwxcore/dwxcmdline.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

DWXCmdLine Parse(std::vector<const char*> arguments) {
    return DWXCmdLine(static_cast<int>(arguments.size()), arguments.data());
}

// The values of an option joined with commas; "<absent>" without the option.
std::string Values(const DWXCmdLine& line, const char* name) {
    std::string joined = line.Exist(name) ? "" : "<absent>";
    for (int i = 0; i < line.Count(name); ++i) {
        joined += std::string(i ? "," : "") + line.GetString(name, "<default>", i);
    }
    return joined;
}

TEST(DWXCmdLine, ValuesFollowTheirOption) {
    DWXCmdLine line = Parse({"prog", "a", "b", "-x", "1", "2", "-Y", "-f", "one", "-F", "two"});
    EXPECT_EQ("a,b", Values(line, "PROG"));  // values before the first option
    EXPECT_EQ("1,2", Values(line, "-x"));
    EXPECT_EQ("", Values(line, "-y"));
    EXPECT_EQ("<absent>", Values(line, "x"));
    EXPECT_EQ("one", Values(line, "-F"));  // repeated options: the first answers
    EXPECT_EQ(2, line.GetInt("-x", 99, 1));
    EXPECT_EQ(99, line.GetInt("-x", 99, 2));
    EXPECT_EQ(99, line.GetInt("-x", 99, -1));
    EXPECT_EQ(99, line.GetInt("-Y", 99, 0));
}

TEST(DWXCmdLine, HyphensAndBarsSplitArguments) {
    struct {
        std::vector<const char*> arguments;
        const char* name;
        const char* expected;
    } cases[] = {
        {{"prog", "-n", "--5"}, "-n", "-5"},
        {{"prog", "-n", "-5"}, "-n", ""},
        {{"prog", "-n", "-5"}, "-5", ""},
        {{"prog", "-n", "--"}, "-n", "-"},
        {{"prog", "-", "a"}, "-", "a"},
        {{"prog", "-l", "a|b"}, "-l", "a,b"},
        {{"prog", "-l", "a||b|", "c"}, "-l", "a,b,c"},
        {{"prog", "-e", "", "x", nullptr}, "-e", "x"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(c.expected, Values(Parse(c.arguments), c.name)) << c.arguments[2];
    }
    DWXCmdLine numbers = Parse({"prog", "-n", "--5", "--2.5", "x"});
    EXPECT_EQ(-5, numbers.GetInt("-n", 0, 0));
    EXPECT_FLOAT_EQ(-2.5f, numbers.GetFloat("-n", 0.0f, 1));
    EXPECT_EQ(0, numbers.GetInt("-n", 7, 2));
}

TEST(DWXCmdLine, MissingAnswersGiveTheCallersDefault) {
    static const char fallback[] = "fallback";
    const char* noArguments[] = {nullptr};
    DWXCmdLine full = Parse({"prog", "-a", "1"});
    for (const DWXCmdLine& line : {DWXCmdLine(0, noArguments), DWXCmdLine(0, nullptr),
                                   DWXCmdLine("  "), DWXCmdLine(nullptr)}) {
        EXPECT_EQ(0, line.Exist("prog"));
        EXPECT_EQ(7, line.GetInt("prog", 7, 0));
        EXPECT_FLOAT_EQ(1.5f, line.GetFloat("prog", 1.5f, 0));
        EXPECT_EQ(fallback, line.GetString("prog", fallback, 0));
    }
    EXPECT_EQ(fallback, full.GetString("-b", fallback, 0));
    EXPECT_EQ(fallback, full.GetString("-a", fallback, 1));
    EXPECT_EQ(fallback, full.GetString(nullptr, fallback, 0));
    EXPECT_EQ(0, full.Exist(nullptr));
}

TEST(DWXCmdLine, CommandStringMatchesTheVector) {
    DWXCmdLine vector = Parse({"prog", "p1", "-v", "3", "-w", "-x", "a|b", "--1"});
    for (const char* command : {"prog p1 -v 3 -w -x a|b --1", "  prog  p1 -v  3 -w -x a|b --1 "}) {
        DWXCmdLine line(command);
        for (const char* name : {"prog", "-v", "-w", "-x", "p1"}) {
            EXPECT_EQ(Values(vector, name), Values(line, name)) << command << " " << name;
        }
    }
}

TEST(DWXCmdLine, CopiesAreDeepAndIndependent) {
    char value[] = "1";
    const char* arguments[] = {"prog", "a", "-x", value, "2", "-y"};
    auto* source = new DWXCmdLine(6, arguments);
    value[0] = '9';  // the parser keeps its own copies
    DWXCmdLine copy(*source);
    DWXCmdLine assigned = Parse({"other", "-z", "9"});
    assigned = *source;
    delete source;
    DWXCmdLine& alias = copy;
    copy = alias;
    for (const DWXCmdLine* line : {&copy, &assigned}) {
        EXPECT_EQ("a", Values(*line, "prog"));
        EXPECT_EQ("1,2", Values(*line, "-x"));
        EXPECT_EQ("", Values(*line, "-y"));
        EXPECT_EQ("<absent>", Values(*line, "-z"));
    }

    DWXCmdLineOption option("-o"), optionCopy(option);
    option = optionCopy;
    EXPECT_STREQ("Option", option.GetClassName());
}

}  // namespace
