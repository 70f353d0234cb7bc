#include "treefile.h"

#include "iofiles.h"

#include <dwxcore/dwxobject.h>
#include <services/tracer.h>
#include <services/utilhub.h>

#include <ctype.h>
#include <errno.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <filesystem>
#include <system_error>
#include <vector>

namespace dwxtree {

namespace {

int gReports = 0;
std::string gLastReport;
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

// Collects line `want` (counted from 1) of a text fed in pieces, at most
// kShown bytes of it.
class LineFinder {
  public:
    static constexpr size_t kShown = 160;
    explicit LineFinder(int want) : nWant(want) {}
    // False once the line is complete.
    bool Feed(const char* bytes, size_t size) {
        const char* end = bytes + size;
        while (bytes < end && nCurrent <= nWant) {
            const char* newline = static_cast<const char*>(memchr(bytes, '\n', end - bytes));
            const char* stop = newline ? newline : end;
            if (nCurrent == nWant) {
                size_t room = kShown + 1 - std::min(oText.size(), kShown + 1);
                oText.append(bytes, std::min(static_cast<size_t>(stop - bytes), room));
                bFound = true;
            }
            if (newline) {
                ++nCurrent;
            }
            bytes = newline ? newline + 1 : end;
        }
        return nCurrent <= nWant;
    }
    // The line without its line end, cut to kShown bytes with "..."; empty
    // when the text has no such line.
    std::string Text() const {
        if (!bFound) {
            return std::string();
        }
        std::string text = oText;
        if (text.size() > kShown) {
            text.resize(kShown);
            text += "...";
        } else if (!text.empty() && text.back() == '\r') {
            text.pop_back();
        }
        return text;
    }

  private:
    int nWant;
    int nCurrent = 1;
    bool bFound = false;
    std::string oText;
};

std::string LineOf(const std::string& file, int line) {
    if (line <= 0 || file.empty()) {
        return std::string();
    }
    LineFinder finder(line);
    if (gStandardInput && file == kStandardInputName) {
        finder.Feed(gStandardInput->data(), gStandardInput->size());
        return finder.Text();
    }
    if (!UnreadableReason(file, true).empty()) {
        return std::string();
    }
    FILE* stream = fopen(file.c_str(), "rb");
    if (!stream) {
        return std::string();
    }
    char chunk[65536];
    size_t got;
    while ((got = fread(chunk, 1, sizeof chunk, stream)) > 0 && finder.Feed(chunk, got)) {
    }
    fclose(stream);
    return finder.Text();
}

// A library report taken apart: file, line and a message in the tool's
// words. The reader's texts are matched here and nowhere else; a text
// that matches none is shown whole, on one line.
struct LibraryReport {
    std::string file;
    int line = 0;
    std::string message;
};

// The text between `before` and `after` in `text`, searching `after` from
// the end; false when either is missing.
bool Between(const std::string& text, const char* before, const char* after, std::string& out) {
    size_t start = text.find(before);
    size_t end = text.rfind(after);
    if (start == std::string::npos || end == std::string::npos || end < start + strlen(before)) {
        return false;
    }
    out = text.substr(start + strlen(before), end - start - strlen(before));
    return true;
}

LibraryReport ParseLibraryReport(const char* message) {
    std::string text = message ? message : "";
    LibraryReport report;
    std::string lineText;
    std::string included;
    if (text.compare(0, 13, "Corrupt file ") == 0 &&
        Between(text, "Corrupt file ", "\n at line ", report.file) &&
        Between(text, "\n at line ", " ...", lineText)) {
        report.line = atoi(lineText.c_str());
        report.message =
            "corrupt line: expected '(NAME TYPE VALUE', '(NAME SubTree', ')' or a comment";
    } else if (Between(text, "\non line ", " of file '", lineText) &&
               (Between(text, " of file '", "'.\nIgnoring", report.file) ||
                Between(text, " of file '", "'\nis already", report.file)) &&
               Between(text, "file '", "'\nrequested in", included)) {
        report.line = atoi(lineText.c_str());
        if (text.compare(0, 14, "Include cycle:") == 0) {
            report.message = "include cycle: '" + included + "' is already being read; ignored";
        } else if (text.compare(0, 13, "Unable to loc") == 0) {
            report.message = "cannot find include file '" + included + "'; ignored";
        } else {
            // The depth limit, and any other include report.
            std::string head = text.substr(0, text.find(": file '"));
            head[0] = static_cast<char>(tolower(static_cast<unsigned char>(head[0])));
            report.message = head + " at '" + included + "'; ignored";
        }
    } else {
        report.message = OneLine(message);
        return report;
    }
    if (report.file == kReaderBufferName && gStandardInput) {
        report.file = kStandardInputName;
    }
    return report;
}

void OnReport(int /*code*/, int severity, const char* message) {
    gLastReport = message ? message : "";
    LibraryReport report = ParseLibraryReport(message);
    Report(report.file, report.line, severity <= 1 ? Severity::kError : Severity::kWarning,
           report.message);
}

#ifdef _WIN32
constexpr char kListSeparator = ';';
void SetVariable(const char* name, const char* value) {
    _putenv_s(name, value ? value : "");
}
#else
constexpr char kListSeparator = ':';
void SetVariable(const char* name, const char* value) {
    if (value) {
        setenv(name, value, 1);
    } else {
        unsetenv(name);
    }
}
#endif

// Appends a directory to the "etc" search path and restores the old value
// when it goes out of scope.
class EtcPathExtension {
  public:
    explicit EtcPathExtension(const char* file) {
        const char* old = getenv(DWX_ETC_PATH_VARIABLE);
        bHadOld = old != nullptr;
        if (old) {
            oOld = old;
        }
        std::string directory = std::filesystem::path(file).parent_path().string();
        if (directory.empty()) {
            directory = ".";
        }
        std::string extended = oOld.empty() ? directory : oOld + kListSeparator + directory;
        SetVariable(DWX_ETC_PATH_VARIABLE, extended.c_str());
    }
    ~EtcPathExtension() { SetVariable(DWX_ETC_PATH_VARIABLE, bHadOld ? oOld.c_str() : nullptr); }
    EtcPathExtension(const EtcPathExtension&) = delete;
    EtcPathExtension& operator=(const EtcPathExtension&) = delete;

  private:
    bool bHadOld = false;
    std::string oOld;
};

std::string Canonical(const std::string& path) {
    std::error_code error;
    std::filesystem::path canonical = std::filesystem::weakly_canonical(path, error);
    return error ? path : canonical.string();
}

struct FreeText {
    void operator()(char* text) const { free(text); }
};
using HeapText = std::unique_ptr<char, FreeText>;

// The file an include directive reaches, searched the way the reader
// searches (as given, then "etc", then "pro"); empty when none.
std::string ResolveInclude(const std::string& token) {
    HeapText path(HStringExpand(token.c_str()));
    if (!path) {
        return std::string();
    }
    if (!DKCheck(path.get())) {
        HeapText found(IMPFindFile("etc", path.get()));
        if (!found) {
            found.reset(IMPFindFile("pro", path.get()));
        }
        if (found) {
            path = std::move(found);
        }
    }
    return DKCheck(path.get()) ? Canonical(path.get()) : std::string();
}

// The reader traces every include directive when the debug level is set;
// each trace ends in "<DIRECTIVE FILE>". Those are the files the reading
// reached.
void CollectIncludes(FILE* traces, std::set<std::string>& files) {
    rewind(traces);
    std::string all;
    char chunk[4096];
    size_t got;
    while ((got = fread(chunk, 1, sizeof chunk, traces)) > 0) {
        all.append(chunk, got);
    }
    size_t start = 0;
    while ((start = all.find('<', start)) != std::string::npos) {
        size_t blank = all.find(' ', start);
        size_t end = all.find(">\n", start);
        if (blank == std::string::npos || end == std::string::npos || blank > end) {
            break;
        }
        std::string resolved = ResolveInclude(all.substr(blank + 1, end - blank - 1));
        if (!resolved.empty()) {
            files.insert(resolved);
        }
        start = end + 2;
    }
}

// Turns include tracing on for its lifetime, into a scratch file.
class IncludeTrace {
  public:
    IncludeTrace() : poStream(tmpfile()) {
        if (poStream) {
            nOldLevel = tzn::tracer::Debugger::moDebugLevel;
            poOldStream = tzn::tracer::Debugger::SetStream(poStream);
            tzn::tracer::Debugger::moDebugLevel = 1;
        }
    }
    ~IncludeTrace() {
        if (poStream) {
            tzn::tracer::Debugger::moDebugLevel = nOldLevel;
            tzn::tracer::Debugger::SetStream(poOldStream == stderr ? nullptr : poOldStream);
            fclose(poStream);
        }
    }
    IncludeTrace(const IncludeTrace&) = delete;
    IncludeTrace& operator=(const IncludeTrace&) = delete;
    FILE* Stream() const { return poStream; }

  private:
    FILE* poStream;
    FILE* poOldStream = nullptr;
    int nOldLevel = 0;
};

}  // namespace

void InstallReportHandler() {
    IMPSetErrorHandler(OnReport);
}

int ReportCount() {
    return gReports;
}

void Report(const std::string& file, int line, Severity severity, const std::string& message) {
    ++gReports;
    const char* kind = severity == Severity::kError ? "error" : "warning";
    if (file.empty()) {
        fprintf(stderr, "dwxtree: %s: %s\n", kind, message.c_str());
        return;
    }
    if (line <= 0) {
        fprintf(stderr, "%s: %s: %s\n", file.c_str(), kind, message.c_str());
        return;
    }
    fprintf(stderr, "%s:%d: %s: %s\n", file.c_str(), line, kind, message.c_str());
    std::string text = LineOf(file, line);
    if (!text.empty()) {
        fprintf(stderr, " %5d | %s\n", line, text.c_str());
    }
}

void Complain(const std::string& message) {
    Report(std::string(), 0, Severity::kError, message);
}

bool ReadTreeFile(const std::string& path, TreeFile& out, bool listFiles) {
    bool standardInput = path == kStandardStream;
    out.root = std::make_unique<PTNSubTree>(path.c_str());
    out.name = standardInput ? kStandardInputName : path;
    out.text.clear();
    out.files.clear();
    out.reports = 0;
    FILE* stream = nullptr;
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
    } else {
        std::string reason = UnreadableReason(path, true);
        stream = reason.empty() ? DKOpen(path.c_str(), 4, "r") : nullptr;
        if (!stream) {
            Report(path, 0, Severity::kError,
                   "cannot read: " + (reason.empty() ? ErrorText(errno) : reason));
            return false;
        }
    }

    int before = ReportCount();
    {
        std::unique_ptr<EtcPathExtension> searchHere;
        if (!standardInput) {
            searchHere = std::make_unique<EtcPathExtension>(path.c_str());
        }
        std::unique_ptr<IncludeTrace> trace;
        if (listFiles) {
            trace = std::make_unique<IncludeTrace>();
        }
        gLastReport.clear();
        gStandardInput = standardInput ? &out.text : nullptr;
        try {
            if (standardInput) {
                out.root->BuildFromString(out.text.c_str());
            } else {
                out.root->BuildFromFile(stream);
            }
        } catch (const tzn::Exception& e) {
            // The handler has shown the report already; only a text it has
            // not seen is shown here.
            if (gLastReport != e.what()) {
                OnReport(e.Code(), e.Severity(), e.what());
            }
        }
        if (trace && trace->Stream()) {
            fflush(trace->Stream());
            CollectIncludes(trace->Stream(), out.files);
        }
    }
    gStandardInput = nullptr;
    if (stream) {
        DKClose(stream);
        out.files.insert(Canonical(path));
    } else {
        out.files.insert(kStandardInputName);
    }
    out.reports = ReportCount() - before;
    return true;
}

const char* TypeKeyword(const DWXParseTreeNode& node) {
    const char* name = node.GetClassName();
    return strncmp(name, "PTN", 3) == 0 ? name + 3 : name;
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
        fprintf(stream, "(%s %s %s)\n", node->GetName(), TypeKeyword(*node),
                value ? value.get() : "");
    }
}

}  // namespace dwxtree
