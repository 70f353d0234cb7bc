#include "treefile.h"

#include "iofiles.h"

#include <dwxcore/dwxobject.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <ctype.h>
#include <errno.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <map>
#include <vector>

namespace dwxtree {

namespace {

// While standard input is read: its text, for the lines that reports show.
const std::string* gStandardInput = nullptr;

// The name the reader gives a text that is not a file.
constexpr char kReaderBufferName[] = "Memory";

// Report texts of the library span several lines; a tool prints one line
// per problem, so line ends and the blanks around them become one blank.
std::string OneLine(const char* text) {
    std::string line;
    bool pendingBlank = false;
    for (const char* p = text ? text : ""; *p; ++p) {
        if (*p == '\n' || *p == '\r' || *p == ' ' || *p == '\t') {
            pendingBlank = !line.empty();
            continue;
        }
        if (pendingBlank) {
            line.push_back(' ');
            pendingBlank = false;
        }
        line.push_back(*p);
    }
    return line;
}

// Collects some lines (counted from 1) of a text fed in pieces, at most
// kShown bytes of each, in one pass over the text.
class LineFinder {
  public:
    static constexpr size_t kShown = 160;
    // `want` holds the line numbers in any order; repeats are allowed.
    explicit LineFinder(std::vector<int> want) : oWant(std::move(want)) {
        std::sort(oWant.begin(), oWant.end());
        oWant.erase(std::unique(oWant.begin(), oWant.end()), oWant.end());
        oTexts.resize(oWant.size());
        oFound.resize(oWant.size());
    }
    // False once every wanted line is complete.
    bool Feed(const char* bytes, size_t size) {
        const char* end = bytes + size;
        while (bytes < end && nNext < oWant.size()) {
            const char* newline = static_cast<const char*>(memchr(bytes, '\n', end - bytes));
            const char* stop = newline ? newline : end;
            bool wanted = nCurrent == oWant[nNext];
            if (wanted) {
                std::string& text = oTexts[nNext];
                size_t room = kShown + 1 - std::min(text.size(), kShown + 1);
                text.append(bytes, std::min(static_cast<size_t>(stop - bytes), room));
                oFound[nNext] = true;
            }
            if (newline) {
                nNext += wanted ? 1 : 0;
                ++nCurrent;
            }
            bytes = newline ? newline + 1 : end;
        }
        return nNext < oWant.size();
    }
    // The line without its line end, cut to kShown bytes with "..."; empty
    // when the text has no such line or it was not wanted. O(log wanted).
    std::string Text(int line) const {
        auto at = std::lower_bound(oWant.begin(), oWant.end(), line);
        if (at == oWant.end() || *at != line || !oFound[at - oWant.begin()]) {
            return std::string();
        }
        std::string text = oTexts[at - oWant.begin()];
        if (text.size() > kShown) {
            text.resize(kShown);
            text += "...";
        } else if (!text.empty() && text.back() == '\r') {
            text.pop_back();
        }
        return text;
    }

  private:
    std::vector<int> oWant;  // ascending, each once
    std::vector<std::string> oTexts;
    std::vector<bool> oFound;
    size_t nNext = 0;  // the first wanted line not yet complete
    int nCurrent = 1;
};

// Reads the wanted lines of `file` (standard input's text while it is
// read) in one pass: O(size of the file) for any number of lines.
LineFinder LinesOf(const std::string& file, std::vector<int> lines) {
    LineFinder finder(std::move(lines));
    if (gStandardInput && file == kStandardInputName) {
        finder.Feed(gStandardInput->data(), gStandardInput->size());
        return finder;
    }
    FILE* stream =
        !file.empty() && UnreadableReason(file, true).empty() ? fopen(file.c_str(), "rb") : nullptr;
    if (!stream) {
        return finder;
    }
    char chunk[65536];
    size_t got;
    while ((got = fread(chunk, 1, sizeof chunk, stream)) > 0 && finder.Feed(chunk, got)) {
    }
    fclose(stream);
    return finder;
}

void PrintReport(const std::string& file, int line, Severity severity, const std::string& message,
                 const std::string& text) {
    const char* kind = severity == Severity::kError ? "error" : "warning";
    if (file.empty()) {
        fprintf(stderr, "dwxtree: %s: %s\n", kind, message.c_str());
    } else if (line <= 0) {
        fprintf(stderr, "%s: %s: %s\n", file.c_str(), kind, message.c_str());
    } else {
        fprintf(stderr, "%s:%d: %s: %s\n", file.c_str(), line, kind, message.c_str());
        if (!text.empty()) {
            fprintf(stderr, " %5d | %s\n", line, text.c_str());
        }
    }
}

// The text after `marker` up to the next quote: the file a report of an
// include names. Empty when the marker is missing.
std::string QuotedAfter(const std::string& text, const char* marker) {
    size_t start = text.find(marker);
    if (start == std::string::npos) {
        return std::string();
    }
    start += strlen(marker);
    size_t end = text.find('\'', start);
    return text.substr(start, end == std::string::npos ? end : end - start);
}

// A report of the reader in the tool's words. The file and the line come
// with the report; only its kind and the include it names are taken from
// the text. A text of another kind is shown whole, on one line.
std::string Wording(const PTNReadReport& report) {
    const std::string& text = report.message;
    if (report.code == -1 && report.severity == 1) {
        return "corrupt line: expected '(NAME TYPE VALUE', '(NAME SubTree', ')' or a comment";
    }
    std::string included = QuotedAfter(text, "file '");
    if (text.compare(0, 14, "Include cycle:") == 0) {
        return "include cycle: '" + included + "' is already being read; ignored";
    }
    if (text.compare(0, 16, "Unable to locate") == 0) {
        return "cannot find include file '" + included + "'; ignored";
    }
    if (text.compare(0, 19, "Include depth limit") == 0) {
        std::string head = OneLine(text.substr(0, text.find(": file '")).c_str());
        head[0] = 'i';
        return head + " at '" + included + "'; ignored";
    }
    std::string line = OneLine(text.c_str());
    if (!line.empty()) {
        // A message in the compilers' form: lower case, no final stop.
        line[0] = static_cast<char>(tolower(static_cast<unsigned char>(line[0])));
        if (line.back() == '.') {
            line.pop_back();
        }
    }
    return line;
}

void OnReport(int /*code*/, int severity, const char* message) {
    Report(std::string(), 0, severity <= 1 ? Severity::kError : Severity::kWarning,
           OneLine(message));
}

}  // namespace

void InstallReportHandler() {
    IMPSetErrorHandler(OnReport);
}

void Report(const std::string& file, int line, Severity severity, const std::string& message) {
    std::string text = line > 0 ? LinesOf(file, {line}).Text(line) : std::string();
    PrintReport(file, line, severity, message, text);
}

void Complain(const std::string& message) {
    Report(std::string(), 0, Severity::kError, message);
}

namespace {

// Reads the tree of `path` (standard input for "-") into `out`, keeping the
// text read from standard input. False, reported, when nothing could be read.
bool BuildTree(const std::string& path, bool standardInput, TreeFile& out) {
    if (standardInput) {
        char chunk[65536];
        size_t got;
        while ((got = fread(chunk, 1, sizeof chunk, stdin)) > 0) {
            out.text.append(chunk, got);
        }
        if (ferror(stdin)) {
            Report(out.name, 0, Severity::kError, "cannot read: " + ErrorText(errno));
            return false;
        }
        out.root->BuildFromString(out.text.c_str(), &out.log);
        return true;
    }
    std::string reason = UnreadableReason(path, true);
    FILE* stream = reason.empty() ? DKOpen(path.c_str(), 4, "r") : nullptr;
    if (!stream) {
        Report(path, 0, Severity::kError,
               "cannot read: " + (reason.empty() ? ErrorText(errno) : reason));
        return false;
    }
    out.root->BuildFromFile(stream, &out.log);
    DKClose(stream);
    return true;
}

// Every report of the read, then every warning, each at its own file and
// line. The lines they show are read in one pass per file, as a file may
// have a warning on each of its lines.
void PrintReadReports(const TreeFile& out, bool standardInput) {
    const auto lists = {&out.log.Reports(), &out.log.Warnings()};
    auto nameOf = [&](const PTNReadReport& report) {
        return standardInput && report.file == kReaderBufferName ? std::string(kStandardInputName)
                                                                 : report.file;
    };
    std::map<std::string, std::vector<int>> wanted;
    for (const auto* list : lists) {
        for (const PTNReadReport& report : *list) {
            wanted[nameOf(report)].push_back(report.line);
        }
    }
    gStandardInput = standardInput ? &out.text : nullptr;
    std::map<std::string, LineFinder> lines;
    for (auto& [file, numbers] : wanted) {
        lines.emplace(file, LinesOf(file, std::move(numbers)));
    }
    gStandardInput = nullptr;
    for (const auto* list : lists) {
        for (const PTNReadReport& report : *list) {
            std::string file = nameOf(report);
            PrintReport(file, report.line,
                        report.severity <= 1 ? Severity::kError : Severity::kWarning,
                        Wording(report), lines.at(file).Text(report.line));
        }
    }
}

}  // namespace

bool ReadTreeFile(const std::string& path, TreeFile& out) {
    bool standardInput = path == kStandardStream;
    out.root = std::make_unique<PTNSubTree>(path.c_str());
    out.name = standardInput ? kStandardInputName : path;
    out.text.clear();
    out.log = PTNReadLog();
    if (!BuildTree(path, standardInput, out)) {
        return false;
    }
    PrintReadReports(out, standardInput);
    return true;
}

std::vector<std::string> FilesRead(const TreeFile& file) {
    std::vector<std::string> files;
    if (file.name == kStandardInputName) {
        // A buffer is no file the reader opens; its includes are.
        files.push_back(kStandardInputName);
    }
    files.insert(files.end(), file.log.Files().begin(), file.log.Files().end());
    return files;
}

std::string SourceName(const TreeFile& file, const PTNSourceFile& source) {
    return source.includedBy ? source.name : file.name;
}

void WriteTopLevel(FILE* stream, const PTNSubTree& root) {
    DWXIter iter(root.GetChildren());
    for (DWXObject* object = iter.Start(); object; object = iter.Next()) {
        auto* node = static_cast<DWXParseTreeNode*>(object);
        if (auto* subtree = dynamic_cast<PTNSubTree*>(node)) {
            subtree->WriteToFile(stream);
            continue;
        }
        HeapText value(node->GetAsString());
        fprintf(stream, "(%s %s %s)\n", node->GetName(), PTNTypeKeyword(node->GetClassName()),
                value ? value.get() : "");
    }
}

}  // namespace dwxtree
