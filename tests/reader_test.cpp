// Reading the text form into trees: line kinds, keywords, the ')' cut, line
// numbers in reports, errors inside and outside subtrees, includes, and
// write-then-read round trips. Files live in a fresh temp directory.
#include <dwxcore/dwxparse.h>
#include <services/tracer.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

struct Report {
    int code;
    int severity;
    std::string message;
};
std::vector<Report> gReports;
void Capture(int code, int severity, const char* message) {
    gReports.push_back({code, severity, message ? message : ""});
}

class ReaderTest : public ::testing::Test {
  protected:
    void SetUp() override {
        gReports.clear();
        oPrevious = IMPSetErrorHandler(Capture);
        oDir = fs::temp_directory_path() /
               ("reader_test_" + std::to_string(::getpid()) + "_" +
                ::testing::UnitTest::GetInstance()->current_test_info()->name());
        fs::create_directories(oDir);
    }
    void TearDown() override {
        IMPSetErrorHandler(oPrevious);
        fs::remove_all(oDir);
        unsetenv(DWX_ETC_PATH_VARIABLE);
        unsetenv(DWX_PRO_PATH_VARIABLE);
    }
    std::string Write(const std::string& name, const std::string& text) {
        fs::path path = oDir / name;
        fs::create_directories(path.parent_path());
        std::ofstream(path, std::ios::binary) << text;
        return path.string();
    }
    // Reads a file opened the way hosts open it.
    void ReadFile(PTNSubTree& tree, const std::string& path) {
        FILE* stream = DKOpen(path.c_str(), 4, "r");
        ASSERT_NE(stream, nullptr);
        struct Closer {
            FILE* f;
            ~Closer() { DKClose(f); }
        } closer{stream};
        tree.BuildFromFile(stream);
    }

    IMPErrorHandler oPrevious = nullptr;
    fs::path oDir;
};

std::unique_ptr<PTNSubTree> Read(const char* text) {
    auto tree = std::make_unique<PTNSubTree>("root");
    tree->BuildFromString(text);
    return tree;
}

// The names of the children, joined with blanks; subtrees as name{...}.
std::string Shape(const PTNSubTree* tree) {
    std::string shape;
    DWXIter it(tree->GetChildren());
    for (DWXObject* object = it.Current(); object; object = it.Next()) {
        auto* node = static_cast<DWXParseTreeNode*>(object);
        if (!shape.empty())
            shape += ' ';
        shape += node->GetName();
        if (auto* sub = dynamic_cast<PTNSubTree*>(node))
            shape += "{" + Shape(sub) + "}";
    }
    return shape;
}

std::string ValueText(const DWXParseTreeNode* node) {
    char* text = node->GetAsString();
    std::string value = text ? text : "(null)";
    free(text);
    return value;
}

TEST_F(ReaderTest, EveryKeywordBuildsItsNode) {
    struct Row {
        const char* line;
        const char* className;  // null: no node
        const char* value;      // GetAsString of the node
    } rows[] = {
        {"(width Integer 640)", "PTNInteger", "640"},
        {"(width Integer 640 )", "PTNInteger", "640"},
        {"(width INTEGER 12abc", "PTNInteger", "12"},
        {"(c Char xyz)", "PTNChar", "x"},
        {"(b Boolean yes)", "PTNBool", "TRUE"},
        {"(b Bool no)", "PTNBool", "FALSE"},
        {"(b bool Y)", "PTNBool", "TRUE"},
        {"(b BOOLish 1)", "PTNBool", "TRUE"},
        {"(b Bool on)", "PTNBool", "FALSE"},
        {"(d Double -2.5)", "PTNDouble", "-2.5"},
        {"(s String \"Main window\")", "PTNString", "\"Main window\""},
        {"(s String \"a\" \"b\")", "PTNString", "\"ab\""},
        {"(s String a\\qb)", "PTNString", "\"a\\qb\""},
        {"(s String )", "PTNString", "\"\""},
        {"(s String \"x\" ) ignored", "PTNString", "\"x\""},
        {"(l StringList \"x\" \"y z\")", "PTNStringList", "\"x\" \"y z\""},
        {"(l StringList )", "PTNStringList", ""},
        {"(dl DoubleList 1.5 2.5)", "PTNDoubleList", "1.5 2.5"},
        {"(dl DoubleList )", "PTNDoubleList", ""},
        {"(b64 Base64 YWI)", "PTNBase64", "YWI"},
        {"(x IntegerList 1 2)", nullptr, nullptr},
        {"(x Integer32List 1)", nullptr, nullptr},
        {"(x Float 1.5)", nullptr, nullptr},
        {"(x Whatever 1)", nullptr, nullptr},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.line);
        std::string text = std::string(row.line) + "\n(after Integer 1)\n";
        auto tree = Read(text.c_str());
        EXPECT_TRUE(gReports.empty());
        EXPECT_EQ(tree->GetChildAsInteger("after"), 1);
        // The row's node, if any, comes first and "after" is read regardless.
        ASSERT_EQ(tree->GetChildren()->GetCount(), row.className ? 2 : 1);
        if (!row.className) {
            continue;
        }
        auto* node = static_cast<DWXParseTreeNode*>((*tree->GetChildren())[0]);
        ASSERT_NE(node, nullptr);
        EXPECT_STREQ(node->GetClassName(), row.className);
        EXPECT_EQ(ValueText(node), row.value);
    }
    // The reader stores exactly 1 for a true Bool, and an empty StringList
    // has a list without entries.
    auto tree = Read("(b Bool TRUE)\n(l StringList )\n");
    EXPECT_EQ(tree->GetChildAsBool("b"), 1);
    ASSERT_NE(tree->GetChildAsStringList("l"), nullptr);
    EXPECT_EQ(tree->GetChildAsStringList("l")[0], nullptr);
}

TEST_F(ReaderTest, CorruptLineOutsideSubtreesReachesHost) {
    // Comments and blank lines count: the bad line is always line 5. The
    // cut takes a ')' after a tab, leaving no token.
    const char* bad[] = {"(n String)", "n Integer 1", "(n)", "(n Integer)", "\t)"};
    for (const char* line : bad) {
        SCOPED_TRACE(line);
        gReports.clear();
        std::string text =
            std::string("! c\n(a Integer 1)\n\n   # c\n") + line + "\n(b Integer 2)\n";
        PTNSubTree tree("root");
        EXPECT_THROW(tree.BuildFromString(text.c_str()), tzn::Exception);
        EXPECT_EQ(Shape(&tree), "a");
        ASSERT_EQ(gReports.size(), 1u);
        EXPECT_EQ(gReports[0].code, -1);
        EXPECT_EQ(gReports[0].severity, 1);
        EXPECT_EQ(gReports[0].message, "Corrupt file Memory\n at line 5 ... missing tokens.\n");
    }
}

TEST_F(ReaderTest, CorruptLineInsideSubtreeStopsQuietly) {
    const char* text =
        "(a Integer 1)\n(s SubTree\n  (b Integer 2)\n  (t SubTree\n    (c Integer 3)\n"
        "    (bad String)\n    (d Integer 4)\n  )\n  (e Integer 5)\n)\n(f Integer 6)\n";
    auto tree = Read(text);  // no exception
    EXPECT_EQ(Shape(tree.get()), "a s{b t{c}}");
    ASSERT_EQ(gReports.size(), 1u);
    EXPECT_NE(gReports[0].message.find("at line 6 "), std::string::npos);

    // Through AddChildrenFromStringList: null position, and the count that
    // the level holding the failed subtree had reached when it opened it.
    char** lines = BufferToStringList(text);
    PTNSubTree other("other");
    int counter = 10;
    EXPECT_EQ(other.AddChildrenFromStringList(lines, "f.cfg", &counter), nullptr);
    EXPECT_EQ(counter, 14);
    EXPECT_NE(gReports[1].message.find("Corrupt file f.cfg\n at line 16 "), std::string::npos);
    DestroyStringList(lines);
}

TEST_F(ReaderTest, LevelsPositionsAndCounter) {
    // A closing line at the outermost level ends the call; missing closing
    // lines end quietly; children already present stay in front.
    char** lines =
        BufferToStringList("(a Integer 1)\n# c\n)\n(b Integer 2)\n(s SubTree\n(c Char x");
    PTNSubTree tree("root");
    tree.AddChild(new PTNInteger("old", 0));
    int counter = 0;
    char** next = tree.AddChildrenFromStringList(lines, nullptr, &counter);
    EXPECT_EQ(next, lines + 3);
    EXPECT_EQ(counter, 3);
    EXPECT_EQ(Shape(&tree), "old a");
    next = tree.AddChildrenFromStringList(next, nullptr, &counter);
    EXPECT_EQ(next, lines + 6);
    EXPECT_EQ(*next, nullptr);
    EXPECT_EQ(counter, 6);
    EXPECT_EQ(Shape(&tree), "old a b s{c}");
    EXPECT_EQ(tree.AddChildrenFromStringList(nullptr, nullptr, nullptr), nullptr);
    DestroyStringList(lines);

    // A glued ')' is cut, so "(t SubTree)" opens a subtree, and "  )" is a
    // closing line.
    EXPECT_EQ(Shape(Read("(t SubTree)\n  (a Integer 1)\n  )\n(b Integer 2)\n").get()), "t{a} b");
    // "( config SubTree" builds nothing: the name is empty and config is the
    // keyword, so its children land on the same level, which its closing
    // line then ends.
    auto read = Read("( config SubTree\n(a Integer 1)\n)\n(b Integer 2)\n");
    EXPECT_EQ(Shape(read.get()), "a");
    EXPECT_EQ(Read(nullptr)->GetChildren()->GetCount(), 0);
    EXPECT_EQ(Read("")->GetChildren()->GetCount(), 0);
    EXPECT_TRUE(gReports.empty());
}

TEST_F(ReaderTest, CommentLinesAndTreeStart) {
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine(" \t# x"), 1);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine(nullptr), 1);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine("\xa1x"), 0);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine("x ! y"), 0);
    const char* mixed[] = {"! a", "  # b", "(x SubTree", nullptr};
    const char* comments[] = {"! a", "", nullptr};
    const char* empty[] = {nullptr};
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(mixed), 2);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(comments), -1);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(empty), -1);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(nullptr), -1);
    EXPECT_EQ(PTNSubTree::BuildPTNSubTreeFromStringList(mixed), nullptr);
}

TEST_F(ReaderTest, FilesAndForeignStreams) {
    std::string path = Write("main.cfg", "(a Integer 1)\r\n\n(bad)\n");
    PTNSubTree tree("root");
    try {
        ReadFile(tree, path);
        ADD_FAILURE() << "no exception";
    } catch (const tzn::Exception& e) {
        EXPECT_EQ(std::string(e.what()),
                  "Corrupt file " + path + "\n at line 3 ... missing tokens.\n");
    }
    EXPECT_EQ(Shape(&tree), "a");

    // A stream DKOpen did not open is read from its own content, from its
    // start, and left at its start; reports name it "Memory".
    FILE* foreign = fopen(path.c_str(), "r");
    ASSERT_NE(foreign, nullptr);
    fgetc(foreign);
    PTNSubTree other("other");
    try {
        other.BuildFromFile(foreign);
        ADD_FAILURE() << "no exception";
    } catch (const tzn::Exception& e) {
        EXPECT_STREQ(e.what(), "Corrupt file Memory\n at line 3 ... missing tokens.\n");
    }
    EXPECT_EQ(Shape(&other), "a");
    EXPECT_EQ(ftell(foreign), 0);
    fclose(foreign);
    other.BuildFromFile(nullptr);  // ignored
}

TEST_F(ReaderTest, IncludesPlaceNodesAndCountOwnLines) {
    std::string inc = Write("inc.cfg", "# own count\n(x Integer 9)\n)\n(never Integer 0)\n");
    std::string bad = Write("bad.cfg", "# 1\n# 2\n(oops)\n");
    std::string main =
        Write("main.cfg", "(a Integer 1)\n(@include " + inc + ")\n(s SubTree\n  (@Include " + inc +
                              ")\n  (y Integer 2)\n)\n(b Integer 3)\n");
    PTNSubTree tree("root");
    ReadFile(tree, main);
    EXPECT_EQ(Shape(&tree), "a x s{x y} b");
    EXPECT_TRUE(gReports.empty());

    // A corrupt line at the outermost level of an included file reaches the
    // host when the directive is outside every subtree...
    std::string top = Write("top.cfg", "(a Integer 1)\n(@include " + bad + ")\n(b Integer 2)\n");
    PTNSubTree failed("root");
    EXPECT_THROW(ReadFile(failed, top), tzn::Exception);
    ASSERT_EQ(gReports.size(), 1u);
    EXPECT_EQ(gReports[0].message, "Corrupt file " + bad + "\n at line 3 ... missing tokens.\n");
    // ...and stops the read quietly when it is inside one.
    std::string nested = Write(
        "nested.cfg", "(s SubTree\n(@include " + bad + ")\n(c Integer 1)\n)\n(d Integer 2)\n");
    PTNSubTree quiet("root");
    ReadFile(quiet, nested);
    EXPECT_EQ(Shape(&quiet), "s{}");
    // An error inside a subtree of the included file ends only that file.
    std::string inner = Write("inner.cfg", "(t SubTree\n(oops)\n)\n(lost Integer 1)\n");
    EXPECT_EQ(Shape(Read(("(@include " + inner + ")\n(z Integer 1)\n").c_str()).get()), "t{} z");
}

TEST_F(ReaderTest, MissingIncludesAndSearchPath) {
    setenv("READER_TEST_DIR", oDir.c_str(), 1);
    auto tree = Read(
        "(a Integer 1)\n! c\n(@include $READER_TEST_DIR/none.cfg)\n"
        "(@TRY_INCLUDE ${READER_TEST_DIR}/none.cfg)\n(b Integer 2)\n");
    EXPECT_EQ(Shape(tree.get()), "a b");
    ASSERT_EQ(gReports.size(), 1u);
    EXPECT_EQ(gReports[0].code, 3);
    EXPECT_EQ(gReports[0].severity, 2);
    EXPECT_EQ(gReports[0].message, "Unable to locate file '" + (oDir / "none.cfg").string() +
                                       "'\nrequested in @include directive\non line 3 of file "
                                       "'Memory'.\nIgnoring.\n");

    // Relative names are searched in the "etc" list first, then "pro".
    Write("etc/both.cfg", "(fromEtc Integer 1)\n");
    Write("pro/both.cfg", "(fromPro Integer 1)\n");
    Write("pro/only.cfg", "(onlyPro Integer 1)\n");
    setenv(DWX_ETC_PATH_VARIABLE, (oDir / "etc").c_str(), 1);
    setenv(DWX_PRO_PATH_VARIABLE, (oDir / "pro").c_str(), 1);
    tree = Read("(@include both.cfg)\n(@include only.cfg)\n");
    EXPECT_EQ(Shape(tree.get()), "fromEtc onlyPro");
    EXPECT_EQ(gReports.size(), 1u);
}

TEST_F(ReaderTest, IncludeCyclesDiamondsAndDepth) {
    std::string self = (oDir / "self.cfg").string();
    Write("self.cfg", "(s Integer 1)\n(@include " + self + ")\n(t Integer 2)\n");
    PTNSubTree tree("root");
    ReadFile(tree, self);
    EXPECT_EQ(Shape(&tree), "s t");
    ASSERT_EQ(gReports.size(), 1u);
    EXPECT_EQ(gReports[0].code, 3);
    EXPECT_EQ(gReports[0].message, "Include cycle: file '" + self +
                                       "'\nrequested in @include directive\non line 2 of file '" +
                                       self + "'\nis already being read.\nIgnoring.\n");

    // a -> b -> a is stopped at b; d reached twice through b and c is read twice.
    std::string d = Write("d.cfg", "(d Integer 1)\n");
    std::string a = (oDir / "a.cfg").string();
    std::string b = Write("b.cfg", "(b Integer 1)\n(@include " + a + ")\n(@include " + d + ")\n");
    std::string c = Write("c.cfg", "(c Integer 1)\n(@try_include " + d + ")\n");
    Write("a.cfg", "(@include " + b + ")\n(@include " + c + ")\n");
    gReports.clear();
    PTNSubTree diamond("root");
    ReadFile(diamond, a);
    EXPECT_EQ(Shape(&diamond), "b d c d");
    ASSERT_EQ(gReports.size(), 1u);
    EXPECT_NE(gReports[0].message.find("Include cycle: file '" + a), std::string::npos);

    // A chain of 70 distinct files: 64 nested includes are read.
    for (int i = 0; i < 70; ++i) {
        Write("chain" + std::to_string(i) + ".cfg",
              "(n" + std::to_string(i) + " Integer 1)\n(@include " +
                  (oDir / ("chain" + std::to_string(i + 1) + ".cfg")).string() + ")\n");
    }
    gReports.clear();
    PTNSubTree chain("root");
    ReadFile(chain, (oDir / "chain0.cfg").string());
    EXPECT_EQ(chain.GetChildren()->GetCount(), 65);
    EXPECT_EQ(chain.GetChild("n64")->GetName(), std::string("n64"));
    ASSERT_EQ(gReports.size(), 1u);
    EXPECT_NE(gReports[0].message.find("Include depth limit of 64 reached: file '" +
                                       (oDir / "chain65.cfg").string()),
              std::string::npos);
}

TEST_F(ReaderTest, IncludeTrace) {
    std::string inc = Write("inc.cfg", "(x Integer 9)\n");
    char* buffer = nullptr;
    size_t size = 0;
    FILE* trace = open_memstream(&buffer, &size);
    FILE* previous = tzn::tracer::Debugger::SetStream(trace);
    tzn::tracer::Debugger::moDebugLevel = 1;
    std::string text = "(@Include " + inc + ")\n";
    auto tree = Read(text.c_str());
    tzn::tracer::Debugger::moDebugLevel = 0;
    Read(text.c_str());  // no trace at level 0
    tzn::tracer::Debugger::SetStream(previous == stderr ? nullptr : previous);
    fclose(trace);
    EXPECT_EQ(std::string(buffer),
              "[dwxcore:2] base/dwxcore/dwxparse:856: <@Include " + inc + ">\n");
    free(buffer);
    EXPECT_EQ(Shape(tree.get()), "x");
}

TEST_F(ReaderTest, WriteThenReadEveryClass) {
    PTNSubTree config("config");
    config.AddChild(new PTNInteger("i", -42));
    config.AddChild(new PTNDouble("d", 0.1));
    config.AddChild(new PTNChar("c", 'q'));
    config.AddChild(new PTNBool("b", 5));
    config.AddChild(new PTNString("s", "say \"hi\"\nback\\slash ( ) # !"));
    config.AddChild(new PTNString("null", nullptr));
    char* entries[] = {(char*)"x", (char*)"y z", (char*)"", nullptr};
    config.AddChild(new PTNStringList("sl", entries));
    char* none[] = {nullptr};
    config.AddChild(new PTNStringList("esl", none));
    double values[] = {1.5, -2.25, 1e300};
    config.AddChild(new PTNDoubleList("dl", 3, values));
    config.AddChild(new PTNDoubleList("edl", 0, nullptr));
    const unsigned char bytes[] = {0, 255, 'a', 10};
    config.AddChild(new PTNBase64("b64", bytes, 4));
    int ints[] = {1, 2};
    config.AddChild(new PTNIntegerList("il", 2, ints));
    config.AddChild(new PTNInteger32List("i32", 2, ints));
    config.AddChild(new PTNFloat("f", 1.5f));
    config.AddChild(new PTNChar("zero", 0));
    config.AddChild(new PTNChar("blank", ' '));
    auto inner = std::make_unique<PTNSubTree>("inner");
    inner->AddChild(new PTNInteger("deep", 7));
    inner->AddChild(new PTNSubTree("empty"));
    config.AddChild(inner.release());
    config.AddChild(new PTNChar("tab", '\t'));  // breaks its line: read stops here
    config.AddChild(new PTNInteger("lost", 1));

    std::string path = (oDir / "tree.cfg").string();
    FILE* out = fopen(path.c_str(), "w");
    config.WriteToFile(out);
    fclose(out);
    PTNSubTree root("root");
    ReadFile(root, path);
    ASSERT_EQ(root.GetChildren()->GetCount(), 1);
    auto* back = dynamic_cast<PTNSubTree*>(root.GetChild("config"));
    ASSERT_NE(back, nullptr);
    EXPECT_EQ(Shape(back), "i d c b s null sl esl dl edl b64 zero blank inner{deep empty{}}");
    ASSERT_EQ(gReports.size(), 1u);  // the tab line
    EXPECT_EQ(back->GetChildAsInteger("i"), -42);
    EXPECT_EQ(back->GetChildAsDouble("d"), 0.1);
    EXPECT_EQ(back->GetChildAsChar("c"), 'q');
    EXPECT_EQ(back->GetChildAsBool("b"), 1);
    EXPECT_STREQ(back->GetChildAsString("s"), "say \"hi\"\nback\\slash ( ) # !");
    EXPECT_STREQ(back->GetChildAsString("null"), "\"\"");
    EXPECT_EQ(ValueText(back->GetChild("sl")), "\"x\" \"y z\" \"\"");
    EXPECT_EQ(back->GetChildAsStringList("esl")[0], nullptr);
    int count = 0;
    double* read = static_cast<PTNDoubleList*>(back->GetChild("dl"))->GetValue(&count);
    ASSERT_EQ(count, 3);
    EXPECT_EQ(read[0], 1.5);
    EXPECT_EQ(read[1], -2.25);
    EXPECT_EQ(read[2], 1e300);
    static_cast<PTNDoubleList*>(back->GetChild("edl"))->GetValue(&count);
    EXPECT_EQ(count, 0);
    unsigned int length = 0;
    unsigned char* decoded =
        static_cast<PTNBase64*>(back->GetChild("b64"))->Decode(nullptr, &length);
    EXPECT_EQ(std::string((char*)decoded, length), std::string((const char*)bytes, 4));
    free(decoded);
    EXPECT_EQ(back->GetChildAsChar("zero"), ')');
    EXPECT_EQ(back->GetChildAsChar("blank"), ')');
    EXPECT_EQ(static_cast<PTNSubTree*>(back->GetChild("inner"))->GetChildAsInteger("deep"), 7);
}

}  // namespace
