// Reading the text form into trees: keywords and values, line numbers in
// reports, errors inside and outside subtrees, reads with a log, includes,
// files against their string lists, and failing streams.
#include "report_capture.h"
#include "scratch_dir.h"
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <errno.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <strings.h>
#include <sys/stat.h>
#include <unistd.h>

#include <functional>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

namespace {

class ReaderTest : public ::testing::Test {
  protected:
    // Everything a read leaves: each report, "thrown" if it threw (with the
    // last report's message), and the tree.
    std::string Outcome(PTNSubTree& tree, bool values, const std::function<void()>& read) {
        oCapture.Clear();
        std::string thrown, outcome;
        try {
            read();
        } catch (const tzn::Exception& e) {
            EXPECT_TRUE(!oCapture.Reports().empty() &&
                        oCapture.Reports().back().message == e.what());
            thrown = "thrown\n";
        }
        for (const std::string& report : oCapture.Texts()) {
            outcome += report;
        }
        return outcome + thrown + Shape(&tree, values);
    }
    ReportCapture oCapture;  // "code/severity message"
    ScratchDir oDir;
};

std::unique_ptr<PTNSubTree> Read(const std::string& text) {
    auto tree = std::make_unique<PTNSubTree>("root");
    tree->BuildFromString(text.c_str());
    return tree;
}

std::string Corrupt(const std::string& file, int line) {
    return "-1/1 Corrupt file " + file + "\n at line " + std::to_string(line) +
           " ... missing tokens.\n";
}

// Every keyword builds its node, whatever its ASCII case; near misses and
// classes that are written but never read build nothing, and reading goes on.
TEST_F(ReaderTest, EveryKeywordBuildsItsNode) {
    // A line of more tokens than the reader first makes room for, twice over.
    std::string longLine = "(long StringList", longNode = "long:PTNStringList=\"v0\"";
    for (int i = 0; i < 40; ++i) {
        longLine += " v" + std::to_string(i) + (i == 39 ? ")\n" : "");
        longNode += i ? " \"v" + std::to_string(i) + "\"" : "";
    }
    auto tree = Read(
        "(i Integer -2147483648 )\n(j INTEGER 12abc\n(k iNtEgEr 7)\n(c Char xyz)\n"
        "(d Double -2.5e3)\n(b1 Boolean yes)\n(b2 bool Y)\n(b3 BOOLish 1)\n(b4 Bool TRUE)\n"
        "(f1 Bool on)\n(f2 Bool yess)\n(f4 Bool \x11)\n(f5 Bool\xC0 t)\n"
        "(s1 String \"Main window\")\n(s2 String \"a\" \"b\")\n(s3 String a\\qb)\n(s4 String )\n"
        "(s5 String \"x\" ) ignored\n(l1 StringList \"x\" \"y z\")\n(l2 stringLIST a)\n"
        "(l3 StringList )\n(dl1 DoubleList 1.5 2.5)\n(dl2 DoubleList )\n(b64 BASE64 YWI)\n"
        "(x1 IntegerList 1 2)\n(x2 Float 1.5)\n(x3 Integr 1)\n(x4 Integer2 1)\n"
        "(x5 Base\x16\x14 YWI)\n(x6 Bo 1)\n" +
        longLine + "(after Integer 1)\n");
    EXPECT_EQ(
        Shape(tree.get(), true),
        "i:PTNInteger=-2147483648 j:PTNInteger=12 k:PTNInteger=7 c:PTNChar=x d:PTNDouble=-2500 "
        "b1:PTNBool=TRUE b2:PTNBool=TRUE b3:PTNBool=TRUE b4:PTNBool=TRUE f1:PTNBool=FALSE "
        "f2:PTNBool=FALSE f4:PTNBool=FALSE f5:PTNBool=FALSE "
        "s1:PTNString=\"Main window\" s2:PTNString=\"ab\" s3:PTNString=\"a\\qb\" "
        "s4:PTNString=\"\" s5:PTNString=\"x\" l1:PTNStringList=\"x\" \"y z\" "
        "l2:PTNStringList=\"a\" l3:PTNStringList= dl1:PTNDoubleList=1.5 2.5 "
        "dl2:PTNDoubleList= b64:PTNBase64=YWI " +
            longNode + " after:PTNInteger=1");
    EXPECT_TRUE(oCapture.Texts().empty());
    // A true Bool is stored as 1, and an empty StringList is a list without entries.
    EXPECT_EQ(tree->GetChildAsBool("b4"), 1);
    EXPECT_EQ(tree->GetChildAsStringList("l3")[0], nullptr);
    // Values of every length around the reader's buffer sizes, bare and quoted.
    for (size_t n = 14; n <= 80; ++n) {
        std::string v(n, 'v');
        tree = Read("(u String " + v + ")\n(q String \"" + v + "\")\n");
        EXPECT_EQ(std::string(tree->GetChildAsString("u")) + tree->GetChildAsString("q"), v + v);
    }
}

// Integer and Double values are atoi and atof of their token, bit for bit,
// whatever shortcut the reader takes for plain numbers.
TEST_F(ReaderTest, NumbersReadAsTheCRuntimeReadsThem) {
    std::istringstream tokens(
        "0 -0 +7 007 2147483647 -2147483648 2147483648 99999999999 12abc 0x10 - -0.0 .5 5. -.25 "
        "+3.75 0.1 3.14159265358979 1234567890123456 0.30000000000000004 1e3 1.5E-3 0x1p3 inf "
        "-nan 1.5x 1..5 .");
    for (std::string token; tokens >> token;) {
        auto tree = Read("(n Integer " + token + ")\n(d Double " + token + ")\n(l DoubleList " +
                         token + ")");
        EXPECT_EQ(tree->GetChildAsInteger("n"), atoi(token.c_str())) << token;
        double expected = atof(token.c_str()), got = tree->GetChildAsDouble("d");
        int count = 0;
        double* values = dynamic_cast<PTNDoubleList*>(tree->GetChild("l"))->GetValue(&count);
        ASSERT_EQ(count, 1) << token;
        EXPECT_EQ(memcmp(&got, &expected, sizeof got), 0) << token << " " << got;
        EXPECT_EQ(memcmp(&values[0], &expected, sizeof expected), 0) << token;
    }
}

const char* const kNested =
    "(a Integer 1)\n(s SubTree\n  (b Integer 2)\n  (t SubTree\n    (c Integer 3)\n"
    "    (bad String)\n    (d Integer 4)\n  )\n  (e Integer 5)\n)\n(f Integer 6)\n";

// Without a log, a corrupt line reaches the handler, and outside every
// subtree the host as an exception; with one, reports and warnings go to the
// log only, with their lines. The tree is the same either way.
TEST_F(ReaderTest, ErrorsAndWarningsWithAndWithoutALog) {
    struct Row {
        std::string text;
        std::string outcome;  // without a log
        const char* log;      // "code/severity:line", reports first
    };
    std::vector<Row> rows = {
        {kNested, Corrupt("Memory", 6) + "a s{b t{c}}", "-1/1:6"},
        {"! c\n(port Integr 8080)\n(f Float 1.5)\n(i Integer 12abc)\n(j Integer 2147483648)\n"
         "(m Integer -)\n(n Integer -2147483649)\n(d Double 1.5x)\n(e Double abc)\n#\n\n"
         "(s String \"a\" \"b\")\n(a Integer 1)\n)\n(b Integer 2)\n",
         "i j m n d e s a",
         "101/3:2 101/3:3 104/3:4 104/3:5 104/3:6 104/3:7 105/3:8 105/3:9 106/3:12 102/3:14"},
        // The blank makes config the keyword; the closing line then ends the read.
        {"( config SubTree\n(x Integer 1)\n)\n(y Integer 2)\n", "x", "103/3:1 102/3:3"},
        // A glued ')' is cut, so "(t SubTree)" opens a subtree and "  )" closes it.
        {"(t SubTree)\n  (a Integer 1)\n  )\n(b Integer 2)\n", "t{a} b", ""},
    };
    // Comments and blank lines count; the cut takes a ')' after a tab, leaving no token.
    for (const char* line : {"(n String)", "n Integer 1", "(n)", "(n Integer)", "\t)"}) {
        rows.push_back({std::string("! c\n(a Integer 1)\n\n   # c\n") + line + "\n(b Integer 2)\n",
                        Corrupt("Memory", 5) + "thrown\na", "-1/1:5"});
    }
    for (const Row& row : rows) {
        SCOPED_TRACE(row.text);
        PTNSubTree logged("root"), plain("root");
        PTNReadLog log;
        EXPECT_EQ(Outcome(plain, false, [&] { plain.BuildFromString(row.text.c_str()); }),
                  row.outcome);
        // With a log nothing is thrown or reported to the handler; the tree is the same.
        EXPECT_EQ(Outcome(logged, true, [&] { logged.BuildFromString(row.text.c_str(), &log); }),
                  Shape(&plain, true));
        std::string entries;
        for (const auto* list : {&log.Reports(), &log.Warnings()}) {
            for (const PTNReadReport& r : *list) {
                entries += (entries.empty() ? "" : " ") + std::to_string(r.code) + "/" +
                           std::to_string(r.severity) + ":" + std::to_string(r.line);
                EXPECT_EQ(r.file, "Memory");
            }
        }
        EXPECT_EQ(entries, row.log);
    }
}

TEST_F(ReaderTest, StringListsLevelsAndCounter) {
    // A closing line at the outermost level ends the call; missing closing
    // lines end quietly; children already present stay in front.
    char** lines =
        BufferToStringList("(a Integer 1)\n# c\n)\n(b Integer 2)\n(s SubTree\n(c Char x");
    PTNSubTree tree("root");
    tree.AddChild(new PTNInteger("old", 0));
    int counter = 0;
    char** next = tree.AddChildrenFromStringList(lines, nullptr, &counter);
    EXPECT_EQ(next - lines, 3);
    EXPECT_EQ(counter, 3);
    EXPECT_EQ(tree.AddChildrenFromStringList(next, nullptr, &counter) - lines, 6);
    EXPECT_EQ(counter, 6);
    EXPECT_EQ(Shape(&tree), "old a b s{c}");
    EXPECT_EQ(tree.AddChildrenFromStringList(nullptr, nullptr, nullptr), nullptr);
    DestroyStringList(lines);

    // An error inside a subtree: a null position, and the count that the
    // level holding the failed subtree had reached when it opened it.
    lines = BufferToStringList(kNested);
    counter = 10;
    EXPECT_EQ(tree.AddChildrenFromStringList(lines, "f.cfg", &counter), nullptr);
    EXPECT_EQ(counter, 14);
    EXPECT_EQ(oCapture.Texts(), std::vector<std::string>{Corrupt("f.cfg", 16)});
    DestroyStringList(lines);

    for (const char* line : {" \t# x", static_cast<const char*>(nullptr), "\xa1x", "x ! y"}) {
        EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine(line), !line || line[0] == ' ')
            << (line ? line : "null");
    }
    const char* mixed[] = {"! a", "  # b", "(x SubTree", nullptr};
    const char* comments[] = {"! a", "", nullptr};
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(mixed), 2);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(comments), -1);
    EXPECT_EQ(PTNSubTree::BuildPTNSubTreeFromStringList(mixed), nullptr);
}

// A file is read line by line in place, not as a string list; every outcome
// must be the one of reading its string list, and of its buffer but for the
// file name.
TEST_F(ReaderTest, FilesReadAsTheirStringLists) {
    std::string many;
    for (int i = 0; many.size() < 400000; ++i) {
        many += "  (n" + std::to_string(i) + (i % 2 ? " Integer " : " String \"") +
                std::to_string(i) + (i % 2 ? ")\n" : "\")\r\n");
    }
    // A 1 MB value with every escape in it, as the writer quotes it.
    std::string big;
    while (big.size() < (1u << 20)) {
        big += "text \"quoted\" back\\slash\nline ";
    }
    big = HeapText(PTNString("v", big.c_str()).GetAsString()).get();
    const std::string texts[] = {
        "(a Integer 1)\r\n(b String \"x y\")\r\n\r\n(c Integer 3)\r",
        "\xEF\xBB\xBF(a Integer 1)\n\xEF\xBB\xBF(b Integer 2)",
        std::string("(a String \"x\0y\")\n(b Integer 2)\n(c\0 Integer 3)\n", 45),
        "(s SubTree\n(t SubTree\n(a Double 2.5)",
        "(v String " + big + ")\n(w Integer 1)\n",
        "(s SubTree\n" + many + ")\n",
    };
    for (const std::string& text : texts) {
        std::string path = oDir.Write("case.cfg", text);
        PTNSubTree inPlace("root"), fromList("root"), fromBuffer("root");
        std::string expected = Outcome(fromList, true, [&] {
            std::unique_ptr<char*, void (*)(char**)> lines(TextFileToStringList(path.c_str()),
                                                           DestroyStringList);
            int counter = 0;
            fromList.AddChildrenFromStringList(lines.get(), path.c_str(), &counter);
        });
        EXPECT_EQ(Outcome(inPlace, true, [&] { ReadFile(inPlace, path); }), expected)
            << text.size();
        EXPECT_TRUE(text.find(big) == std::string::npos ||
                    expected.find(":PTNString=" + big + " ") != std::string::npos);
        if (text.find('\0') == std::string::npos) {
            for (size_t at; (at = expected.find(path)) != std::string::npos;) {
                expected.replace(at, path.size(), "Memory");
            }
            EXPECT_EQ(Outcome(fromBuffer, true, [&] { fromBuffer.BuildFromString(text.c_str()); }),
                      expected);
        }
    }

    // A stream DKOpen did not open is read from its own content, from its
    // start, and left at its start; reports name it "Memory".
    FILE* foreign = fopen(oDir.Write("main.cfg", "(a Integer 1)\r\n\n(bad)\n").c_str(), "r");
    fgetc(foreign);
    PTNSubTree tree("root");
    EXPECT_EQ(Outcome(tree, false, [&] { tree.BuildFromFile(foreign); }),
              Corrupt("Memory", 3) + "thrown\na");
    EXPECT_EQ(ftell(foreign), 0);
    fclose(foreign);
    tree.BuildFromFile(nullptr);  // ignored
}

std::string Missing(const std::string& file, int line, const std::string& in) {
    return "3/2 Unable to locate file '" + file + "'\nrequested in @include directive\non line " +
           std::to_string(line) + " of file '" + in + "'.\nIgnoring.\n";
}

std::string ReadError(const std::string& file, int line) {
    return "3/2 Read error in file '" + file + "'\nafter line " + std::to_string(line) + ": " +
           strerror(EIO) + ".\nThe lines before it were kept.\n";
}

// Each case is a set of files, read from the first; "@NAME" in a text stands
// for the path of NAME.cfg, "@." for the directory.
TEST_F(ReaderTest, Includes) {
    const std::vector<std::pair<std::vector<std::pair<std::string, std::string>>, std::string>>
        cases = {
            // Included nodes sit in place, and a closing line at the outermost
            // level of an included file ends only that file.
            {{{"a", "(@include @inc)\n(s SubTree\n  (@Include @inc)\n  (y Integer 2)\n)\n"},
              {"inc", "(x Integer 9)\n)\n(never Integer 0)\n"}},
             "x s{x y}"},
            // An included file counts its own lines. A corrupt line at its
            // outermost level reaches the host when the directive is outside every subtree...
            {{{"a", "(a Integer 1)\n(@include @bad)\n(b Integer 2)\n"},
              {"bad", "# 1\n# 2\n(oops)\n"}},
             Corrupt("@bad", 3) + "thrown\na"},
            // ...and stops the read quietly when it is inside one.
            {{{"a", "(s SubTree\n(@include @bad)\n(c Integer 1)\n)\n(d Integer 2)\n"}},
             Corrupt("@bad", 3) + "s{}"},
            // An error inside a subtree of the included file ends only that file.
            {{{"a", "(@include @inner)\n(z Integer 1)\n"},
              {"inner", "(t SubTree\n(oops)\n)\n(lost Integer 1)\n"}},
             Corrupt("@inner", 2) + "t{} z"},
            // A missing file is reported unless tried.
            {{{"a",
               "(a Integer 1)\n! c\n(@include @gone)\n(@TRY_INCLUDE @gone)\n(@include @b)\n(a2 "
               "Integer 2)\n"},
              {"b", "(b1 Integer 1)\n\n(@include @gone)\n(b2 Integer 2)\n"}},
             Missing("@gone", 3, "@a") + Missing("@gone", 3, "@b") + "a b1 b2 a2"},
            {{{"a", "(s Integer 1)\n(@try_include @a)\n(t Integer 2)\n"}},
             "3/2 Include cycle: file '@a'\nrequested in @try_include directive\non line 2 of "
             "file '@a'\nis already being read.\nIgnoring.\ns t"},
            // The null device, under any name, and an empty file are empty
            // includes; other files that are not regular ones are missing, and a
            // FIFO without a writer is refused rather than waited on. A read
            // error keeps what was read.
            {{{"a",
               "(a Integer 1)\n(@include @off)\n(@include @pipe)\n(@include /dev/zero)\n"
               "(@include @.)\n(@include @empty)\n(@include /proc/self/mem)\n(b Integer 2)\n"},
              {"empty", ""}},
             Missing("@pipe", 3, "@a") + Missing("/dev/zero", 4, "@a") + Missing("@.", 5, "@a") +
                 ReadError("/proc/self/mem", 0) + "a b"},
        };
    auto resolve = [this](std::string text) {
        for (size_t at = text.find('@'); at != std::string::npos; at = text.find('@', at + 1)) {
            size_t end = text.find_first_of(")'\n", at);
            std::string name = text.substr(at + 1, end - at - 1);
            if (strncasecmp(name.c_str(), "include", 7) &&
                strncasecmp(name.c_str(), "try_include", 11)) {
                text.replace(at, end - at, name == "." ? oDir.Root() : oDir.Path(name + ".cfg"));
            }
        }
        return text;
    };
    ASSERT_EQ(mkfifo(oDir.Path("pipe.cfg").c_str(), 0600), 0);
    ASSERT_EQ(symlink("/dev/null", oDir.Path("off.cfg").c_str()), 0);
    for (const auto& c : cases) {
        SCOPED_TRACE(c.first[0].second);
        for (const auto& file : c.first) {
            oDir.Write(file.first + ".cfg", resolve(file.second));
        }
        std::string path = oDir.Path(c.first[0].first + ".cfg");
        PTNSubTree tree("root");
        EXPECT_EQ(Outcome(tree, false, [&] { ReadFile(tree, path); }), resolve(c.second));
    }
}

// A read error is reported with the file, the line reached and the system's
// reason; the complete lines before it stay read, the line it cut short is
// dropped rather than read with a truncated value.
TEST_F(ReaderTest, ReadErrorsAreReportedAndKeepWhatWasRead) {
    // Hands out a text cut short in one read, then fails with EIO. It cannot
    // seek: rewinding it fails harmlessly, since it is read from its start.
    static const char kText[] = "(a Integer 1)\n(s SubTree\n  (b Integer 2)\n  (c Integer 34";
    cookie_io_functions_t io = {};
    io.read = [](void* reads, char* buffer, size_t) -> ssize_t {
        if ((*static_cast<int*>(reads))++) {
            errno = EIO;
            return -1;
        }
        memcpy(buffer, kText, sizeof kText - 1);
        return sizeof kText - 1;
    };
    int reads = 0;
    FILE* stream = fopencookie(&reads, "r", io);
    PTNSubTree tree("root");
    EXPECT_EQ(Outcome(tree, true, [&] { tree.BuildFromFile(stream); }),
              ReadError("Memory", 3) + "a:PTNInteger=1 s{b:PTNInteger=2}");
    fclose(stream);
}

// PTNValidateFile: does a stream hold a tree of a given name?
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

// A node's line and the chain of files that reached it, "line file@includedAtLine ...".
std::string Where(const DWXParseTreeNode* node) {
    std::string text = std::to_string(node->GetSourceLine());
    for (const PTNSourceFile* file = node->GetSourceFile(); file; file = file->includedBy) {
        const char* slash = strrchr(file->name, '/');
        text += std::string(" ") + (slash ? slash + 1 : file->name) + "@" +
                std::to_string(file->includedAtLine);
    }
    return text;
}

// Copies keep their nodes' sources and merges the target's; text read from
// memory is "Memory", and a node made by hand has none.
TEST_F(ReaderTest, SourcesSurviveCopiesAndMerges) {
    std::string leaf = oDir.Write("leaf.cfg", "! leaf\n(deep Integer 3)\n");
    PTNSubTree tree("root");
    ReadFile(tree, oDir.Write("main.cfg", "(s SubTree\n(@include " + leaf + ")\n)\n"));
    std::unique_ptr<PTNSubTree> copy(tree.DeepCopy());
    DWXParseTreeNode* deep = tree.Find("s/deep");
    EXPECT_EQ(Where(copy->Find("s")) + ", " + Where(copy->Find("s/deep")),
              "1 main.cfg@0, 2 leaf.cfg@2 main.cfg@0");
    auto other = Read("\n\n(s SubTree\n(deep Integer 30)\n)\n");
    tree.SetFrom(other.get(), ExceptionList());
    EXPECT_EQ(Text(*deep) + " " + Where(deep), "30 2 leaf.cfg@2 main.cfg@0");
    PTNInteger made("made", 1);
    EXPECT_EQ(Where(other->Find("s/deep")) + ", " + Where(&made), "4 Memory@0, 0");
}

}  // namespace
