// Bad and huge input for the reader: include chains, cycles, diamonds and
// missing files; a 1 MB line, a million siblings and nesting far deeper than
// any configuration. Whatever happens is reported through the error handler,
// everything read before a problem stays, and nothing crashes.
#include "report_capture.h"
#include "scratch_dir.h"
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <stdlib.h>
#include <string.h>
#include <strings.h>
#include <unistd.h>

#include <map>
#include <memory>
#include <string>
#include <vector>

namespace {

class RobustnessTest : public ::testing::Test {
  protected:
    ReportCapture oCapture;
    ScratchDir oDir;
};

// The number of subtrees on the path that always takes the first subtree child.
int Depth(const PTNSubTree* tree) {
    int depth = 0;
    for (;;) {
        const PTNSubTree* next = nullptr;
        DWXIter it(tree->GetChildren());
        for (DWXObject* object = it.Current(); object && !next; object = it.Next()) {
            next = dynamic_cast<PTNSubTree*>(object);
        }
        if (!next) {
            return depth;
        }
        tree = next;
        ++depth;
    }
}

TEST_F(RobustnessTest, IncludeChainOfAHundredFiles) {
    // chainI holds nI, includes chainI+1, then holds tI: the included nodes
    // sit between nI and tI.
    const int files = 100;
    for (int i = 0; i < files; ++i) {
        std::string text = "(n" + std::to_string(i) + " Integer " + std::to_string(i) + ")\n";
        if (i + 1 < files) {
            text += "(@include " + oDir.Path("chain" + std::to_string(i + 1) + ".cfg") + ")\n";
        }
        text += "(t" + std::to_string(i) + " Integer " + std::to_string(i) + ")\n";
        oDir.Write("chain" + std::to_string(i) + ".cfg", text);
    }
    PTNSubTree tree("root");
    ReadFile(tree, oDir.Path("chain0.cfg"));

    // Files 0 to read - 1 were read; a depth limit, if it stops the chain,
    // is reported once, naming the first file left out.
    int read = 0;
    while (read < files && tree.GetChild(("n" + std::to_string(read)).c_str())) {
        ++read;
    }
    std::string expected;
    for (int i = 0; i < read; ++i) {
        expected += "n" + std::to_string(i) + " ";
    }
    for (int i = read - 1; i >= 0; --i) {
        expected += "t" + std::to_string(i) + (i ? " " : "");
    }
    EXPECT_EQ(Shape(&tree), expected);
    if (read == files) {
        EXPECT_TRUE(oCapture.Reports().empty());
    } else {
        EXPECT_GE(read, 50);
        ASSERT_EQ(oCapture.Reports().size(), 1u);
        EXPECT_EQ(oCapture.Reports()[0].code, 3);
        EXPECT_EQ(oCapture.Reports()[0].severity, 2);
        EXPECT_NE(oCapture.Reports()[0].message.find("chain" + std::to_string(read) + ".cfg'"),
                  std::string::npos)
            << oCapture.Reports()[0].message;
    }
}

TEST_F(RobustnessTest, IncludeCyclesDiamondsAndMissingFiles) {
    struct Case {
        const char* name;
        std::map<std::string, std::string> files;  // "@NAME" stands for NAME's path
        const char* start;
        const char* shape;
        std::vector<std::string> reports;  // texts each report holds, in order
    };
    const Case cases[] = {
        {"self-include",
         {{"a", "(x Integer 1)\n(@include @a)\n(y Integer 2)\n"}},
         "a",
         "x y",
         {"Include cycle: file '@a'"}},
        {"cycle of three",
         {{"a", "(a1 Integer 1)\n(@include @b)\n(a2 Integer 2)\n"},
          {"b", "(b1 Integer 1)\n(@include @c)\n(b2 Integer 2)\n"},
          {"c", "(c1 Integer 1)\n(@include @a)\n(c2 Integer 2)\n"}},
         "a",
         "a1 b1 c1 c2 b2 a2",
         {"Include cycle: file '@a'\nrequested in @include directive\non line 2 of file '@c'"}},
        {"cycle through a subtree",
         {{"a", "(s SubTree\n  (@include @b)\n)\n(after Integer 1)\n"},
          {"b", "(inner SubTree\n(@try_include @a)\n)\n"}},
         "a",
         "s{inner{}} after",
         {"Include cycle: file '@a'\nrequested in @try_include directive"}},
        {"diamond",
         {{"a", "(@include @b)\n(@include @c)\n"},
          {"b", "(b Integer 1)\n(@include @d)\n"},
          {"c", "(c Integer 1)\n(@include @d)\n"},
          {"d", "(d Integer 1)\n"}},
         "a",
         "b d c d",
         {}},
        {"missing at the top",
         {{"a", "(a1 Integer 1)\n(@include @gone)\n(@include @b)\n"},
          {"b", "(b1 Integer 1)\n(@include @c)\n"},
          {"c", "(c1 Integer 1)\n"}},
         "a",
         "a1 b1 c1",
         {"Unable to locate file '@gone'\nrequested in @include directive\non line 2 of file "
          "'@a'"}},
        {"missing in the middle",
         {{"a", "(a1 Integer 1)\n(@include @b)\n(a2 Integer 2)\n"},
          {"b", "(b1 Integer 1)\n(@include @c)\n\n! comment\n(@include @gone)\n(b2 Integer 2)\n"},
          {"c", "(c1 Integer 1)\n"}},
         "a",
         "a1 b1 c1 b2 a2",
         {"on line 5 of file '@b'"}},
        {"missing at the bottom, silently tried first",
         {{"a", "(@include @b)\n(a2 Integer 2)\n"},
          {"b", "(@include @c)\n"},
          {"c", "(@TRY_INCLUDE @gone)\n(@include @gone)\n(c1 Integer 1)\n"}},
         "a",
         "c1 a2",
         {"Unable to locate file '@gone'\nrequested in @include directive\non line 2 of file "
          "'@c'"}},
        {"directory and empty file",
         {{"a", "(@include @.)\n(@include @empty)\n(a1 Integer 1)\n"}, {"empty", ""}},
         "a",
         "a1",
         {"Unable to locate file '@.'"}},
    };
    // "@NAME" in a text becomes the path of file NAME.
    auto resolve = [this](std::string text) {
        for (size_t at = text.find('@'); at != std::string::npos; at = text.find('@', at + 1)) {
            size_t end = text.find_first_of(")'\n", at);
            std::string name = text.substr(at + 1, end - at - 1);
            if (strncasecmp(name.c_str(), "include", 7) == 0 ||
                strncasecmp(name.c_str(), "try_include", 11) == 0) {
                continue;  // a directive, not a file
            }
            std::string path = name == "." ? oDir.Root() : oDir.Path(name + ".cfg");
            text.replace(at, end - at, path);
            at += path.size() - 1;
        }
        return text;
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        oCapture.Clear();
        for (const auto& file : c.files) {
            oDir.Write(file.first + ".cfg", resolve(file.second));
        }
        PTNSubTree tree("root");
        ReadFile(tree, oDir.Path(std::string(c.start) + ".cfg"));
        EXPECT_EQ(Shape(&tree), c.shape);
        ASSERT_EQ(oCapture.Reports().size(), c.reports.size());
        for (size_t i = 0; i < c.reports.size(); ++i) {
            EXPECT_EQ(oCapture.Reports()[i].code, 3);
            EXPECT_EQ(oCapture.Reports()[i].severity, 2);
            EXPECT_NE(oCapture.Reports()[i].message.find(resolve(c.reports[i])), std::string::npos)
                << oCapture.Reports()[i].message;
        }
        oDir.Clear();
    }
}

TEST_F(RobustnessTest, MegabyteLine) {
    // A 1 MB value with every escape in it reads, writes and reads back whole.
    std::string value;
    while (value.size() < (1u << 20)) {
        value += "text \"quoted\" back\\slash\nline ";
    }
    PTNString leaf("big", value.c_str());
    char* token = leaf.GetAsString();
    std::string text = "(big String " + std::string(token) + ")\n(after Integer 1)\n";
    free(token);
    ASSERT_GT(text.size(), 1u << 20);

    PTNSubTree tree("root");
    tree.BuildFromString(text.c_str());
    EXPECT_EQ(tree.GetChildAsString("big"), value);
    EXPECT_EQ(tree.GetChildAsInteger("after"), 1);

    char* written = tree.GetAsString();
    PTNSubTree again("again");
    again.BuildFromString(written);
    free(written);
    auto* root = dynamic_cast<PTNSubTree*>(again.GetChild("root"));
    ASSERT_NE(root, nullptr);
    EXPECT_EQ(root->GetChildAsString("big"), value);
    EXPECT_TRUE(oCapture.Reports().empty());

    // A 1 MB line that is no node line is a corrupt line like any other.
    std::string junk(1u << 20, 'x');
    junk = "(ok Integer 1)\n" + junk + "\n(lost Integer 2)\n";
    PTNSubTree bad("bad");
    EXPECT_THROW(bad.BuildFromString(junk.c_str()), tzn::Exception);
    EXPECT_EQ(Shape(&bad), "ok");
    ASSERT_EQ(oCapture.Reports().size(), 1u);
    EXPECT_NE(oCapture.Reports()[0].message.find("at line 2"), std::string::npos);
}

TEST_F(RobustnessTest, AMillionSiblings) {
    // Memcheck runs this a few hundred times slower; the valgrind tests set
    // DWXCORE_UNDER_VALGRIND and check memory on a twentieth of the count.
    const int count = getenv("DWXCORE_UNDER_VALGRIND") ? 50000 : 1000000;
    std::string text = "(big SubTree\n";
    text.reserve(24u * count);
    for (int i = 0; i < count; ++i) {
        text += "  (i" + std::to_string(i) + " Integer " + std::to_string(i) + ")\n";
    }
    text += ")\n(after Integer 1)\n";

    PTNSubTree tree("root");
    tree.BuildFromString(text.c_str());
    EXPECT_TRUE(oCapture.Reports().empty());
    auto* big = dynamic_cast<PTNSubTree*>(tree.GetChild("big"));
    ASSERT_NE(big, nullptr);
    ASSERT_EQ(big->GetChildren()->GetCount(), count);
    EXPECT_EQ(big->GetChildAsInteger("i0"), 0);
    const std::string last = "i" + std::to_string(count - 1);
    EXPECT_EQ(big->GetChildAsInteger(last.c_str()), count - 1);
    EXPECT_EQ(tree.GetChildAsInteger("after"), 1);

    char** lines = big->GetAsStringList(0);
    EXPECT_EQ(CountStringList(lines), count + 2);
    DestroyStringList(lines);
}

TEST_F(RobustnessTest, NestingFarTooDeep) {
    // 100,000 nested subtrees, a leaf at the bottom. Either the whole tree is
    // read, and then copying, merging and deleting it must not exhaust the
    // stack; or a nesting limit stops the reading with one report and keeps
    // the levels above it, which then survive a write and a read back.
    const int levels = 100000;
    std::string text = "(first Integer 1)\n";
    for (int i = 1; i <= levels; ++i) {
        text += "(n" + std::to_string(i) + " SubTree\n";
    }
    text += "(leaf Integer 7)\n";
    for (int i = 0; i < levels; ++i) {
        text += ")\n";
    }
    text += "(after Integer 2)\n";

    PTNSubTree tree("root");
    tree.BuildFromString(text.c_str());
    EXPECT_EQ(tree.GetChildAsInteger("first"), 1);
    const int depth = Depth(&tree);
    if (depth == levels) {
        EXPECT_TRUE(oCapture.Reports().empty());
        EXPECT_EQ(tree.GetChildAsInteger("after"), 2);
        // Writing is left out: the indentation alone would be about 20 GB.
        std::unique_ptr<PTNSubTree> copy(tree.DeepCopy());
        EXPECT_EQ(Depth(copy.get()), levels);
        copy->SetFrom(&tree, ExceptionList());
        return;
    }
    EXPECT_GE(depth, 256);
    ASSERT_EQ(oCapture.Reports().size(), 1u);
    EXPECT_EQ(oCapture.Reports()[0].code, -1);
    EXPECT_EQ(oCapture.Reports()[0].severity, 1);
    // The first subtree left out opens line depth + 2.
    EXPECT_NE(oCapture.Reports()[0].message.find("at line " + std::to_string(depth + 2)),
              std::string::npos)
        << oCapture.Reports()[0].message;
    EXPECT_EQ(tree.GetChild("after"), nullptr);

    // The kept levels survive a write and a read back, and a deep copy.
    auto* top = dynamic_cast<PTNSubTree*>(tree.GetChild("n1"));
    ASSERT_NE(top, nullptr);
    char* written = top->GetAsString();
    PTNSubTree again("again");
    again.BuildFromString(written);
    free(written);
    EXPECT_EQ(Depth(&again), depth);
    std::unique_ptr<PTNSubTree> copy(tree.DeepCopy());
    EXPECT_EQ(Depth(copy.get()), depth);
    EXPECT_EQ(oCapture.Reports().size(), 1u);
}

}  // namespace
