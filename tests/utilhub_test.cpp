#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <fcntl.h>
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

// A scratch directory, removed with its content at the end of the test.
class TempDir {
  public:
    TempDir() {
        char pattern[] = "/tmp/utilhub_test_XXXXXX";
        path = mkdtemp(pattern);
    }
    ~TempDir() { EXPECT_EQ(system(("rm -rf '" + path + "'").c_str()), 0); }
    std::string Write(const std::string& name, const std::string& content) const {
        std::string file = path + "/" + name;
        FILE* out = fopen(file.c_str(), "wb");
        fwrite(content.data(), 1, content.size(), out);
        fclose(out);
        return file;
    }
    std::string path;
};

TEST(UtilhubTokenize, WhiteSpaceAndQuotedRuns) {
    struct Case {
        const char* text;
        Lines tokens;
    } cases[] = {
        {"", {}},
        {" \t\r\n\v\f", {}},
        {"  a  b\tc\r\nd\ve\ff ", {"a", "b", "c", "d", "e", "f"}},
        {"(title String \"Main window\")", {"(title", "String", "\"Main window\")"}},
        {"a\"b c\"d e", {"a\"b c\"d", "e"}},
        {"\"\" \"x\ty\"", {"\"\"", "\"x\ty\""}},
        {"x \"never closed  y", {"x", "\"never closed  y"}},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(Consume(Tokenize(c.text)), c.tokens) << c.text;
    }
    EXPECT_EQ(Consume(Tokenize(nullptr)), Lines{});
    std::string longWord(200000, 'w');
    EXPECT_EQ(Consume(Tokenize(("a " + longWord).c_str())), (Lines{"a", longWord}));
}

TEST(UtilhubTokenize, DelimitersDropEmptyPieces) {
    struct Case {
        const char* text;
        const char* delimiters;
        Lines pieces;
    } cases[] = {
        {",a,,b,", ",", {"a", "b"}},
        {" x | y ", "|", {" x ", " y "}},
        {"-o a|b", " |", {"-o", "a", "b"}},
        {"", ",", {}},
        {",,,", ",", {}},
        {"whole", "", {"whole"}},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(Consume(TokenizeDelim(c.text, c.delimiters)), c.pieces) << c.text;
    }
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

TEST(UtilhubStringList, LargeListsGrowInAmortisedConstantTime) {
    const int count = 900000;
    char** list = nullptr;
    for (int i = 0; i < count; ++i) {
        list = AddStringToList(list, i % 2 ? "odd line" : "");
    }
    ASSERT_EQ(CountStringList(list), count);
    char* buffer = StringListToBuffer(list);
    EXPECT_EQ(strlen(buffer), static_cast<size_t>(count / 2) * 10);
    char** again = BufferToStringList(buffer);
    ASSERT_EQ(CountStringList(again), count);
    EXPECT_STREQ(again[0], "");
    EXPECT_STREQ(again[count - 1], "odd line");
    free(buffer);
    DestroyStringList(again);
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
    TempDir dir;
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
        expected.push_back(
            std::string(static_cast<size_t>(i % 4099), static_cast<char>('a' + i % 26)));
        text += expected.back() + (i % 3 ? "\n" : "\r\n");
    }
    std::string big = dir.Write("big.txt", text);
    EXPECT_EQ(ReadLines(reader, [&](TextLineReader& r) { r.OpenFile(big.c_str()); }), expected);
    EXPECT_EQ(Consume(TextFileToStringList(big.c_str())), expected);
    // A new reader's first line may be empty.
    TextLineReader fresh;
    EXPECT_EQ(ReadLines(fresh, [](TextLineReader& r) { r.OpenBuffer("\n"); }), Lines{""});
    // Nothing to read: no lines, until opened on something else.
    EXPECT_EQ(ReadLines(reader, [](TextLineReader& r) { r.OpenBuffer(nullptr); }), Lines{});
    EXPECT_EQ(ReadLines(reader, [](TextLineReader& r) { EXPECT_EQ(r.OpenFile(nullptr), 0); }),
              Lines{});
    EXPECT_EQ(BufferToStringList(nullptr), nullptr);
    EXPECT_EQ(TextFileToStringList(nullptr), nullptr);
    EXPECT_EQ(TextFileToStringList((dir.path + "/missing").c_str()), nullptr);

    char* lines[] = {const_cast<char*>("a"), const_cast<char*>(""), const_cast<char*>("b"),
                     nullptr};
    char* joined = StringListToBuffer(lines);
    EXPECT_STREQ(joined, "a\n\nb\n");
    free(joined);
    joined = StringListToBuffer(nullptr);
    EXPECT_STREQ(joined, "");
    free(joined);
}

TEST(UtilhubFiles, OnlyReadableRegularFilesPassTheCheck) {
    TempDir dir;
    std::string file = dir.Write("plain.cfg", "x\n");
    std::string fifo = dir.path + "/pipe";
    ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
    EXPECT_EQ(DKCheck(file.c_str()), 1);
    for (const std::string& path : {dir.path, std::string("/dev/null"), std::string("/dev/zero"),
                                    fifo, dir.path + "/missing", std::string()}) {
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
    TempDir dir;
    std::string path = dir.Write("read.cfg", "first\r\n\nlast");
    EXPECT_EQ(DKOpen((dir.path + "/missing").c_str(), 4, "r"), nullptr);

    FILE* stream = DKOpen(path.c_str(), 4, "r");
    ASSERT_NE(stream, nullptr);
    const char* name = fp2filename(stream);
    EXPECT_EQ(std::string(name), path);
    EXPECT_EQ(fp2filename(stream), name);

    FILE* foreign = fopen(path.c_str(), "r");
    EXPECT_EQ(fp2filename(foreign), nullptr);
    fclose(foreign);
    EXPECT_EQ(fp2filename(nullptr), nullptr);

    EXPECT_STREQ(DKReadLine(stream), "first");
    EXPECT_STREQ(DKReadLine(stream), "");
    EXPECT_STREQ(DKReadLine(stream), "last");
    EXPECT_EQ(DKReadLine(stream), nullptr);
    EXPECT_EQ(DKClose(stream), 0);
    EXPECT_EQ(DKClose(nullptr), 0);

    // A new stream (possibly at the same address) does not inherit the old path.
    FILE* reused = fopen(path.c_str(), "r");
    EXPECT_EQ(fp2filename(reused), nullptr);
    fclose(reused);
}

TEST(UtilhubFiles, FindFileSearchesTheDirectoryLists) {
    TempDir first, second;
    second.Write("both.cfg", "");
    first.Write("both.cfg", "");
    second.Write("late.cfg", "");
    ASSERT_EQ(mkdir((first.path + "/late.cfg").c_str(), 0700), 0);  // a directory is no match

    setenv(DWX_ETC_PATH_VARIABLE, ("/nonexistent::" + first.path + ":" + second.path + "/").c_str(),
           1);
    setenv(DWX_PRO_PATH_VARIABLE, second.path.c_str(), 1);
    struct Case {
        const char* key;
        const char* name;
        std::string expected;  // empty: not found
    } cases[] = {
        {"etc", "both.cfg", first.path + "/both.cfg"},
        {"etc", "late.cfg", second.path + "/late.cfg"},
        {"pro", "both.cfg", second.path + "/both.cfg"},
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
        {"plain", "plain"},
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
    int day = 0, month = 0, year = 0;
    ASSERT_EQ(sscanf(IMPTime(nullptr, 10), "%d-%d-%d", &day, &month, &year), 3);
    EXPECT_EQ(day, local.tm_mday);
    EXPECT_EQ(month, local.tm_mon + 1);
    EXPECT_EQ(year, local.tm_year + 1900);
}

struct Report {
    int code;
    int severity;
    std::string message;
};
std::vector<Report> reports;

void Capture(int code, int severity, const char* message) {
    reports.push_back({code, severity, message});
}

TEST(UtilhubReport, HandlerSeesEveryReportAndSeverityOneThrows) {
    reports.clear();
    IMPErrorHandler previous = IMPSetErrorHandler(Capture);
    EXPECT_NE(previous, nullptr);  // the default handler
    IMPError(100, 0, "bad date");
    IMPError(3, 2, nullptr);
    try {
        IMPError(-1, 1, "Corrupt file x\n at line 5");
        ADD_FAILURE() << "severity 1 returned";
    } catch (const tzn::Exception& e) {
        EXPECT_EQ(e.Code(), -1);
        EXPECT_EQ(e.Severity(), 1);
        EXPECT_STREQ(e.what(), "Corrupt file x\n at line 5");
        ASSERT_EQ(reports.size(), 3u);  // the handler saw it before the throw
    }
    EXPECT_EQ(reports[0].code, 100);
    EXPECT_EQ(reports[0].message, "bad date");
    EXPECT_EQ(reports[1].severity, 2);
    EXPECT_EQ(reports[1].message, "");
    EXPECT_EQ(reports[2].code, -1);

    EXPECT_EQ(IMPSetErrorHandler(nullptr), Capture);
    testing::internal::CaptureStderr();
    IMPError(7, 2, "first\nsecond\n");
    std::string written = testing::internal::GetCapturedStderr();
    EXPECT_EQ(written.find('\n'), written.size() - 1) << written;
    EXPECT_NE(written.find("first second"), std::string::npos) << written;
    EXPECT_NE(written.find('7'), std::string::npos) << written;
}

int exitPipe = -1;
void Note(char c) {
    EXPECT_EQ(write(exitPipe, &c, 1), 1);
}
void ExitA() {
    Note('a');
}
void ExitB() {
    Note('b');
}
void ExitD() {
    Note('d');
}
void ExitThrows() {
    throw 1;
}
void ExitC() {
    Note('c');
    _IMPAtExit(ExitD, __FILE__, __LINE__);  // registered while the callbacks run
}

TEST(UtilhubAtExit, CallbacksRunOnceLastRegisteredFirst) {
    int fds[2];
    ASSERT_EQ(pipe(fds), 0);
    pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        close(fds[0]);
        exitPipe = fds[1];
        _IMPAtExit(ExitA, __FILE__, __LINE__);
        _IMPAtExit(ExitThrows, __FILE__, __LINE__);
        _IMPAtExit(ExitB, __FILE__, __LINE__);
        _IMPAtExit(ExitC, __FILE__, __LINE__);
        _IMPAtExit(nullptr, __FILE__, __LINE__);
        exit(0);
    }
    close(fds[1]);
    std::string order;
    char c;
    while (read(fds[0], &c, 1) == 1) {
        order.push_back(c);
    }
    close(fds[0]);
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    EXPECT_EQ(order, "cdba");
}

}  // namespace
