// Reading the text form into trees: line kinds, keywords, the ')' cut, line
// numbers in reports, errors inside and outside subtrees, includes, and
// write-then-read round trips. Files live in a fresh temp directory.
#include "report_capture.h"
#include "scratch_dir.h"
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <services/tracer.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <errno.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

namespace {

using Texts = std::vector<std::string>;

class ReaderTest : public ::testing::Test {
  protected:
    void TearDown() override {
        unsetenv(DWX_ETC_PATH_VARIABLE);
        unsetenv(DWX_PRO_PATH_VARIABLE);
    }
    ReportCapture oCapture;  // "code/severity message"
    ScratchDir oDir;
};

std::unique_ptr<PTNSubTree> Read(const std::string& text) {
    auto tree = std::make_unique<PTNSubTree>("root");
    tree->BuildFromString(text.c_str());
    return tree;
}

TEST_F(ReaderTest, EveryKeywordBuildsItsNode) {
    // A line of more tokens than the reader first makes room for, twice over.
    std::string longLine = "(l StringList", longNode = "PTNStringList=";
    for (int i = 0; i < 40; ++i) {
        longLine += " v" + std::to_string(i);
        longNode += std::string(i ? " " : "") + "\"v" + std::to_string(i) + "\"";
    }
    longLine += ")";
    struct Row {
        const char* line;
        const char* node;  // class=value, or empty: no node
    } rows[] = {
        {"(width Integer 640)", "PTNInteger=640"},
        {"(width Integer 640 )", "PTNInteger=640"},
        {"(width INTEGER 12abc", "PTNInteger=12"},
        {"(c Char xyz)", "PTNChar=x"},
        {"(b Boolean yes)", "PTNBool=TRUE"},
        {"(b bool Y)", "PTNBool=TRUE"},
        {"(b BOOLish 1)", "PTNBool=TRUE"},
        {"(b Bool on)", "PTNBool=FALSE"},
        {"(b Bool yess)", "PTNBool=FALSE"},
        {"(b Bool 11)", "PTNBool=FALSE"},
        {"(b Bool \x11)", "PTNBool=FALSE"},
        {"(x Bool\xC0 t)", "PTNBool=FALSE"},
        {"(d Double -2.5)", "PTNDouble=-2.5"},
        {"(s String \"Main window\")", "PTNString=\"Main window\""},
        {"(s String \"a\" \"b\")", "PTNString=\"ab\""},
        {"(s String a\\qb)", "PTNString=\"a\\qb\""},
        {"(s String )", "PTNString=\"\""},
        {"(s String \"x\" ) ignored", "PTNString=\"x\""},
        {"(l StringList \"x\" \"y z\")", "PTNStringList=\"x\" \"y z\""},
        {"(dl DoubleList 1.5 2.5)", "PTNDoubleList=1.5 2.5"},
        {"(dl DoubleList )", "PTNDoubleList="},
        {"(b64 Base64 YWI)", "PTNBase64=YWI"},
        // Keywords ignore ASCII case only; near misses and write-only classes build nothing.
        {"(x iNtEgEr 7)", "PTNInteger=7"},
        {"(x BASE64 YWI)", "PTNBase64=YWI"},
        {"(x stringLIST a)", "PTNStringList=\"a\""},
        {"(x IntegerList 1 2)", ""},
        {"(x Float 1.5)", ""},
        {"(x Integr 1)", ""},
        {"(x Integer2 1)", ""},
        {"(x Base\x16\x14 YWI)", ""},
        {"(x Bo 1)", ""},
        {longLine.c_str(), longNode.c_str()},
    };
    for (const Row& row : rows) {
        // The row's node, if any, comes first and "after" is read regardless.
        auto tree = Read(std::string(row.line) + "\n(after Integer 1)\n");
        std::string name(row.line + 1, strchr(row.line, ' '));
        std::string node = *row.node ? name + ":" + row.node + " " : "";
        EXPECT_EQ(Shape(tree.get(), true), node + "after:PTNInteger=1") << row.line;
    }
    EXPECT_TRUE(oCapture.Texts().empty());
    // A true Bool is stored as 1, and an empty StringList is a list without entries.
    auto tree = Read("(b Bool TRUE)\n(l StringList )\n");
    EXPECT_EQ(tree->GetChildAsBool("b"), 1);
    ASSERT_NE(tree->GetChildAsStringList("l"), nullptr);
    EXPECT_EQ(tree->GetChildAsStringList("l")[0], nullptr);
}

// Integer and Double values are atoi and atof of their token, bit for bit,
// whatever shortcut the reader takes for plain numbers.
TEST_F(ReaderTest, NumbersReadAsTheCRuntimeReadsThem) {
    std::istringstream integers(
        "0 -0 +7 123456789 -987654321 1234567890 2147483647 -2147483648 2147483648 "
        "99999999999 12abc 0x10 - + 007");
    for (std::string token; integers >> token;) {
        EXPECT_EQ(Read("(n Integer " + token + ")")->GetChildAsInteger("n"), atoi(token.c_str()))
            << token;
    }
    std::istringstream doubles(
        "0 -0 -0.0 1.5 .5 5. -.25 +3.75 0.1 3.14159265358979 999999999999999 1234567890123456 "
        "0.30000000000000004 1e3 1.5E-3 0x1p3 inf -nan 1.5x 1..5 . -");
    for (std::string token; doubles >> token;) {
        auto tree = Read("(d Double " + token + ")\n(l DoubleList " + token + ")");
        double expected = atof(token.c_str()), got = tree->GetChildAsDouble("d");
        EXPECT_EQ(memcmp(&got, &expected, sizeof got), 0) << token << " " << got;
        auto* list = dynamic_cast<PTNDoubleList*>(tree->GetChild("l"));
        int count = 0;
        double* values = list ? list->GetValue(&count) : nullptr;
        ASSERT_EQ(count, 1) << token;
        EXPECT_EQ(memcmp(&values[0], &expected, sizeof expected), 0) << token;
    }
}

TEST_F(ReaderTest, CorruptLineOutsideSubtreesReachesHost) {
    // Comments and blank lines count: the bad line is always line 5. The
    // cut takes a ')' after a tab, leaving no token.
    for (const char* line : {"(n String)", "n Integer 1", "(n)", "(n Integer)", "\t)"}) {
        oCapture.Clear();
        PTNSubTree tree("root");
        EXPECT_THROW(tree.BuildFromString((std::string("! c\n(a Integer 1)\n\n   # c\n") + line +
                                           "\n(b Integer 2)\n")
                                              .c_str()),
                     tzn::Exception);
        EXPECT_EQ(Shape(&tree), "a") << line;
        EXPECT_EQ(oCapture.Texts(),
                  Texts{"-1/1 Corrupt file Memory\n at line 5 ... missing tokens.\n"});
    }
}

TEST_F(ReaderTest, CorruptLineInsideSubtreeStopsQuietly) {
    const char* text =
        "(a Integer 1)\n(s SubTree\n  (b Integer 2)\n  (t SubTree\n    (c Integer 3)\n"
        "    (bad String)\n    (d Integer 4)\n  )\n  (e Integer 5)\n)\n(f Integer 6)\n";
    EXPECT_EQ(Shape(Read(text).get()), "a s{b t{c}}");  // no exception
    EXPECT_EQ(oCapture.Texts(),
              Texts{"-1/1 Corrupt file Memory\n at line 6 ... missing tokens.\n"});

    // Through AddChildrenFromStringList: null position, and the count that
    // the level holding the failed subtree had reached when it opened it.
    char** lines = BufferToStringList(text);
    PTNSubTree other("other");
    int counter = 10;
    EXPECT_EQ(other.AddChildrenFromStringList(lines, "f.cfg", &counter), nullptr);
    EXPECT_EQ(counter, 14);
    EXPECT_EQ(oCapture.Texts().back(),
              "-1/1 Corrupt file f.cfg\n at line 16 ... missing tokens.\n");
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
    EXPECT_EQ(tree.AddChildrenFromStringList(next, nullptr, &counter), lines + 6);
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
    EXPECT_EQ(Shape(Read("( config SubTree\n(a Integer 1)\n)\n(b Integer 2)\n").get()), "a");
    PTNSubTree empty("root");
    empty.BuildFromString(nullptr);
    EXPECT_EQ(Shape(&empty) + Shape(Read("").get()), "");
    EXPECT_TRUE(oCapture.Texts().empty());
}

TEST_F(ReaderTest, CommentLinesAndTreeStart) {
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine(" \t# x"), 1);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine(nullptr), 1);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine("\xa1x"), 0);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine("x ! y"), 0);
    const char* mixed[] = {"! a", "  # b", "(x SubTree", nullptr};
    const char* comments[] = {"! a", "", nullptr};
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(mixed), 2);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(comments), -1);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(comments + 2), -1);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(nullptr), -1);
    EXPECT_EQ(PTNSubTree::BuildPTNSubTreeFromStringList(mixed), nullptr);
}

// A stream DKOpen did not open is read from its own content, from its start,
// and left at its start; reports name it "Memory".
TEST_F(ReaderTest, ForeignStreams) {
    FILE* foreign = fopen(oDir.Write("main.cfg", "(a Integer 1)\r\n\n(bad)\n").c_str(), "r");
    ASSERT_NE(foreign, nullptr);
    fgetc(foreign);
    PTNSubTree tree("root");
    try {
        tree.BuildFromFile(foreign);
        ADD_FAILURE() << "no exception";
    } catch (const tzn::Exception& e) {
        EXPECT_STREQ(e.what(), "Corrupt file Memory\n at line 3 ... missing tokens.\n");
    }
    EXPECT_EQ(Shape(&tree), "a");
    EXPECT_EQ(ftell(foreign), 0);
    fclose(foreign);
    tree.BuildFromFile(nullptr);  // ignored
}

// Everything a read leaves: the exception, the reports and the tree.
std::string Outcome(ReportCapture& capture, PTNSubTree& tree, const std::function<void()>& read) {
    capture.Clear();
    std::string outcome;
    try {
        read();
    } catch (const tzn::Exception& e) {
        outcome = std::string("exception: ") + e.what() + "\n";
    }
    for (const std::string& report : capture.Texts()) {
        outcome += report + "\n";
    }
    return outcome + Shape(&tree, true);
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
    const std::string texts[] = {
        "(a Integer 1)\r\n(b String \"x y\")\r\n\r\n(c Integer 3)\r",
        "\xEF\xBB\xBF(a Integer 1)\n(b Integer 2)",
        "(a Integer 1)\n\xEF\xBB\xBF(b Integer 2)\n",
        std::string("(a String \"x\0y\")\n(b Integer 2)\n(c\0 Integer 3)\n", 45),
        "(s SubTree\n  (a Integer 1)\n\t)\n(b Integer 2)\n",
        "",
        "\n\n",
        "(a Integer 1\n)\n(never Integer 2)\n",
        "(s SubTree\n(t SubTree\n(a Double 2.5)",
        "(v String \"" + std::string(300000, 'v') + "\")\n(w Integer 1)\n",
        "(s SubTree\n" + many + ")\n",
    };
    for (const std::string& text : texts) {
        std::string path = oDir.Write("case.cfg", text);
        PTNSubTree inPlace("root"), fromList("root"), fromBuffer("root");
        std::string expected = Outcome(oCapture, fromList, [&] {
            std::unique_ptr<char*, void (*)(char**)> lines(TextFileToStringList(path.c_str()),
                                                           DestroyStringList);
            int counter = 0;
            fromList.AddChildrenFromStringList(lines.get(), path.c_str(), &counter);
        });
        EXPECT_EQ(Outcome(oCapture, inPlace, [&] { ReadFile(inPlace, path); }), expected)
            << text.size();
        if (text.find('\0') == std::string::npos) {
            for (size_t at; (at = expected.find(path)) != std::string::npos;) {
                expected.replace(at, path.size(), "Memory");
            }
            EXPECT_EQ(
                Outcome(oCapture, fromBuffer, [&] { fromBuffer.BuildFromString(text.c_str()); }),
                expected);
        }
    }
}

TEST_F(ReaderTest, IncludesPlaceNodesAndCountOwnLines) {
    std::string inc = oDir.Write("inc.cfg", "# own count\n(x Integer 9)\n)\n(never Integer 0)\n");
    std::string bad = oDir.Write("bad.cfg", "# 1\n# 2\n(oops)\n");
    PTNSubTree tree("root");
    ReadFile(tree, oDir.Write("main.cfg", "(a Integer 1)\n(@include " + inc +
                                              ")\n(s SubTree\n  (@Include " + inc +
                                              ")\n  (y Integer 2)\n)\n(b Integer 3)\n"));
    EXPECT_EQ(Shape(&tree), "a x s{x y} b");
    EXPECT_TRUE(oCapture.Texts().empty());

    // A corrupt line at the outermost level of an included file reaches the
    // host when the directive is outside every subtree, naming that file...
    PTNSubTree failed("root");
    EXPECT_THROW(ReadFile(failed, oDir.Write("top.cfg", "(a Integer 1)\n(@include " + bad +
                                                            ")\n(b Integer 2)\n")),
                 tzn::Exception);
    EXPECT_EQ(Shape(&failed), "a");
    EXPECT_EQ(oCapture.Texts(),
              Texts{"-1/1 Corrupt file " + bad + "\n at line 3 ... missing tokens.\n"});
    // ...and stops the read quietly when it is inside one.
    PTNSubTree quiet("root");
    ReadFile(quiet, oDir.Write("nested.cfg", "(s SubTree\n(@include " + bad +
                                                 ")\n(c Integer 1)\n)\n(d Integer 2)\n"));
    EXPECT_EQ(Shape(&quiet), "s{}");
    // An error inside a subtree of the included file ends only that file.
    std::string inner = oDir.Write("inner.cfg", "(t SubTree\n(oops)\n)\n(lost Integer 1)\n");
    EXPECT_EQ(Shape(Read("(@include " + inner + ")\n(z Integer 1)\n").get()), "t{} z");
}

TEST_F(ReaderTest, MissingIncludesAndSearchPath) {
    setenv("READER_TEST_DIR", oDir.Root().c_str(), 1);
    auto tree = Read(
        "(a Integer 1)\n! c\n(@include $READER_TEST_DIR/none.cfg)\n"
        "(@TRY_INCLUDE ${READER_TEST_DIR}/none.cfg)\n(b Integer 2)\n");
    EXPECT_EQ(Shape(tree.get()), "a b");
    EXPECT_EQ(oCapture.Texts(), Texts{"3/2 Unable to locate file '" + oDir.Path("none.cfg") +
                                      "'\nrequested in @include directive\non line 3 of file "
                                      "'Memory'.\nIgnoring.\n"});

    // Relative names are searched in the "etc" list first, then "pro".
    oDir.Write("etc/both.cfg", "(fromEtc Integer 1)\n");
    oDir.Write("pro/both.cfg", "(fromPro Integer 1)\n");
    oDir.Write("pro/only.cfg", "(onlyPro Integer 1)\n");
    setenv(DWX_ETC_PATH_VARIABLE, oDir.Path("etc").c_str(), 1);
    setenv(DWX_PRO_PATH_VARIABLE, oDir.Path("pro").c_str(), 1);
    EXPECT_EQ(Shape(Read("(@include both.cfg)\n(@include only.cfg)\n").get()), "fromEtc onlyPro");
    EXPECT_EQ(oCapture.Texts().size(), 1u);
}

// Diamonds and longer cycles are in the robustness tests.
TEST_F(ReaderTest, IncludeCycleAndDepthLimit) {
    std::string self = oDir.Path("self.cfg");
    PTNSubTree tree("root");
    ReadFile(tree,
             oDir.Write("self.cfg", "(s Integer 1)\n(@include " + self + ")\n(t Integer 2)\n"));
    EXPECT_EQ(Shape(&tree), "s t");
    EXPECT_EQ(oCapture.Texts(), Texts{"3/2 Include cycle: file '" + self +
                                      "'\nrequested in @include directive\non line 2 of file '" +
                                      self + "'\nis already being read.\nIgnoring.\n"});

    // A chain of 70 distinct files: 64 nested includes are read.
    auto chain = [](int i) { return "chain" + std::to_string(i) + ".cfg"; };
    for (int i = 0; i < 70; ++i) {
        oDir.Write(chain(i), "(n" + std::to_string(i) + " Integer 1)\n(@include " +
                                 oDir.Path(chain(i + 1)) + ")\n");
    }
    oCapture.Clear();
    PTNSubTree deep("root");
    ReadFile(deep, oDir.Path(chain(0)));
    EXPECT_EQ(deep.GetChildren()->GetCount(), 65);
    EXPECT_NE(deep.GetChild("n64"), nullptr);
    ASSERT_EQ(oCapture.Texts().size(), 1u);
    EXPECT_EQ(oCapture.Texts()[0].find("3/2 Include depth limit of 64 reached: file '" +
                                       oDir.Path(chain(65))),
              0u);
}

// The null device, under any name, switches an include off silently; every
// other kind of file that is not a regular one is refused as missing, and a
// FIFO without a writer is refused at once rather than waited on.
TEST_F(ReaderTest, NullDeviceIsAnEmptyIncludeOtherSpecialFilesAreMissing) {
    std::string fifo = oDir.Path("pipe");
    ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
    std::string nullLink = oDir.Path("off.cfg");
    ASSERT_EQ(symlink("/dev/null", nullLink.c_str()), 0);
    struct Row {
        std::string target;
        bool missing;
    } rows[] = {
        {"/dev/null", false}, {nullLink, false},   {fifo, true},
        {"/dev/zero", true},  {oDir.Root(), true},
    };
    for (const Row& row : rows) {
        for (const char* directive : {"@include", "@try_include"}) {
            oCapture.Clear();
            auto tree = Read("(a Integer 1)\n(" + std::string(directive) + " " + row.target +
                             ")\n(b Integer 2)\n");
            EXPECT_EQ(Shape(tree.get()), "a b") << row.target;
            bool reported = row.missing && directive[1] == 'i';
            ASSERT_EQ(oCapture.Texts().size(), reported ? 1u : 0u)
                << directive << " " << row.target;
            if (reported) {
                EXPECT_EQ(
                    oCapture.Texts()[0].find("3/2 Unable to locate file '" + row.target + "'"), 0u);
            }
        }
    }
}

// A stream that hands out `text` up to byte `failAt`, then fails with EIO. It
// cannot seek: rewinding it fails harmlessly, since it is read from its start.
struct FailingSource {
    std::string text;
    size_t failAt;
    size_t position = 0;
};

FILE* OpenFailing(FailingSource& source) {
    cookie_io_functions_t io = {};
    io.read = [](void* cookie, char* buffer, size_t size) -> ssize_t {
        auto* failing = static_cast<FailingSource*>(cookie);
        if (failing->position >= failing->failAt) {
            errno = EIO;
            return -1;
        }
        size_t count = std::min(size, failing->failAt - failing->position);
        memcpy(buffer, failing->text.data() + failing->position, count);
        failing->position += count;
        return static_cast<ssize_t>(count);
    };
    return fopencookie(&source, "r", io);
}

// A read error is reported with the file, the line reached and the system's
// reason; the complete lines before it stay read, the line it cut short is
// dropped rather than read with a truncated value.
TEST_F(ReaderTest, ReadErrorsAreReportedAndKeepWhatWasRead) {
    auto report = [](const std::string& file, int line) {
        return "3/2 Read error in file '" + file + "'\nafter line " + std::to_string(line) + ": " +
               strerror(EIO) + ".\nThe lines before it were kept.\n";
    };
    std::string text = "(a Integer 1)\n(s SubTree\n  (b Integer 2)\n  (c Integer 345)\n)\n";
    FailingSource source{text, text.find("5)")};
    FILE* stream = OpenFailing(source);
    ASSERT_NE(stream, nullptr);
    PTNSubTree tree("root");
    tree.BuildFromFile(stream);
    fclose(stream);
    EXPECT_EQ(Shape(&tree, true), "a:PTNInteger=1 s{b:PTNInteger=2}");
    EXPECT_EQ(oCapture.Texts(), Texts{report("Memory", 3)});

    // The kernel refuses to read the first page of a process's memory: a
    // real error on a file that passes every check. Through an include, and
    // as the file the reading starts from.
    oCapture.Clear();
    auto included = Read("(a Integer 1)\n(@include /proc/self/mem)\n(b Integer 2)\n");
    EXPECT_EQ(Shape(included.get()), "a b");
    EXPECT_EQ(oCapture.Texts(), Texts{report("/proc/self/mem", 0)});
    oCapture.Clear();
    PTNSubTree whole("root");
    ReadFile(whole, "/proc/self/mem");
    EXPECT_EQ(oCapture.Texts(), Texts{report("/proc/self/mem", 0)});

    // With a read log the report goes there, with its place, and nowhere else.
    oCapture.Clear();
    FailingSource again{text, text.find("5)")};
    stream = OpenFailing(again);
    PTNSubTree logged("root");
    PTNReadLog log;
    logged.BuildFromFile(stream, &log);
    fclose(stream);
    EXPECT_TRUE(oCapture.Texts().empty());
    ASSERT_EQ(log.Reports().size(), 1u);
    EXPECT_EQ(log.Reports()[0].code, 3);
    EXPECT_EQ(log.Reports()[0].file, "Memory");
    EXPECT_EQ(log.Reports()[0].line, 3);
}

TEST_F(ReaderTest, IncludeTrace) {
    std::string directive = "@Include " + oDir.Write("inc.cfg", "(x Integer 9)\n");
    std::string text = "(" + directive + ")\n";
    char* buffer = nullptr;
    size_t size = 0;
    FILE* trace = open_memstream(&buffer, &size);
    FILE* previous = tzn::tracer::Debugger::SetStream(trace);
    tzn::tracer::Debugger::moDebugLevel = 1;
    EXPECT_EQ(Shape(Read(text).get()), "x");
    tzn::tracer::Debugger::moDebugLevel = 0;
    Read(text);  // no trace at level 0
    tzn::tracer::Debugger::SetStream(previous == stderr ? nullptr : previous);
    fclose(trace);
    EXPECT_EQ(std::string(buffer), "[dwxcore:2] base/dwxcore/dwxparse:856: <" + directive + ">\n");
    free(buffer);
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
    config.AddChild(new PTNIntegerList("il", 2, ints));  // written, not read
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

    std::string path = oDir.Path("tree.cfg");
    FILE* out = fopen(path.c_str(), "w");
    config.WriteToFile(out);
    fclose(out);
    PTNSubTree root("root");
    ReadFile(root, path);
    EXPECT_EQ(
        Shape(&root, true),
        R"(config{i:PTNInteger=-42 d:PTNDouble=0.1 c:PTNChar=q b:PTNBool=TRUE )"
        R"(s:PTNString="say \qhi\q\nback\\slash ( ) # !" null:PTNString="\q\q" )"
        R"(sl:PTNStringList="x" "y z" "" esl:PTNStringList= dl:PTNDoubleList=1.5 -2.25 1e+300 )"
        R"(edl:PTNDoubleList= b64:PTNBase64=AP9hCg== zero:PTNChar=) blank:PTNChar=) )"
        R"(inner{deep:PTNInteger=7 empty{}}})");
    ASSERT_EQ(oCapture.Texts().size(), 1u);  // the tab line
}

// Reads with a log ----------------------------------------------------------

// Each entry as "code/severity file:line".
Texts Entries(const std::vector<PTNReadReport>& reports) {
    Texts texts;
    for (const PTNReadReport& r : reports) {
        texts.push_back(std::to_string(r.code) + "/" + std::to_string(r.severity) + " " + r.file +
                        ":" + std::to_string(r.line));
    }
    return texts;
}

PTNReadLog ReadLogged(PTNSubTree& tree, const std::string& path) {
    PTNReadLog log;
    FILE* stream = DKOpen(path.c_str(), 4, "r");
    EXPECT_NO_THROW(tree.BuildFromFile(stream, &log));
    DKClose(stream);
    return log;
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

TEST_F(ReaderTest, LogTakesReportsAndWarningsWithTheirLines) {
    struct Row {
        const char* text;
        Texts reports, warnings;
    } rows[] = {
        {"(t SubTree\n(w Integer -2147483648)\n(b Bool yes)\n(s String \"x y\" )\n"
         "(d Double -2.5e3)\n(e Double .5)\n(k Integer +7)\n)\n",
         {},
         {}},
        {"(a Integer 1)\n\n(corrupt)\n(b Integer 2)\n", {"-1/1 Memory:3"}, {}},
        {"! c\n(port Integr 8080)\n(f Float 1.5)\n", {}, {"101/3 Memory:2", "101/3 Memory:3"}},
        {"(a Integer 1)\n)\n(b Integer 2)\n", {}, {"102/3 Memory:2"}},
        // The blank makes config the keyword; the closing line then ends the read.
        {"( config SubTree\n(x Integer 1)\n)\n(y Integer 2)\n",
         {},
         {"103/3 Memory:1", "102/3 Memory:3"}},
        {"(i Integer 12abc)\n(j Integer 2147483648)\n(m Integer -)\n(n Integer -2147483649)\n",
         {},
         {"104/3 Memory:1", "104/3 Memory:2", "104/3 Memory:3", "104/3 Memory:4"}},
        {"(d Double 1.5x)\n(f Double abc)\n", {}, {"105/3 Memory:1", "105/3 Memory:2"}},
        {"#\n\n(s String \"a\" \"b\")\n", {}, {"106/3 Memory:3"}},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.text);
        PTNSubTree logged("root"), plain("root");
        PTNReadLog log;
        EXPECT_NO_THROW(logged.BuildFromString(row.text, &log));
        EXPECT_TRUE(oCapture.Texts().empty());
        EXPECT_EQ(Entries(log.Reports()), row.reports);
        EXPECT_EQ(Entries(log.Warnings()), row.warnings);
        EXPECT_EQ(log.Ok(), row.reports.empty());
        // Without a log: the handler and the exception as always, no warnings, the same tree.
        try {
            plain.BuildFromString(row.text, nullptr);
        } catch (const tzn::Exception&) {
        }
        EXPECT_EQ(oCapture.Texts().size(), row.reports.size());
        EXPECT_EQ(Shape(&logged, true), Shape(&plain, true));
        oCapture.Clear();
    }
}

TEST_F(ReaderTest, LogNamesIncludedFilesAndTheirOwnLines) {
    std::string inc =
        oDir.Write("inc.cfg", "! 1\n(x Integr 5)\n(s SubTree\n(bad)\n)\n(lost Integer 1)\n");
    std::string main = oDir.Write("main.cfg", "(a Integer 1)\n(@include " + inc + ")\n(@include " +
                                                  oDir.Path("none.cfg") + ")\n(@include " + inc +
                                                  ")\n(b Integer 2)\n");
    PTNSubTree tree("root");
    PTNReadLog log = ReadLogged(tree, main);
    EXPECT_EQ(Shape(&tree), "a s{} s{} b");
    EXPECT_EQ(Entries(log.Reports()),
              (Texts{"-1/1 " + inc + ":4", "3/2 " + main + ":3", "-1/1 " + inc + ":4"}));
    EXPECT_EQ(Entries(log.Warnings()), (Texts{"101/3 " + inc + ":2", "101/3 " + inc + ":2"}));
    EXPECT_EQ(log.Files(), (Texts{main, inc}));  // once each, the starting file first
    EXPECT_TRUE(oCapture.Texts().empty());
}

TEST_F(ReaderTest, SourcesThroughIncludesCopiesMergesAndRereads) {
    std::string leaf = oDir.Write("leaf.cfg", "! leaf\n(deep Integer 3)\n");
    std::string mid = oDir.Write("mid.cfg", "(@include " + leaf + ")\n(mid Integer 2)\n");
    std::string main =
        oDir.Write("main.cfg", "(s SubTree\n(top Integer 1)\n(@include " + mid + ")\n)\n");
    PTNSubTree tree("root"), again("root");
    ReadFile(tree, main);
    ReadFile(again, main);
    DWXParseTreeNode* deep = tree.Find("s/deep");
    EXPECT_EQ(Where(tree.Find("s")) + ", " + Where(tree.Find("s/mid")) + ", " + Where(deep),
              "1 main.cfg@0, 2 mid.cfg@3 main.cfg@0, 2 leaf.cfg@1 mid.cfg@3 main.cfg@0");
    EXPECT_EQ(tree.Find("s/mid")->GetSourceFile()->name, mid);
    // Rereads and copies point to the very same records; merges keep the target's.
    for (const char* path : {"s", "s/top", "s/mid", "s/deep"}) {
        EXPECT_EQ(again.Find(path)->GetSourceFile(), tree.Find(path)->GetSourceFile()) << path;
    }
    std::unique_ptr<PTNSubTree> copy(tree.DeepCopy());
    std::unique_ptr<DWXParseTreeNode> leafCopy(deep->Copy());
    EXPECT_TRUE(copy->Find("s/deep")->GetSourceFile() == deep->GetSourceFile() &&
                leafCopy->GetSourceFile() == deep->GetSourceFile());
    EXPECT_EQ(Where(copy->Find("s")) + ", " + Where(leafCopy.get()),
              Where(tree.Find("s")) + ", " + Where(deep));
    auto other = Read("\n\n(s SubTree\n(deep Integer 30)\n)\n");
    tree.SetFrom(other.get(), ExceptionList());
    EXPECT_EQ(Text(*deep) + " " + Where(deep), "30 2 leaf.cfg@1 mid.cfg@3 main.cfg@0");
    EXPECT_EQ(Where(other->Find("s/deep")), "4 Memory@0");
    PTNInteger made("made", 1);
    EXPECT_EQ(Where(&made), "0");  // not built by the reader
}

TEST_F(ReaderTest, IncludesNextToTheIncluder) {
    std::string main = oDir.Write("conf/main.cfg", "(@include part.cfg)\n(m Integer 1)\n");
    std::string part = oDir.Write("conf/part.cfg", "(near Integer 1)\n(@include sub/deep.cfg)\n");
    std::string deep = oDir.Write("conf/sub/deep.cfg", "(deep Integer 1)\n(@include etc.cfg)\n");
    std::string etc = oDir.Write("etc/etc.cfg", "(viaEtc Integer 1)\n");
    setenv(DWX_ETC_PATH_VARIABLE, oDir.Path("etc").c_str(), 1);
    for (bool on : {false, true, false}) {
        PTNSubTree::SetIncludeSearchNextToIncluder(on);
        PTNSubTree tree("root");
        PTNReadLog log = ReadLogged(tree, main);
        EXPECT_EQ(Shape(&tree), on ? "near deep viaEtc m" : "m");
        EXPECT_EQ(log.Reports().size(), on ? 0u : 1u);
        EXPECT_EQ(log.Files(), on ? (Texts{main, part, deep, etc}) : Texts{main});
    }
}

}  // namespace
