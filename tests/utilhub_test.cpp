#include "report_capture.h"
#include "scratch_dir.h"

#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <string.h>
#include <sys/stat.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

namespace {

// The entries of a list, each followed by '/', and the list released.
std::string Consume(char** list) {
    std::string entries;
    for (char** entry = list; list && *entry; ++entry) {
        entries += std::string(*entry) + "/";
    }
    EXPECT_EQ(CountStringList(list), std::count(entries.begin(), entries.end(), '/'));
    DestroyStringList(list);
    return list ? entries : "(null)";
}

// A heap text as a string, "(null)" for none, and the text released.
std::string Owned(char* text) {
    const std::string owned = text ? text : "(null)";
    free(text);
    return owned;
}

// The same for every line the opened reader hands out.
std::string ReadLines(TextLineReader& reader) {
    std::string lines;
    size_t length = 0;
    while (char* line = reader.Next(&length)) {
        EXPECT_EQ(strlen(line), length);
        lines += std::string(line) + "/";
        line[0] = '\0';  // the text is the caller's to change
    }
    EXPECT_EQ(reader.Next(&length), nullptr);  // and stays at the end
    EXPECT_EQ(reader.Failed(), 0);
    return lines;
}

// White space splits outside quoted runs; delimiters split anywhere and drop empty pieces.
TEST(UtilhubStringList, Tokenize) {
    const std::string longWord(200000, 'w');
    struct Case {
        std::string text;
        const char* delimiters;  // null: Tokenize
        std::string tokens;
    } cases[] = {
        {" \t\r\n\v\f", nullptr, ""},
        {" a  b\tc\r\nd\ve\ff " + longWord, nullptr, "a/b/c/d/e/f/" + longWord + "/"},
        {"a\"b\tc\"d \"\" (t \"never closed  y", nullptr, "a\"b\tc\"d/\"\"/(t/\"never closed  y/"},
        {",a,,b,", ",", "a/b/"},
        {" x |y-z", "|-", " x /y/z/"},
        {",,,", ",", ""}};
    for (const Case& c : cases) {
        const char* text = c.text.c_str();
        char** list = c.delimiters ? TokenizeDelim(text, c.delimiters) : Tokenize(text);
        EXPECT_EQ(Consume(list), c.tokens) << c.text.substr(0, 40);
    }
    EXPECT_EQ(Consume(Tokenize(nullptr)) + Consume(TokenizeDelim(nullptr, ",")), "");
}

// Hosts build lists themselves, cut them short by hand and build them in
// blocks the allocator recycled: nothing past the terminator may be trusted.
TEST(UtilhubStringList, AppendsToCopiesAndToListsBuiltByHand) {
    EXPECT_EQ(DuplicateStringList(nullptr), nullptr);
    char** list = AddStringList(AddStringToList(AddStringToList(nullptr, "one"), nullptr), nullptr);
    char** copy = DuplicateStringList(list);
    list = AddStringList(list, copy);
    list = AddStringList(list, list);  // appending a list to itself doubles it
    EXPECT_EQ(Consume(copy), "one//");
    EXPECT_EQ(Consume(list), "one//one//one//one//");

    char** cut = Tokenize("a b c");
    free(cut[1]);
    free(cut[2]);
    cut[1] = nullptr;  // cut[2] is left dangling, as a host leaves it
    EXPECT_EQ(Consume(AddStringToList(AddStringToList(cut, "NEW"), "NEXT")), "a/NEW/NEXT/");
    for (bool bulk : {false, true}) {
        DestroyStringList(Tokenize("0 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17 18 19"));
        // Exactly full, or often the block just freed.
        char** host = static_cast<char**>(malloc((bulk ? 32 : 2) * sizeof(char*)));
        host[0] = HString("x");
        host[1] = nullptr;
        char* more[] = {const_cast<char*>("y"), const_cast<char*>("z"), nullptr};
        host = bulk ? AddStringList(host, more) : AddStringToList(AddStringToList(host, "y"), "z");
        EXPECT_EQ(Consume(host), "x/y/z/");
    }
}

// Files, buffers, the list readers and the line reader split lines alike.
TEST(UtilhubStringList, LinesOfBuffersAndFiles) {
    // Lines of every length around the readers' block boundaries, then many short ones.
    std::string many, manyLines;
    for (int i = 0; i < 300000; ++i) {
        std::string line(many.size() < 700000 ? static_cast<size_t>(i) : 1,
                         static_cast<char>('a' + i % 26));
        many += line + (i % 3 ? "\n" : "\r\n");
        manyLines += line + "/";
    }
    const std::string l3(300000, 'L');
    const std::pair<std::string, std::string> cases[] = {
        {"\n", "/"},  // first, so that a fresh reader's first line is empty
        {"", ""},
        {"a\n\n  \nb\r\r\nc\r\nd", "a//  /b\r/c/d/"},  // one CR at most goes
        // A byte order mark counts only at the start.
        {"\xEF\xBB\xBFhead\n\xEF\xBB\xBF", "head/\xEF\xBB\xBF/"},
        {l3 + "\r\nshort\r", l3 + "/short/"},
        // A file line ends at its first NUL byte, as its list entry reads.
        {std::string("a\0b\nc\0\r\nd", 9), "a/c/d/"},
        {many, manyLines},
    };
    ScratchDir dir;
    TextLineReader reader;  // reused across files and buffers
    for (const auto& [text, lines] : cases) {
        SCOPED_TRACE(text.substr(0, 40));
        std::string path = dir.Write("lines.txt", text);
        EXPECT_EQ(Consume(TextFileToStringList(path.c_str())), lines);
        EXPECT_EQ(reader.OpenFile(path.c_str()), 1);
        EXPECT_EQ(ReadLines(reader), lines);
        if (text.find('\0') == std::string::npos) {  // a buffer ends at its first NUL
            EXPECT_EQ(Consume(BufferToStringList(text.c_str())), lines);
            reader.OpenBuffer(text.c_str());
            EXPECT_EQ(ReadLines(reader), lines);
        }
    }
    reader.OpenBuffer(nullptr);
    EXPECT_EQ(ReadLines(reader) + Consume(BufferToStringList(nullptr)), "(null)");
    // Doubled in one call and joined, they come back whole.
    char** list = BufferToStringList(many.c_str());
    list = AddStringList(list, list);
    const std::string joined = Owned(StringListToBuffer(list));
    DestroyStringList(list);
    EXPECT_EQ(Consume(BufferToStringList(joined.c_str())), manyLines + manyLines);
}

// Only regular files and the null device (under any name) pass; a FIFO
// without a writer is refused at once, never waited on. Streams that DKOpen
// opened remember their path. Names are looked for along the path variables.
TEST(UtilhubFiles, CheckingFindingAndReading) {
    ScratchDir dir, second;
    std::string file = dir.Write("read.cfg", "first\r\n\nlast");
    std::string fifo = dir.Path("pipe"), nullLink = dir.Path("off.cfg");
    ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
    ASSERT_EQ(symlink("/dev/null", nullLink.c_str()), 0);
    for (const std::string& path : {file, std::string("/dev/null"), nullLink}) {
        EXPECT_EQ(DKCheck(path.c_str()), 1) << path;
        EXPECT_EQ(Consume(TextFileToStringList(path.c_str())), path == file ? "first//last/" : "");
    }
    FILE* stream = DKOpen(file.c_str(), 4, "r");
    ASSERT_NE(stream, nullptr);
    EXPECT_EQ(fp2filename(stream), file);
    for (const char* line : {"first", "", "last"}) {
        EXPECT_STREQ(DKReadLine(stream), line);
    }
    EXPECT_EQ(DKReadLine(stream), nullptr);
    EXPECT_EQ(DKClose(stream) + DKClose(nullptr), 0);
    // Streams DKOpen did not open, possibly at the address of a closed one, have no path.
    FILE* foreign = fopen(file.c_str(), "r");
    EXPECT_EQ(fp2filename(foreign), nullptr);
    fclose(foreign);

    second.Write("both.cfg", "");
    second.Write("late.cfg", "");
    setenv(DWX_ETC_PATH_VARIABLE, ("/none::" + dir.Root() + ":" + second.Root() + "/").c_str(), 1);
    setenv(DWX_PRO_PATH_VARIABLE, second.Root().c_str(), 1);
    ASSERT_EQ(mkdir(dir.Path("late.cfg").c_str(), 0700), 0);  // a directory is no match
    dir.Write("both.cfg", "");
    EXPECT_EQ(Owned(IMPFindFile("etc", "both.cfg")), dir.Path("both.cfg"));
    EXPECT_EQ(Owned(IMPFindFile("etc", "late.cfg")), second.Path("late.cfg"));
    EXPECT_EQ(Owned(IMPFindFile("pro", "both.cfg")), second.Path("both.cfg"));
    EXPECT_EQ(Owned(IMPFindFile("etc", "absent.cfg")) + Owned(IMPFindFile("bin", "both.cfg")),
              "(null)(null)");
    unsetenv(DWX_PRO_PATH_VARIABLE);
    EXPECT_EQ(Owned(IMPFindFile("pro", "both.cfg")) + Owned(IMPFindFile(nullptr, "both.cfg")),
              "(null)(null)");
    unsetenv(DWX_ETC_PATH_VARIABLE);
    // A relative name is looked for next to the including file, an absolute one never.
    EXPECT_EQ(Owned(IMPFindFileNextTo(second.Path("x.cfg").c_str(), "late.cfg")),
              second.Path("late.cfg"));
    EXPECT_EQ(IMPFindFileNextTo("/z/x.cfg", second.Path("both.cfg").c_str()), nullptr);

    EXPECT_EQ(DKOpen(dir.Path("missing").c_str(), 4, "r"), nullptr);
    chmod(file.c_str(), 0);  // unreadable, unless we are root
    for (const std::string& path :
         {dir.Root(), std::string("/dev/zero"), fifo, dir.Path("missing"), std::string(), file}) {
        if (path == file && geteuid() == 0) {
            continue;
        }
        EXPECT_EQ(DKCheck(path.c_str()), 0) << path;
        EXPECT_EQ(TextFileToStringList(path.c_str()), nullptr) << path;
        TextLineReader reader;
        EXPECT_EQ(reader.OpenFile(path.c_str()), 0) << path;
        EXPECT_EQ(reader.Next(nullptr), nullptr) << path;
    }
    EXPECT_EQ(std::to_string(DKCheck(nullptr)) + Consume(TextFileToStringList(nullptr)), "0(null)");
}

TEST(UtilhubText, ExpandWhiteSpaceFormattingAndToday) {
    setenv("UTILHUB_DIR", "/opt/conf", 1);
    unsetenv("UTILHUB_UNSET");
    EXPECT_EQ(Owned(HStringExpand("${UTILHUB_DIR}x[$UTILHUB_UNSET]$UTILHUB_DIR/a")),
              "/opt/confx[]/opt/conf/a");
    // What is no variable keeps its '$'.
    EXPECT_EQ(Owned(HStringExpand("$$UTILHUB_DIR $ ${} $5 a$ ${UTILHUB_DIR")),
              "$/opt/conf $ ${} $5 a$ ${UTILHUB_DIR");
    EXPECT_EQ(HStringExpand(nullptr), nullptr);

    char trailing[] = " \v\f a b \t\r\n";
    EXPECT_EQ(LSCGetFirstNonWhiteSpace(trailing), trailing + 4);
    EXPECT_STREQ(LSCEatWSBack(trailing), " \v\f a b");
    std::string words = "  ab c \n", blank = " \t ";
    EXPECT_EQ(FindFirstNonWhitespace(words, 4), 5u);
    EXPECT_EQ(FindLastNonWhitespace(words), 5u);
    EXPECT_EQ(FindFirstNonWhitespace(words, 6), std::string::npos);
    EXPECT_EQ(FindLastNonWhitespace(words, 1), std::string::npos);
    EXPECT_EQ(TrimWhitespace(words) + TrimWhitespace(blank), "ab c");
    const std::string big(50000, 'z');  // longer than any fixed buffer
    EXPECT_EQ(Owned(HSPrintf("<%s|%d>", big.c_str(), 7)), "<" + big + "|7>");

    const time_t now = time(nullptr);
    struct tm local;
    localtime_r(&now, &local);
    char today[32];
    strftime(today, sizeof today, "%-d-%-m-%Y", &local);  // day and month unpadded
    EXPECT_STREQ(IMPTime(nullptr, 10), today);
    EXPECT_EQ(std::string(IMPTime(nullptr, 0)).find(today + std::string(" ")), 0u);
}

TEST(UtilhubReport, HandlerSeesEveryReportAndSeverityOneThrows) {
    ReportCapture capture;
    IMPError(3, 2, nullptr);
    try {
        IMPError(-1, 1, "Corrupt file x\n at line 5");
        ADD_FAILURE() << "severity 1 returned";
    } catch (const tzn::Exception& e) {
        EXPECT_TRUE(e.Code() == -1 && e.Severity() == 1);
        EXPECT_STREQ(e.what(), "Corrupt file x\n at line 5");
    }
    // The handler saw the last report before the throw.
    EXPECT_EQ(capture.Texts(),
              (std::vector<std::string>{"3/2 ", "-1/1 Corrupt file x\n at line 5"}));
}

// Callbacks run once each, last registered first, those registered while
// they run included; one that throws stops none of the others.
TEST(UtilhubAtExitDeathTest, CallbacksRunOnceLastRegisteredFirst) {
    auto child = [] {
        _IMPAtExit([] { fputs("@a", stderr); }, __FILE__, __LINE__);
        _IMPAtExit([] { throw 1; }, __FILE__, __LINE__);
        _IMPAtExit(
            [] {
                fputs("@c", stderr);
                _IMPAtExit([] { fputs("@d", stderr); }, __FILE__, __LINE__);  // while they run
            },
            __FILE__, __LINE__);
        _IMPAtExit(nullptr, __FILE__, __LINE__);
        exit(0);
    };
    EXPECT_EXIT(child(), testing::ExitedWithCode(0), "^@c@d[^@]*@a$");
}

}  // namespace
