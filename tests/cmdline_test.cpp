#include <dwxcore/dwxcmdline.h>

#include <gtest/gtest.h>

#include <string.h>

#include <string>
#include <vector>

namespace {

DWXCmdLine Parse(std::vector<const char*> arguments) {
    return DWXCmdLine(static_cast<int>(arguments.size()), arguments.data());
}

// The values of an option joined with commas, "<absent>" for no option.
std::string Values(const DWXCmdLine& line, const char* name) {
    if (!line.Exist(name)) {
        return "<absent>";
    }
    std::string joined;
    for (int i = 0; i < line.Count(name); ++i) {
        joined += (i ? "," : "");
        joined += line.GetString(name, "<default>", i);
    }
    return joined;
}

TEST(DWXCmdLine, ValuesFollowTheirOption) {
    DWXCmdLine line = Parse({"prog", "a", "b", "-x", "1", "2", "-Y"});
    EXPECT_EQ("a,b", Values(line, "prog"));
    EXPECT_EQ("1,2", Values(line, "-x"));
    EXPECT_EQ("", Values(line, "-Y"));
    EXPECT_EQ(1, line.Exist("-y"));
    EXPECT_EQ(1, line.Exist("PROG"));
    EXPECT_EQ(0, line.Exist("x"));
    EXPECT_EQ(2, line.Count("-X"));
    EXPECT_EQ(0, line.Count("-Y"));
    EXPECT_EQ(2, line.GetInt("-x", 99, 1));
    EXPECT_EQ(99, line.GetInt("-x", 99, 2));
    EXPECT_EQ(99, line.GetInt("-x", 99, -1));
    EXPECT_EQ(99, line.GetInt("-Y", 99, 0));
    EXPECT_EQ(1, line.GetInt("-x", 99));
}

TEST(DWXCmdLine, HyphensDecideBetweenOptionsAndValues) {
    struct {
        std::vector<const char*> arguments;
        const char* name;
        const char* expected;
    } cases[] = {
        {{"prog", "-n", "--5"}, "-n", "-5"},
        {{"prog", "-n", "-5"}, "-n", ""},
        {{"prog", "-n", "-5"}, "-5", ""},
        {{"prog", "-n", "--"}, "-n", "-"},
        {{"prog", "-n", "---x"}, "-n", "--x"},
        {{"prog", "-", "a"}, "-", "a"},
        {{"prog", "-list", "a|b"}, "-list", "a,b"},
        {{"prog", "-list", "a||b|", "c"}, "-list", "a,b,c"},
        {{"prog", "-list", "|"}, "-list", ""},
        {{"prog", "-e", "", "x", ""}, "-e", "x"},
        {{"prog", "-e", ""}, "-e", ""},
        {{"prog", "-e", nullptr, "y"}, "-e", "y"},
        {{"prog", "-s", "a b"}, "-s", "a b"},
    };
    for (const auto& c : cases) {
        DWXCmdLine line = Parse(c.arguments);
        EXPECT_EQ(c.expected, Values(line, c.name)) << c.arguments[1] << " " << c.name;
    }

    DWXCmdLine negative = Parse({"prog", "-n", "--5", "--2.5"});
    EXPECT_EQ(-5, negative.GetInt("-n", 0, 0));
    EXPECT_FLOAT_EQ(-2.5f, negative.GetFloat("-n", 0.0f, 1));
}

TEST(DWXCmdLine, RepeatedOptionsAnswerWithTheFirst) {
    DWXCmdLine line = Parse({"prog", "-f", "one", "-F", "two", "three"});
    EXPECT_STREQ("one", line.GetString("-f", nullptr, 0));
    EXPECT_EQ(1, line.Count("-f"));
    EXPECT_EQ(nullptr, line.GetString("-F", nullptr, 1));
}

TEST(DWXCmdLine, MissingAnswersGiveTheDefaults) {
    static const char fallback[] = "fallback";
    const char* noVector[] = {nullptr};
    DWXCmdLine emptyLines[] = {DWXCmdLine(0, noVector),  DWXCmdLine(0, nullptr),
                               DWXCmdLine(-1, noVector), DWXCmdLine(""),
                               DWXCmdLine("   "),        DWXCmdLine(nullptr)};
    DWXCmdLine full = Parse({"prog", "-a", "1"});
    for (const DWXCmdLine& line : emptyLines) {
        EXPECT_EQ(0, line.Exist("prog"));
        EXPECT_EQ(0, line.Exist(""));
        EXPECT_EQ(0, line.Count("prog"));
        EXPECT_EQ(7, line.GetInt("prog", 7, 0));
        EXPECT_FLOAT_EQ(1.5f, line.GetFloat("prog", 1.5f, 0));
        EXPECT_EQ(fallback, line.GetString("prog", fallback, 0));
    }

    EXPECT_EQ(fallback, full.GetString("-b", fallback, 0));
    EXPECT_EQ(fallback, full.GetString("-a", fallback, 1));
    EXPECT_EQ(fallback, full.GetString("-a", fallback, -1));
    EXPECT_EQ(nullptr, full.GetString("-b", nullptr, 0));
    EXPECT_EQ(0, full.Exist(nullptr));
    EXPECT_EQ(0, full.Count(nullptr));
    EXPECT_EQ(fallback, full.GetString(nullptr, fallback, 0));
    EXPECT_EQ(1, full.GetInt("-a", 5, 0));
    EXPECT_EQ(0, Parse({"prog", "-a", "text"}).GetInt("-a", 5, 0));
}

TEST(DWXCmdLine, CommandStringMatchesTheVector) {
    const char* names[] = {"prog", "-v", "-w", "-x", "other"};
    DWXCmdLine vector = Parse({"prog", "p1", "-v", "3", "-w", "-x", "a|b", "--1"});
    for (const char* command :
         {"prog p1 -v 3 -w -x a|b --1", "  prog   p1 -v  3 -w -x a|b --1  "}) {
        DWXCmdLine line(command);
        for (const char* name : names) {
            EXPECT_EQ(Values(vector, name), Values(line, name)) << command << " " << name;
        }
    }
    DWXCmdLine simple("prog -v 3");
    EXPECT_EQ(3, simple.GetInt("-v", 0, 0));
}

TEST(DWXCmdLine, ArgumentsAreCopied) {
    char program[] = "prog";
    char option[] = "-o";
    char value[] = "value";
    char* arguments[] = {program, option, value};
    DWXCmdLine line(3, arguments);
    strcpy(value, "VALUE");
    strcpy(option, "-p");
    EXPECT_STREQ("value", line.GetString("-o", nullptr, 0));
    EXPECT_EQ(0, line.Exist("-p"));
}

TEST(DWXCmdLine, CopiesAreDeepAndIndependent) {
    auto* source = new DWXCmdLine(Parse({"prog", "a", "-x", "1", "2", "-y"}));
    DWXCmdLine copy(*source);
    DWXCmdLine assigned = Parse({"other", "-z", "9"});
    assigned = *source;
    const char* sourceValue = source->GetString("-x", nullptr, 1);
    EXPECT_NE(sourceValue, copy.GetString("-x", nullptr, 1));
    delete source;

    for (const DWXCmdLine* line : {&copy, &assigned}) {
        EXPECT_EQ("a", Values(*line, "prog"));
        EXPECT_EQ("1,2", Values(*line, "-x"));
        EXPECT_EQ("", Values(*line, "-y"));
        EXPECT_EQ("<absent>", Values(*line, "-z"));
        EXPECT_EQ("<absent>", Values(*line, "other"));
    }

    DWXCmdLine& alias = copy;
    copy = alias;
    EXPECT_EQ("1,2", Values(copy, "-x"));

    DWXCmdLineOption option("-o");
    DWXCmdLineOption optionCopy(option);
    option = optionCopy;
    optionCopy = option;
    EXPECT_STREQ("Option", optionCopy.GetClassName());
    EXPECT_STREQ("DWXCmdLine", copy.GetClassName());
}

}  // namespace
