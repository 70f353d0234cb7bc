// Reads with a log: reports kept from the handler, warnings with their lines,
// the files opened; where each node came from; includes found next to the
// file that holds the directive.
#include "scratch_dir.h"
#include "tree_test_util.h"

#include <dwxcore/dwxparse.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <stdlib.h>

#include <memory>
#include <string>
#include <vector>

namespace {

using Texts = std::vector<std::string>;
Texts gHandled;  // what reached the error handler
void Capture(int code, int, const char*) {
    gHandled.push_back(std::to_string(code));
}

// Each entry as "code file:line".
Texts Entries(const std::vector<PTNReadReport>& reports) {
    Texts texts;
    for (const PTNReadReport& r : reports) {
        texts.push_back(std::to_string(r.code) + " " + r.file + ":" + std::to_string(r.line));
    }
    return texts;
}

class ReadLogTest : public ::testing::Test {
  protected:
    void SetUp() override {
        gHandled.clear();
        oPrevious = IMPSetErrorHandler(Capture);
        setenv("READLOG_DIR", oDir.Root().c_str(), 1);
    }
    void TearDown() override {
        IMPSetErrorHandler(oPrevious);
        PTNSubTree::SetIncludeSearchNextToIncluder(false);
        unsetenv(DWX_ETC_PATH_VARIABLE);
    }
    // Reads the file with a log, as a host opens it.
    void ReadLogged(PTNSubTree& tree, const std::string& path, PTNReadLog& log) {
        std::unique_ptr<FILE, int (*)(FILE*)> stream(DKOpen(path.c_str(), 4, "r"), DKClose);
        ASSERT_NE(stream, nullptr);
        tree.BuildFromFile(stream.get(), &log);
    }
    IMPErrorHandler oPrevious = nullptr;
    ScratchDir oDir;
};

TEST_F(ReadLogTest, ReportsGoToTheLogAndNeverToTheHandler) {
    const std::string text = "(a Integer 1)\n\n(corrupt)\n(b Integer 2)\n";
    PTNSubTree logged("root");
    PTNReadLog log;
    EXPECT_NO_THROW(logged.BuildFromString(text.c_str(), &log));
    EXPECT_FALSE(log.Ok());
    ASSERT_EQ(Entries(log.Reports()), Texts{"-1 Memory:3"});
    EXPECT_EQ(log.Reports()[0].severity, 1);
    EXPECT_EQ(log.Reports()[0].message, "Corrupt file Memory\n at line 3 ... missing tokens.\n");
    EXPECT_TRUE(gHandled.empty());

    // The same process without a log: the handler and the exception, as always.
    PTNSubTree plain("root");
    EXPECT_THROW(plain.BuildFromString(text.c_str()), tzn::Exception);
    EXPECT_EQ(gHandled, Texts{"-1"});
    EXPECT_EQ(Shape(&logged, true), Shape(&plain, true));

    // A null log is no log.
    EXPECT_THROW(PTNSubTree("r").BuildFromString(text.c_str(), nullptr), tzn::Exception);
    // Warnings never reach the handler, and do not make a log fail.
    gHandled.clear();
    PTNReadLog clean;
    PTNSubTree("r").BuildFromString("(a Integr 1)\n(b Integer x)\n", &clean);
    PTNSubTree("r").BuildFromString("(a Integr 1)\n(b Integer x)\n");
    EXPECT_TRUE(clean.Ok());
    EXPECT_EQ(clean.Warnings().size(), 2u);
    EXPECT_TRUE(gHandled.empty());
}

TEST_F(ReadLogTest, EachWarningWithItsLine) {
    struct Row {
        const char* text;
        Texts warnings;  // "code line"
    } rows[] = {
        {"(t SubTree\n(w Integer -2147483648)\n(b Bool yes)\n(s String \"x y\" )\n"
         "(d Double -2.5e3)\n(l StringList \"a\" \"b\")\n)\n",
         {}},
        {"! c\n(port Integr 8080)\n(f Float 1.5)\n", {"101 2", "101 3"}},
        {"(a Integer 1)\n)\n(b Integer 2)\n", {"102 2"}},
        // The blank makes config the keyword; the closing line then ends the read.
        {"( config SubTree\n(x Integer 1)\n)\n(y Integer 2)\n", {"103 1", "102 3"}},
        {"(i Integer 12abc)\n(j Integer 2147483648)\n(k Integer +7)\n(m Integer -)\n",
         {"104 1", "104 2", "104 4"}},
        {"(d Double 1.5x)\n(e Double .5)\n(f Double abc)\n", {"105 1", "105 3"}},
        {"#\n#\n(s String \"a\" \"b\")\n(t String \"c\" )\n", {"106 3"}},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.text);
        PTNSubTree logged("root"), plain("root");
        PTNReadLog log;
        logged.BuildFromString(row.text, &log);
        plain.BuildFromString(row.text);
        Texts warnings;
        for (const PTNReadReport& w : log.Warnings()) {
            EXPECT_EQ(w.file, "Memory");
            EXPECT_EQ(w.severity, 3);
            EXPECT_FALSE(w.message.empty());
            warnings.push_back(std::to_string(w.code) + " " + std::to_string(w.line));
        }
        EXPECT_EQ(warnings, row.warnings);
        EXPECT_TRUE(log.Ok());
        // A log changes what the read reports, never what it builds.
        EXPECT_EQ(Shape(&logged, true), Shape(&plain, true));
    }
}

TEST_F(ReadLogTest, ReportsAndWarningsInsideIncludesNameTheIncludedFile) {
    std::string inc =
        oDir.Write("inc.cfg", "! 1\n(x Integr 5)\n(s SubTree\n(bad)\n)\n(lost Integer 1)\n");
    std::string main = oDir.Write("main.cfg",
                                  "(a Integer 1)\n(@include $READLOG_DIR/inc.cfg)\n"
                                  "(@include $READLOG_DIR/none.cfg)\n(@include "
                                  "$READLOG_DIR/inc.cfg)\n(b Integer 2)\n");
    PTNSubTree tree("root");
    PTNReadLog log;
    ReadLogged(tree, main, log);
    EXPECT_EQ(Shape(&tree), "a s{} s{} b");
    EXPECT_EQ(Entries(log.Reports()),
              (Texts{"-1 " + inc + ":4", "3 " + main + ":3", "-1 " + inc + ":4"}));
    EXPECT_EQ(Entries(log.Warnings()), (Texts{"101 " + inc + ":2", "101 " + inc + ":2"}));
    EXPECT_EQ(log.Files(), (Texts{main, inc}));  // once each, the starting file first
    EXPECT_TRUE(gHandled.empty());

    // A corrupt line at the outermost level of an include ends the whole
    // read, quietly with a log.
    std::string top =
        oDir.Write("top.cfg", "(a Integer 1)\n(@include $READLOG_DIR/bad.cfg)\n(b Integer 2)\n");
    oDir.Write("bad.cfg", "(c Integer 3)\n(oops)\n");
    PTNSubTree ended("root");
    PTNReadLog endedLog;
    EXPECT_NO_THROW(ReadLogged(ended, top, endedLog));
    EXPECT_EQ(Shape(&ended), "a c");
    EXPECT_EQ(Entries(endedLog.Reports()), Texts{"-1 " + oDir.Path("bad.cfg") + ":2"});
}

TEST_F(ReadLogTest, SourcesThroughIncludesCopiesMergesAndRereads) {
    oDir.Write("leaf.cfg", "! leaf\n(deep Integer 3)\n");
    oDir.Write("mid.cfg", "(@include $READLOG_DIR/leaf.cfg)\n(mid Integer 2)\n");
    std::string main =
        oDir.Write("main.cfg", "(s SubTree\n(top Integer 1)\n(@include $READLOG_DIR/mid.cfg)\n)\n");
    auto read = [&] {
        auto tree = std::make_unique<PTNSubTree>("root");
        PTNReadLog log;
        ReadLogged(*tree, main, log);
        return tree;
    };
    auto tree = read();
    auto* s = tree->FindAs<PTNSubTree>("s");
    DWXParseTreeNode* top = s->GetChild("top");
    DWXParseTreeNode* mid = s->GetChild("mid");
    DWXParseTreeNode* deep = s->GetChild("deep");
    ASSERT_TRUE(s && top && mid && deep);
    EXPECT_EQ(s->GetSourceLine(), 1);
    EXPECT_EQ(top->GetSourceLine(), 2);
    EXPECT_EQ(mid->GetSourceLine(), 2);
    EXPECT_EQ(deep->GetSourceLine(), 2);
    const PTNSourceFile* mainFile = top->GetSourceFile();
    EXPECT_EQ(s->GetSourceFile(), mainFile);
    EXPECT_EQ(std::string(mainFile->name), main);
    EXPECT_EQ(mainFile->includedBy, nullptr);
    const PTNSourceFile* midFile = mid->GetSourceFile();
    EXPECT_EQ(std::string(midFile->name), oDir.Path("mid.cfg"));
    EXPECT_EQ(midFile->includedBy, mainFile);
    EXPECT_EQ(midFile->includedAtLine, 3);
    EXPECT_EQ(deep->GetSourceFile()->includedBy, midFile);
    EXPECT_EQ(deep->GetSourceFile()->includedAtLine, 1);

    // Reading the same files again gives the very same records.
    auto again = read();
    EXPECT_EQ(again->Find("s/deep")->GetSourceFile(), deep->GetSourceFile());
    EXPECT_EQ(again->Find("s")->GetSourceFile(), mainFile);

    // Copies keep the record and line; merges keep the target's.
    std::unique_ptr<PTNSubTree> copy(tree->DeepCopy());
    std::unique_ptr<DWXParseTreeNode> leafCopy(deep->Copy());
    EXPECT_EQ(copy->Find("s/deep")->GetSourceFile(), deep->GetSourceFile());
    EXPECT_EQ(copy->Find("s")->GetSourceLine(), 1);
    EXPECT_EQ(leafCopy->GetSourceFile(), deep->GetSourceFile());
    EXPECT_EQ(leafCopy->GetSourceLine(), 2);
    PTNSubTree other("root");
    other.BuildFromString("\n\n(s SubTree\n(deep Integer 30)\n)\n");
    tree->SetFrom(&other, ExceptionList());
    EXPECT_EQ(static_cast<PTNInteger*>(deep)->GetValue(), 30);
    EXPECT_EQ(deep->GetSourceFile()->includedBy, midFile);
    EXPECT_EQ(deep->GetSourceLine(), 2);
    EXPECT_EQ(std::string(other.Find("s/deep")->GetSourceFile()->name), "Memory");
    EXPECT_EQ(other.Find("s/deep")->GetSourceLine(), 4);

    // Nodes the reader did not build have no source.
    PTNInteger made("n", 1);
    EXPECT_EQ(made.GetSourceFile(), nullptr);
    EXPECT_EQ(made.GetSourceLine(), 0);
}

TEST_F(ReadLogTest, IncludesNextToTheIncluder) {
    std::string main = oDir.Write("conf/main.cfg", "(@include part.cfg)\n(m Integer 1)\n");
    oDir.Write("conf/part.cfg", "(near Integer 1)\n(@include sub/deep.cfg)\n");
    oDir.Write("conf/sub/deep.cfg", "(deep Integer 1)\n(@include etc.cfg)\n");
    oDir.Write("etc/etc.cfg", "(viaEtc Integer 1)\n");
    setenv(DWX_ETC_PATH_VARIABLE, oDir.Path("etc").c_str(), 1);

    struct Row {
        bool on;
        const char* shape;
        size_t reports;
    } rows[] = {{false, "m", 1}, {true, "near deep viaEtc m", 0}, {false, "m", 1}};
    for (const Row& row : rows) {
        SCOPED_TRACE(row.on);
        PTNSubTree::SetIncludeSearchNextToIncluder(row.on);
        PTNSubTree tree("root");
        PTNReadLog log;
        ReadLogged(tree, main, log);
        EXPECT_EQ(Shape(&tree), row.shape);
        EXPECT_EQ(log.Reports().size(), row.reports);
        if (row.on) {
            EXPECT_EQ(log.Files(),
                      (Texts{main, oDir.Path("conf/part.cfg"), oDir.Path("conf/sub/deep.cfg"),
                             oDir.Path("etc/etc.cfg")}));
        }
    }
}

}  // namespace
