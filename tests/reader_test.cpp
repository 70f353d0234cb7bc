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

#include <algorithm>
#include <functional>
#include <memory>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

namespace {

using Texts = std::vector<std::string>;

class ReaderTest : public ::testing::Test {
  protected:
    void TearDown() override {
        unsetenv(DWX_ETC_PATH_VARIABLE);
        unsetenv(DWX_PRO_PATH_VARIABLE);
        PTNSubTree::SetIncludeSearchNextToIncluder(false);
    }
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
        "(i Integer 640 )\n(j INTEGER 12abc\n(k iNtEgEr 7)\n(c Char xyz)\n(d Double -2.5)\n"
        "(b1 Boolean yes)\n(b2 bool Y)\n(b3 BOOLish 1)\n(b4 Bool TRUE)\n(f1 Bool on)\n"
        "(f2 Bool yess)\n(f3 Bool 11)\n(f4 Bool \x11)\n(f5 Bool\xC0 t)\n"
        "(s1 String \"Main window\")\n(s2 String \"a\" \"b\")\n(s3 String a\\qb)\n(s4 String )\n"
        "(s5 String \"x\" ) ignored\n(l1 StringList \"x\" \"y z\")\n(l2 stringLIST a)\n"
        "(l3 StringList )\n(dl1 DoubleList 1.5 2.5)\n(dl2 DoubleList )\n(b64 BASE64 YWI)\n"
        "(x1 IntegerList 1 2)\n(x2 Float 1.5)\n(x3 Integr 1)\n(x4 Integer2 1)\n"
        "(x5 Base\x16\x14 YWI)\n(x6 Bo 1)\n" +
        longLine + "(after Integer 1)\n");
    EXPECT_EQ(Shape(tree.get(), true),
              "i:PTNInteger=640 j:PTNInteger=12 k:PTNInteger=7 c:PTNChar=x d:PTNDouble=-2.5 "
              "b1:PTNBool=TRUE b2:PTNBool=TRUE b3:PTNBool=TRUE b4:PTNBool=TRUE f1:PTNBool=FALSE "
              "f2:PTNBool=FALSE f3:PTNBool=FALSE f4:PTNBool=FALSE f5:PTNBool=FALSE "
              "s1:PTNString=\"Main window\" s2:PTNString=\"ab\" s3:PTNString=\"a\\qb\" "
              "s4:PTNString=\"\" s5:PTNString=\"x\" l1:PTNStringList=\"x\" \"y z\" "
              "l2:PTNStringList=\"a\" l3:PTNStringList= dl1:PTNDoubleList=1.5 2.5 "
              "dl2:PTNDoubleList= b64:PTNBase64=YWI " +
                  longNode + " after:PTNInteger=1");
    EXPECT_TRUE(oCapture.Texts().empty());
    // A true Bool is stored as 1, and an empty StringList is a list without entries.
    EXPECT_EQ(tree->GetChildAsBool("b4"), 1);
    ASSERT_NE(tree->GetChildAsStringList("l3"), nullptr);
    EXPECT_EQ(tree->GetChildAsStringList("l3")[0], nullptr);
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
        auto* list = dynamic_cast<PTNDoubleList*>(tree->GetChild("l"));
        int count = 0;
        double* values = list ? list->GetValue(&count) : nullptr;
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
        {"(t SubTree\n(w Integer -2147483648)\n(b Bool yes)\n(s String \"x y\" )\n"
         "(d Double -2.5e3)\n(e Double .5)\n(k Integer +7)\n)\n",
         "t{w b s d e k}", ""},
        {"! c\n(port Integr 8080)\n(f Float 1.5)\n(i Integer 12abc)\n(j Integer 2147483648)\n"
         "(m Integer -)\n(n Integer -2147483649)\n(d Double 1.5x)\n(e Double abc)\n#\n\n"
         "(s String \"a\" \"b\")\n(a Integer 1)\n)\n(b Integer 2)\n",
         "i j m n d e s a",
         "101/3:2 101/3:3 104/3:4 104/3:5 104/3:6 104/3:7 105/3:8 105/3:9 106/3:12 102/3:14"},
        // The blank makes config the keyword; the closing line then ends the read.
        {"( config SubTree\n(x Integer 1)\n)\n(y Integer 2)\n", "x", "103/3:1 102/3:3"},
        // A glued ')' is cut, so "(t SubTree)" opens a subtree and "  )" closes it.
        {"(t SubTree)\n  (a Integer 1)\n  )\n(b Integer 2)\n", "t{a} b", ""},
        {"", "", ""},
    };
    // Comments and blank lines count; the cut takes a ')' after a tab, leaving no token.
    for (const char* line : {"(n String)", "n Integer 1", "(n)", "(n Integer)", "\t)"}) {
        rows.push_back({std::string("! c\n(a Integer 1)\n\n   # c\n") + line + "\n(b Integer 2)\n",
                        Corrupt("Memory", 5) + "thrown\na", "-1/1:5"});
    }
    for (const Row& row : rows) {
        SCOPED_TRACE(row.text);
        oCapture.Clear();
        PTNSubTree logged("root"), plain("root");
        PTNReadLog log;
        EXPECT_NO_THROW(logged.BuildFromString(row.text.c_str(), &log));
        EXPECT_TRUE(oCapture.Texts().empty());
        std::string entries;
        for (const auto* list : {&log.Reports(), &log.Warnings()}) {
            for (const PTNReadReport& r : *list) {
                entries += (entries.empty() ? "" : " ") + std::to_string(r.code) + "/" +
                           std::to_string(r.severity) + ":" + std::to_string(r.line);
                EXPECT_EQ(r.file, "Memory");
            }
        }
        EXPECT_EQ(entries, row.log);
        EXPECT_EQ(log.Ok(), log.Reports().empty());
        EXPECT_EQ(Outcome(plain, false, [&] { plain.BuildFromString(row.text.c_str()); }),
                  row.outcome);
        EXPECT_EQ(Shape(&logged, true), Shape(&plain, true));
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
    EXPECT_EQ(oCapture.Texts(), Texts{Corrupt("f.cfg", 16)});
    DestroyStringList(lines);

    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine(" \t# x"), 1);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine(nullptr), 1);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine("\xa1x"), 0);
    EXPECT_EQ(PTNSubTree::IsCommentOrEmptyLine("x ! y"), 0);
    const char* mixed[] = {"! a", "  # b", "(x SubTree", nullptr};
    const char* comments[] = {"! a", "", nullptr};
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(mixed), 2);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(comments), -1);
    EXPECT_EQ(PTNSubTree::FindPossiblePTNTreeStart(nullptr), -1);
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
    const std::string texts[] = {
        "(a Integer 1)\r\n(b String \"x y\")\r\n\r\n(c Integer 3)\r",
        "\xEF\xBB\xBF(a Integer 1)\n(b Integer 2)",
        "(a Integer 1)\n\xEF\xBB\xBF(b Integer 2)\n",
        std::string("(a String \"x\0y\")\n(b Integer 2)\n(c\0 Integer 3)\n", 45),
        "(s SubTree\n  (a Integer 1)\n\t)\n(b Integer 2)\n",
        "\n\n",
        "(a Integer 1\n)\n(never Integer 2)\n",
        "(s SubTree\n(t SubTree\n(a Double 2.5)",
        "(v String \"" + std::string(300000, 'v') + "\")\n(w Integer 1)\n",
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
    ASSERT_NE(foreign, nullptr);
    fgetc(foreign);
    PTNSubTree tree("root");
    EXPECT_EQ(Outcome(tree, false, [&] { tree.BuildFromFile(foreign); }),
              Corrupt("Memory", 3) + "thrown\na");
    EXPECT_EQ(ftell(foreign), 0);
    fclose(foreign);
    tree.BuildFromFile(nullptr);  // ignored
}

std::string Missing(const std::string& file, const char* directive, int line,
                    const std::string& in) {
    return "3/2 Unable to locate file '" + file + "'\nrequested in " + directive +
           " directive\non line " + std::to_string(line) + " of file '" + in + "'.\nIgnoring.\n";
}

std::string ReadError(const std::string& file, int line) {
    return "3/2 Read error in file '" + file + "'\nafter line " + std::to_string(line) + ": " +
           strerror(EIO) + ".\nThe lines before it were kept.\n";
}

// Each case is a set of files, read from the first; "@NAME" in a text stands
// for the path of NAME.cfg, "@." for the directory.
TEST_F(ReaderTest, Includes) {
    struct Case {
        std::vector<std::pair<std::string, std::string>> files;
        std::string outcome;
        bool nextToIncluder = false;  // relative names searched next to the including file first
    };
    std::vector<Case> cases = {
        // Included nodes sit in place; an included file counts its own lines,
        // and a closing line at its outermost level ends only that file.
        {{{"a",
           "(a Integer 1)\n(@include @inc)\n(s SubTree\n  (@Include @inc)\n  (y Integer 2)\n)\n"
           "(b Integer 3)\n"},
          {"inc", "# own count\n(x Integer 9)\n)\n(never Integer 0)\n"}},
         "a x s{x y} b"},
        // A corrupt line at the outermost level of an included file reaches
        // the host when the directive is outside every subtree...
        {{{"a", "(a Integer 1)\n(@include @bad)\n(b Integer 2)\n"}, {"bad", "# 1\n# 2\n(oops)\n"}},
         Corrupt("@bad", 3) + "thrown\na"},
        // ...and stops the read quietly when it is inside one.
        {{{"a", "(s SubTree\n(@include @bad)\n(c Integer 1)\n)\n(d Integer 2)\n"}},
         Corrupt("@bad", 3) + "s{}"},
        // An error inside a subtree of the included file ends only that file.
        {{{"a", "(@include @inner)\n(z Integer 1)\n"},
          {"inner", "(t SubTree\n(oops)\n)\n(lost Integer 1)\n"}},
         Corrupt("@inner", 2) + "t{} z"},
        // Names expand variables; a missing file is reported unless tried.
        {{{"a",
           "(a Integer 1)\n! c\n(@include $READER_TEST_DIR/gone.cfg)\n"
           "(@TRY_INCLUDE ${READER_TEST_DIR}/gone.cfg)\n(@include @b)\n(a2 Integer 2)\n"},
          {"b", "(b1 Integer 1)\n\n(@include @gone)\n(b2 Integer 2)\n"}},
         Missing("@gone", "@include", 3, "@a") + Missing("@gone", "@include", 3, "@b") +
             "a b1 b2 a2"},
        // Relative names are searched in the "etc" list first, then "pro".
        {{{"a", "(@include both.cfg)\n(@include only.cfg)\n"}}, "fromEtc onlyPro"},
        {{{"a", "(s Integer 1)\n(@include @a)\n(t Integer 2)\n"}},
         "3/2 Include cycle: file '@a'\nrequested in @include directive\non line 2 of file "
         "'@a'\nis already being read.\nIgnoring.\ns t"},
        {{{"a", "(a1 Integer 1)\n(s SubTree\n(@include @b)\n)\n(a2 Integer 2)\n"},
          {"b", "(b1 Integer 1)\n(@include @c)\n"},
          {"c", "(@try_include @a)\n(c1 Integer 1)\n"}},
         "3/2 Include cycle: file '@a'\nrequested in @try_include directive\non line 1 of file "
         "'@c'\nis already being read.\nIgnoring.\na1 s{b1 c1} a2"},
        {{{"a", "(@include @b)\n(@include @c)\n"},
          {"b", "(b Integer 1)\n(@include @d)\n"},
          {"c", "(c Integer 1)\n(@include @d)\n"},
          {"d", "(d Integer 1)\n"}},
         "b d c d"},
        {{{"conf/main", "(@include part.cfg)\n(m Integer 1)\n"},
          {"conf/part", "(near Integer 1)\n(@include sub/deep.cfg)\n"},
          {"conf/sub/deep", "(deep Integer 1)\n(@include both.cfg)\n"}},
         "near deep fromEtc m",
         true},
        {{{"conf/main", "(@include part.cfg)\n(m Integer 1)\n"}},
         Missing("part.cfg", "@include", 1, "@conf/main") + "m"},
        {{{"a", "(a Integer 1)\n(@include /proc/self/mem)\n(b Integer 2)\n"}},
         ReadError("/proc/self/mem", 0) + "a b"},
        // The null device, under any name, and an empty file are empty
        // includes; other files that are not regular ones are missing, and a
        // FIFO without a writer is refused rather than waited on.
        {{{"a",
           "(a Integer 1)\n(@include /dev/null)\n(@try_include /dev/null)\n(@include @off)\n"
           "(@try_include @off)\n(@include @pipe)\n(@try_include @pipe)\n(@include "
           "/dev/zero)\n(@try_include /dev/zero)\n(@include @.)\n(@try_include @.)\n"
           "(@include @empty)\n(b Integer 2)\n"},
          {"empty", ""}},
         Missing("@pipe", "@include", 6, "@a") + Missing("/dev/zero", "@include", 8, "@a") +
             Missing("@.", "@include", 10, "@a") + "a b"},
    };
    // A chain of 70 distinct files: 64 nested includes are read.
    Case chain{{},
               "3/2 Include depth limit of 64 reached: file '@chain65'\nrequested in @include "
               "directive\non line 2 of file '@chain64'.\nIgnoring.\n"};
    for (int i = 0; i < 70; ++i) {
        std::string n = std::to_string(i);
        chain.files.push_back({"chain" + n, "(n" + n + " Integer 1)\n(@include @chain" +
                                                std::to_string(i + 1) + ")\n"});
        chain.outcome += i > 64 ? "" : (i ? " n" : "n") + n;
    }
    cases.push_back(chain);

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
    setenv("READER_TEST_DIR", oDir.Root().c_str(), 1);
    setenv(DWX_ETC_PATH_VARIABLE, oDir.Path("etc").c_str(), 1);
    setenv(DWX_PRO_PATH_VARIABLE, oDir.Path("pro").c_str(), 1);
    oDir.Write("etc/both.cfg", "(fromEtc Integer 1)\n");
    oDir.Write("pro/both.cfg", "(fromPro Integer 1)\n");
    oDir.Write("pro/only.cfg", "(onlyPro Integer 1)\n");
    ASSERT_EQ(mkfifo(oDir.Path("pipe.cfg").c_str(), 0600), 0);
    ASSERT_EQ(symlink("/dev/null", oDir.Path("off.cfg").c_str()), 0);
    for (const Case& c : cases) {
        SCOPED_TRACE(c.files[0].second);
        for (const auto& file : c.files) {
            oDir.Write(file.first + ".cfg", resolve(file.second));
        }
        PTNSubTree::SetIncludeSearchNextToIncluder(c.nextToIncluder);
        std::string path = oDir.Path(c.files[0].first + ".cfg");
        PTNSubTree tree("root"), logged("root");
        EXPECT_EQ(Outcome(tree, false, [&] { ReadFile(tree, path); }), resolve(c.outcome));
        // With a log: the same tree, and each report there, naming its file and line.
        Texts host = oCapture.Texts();
        PTNReadLog log;
        EXPECT_EQ(Outcome(logged, false,
                          [&] {
                              std::unique_ptr<FILE, int (*)(FILE*)> stream(
                                  DKOpen(path.c_str(), 4, "r"), DKClose);
                              logged.BuildFromFile(stream.get(), &log);
                          }),
                  Shape(&tree));
        ASSERT_EQ(log.Reports().size(), host.size());
        for (size_t i = 0; i < host.size(); ++i) {
            const PTNReadReport& r = log.Reports()[i];
            EXPECT_EQ(host[i].find(std::to_string(r.code) + "/" + std::to_string(r.severity)), 0u);
            EXPECT_NE(host[i].find(r.file), std::string::npos) << host[i];
            EXPECT_NE(host[i].find("line " + std::to_string(r.line)), std::string::npos) << host[i];
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
    std::string text = "(a Integer 1)\n(s SubTree\n  (b Integer 2)\n  (c Integer 345)\n)\n";
    FailingSource source{text, text.find("5)")};
    FILE* stream = OpenFailing(source);
    ASSERT_NE(stream, nullptr);
    PTNSubTree tree("root"), whole("root");
    EXPECT_EQ(Outcome(tree, true, [&] { tree.BuildFromFile(stream); }),
              ReadError("Memory", 3) + "a:PTNInteger=1 s{b:PTNInteger=2}");
    fclose(stream);
    // The kernel refuses to read the first page of a process's memory: a
    // real error on a file that passes every check (see also the includes).
    EXPECT_EQ(Outcome(whole, false, [&] { ReadFile(whole, "/proc/self/mem"); }),
              ReadError("/proc/self/mem", 0));
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

TEST_F(ReaderTest, SourcesThroughIncludesCopiesMergesAndRereads) {
    std::string leaf = oDir.Write("leaf.cfg", "! leaf\n(deep Integer 3)\n");
    std::string mid = oDir.Write("mid.cfg", "(@include " + leaf + ")\n(mid Integer 2)\n");
    std::string main =
        oDir.Write("main.cfg", "(s SubTree\n(top Integer 1)\n(@include " + mid + ")\n)\n");
    PTNSubTree tree("root"), again("root");
    ReadFile(tree, main);
    ReadFile(again, main);
    std::unique_ptr<PTNSubTree> copy(tree.DeepCopy());
    DWXParseTreeNode* deep = tree.Find("s/deep");
    EXPECT_EQ(Where(tree.Find("s")) + ", " + Where(tree.Find("s/mid")) + ", " + Where(deep),
              "1 main.cfg@0, 2 mid.cfg@3 main.cfg@0, 2 leaf.cfg@1 mid.cfg@3 main.cfg@0");
    // Rereads and copies point to the very same records; merges keep the target's.
    for (const char* path : {"s", "s/top", "s/mid", "s/deep"}) {
        EXPECT_EQ(again.Find(path)->GetSourceFile(), tree.Find(path)->GetSourceFile()) << path;
        EXPECT_EQ(copy->Find(path)->GetSourceFile(), tree.Find(path)->GetSourceFile()) << path;
        EXPECT_EQ(copy->Find(path)->GetSourceLine(), tree.Find(path)->GetSourceLine()) << path;
    }
    auto other = Read("\n\n(s SubTree\n(deep Integer 30)\n)\n");
    tree.SetFrom(other.get(), ExceptionList());
    EXPECT_EQ(Text(*deep) + " " + Where(deep), "30 2 leaf.cfg@1 mid.cfg@3 main.cfg@0");
    PTNInteger made("made", 1);  // not built by the reader
    EXPECT_EQ(Where(other->Find("s/deep")) + ", " + Where(&made), "4 Memory@0, 0");
}

}  // namespace
