// The writer: exact line formats and indents, as lists, a buffer and a stream.
#include "container_test_util.h"
#include "tree_test_util.h"

#include <float.h>
#include <limits.h>

#include <tuple>

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

// Each kind: its line and the kind PTNKindOf names (doubles in the fewest
// digits that read back exactly); the whole as lists at any indent, a buffer
// and a stream.
TEST(WriterTest, EveryKindItsLine) {
    const int ints[] = {1, -2};
    const double doubles[] = {1.5, -2};
    const unsigned char bytes[] = {'a', 'b'};
    char* entries[] = {const_cast<char*>("x"), const_cast<char*>("y z"), nullptr};
    auto* nested = new PTNSubTree("t");
    nested->BuildFromString("(fg String \"red\")\n(e SubTree\n)\n");
    const std::tuple<DWXParseTreeNode*, PTNKind, const char*> rows[] = {
        {nested, PTNKind::kSubTree,
         "(t SubTree\n    (fg String \"red\")\n    (e SubTree\n    )\n  )"},
        {new PTNBool("b", 3), PTNKind::kBool, "(b Bool TRUE)"},
        {new PTNBool("no", 0), PTNKind::kBool, "(no Bool FALSE)"},
        {new PTNInteger("min", INT_MIN), PTNKind::kInteger, "(min Integer -2147483648)"},
        {new PTNDouble("w", 640), PTNKind::kDouble, "(w Double 640)"},
        {new PTNDouble("z", -0.0), PTNKind::kDouble, "(z Double -0)"},
        {new PTNChar("c", 'Q'), PTNKind::kChar, "(c Char Q)"},
        {new PTNChar("c0", 0), PTNKind::kChar, "(c0 Char )"},
        {new PTNFloat("f", 0.5f), PTNKind::kFloat, "(f Float 0.500000)"},
        {new PTNDouble("d", 0.1), PTNKind::kDouble, "(d Double 0.1)"},
        {new PTNDouble("max", -DBL_MAX), PTNKind::kDouble, "(max Double -1.7976931348623157e+308)"},
        {new PTNDouble("dn", 5e-324), PTNKind::kDouble, "(dn Double 5e-324)"},
        {new PTNString("s", "a\"b"), PTNKind::kString, "(s String \"a\\qb\")"},
        {new PTNString("n", nullptr), PTNKind::kString, "(n String \\q\\q)"},
        {new PTNStringList("sl", entries), PTNKind::kStringList, "(sl StringList \"x\" \"y z\")"},
        {new PTNStringList("sl0", nullptr), PTNKind::kStringList, "(sl0 StringList )"},
        {new PTNIntegerList("il", 2, ints), PTNKind::kIntegerList, "(il IntegerList 1 -2)"},
        {new PTNInteger32List("i32", 2, ints), PTNKind::kInteger32List,
         "(i32 Integer32List 1.000000 -2.000000)"},
        {new PTNDoubleList("dl", 2, doubles), PTNKind::kDoubleList, "(dl DoubleList 1.5 -2)"},
        {new PTNBase64("b64", bytes, 2), PTNKind::kBase64, "(b64 Base64 YWI=)"},
        {new PTNBase64("b0", nullptr, 0), PTNKind::kBase64, "(b0 Base64 )"},
        {new PTNInteger(nullptr, 1), PTNKind::kInteger, "( Integer 1)"},
    };
    PTNSubTree tree("all");
    std::string written = "(all SubTree\n";
    for (const auto& [node, kind, line] : rows) {
        tree.AddChild(node);
        EXPECT_EQ(PTNKindOf(node), kind) << line;
        written += "  " + std::string(line) + "\n";
    }
    // A line longer than the block a file receives at a time.
    const std::string huge(100000, 'h');
    tree.AddChild(new PTNString("h", huge.c_str()));
    written += "  (h String \"" + huge + "\")\n";
    std::string lines = written + ")\n";
    EXPECT_EQ(Text(tree), lines);
    EXPECT_EQ(Captured([&](FILE* f) { fputs("before\n", f), tree.WriteToFile(f); }),
              "before\n" + lines);
    EXPECT_EQ(Text(*std::unique_ptr<PTNSubTree>(tree.DeepCopy())), lines);
    for (char& c : lines) {
        c = c == '\n' ? '|' : c;
    }
    EXPECT_EQ(Lines(tree), lines);
    EXPECT_EQ(Lines(tree, -1), lines);
    EXPECT_EQ(Lines(*nested, 2),
              "    (t SubTree|      (fg String \"red\")|      (e SubTree|      )|    )|");
    // A child deleted by hand leaves an empty slot behind, which writes nothing.
    delete std::get<0>(rows[1]);
    EXPECT_EQ(Text(tree), written.erase(written.find("  (b Bool"), 16) + ")\n");
    EXPECT_EQ(PTNKindOf(nullptr), PTNKind::kOther);
    EXPECT_STREQ(PTNTypeKeyword(nullptr), "");
    EXPECT_STREQ(PTNTypeKeyword("Ab"), "Ab");
}

// Subclasses render through their own GetClassName and GetAsString, exact
// library classes or not; only real subtrees named PTNSubTree nest.
struct Quiet : PTNString {
    Quiet() : PTNString("q", "secret") {}
    char* GetAsString() const override { return nullptr; }
};
// A library class under another class name.
template <class Base>
struct Renamed : Base {
    template <class... Args>
    explicit Renamed(const char* name, Args... args) : Base(args...), pcClass(name) {}
    const char* GetClassName() const override { return pcClass; }
    const char* pcClass;
};

TEST(WriterTest, HostSubclassesRenderThemselves) {
    auto* group = new Renamed<PTNSubTree>("PTNGroup", "g");
    auto* folder = new Renamed<PTNSubTree>("PTNSUBTREE", "folder");
    group->AddChild(new PTNInteger("in", 1)), folder->AddChild(new PTNChar("nl", '\n'));
    PTNSubTree tree("t");
    for (DWXParseTreeNode* node : std::initializer_list<DWXParseTreeNode*>{
             new Renamed<PTNInteger>("PTNCelsius", "temp", 21), new Quiet(), group,
             new Renamed<PTNBool>("ptnsubtree", "fake", 1), folder}) {
        tree.AddChild(node);
        EXPECT_EQ(PTNKindOf(node), PTNKind::kOther);  // whatever its name says
    }
    EXPECT_EQ(Lines(tree),
              "(t SubTree|  (temp Celsius 21)|  (q String )|"
              "  (g Group (g Group\n  (in Integer 1)\n)\n)|  (fake subtree TRUE)|"
              "  (folder SUBTREE|    (nl Char \n)|  )|)|");
}

}  // namespace
