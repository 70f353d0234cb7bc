#include "report_capture.h"
#include "scratch_dir.h"

#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <time.h>
#include <unistd.h>

#include <string>
#include <vector>

namespace {

using Lines = std::vector<std::string>;

// Takes the list apart into strings and releases it.
Lines Consume(char** list) {
    Lines lines;
    EXPECT_NE(list, nullptr);
    for (char** entry = list; list && *entry; ++entry) {
        lines.push_back(*entry);
    }
    EXPECT_EQ(CountStringList(list), static_cast<int>(lines.size()));
    DestroyStringList(list);
    return lines;
}

// Every line a TextLineReader hands out after `open`.
template <typename Open>
Lines ReadLines(TextLineReader& reader, Open open) {
    Lines lines;
    open(reader);
    size_t length = 0;
    while (char* line = reader.Next(&length)) {
        EXPECT_EQ(strlen(line), length);
        lines.push_back(line);
        line[0] = '\0';  // the text is the caller's to change
    }
    EXPECT_EQ(reader.Next(&length), nullptr);  // and stays at the end
    EXPECT_EQ(reader.Failed(), 0);
    return lines;
}

// White space splits outside quoted runs; delimiters split anywhere and drop empty pieces.
TEST(UtilhubTokenize, QuotedRunsAndDelimiters) {
    std::string longWord(200000, 'w');
    struct Case {
        std::string text;
        const char* delimiters;  // null: Tokenize
        Lines tokens;
    } cases[] = {
        {" \t\r\n\v\f", nullptr, {}},
        {"  a  b\tc\r\nd\ve\ff ", nullptr, {"a", "b", "c", "d", "e", "f"}},
        {"(title String \"Main window\")", nullptr, {"(title", "String", "\"Main window\")"}},
        {"a\"b c\"d e", nullptr, {"a\"b c\"d", "e"}},
        {"\"\" \"x\ty\"", nullptr, {"\"\"", "\"x\ty\""}},
        {"x \"never closed  y", nullptr, {"x", "\"never closed  y"}},
        {"a " + longWord, nullptr, {"a", longWord}},
        {",a,,b,", ",", {"a", "b"}},
        {" x | y ", "|", {" x ", " y "}},
        {"-o a|b", " |", {"-o", "a", "b"}},
        {",,,", ",", {}},
        {"whole", "", {"whole"}},
    };
    for (const Case& c : cases) {
        const char* text = c.text.c_str();
        EXPECT_EQ(Consume(c.delimiters ? TokenizeDelim(text, c.delimiters) : Tokenize(text)),
                  c.tokens)
            << c.text.substr(0, 40);
    }
    EXPECT_EQ(Consume(Tokenize(nullptr)), Lines{});
    EXPECT_EQ(Consume(TokenizeDelim(nullptr, ",")), Lines{});
}

TEST(UtilhubStringList, AppendCopyAndRelease) {
    EXPECT_EQ(CountStringList(nullptr), 0);
    DestroyStringList(nullptr);
    EXPECT_EQ(DuplicateStringList(nullptr), nullptr);

    char** list = AddStringToList(nullptr, "one");
    list = AddStringToList(list, nullptr);
    list = AddStringList(list, nullptr);
    char** copy = DuplicateStringList(list);
    EXPECT_NE(copy[0], list[0]);
    list = AddStringList(list, copy);
    list = AddStringList(list, list);  // appending a list to itself doubles it
    EXPECT_EQ(Consume(copy), (Lines{"one", ""}));
    EXPECT_EQ(Consume(list), (Lines{"one", "", "one", "", "one", "", "one", ""}));

    // Lists made elsewhere, and lists cut short by hand, are extended correctly.
    char** foreign = static_cast<char**>(HCalloc(sizeof(char*), 3));
    foreign[0] = HString("a");
    foreign[1] = HString("b");
    foreign = AddStringToList(foreign, "c");
    foreign = AddStringToList(foreign, "d");
    free(foreign[3]);
    foreign[3] = nullptr;
    foreign = AddStringToList(foreign, "e");
    EXPECT_EQ(Consume(foreign), (Lines{"a", "b", "c", "e"}));
}

// Hosts cut lists short by hand and build them in blocks the allocator
// recycled: whatever lies past the terminator must never be trusted.
TEST(UtilhubStringList, AppendsAtTheTerminatorOfListsEditedByHand) {
    char** cut = Tokenize("a b c");
    free(cut[1]);
    free(cut[2]);
    cut[1] = nullptr;  // cut[2] is left dangling, as a host leaves it
    cut = AddStringToList(cut, "NEW");
    cut = AddStringToList(cut, "NEXT");
    EXPECT_EQ(Consume(cut), (Lines{"a", "NEW", "NEXT"}));

    std::string words;
    for (int i = 0; i < 20; ++i) {
        words += std::to_string(i) + " ";
    }
    for (bool bulk : {false, true}) {
        DestroyStringList(Tokenize(words.c_str()));
        char** host =
            static_cast<char**>(malloc(32 * sizeof(char*)));  // often the block just freed
        host[0] = HString("x");
        host[1] = nullptr;
        char* more[] = {const_cast<char*>("y"), const_cast<char*>("z"), nullptr};
        host = bulk ? AddStringList(host, more) : AddStringToList(host, "y");
        EXPECT_EQ(Consume(host), bulk ? (Lines{"x", "y", "z"}) : (Lines{"x", "y"}));
    }
}

TEST(UtilhubStringList, LargeListsAppendedInOneCall) {
    const int count = 900000;
    std::string text;
    for (int i = 0; i < count / 4; ++i) {  // two lines each, and the list is doubled
        text += "\nodd line\n";
    }
    char** half = BufferToStringList(text.c_str());
    char** list = AddStringList(nullptr, half);
    list = AddStringList(list, half);
    DestroyStringList(half);
    char* buffer = StringListToBuffer(list);
    EXPECT_EQ(strlen(buffer), static_cast<size_t>(count / 2) * 10);
    Lines again = Consume(BufferToStringList(buffer));
    EXPECT_EQ(again.size(), static_cast<size_t>(count));
    EXPECT_EQ(again.back(), "odd line");
    free(buffer);
    DestroyStringList(list);
}

TEST(UtilhubStringList, LinesOfBuffersAndFiles) {
    struct Case {
        std::string text;
        Lines lines;
    } cases[] = {
        {"", {}},
        {"a", {"a"}},
        {"a\nb\n", {"a", "b"}},
        {"a\r\nb\r\n", {"a", "b"}},
        {"a\r\r\nb\r", {"a\r", "b"}},
        {"\n\n", {"", ""}},
        {"x\n\n  \ny", {"x", "", "  ", "y"}},
        {"\xEF\xBB\xBFhead\n", {"head"}},
        {"a\n\xEF\xBB\xBF", {"a", "\xEF\xBB\xBF"}},
        {std::string(100000, 'L') + "\nshort", {std::string(100000, 'L'), "short"}},
        {std::string(300000, 'L') + "\r", {std::string(300000, 'L')}},
        // A file line ends at its first NUL byte, as its list entry reads.
        {std::string("a\0b\nc\0\r\nd", 9), {"a", "c", "d"}},
    };
    ScratchDir dir;
    TextLineReader reader;  // reused across files and buffers
    for (const Case& c : cases) {
        std::string path = dir.Write("lines.txt", c.text);
        EXPECT_EQ(Consume(TextFileToStringList(path.c_str())), c.lines) << c.text;
        EXPECT_EQ(
            ReadLines(reader, [&](TextLineReader& r) { EXPECT_EQ(r.OpenFile(path.c_str()), 1); }),
            c.lines)
            << c.text;
        if (c.text.find('\0') != std::string::npos) {
            continue;  // a buffer ends at its first NUL
        }
        EXPECT_EQ(Consume(BufferToStringList(c.text.c_str())), c.lines) << c.text;
        EXPECT_EQ(ReadLines(reader, [&](TextLineReader& r) { r.OpenBuffer(c.text.c_str()); }),
                  c.lines)
            << c.text;
    }
    // Lines of every length around the reader's block boundaries come out whole.
    std::string text;
    Lines expected;
    for (int i = 0; text.size() < 700000; ++i) {
        expected.emplace_back(static_cast<size_t>(i % 4099), static_cast<char>('a' + i % 26));
        text += expected.back() + (i % 3 ? "\n" : "\r\n");
    }
    std::string big = dir.Write("big.txt", text);
    EXPECT_EQ(ReadLines(reader, [&](TextLineReader& r) { r.OpenFile(big.c_str()); }), expected);
    EXPECT_EQ(Consume(TextFileToStringList(big.c_str())), expected);
    // A new reader's first line may be empty; nothing to read gives no lines.
    TextLineReader fresh;
    EXPECT_EQ(ReadLines(fresh, [](TextLineReader& r) { r.OpenBuffer("\n"); }), Lines{""});
    EXPECT_EQ(ReadLines(reader, [](TextLineReader& r) { r.OpenBuffer(nullptr); }), Lines{});
    EXPECT_EQ(ReadLines(reader, [](TextLineReader& r) { EXPECT_EQ(r.OpenFile(nullptr), 0); }),
              Lines{});
    EXPECT_EQ(BufferToStringList(nullptr), nullptr);
    EXPECT_EQ(TextFileToStringList(nullptr), nullptr);

    const char* lines[] = {"a", "", "b", nullptr};
    char* joined = StringListToBuffer(const_cast<char**>(lines));
    EXPECT_STREQ(joined, "a\n\nb\n");
    free(joined);
    joined = StringListToBuffer(nullptr);
    EXPECT_STREQ(joined, "");
    free(joined);
}

// Only regular files and the null device (under any name) pass; a FIFO
// without a writer is refused at once, never waited on.
TEST(UtilhubFiles, OnlyReadableRegularFilesAndTheNullDevicePassTheCheck) {
    ScratchDir dir;
    std::string file = dir.Write("plain.cfg", "x\n");
    std::string fifo = dir.Path("pipe");
    std::string nullLink = dir.Path("off.cfg");
    ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
    ASSERT_EQ(symlink("/dev/null", nullLink.c_str()), 0);
    EXPECT_EQ(DKCheck(file.c_str()), 1);
    for (const std::string& path : {std::string("/dev/null"), nullLink}) {
        EXPECT_EQ(DKCheck(path.c_str()), 1) << path;
        EXPECT_EQ(Consume(TextFileToStringList(path.c_str())), Lines{}) << path;
    }
    for (const std::string& path :
         {dir.Root(), std::string("/dev/zero"), fifo, dir.Path("missing"), std::string()}) {
        EXPECT_EQ(DKCheck(path.c_str()), 0) << path;
        EXPECT_EQ(TextFileToStringList(path.c_str()), nullptr) << path;
        TextLineReader reader;
        EXPECT_EQ(reader.OpenFile(path.c_str()), 0) << path;
        EXPECT_EQ(reader.Next(nullptr), nullptr) << path;
    }
    EXPECT_EQ(DKCheck(nullptr), 0);
    if (geteuid() != 0) {  // root reads anything
        chmod(file.c_str(), 0);
        EXPECT_EQ(DKCheck(file.c_str()), 0);
    }
}

TEST(UtilhubFiles, StreamsRememberTheirPath) {
    ScratchDir dir;
    std::string path = dir.Write("read.cfg", "first\r\n\nlast");
    EXPECT_EQ(DKOpen(dir.Path("missing").c_str(), 4, "r"), nullptr);
    FILE* stream = DKOpen(path.c_str(), 4, "r");
    ASSERT_NE(stream, nullptr);
    const char* name = fp2filename(stream);
    EXPECT_EQ(std::string(name), path);
    EXPECT_EQ(fp2filename(stream), name);
    EXPECT_EQ(fp2filename(nullptr), nullptr);
    for (const char* line : {"first", "", "last"}) {
        EXPECT_STREQ(DKReadLine(stream), line);
    }
    EXPECT_EQ(DKReadLine(stream), nullptr);
    EXPECT_EQ(DKClose(stream), 0);
    EXPECT_EQ(DKClose(nullptr), 0);

    // Streams DKOpen did not open, possibly at the address of a closed one, have no path.
    FILE* foreign = fopen(path.c_str(), "r");
    EXPECT_EQ(fp2filename(foreign), nullptr);
    fclose(foreign);
}

TEST(UtilhubFiles, FindFileSearchesTheDirectoryLists) {
    ScratchDir first, second;
    second.Write("both.cfg", "");
    first.Write("both.cfg", "");
    second.Write("late.cfg", "");
    ASSERT_EQ(mkdir(first.Path("late.cfg").c_str(), 0700), 0);  // a directory is no match

    setenv(DWX_ETC_PATH_VARIABLE,
           ("/nonexistent::" + first.Root() + ":" + second.Root() + "/").c_str(), 1);
    setenv(DWX_PRO_PATH_VARIABLE, second.Root().c_str(), 1);
    struct Case {
        const char* key;
        const char* name;
        std::string expected;  // empty: not found
    } cases[] = {
        {"etc", "both.cfg", first.Path("both.cfg")},
        {"etc", "late.cfg", second.Path("late.cfg")},
        {"pro", "both.cfg", second.Path("both.cfg")},
        {"etc", "absent.cfg", ""},
        {"bin", "both.cfg", ""},
        {"etc", "", ""},
    };
    for (const Case& c : cases) {
        char* found = IMPFindFile(c.key, c.name);
        EXPECT_EQ(found ? std::string(found) : std::string(), c.expected) << c.key << " " << c.name;
        free(found);
    }
    unsetenv(DWX_PRO_PATH_VARIABLE);
    EXPECT_EQ(IMPFindFile("pro", "both.cfg"), nullptr);
    unsetenv(DWX_ETC_PATH_VARIABLE);
    EXPECT_EQ(IMPFindFile(nullptr, "both.cfg"), nullptr);
}

TEST(UtilhubFiles, ExpandsEnvironmentReferences) {
    setenv("UTILHUB_TEST_DIR", "/opt/conf", 1);
    unsetenv("UTILHUB_TEST_UNSET");
    struct Case {
        const char* text;
        const char* expected;
    } cases[] = {
        {"$UTILHUB_TEST_DIR/a.cfg", "/opt/conf/a.cfg"},
        {"${UTILHUB_TEST_DIR}x", "/opt/confx"},
        {"[$UTILHUB_TEST_UNSET]", "[]"},
        {"${UTILHUB_TEST_UNSET}", ""},
        {"cost $5 and $ and a$", "cost $5 and $ and a$"},
        {"${UTILHUB_TEST_DIR", "${UTILHUB_TEST_DIR"},
        {"${}", "${}"},
        {"$$UTILHUB_TEST_DIR", "$/opt/conf"},
    };
    for (const Case& c : cases) {
        char* expanded = HStringExpand(c.text);
        EXPECT_STREQ(expanded, c.expected) << c.text;
        free(expanded);
    }
    EXPECT_EQ(HStringExpand(nullptr), nullptr);
}

TEST(UtilhubText, WhiteSpaceHelpers) {
    char trailing[] = " \v\f a b \t\r\n";
    EXPECT_EQ(LSCGetFirstNonWhiteSpace(trailing), trailing + 4);
    EXPECT_STREQ(LSCEatWSBack(trailing), " \v\f a b");
    EXPECT_EQ(LSCEatWSBack(nullptr), nullptr);

    const std::string::size_type npos = std::string::npos;
    std::string words = "  ab c \n";
    EXPECT_EQ(FindFirstNonWhitespace(words, 4), 5u);
    EXPECT_EQ(FindFirstNonWhitespace(words, 6), npos);
    EXPECT_EQ(FindLastNonWhitespace(words), 5u);
    EXPECT_EQ(FindLastNonWhitespace(words, 1), npos);
    EXPECT_EQ(FindLastNonWhitespace(std::string()), npos);
    EXPECT_EQ(TrimWhitespace(words), "ab c");
    std::string blank = " \t ";
    EXPECT_EQ(TrimWhitespace(blank), "");

    std::string big(50000, 'z');
    char* formatted = HSPrintf("<%s|%d>", big.c_str(), 7);
    EXPECT_EQ(std::string(formatted), "<" + big + "|7>");
    free(formatted);
}

TEST(UtilhubText, TodayAsDayMonthYear) {
    time_t now = time(nullptr);
    struct tm local;
    localtime_r(&now, &local);
    char expected[40];
    snprintf(expected, sizeof expected, "%d-%d-%d", local.tm_mday, local.tm_mon + 1,
             local.tm_year + 1900);
    EXPECT_STREQ(IMPTime(nullptr, 10), expected);
}

TEST(UtilhubReport, HandlerSeesEveryReportAndSeverityOneThrows) {
    ReportCapture capture;
    EXPECT_NE(capture.Previous(), nullptr);  // the default handler
    IMPError(100, 0, "bad date");
    IMPError(3, 2, nullptr);
    try {
        IMPError(-1, 1, "Corrupt file x\n at line 5");
        ADD_FAILURE() << "severity 1 returned";
    } catch (const tzn::Exception& e) {
        EXPECT_EQ(e.Code(), -1);
        EXPECT_EQ(e.Severity(), 1);
        EXPECT_STREQ(e.what(), "Corrupt file x\n at line 5");
    }
    // The handler saw the last report before the throw.
    EXPECT_EQ(capture.Texts(), (std::vector<std::string>{"100/0 bad date", "3/2 ",
                                                         "-1/1 Corrupt file x\n at line 5"}));

    // The default handler writes one line.
    EXPECT_EQ(IMPSetErrorHandler(nullptr), ReportCapture::Handler());
    testing::internal::CaptureStderr();
    IMPError(7, 2, "first\nsecond\n");
    std::string written = testing::internal::GetCapturedStderr();
    EXPECT_EQ(written.find('\n'), written.size() - 1) << written;
    EXPECT_NE(written.find("first second"), std::string::npos) << written;
    EXPECT_NE(written.find('7'), std::string::npos) << written;
}

int gExitPipe = -1;
void Note(char c) {
    EXPECT_EQ(write(gExitPipe, &c, 1), 1);
}

TEST(UtilhubAtExit, CallbacksRunOnceLastRegisteredFirst) {
    int fds[2];
    ASSERT_EQ(pipe(fds), 0);
    pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        close(fds[0]);
        gExitPipe = fds[1];
        _IMPAtExit([] { Note('a'); }, __FILE__, __LINE__);
        _IMPAtExit([] { throw 1; }, __FILE__, __LINE__);
        _IMPAtExit([] { Note('b'); }, __FILE__, __LINE__);
        _IMPAtExit(
            [] {
                Note('c');
                _IMPAtExit([] { Note('d'); }, __FILE__, __LINE__);  // while the callbacks run
            },
            __FILE__, __LINE__);
        _IMPAtExit(nullptr, __FILE__, __LINE__);
        exit(0);
    }
    close(fds[1]);
    std::string order;
    for (char c; read(fds[0], &c, 1) == 1;) {
        order.push_back(c);
    }
    close(fds[0]);
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    EXPECT_EQ(order, "cdba");
}

}  // namespace
