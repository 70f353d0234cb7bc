// Reading the text form of a parse tree into a PTNSubTree.
//
// Every line is visited once: empty and comment lines are skipped (but
// counted), every other line is trimmed, cut and split in place, and the node
// it describes is appended at once, so that everything read before a failure
// stays in the tree. Files and buffers are walked line by line through one
// reused buffer (TextLineReader); string lists are copied a line at a time
// into a scratch buffer, since their lines are the caller's. Nested subtrees
// are read with an explicit stack of open subtrees rather than by recursion,
// so the depth of nesting is bounded by memory, not by the call stack;
// includes recurse, bounded by the include depth limit.
#include <dwxcore/dwxparse.h>

#include "internal/dwxparse_kinds.h"
#include "internal/dwxparse_scan.h"
#include "internal/dwxparse_token.h"

#include <services/rtprim.h>
#include <services/tracer.h>
#include <services/utilhub.h>

#include <errno.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <atomic>
#include <filesystem>
#include <memory>
#include <mutex>
#include <string>
#include <system_error>
#include <unordered_map>
#include <utility>
#include <vector>

// Appends the nodes the reader makes: new nodes, without a parent, that need
// none of AddChild's checks.
struct PTNTreeBuilder {
    static void Append(PTNSubTree* parent, DWXParseTreeNode* child) { parent->AppendChild(child); }
};

// Records where the reader built a node.
struct PTNSourceSetter {
    static void Set(DWXParseTreeNode* node, const PTNSourceFile* file, int line) {
        node->poSource = file;
        node->nSourceLine = line;
    }
};

// The reader's entries in a PTNReadLog.
struct PTNReadLogWriter {
    static void Add(std::vector<PTNReadReport>& to, int code, int severity, const char* file,
                    int line, const char* message) {
        to.push_back(PTNReadReport{code, severity, file, line, message});
    }
    static void AddReport(PTNReadLog& log, int code, int severity, const char* file, int line,
                          const char* message) {
        Add(log.oReports, code, severity, file, line, message);
    }
    static void AddWarning(PTNReadLog& log, int code, const char* file, int line,
                           const char* message) {
        Add(log.oWarnings, code, 3, file, line, message);
    }
    static size_t ReportCount(const PTNReadLog& log) { return log.oReports.size(); }
    // Lists `name` unless the file `canonical` is listed already.
    static void AddFile(PTNReadLog& log, const char* name, const std::string& canonical) {
        for (const std::string& known : log.oCanonicalFiles) {
            if (known == canonical) {
                return;
            }
        }
        log.oCanonicalFiles.push_back(canonical);
        log.oFiles.push_back(name);
    }
};

namespace {

// Nested includes allowed below the file the reading started from.
constexpr int kMaxIncludeDepth = 64;

using dwxcore::internal::ClassifyKeyword;
using dwxcore::internal::ClassOf;
using dwxcore::internal::IsIncludeDirective;
using dwxcore::internal::IsWhite;
using dwxcore::internal::KindEntry;
using dwxcore::internal::LeafTokens;
using dwxcore::internal::ScanDouble;
using dwxcore::internal::ScanInteger;

const char* SourceName(const char* fileName) {
    return fileName ? fileName : "Memory";
}

std::atomic<bool> gSearchNextToIncluder{false};

// The source records, interned: one per (name, includedBy, includedAtLine),
// made on first use and kept, like the table itself, for the whole process,
// since every node read from a file points to its record.
class SourceTable {
  public:
    const PTNSourceFile* Intern(const char* name, const PTNSourceFile* includedBy, int line) {
        std::string key(name);
        key.push_back('\0');
        key.append(reinterpret_cast<const char*>(&includedBy), sizeof includedBy);
        key.append(reinterpret_cast<const char*>(&line), sizeof line);
        std::lock_guard<std::mutex> guard(oLock);
        std::unique_ptr<Record>& record = oRecords[key];
        if (!record) {
            record = std::make_unique<Record>();
            record->name = name;
            record->file = PTNSourceFile{record->name.c_str(), includedBy, line};
        }
        return &record->file;
    }

  private:
    struct Record {
        std::string name;
        PTNSourceFile file;
    };
    std::mutex oLock;
    std::unordered_map<std::string, std::unique_ptr<Record>> oRecords;
};

const PTNSourceFile* InternSource(const char* fileName, const PTNSourceFile* includedBy, int line) {
    static SourceTable* table = new SourceTable;
    return table->Intern(SourceName(fileName), includedBy, line);
}

// The files being read on this thread's current include chain, by canonical
// path, and the number of includes open on it. A file already on the chain is
// not read again, which stops include cycles; a diamond (one file included
// from two places) is read each time.
struct IncludeChain {
    std::vector<std::string> files;
    int depth = 0;
};
thread_local IncludeChain tChain;

std::string CanonicalPath(const char* path) {
    std::error_code error;
    std::filesystem::path canonical = std::filesystem::weakly_canonical(path, error);
    return error ? std::string(path) : canonical.string();
}

bool IsOnChain(const std::string& canonical) {
    for (const std::string& file : tChain.files) {
        if (file == canonical) {
            return true;
        }
    }
    return false;
}

// Puts a file on the include chain for the lifetime of the reading of it,
// and takes it off again however that reading ends.
class ChainEntry {
  public:
    ChainEntry(std::string canonical, bool isInclude) : bInclude(isInclude) {
        tChain.files.push_back(std::move(canonical));
        if (bInclude) {
            ++tChain.depth;
        }
    }
    ~ChainEntry() {
        tChain.files.pop_back();
        if (bInclude) {
            --tChain.depth;
        }
    }
    ChainEntry(const ChainEntry&) = delete;
    ChainEntry& operator=(const ChainEntry&) = delete;

  private:
    bool bInclude;
};

// Whether a whole token is a number that atoi reads as written: an
// optional sign and decimal digits within the range of int.
bool IsIntegerText(const char* text) {
    const char* p = text + (*text == '-' || *text == '+');
    long long value = 0;
    const char* digits = p;
    for (; *p >= '0' && *p <= '9'; ++p) {
        value = value * 10 + (*p - '0');
        if (value > 2147483648LL) {
            return false;
        }
    }
    return p != digits && *p == '\0' && (*text == '-' || value <= 2147483647LL);
}

// Whether a whole token is a number that atof reads to its end.
bool IsDoubleText(const char* text) {
    char* end = nullptr;
    TZN_strtod(text, &end);
    return end != text && *end == '\0';
}

// The whole content of a stream from its start; the stream is left at its
// start. A read error ends the content at the last complete line before it
// and stores the system's error number in `error` (EIO when it gave none).
std::string ReadStream(FILE* stream, int& error) {
    rewind(stream);
    std::string content;
    char chunk[65536];
    size_t got;
    error = 0;
    for (;;) {
        errno = 0;
        got = fread(chunk, 1, sizeof chunk, stream);
        content.append(chunk, got);
        if (ferror(stream)) {
            error = errno ? errno : EIO;
            size_t lineEnd = content.rfind('\n');
            content.resize(lineEnd == std::string::npos ? 0 : lineEnd + 1);
            break;
        }
        if (got == 0) {
            break;
        }
    }
    rewind(stream);
    return content;
}

// The lines of a string list, each copied into a scratch buffer before it is
// cut, since the list stays the caller's; the position is where reading stopped.
class ListLines {
  public:
    explicit ListLines(char** lines) : ppcPosition(lines) {}
    char* Next(size_t* length) {
        const char* line = *ppcPosition;
        if (!line) {
            return nullptr;
        }
        ++ppcPosition;
        oScratch.assign(line);
        *length = oScratch.size();
        return &oScratch[0];
    }
    char** Position() const { return ppcPosition; }

  private:
    char** ppcPosition;
    std::string oScratch;
};

// Reads lines into a subtree. One reader serves a whole call, includes
// included, so that its scratch buffers are allocated once.
class TreeReader {
  public:
    // With a log, reports go to it instead of IMPError and warnings are made.
    explicit TreeReader(PTNReadLog* log) : poLog(log), oTokens(8), oLengths(8) {}

    // Reads from `lines` (a ListLines or a TextLineReader) of the file
    // `source` into `root` until a closing line at the outermost level or the
    // end of the lines. `count` is the line counter, updated on return.
    // Returns false when an error inside a nested subtree ended the reading;
    // an error at the outermost level propagates as tzn::Exception.
    template <typename Lines>
    bool Read(PTNSubTree* root, Lines& lines, const PTNSourceFile* source, int& count);

    // Every report of the reader passes here: to the log when there is one,
    // else to IMPError. Severity 1 raises tzn::Exception either way.
    void Report(int code, int severity, const char* fileName, int line, const char* message);

    // Reports a read error that ended the reading of a file after `line`;
    // the nodes read before it stay in the tree.
    void ReportReadError(const char* fileName, int line, int error);

  private:
    // The subtrees opened and not yet closed, each with the line count at its
    // opening line.
    using OpenList = std::vector<std::pair<PTNSubTree*, int>>;

    // A closing line: closes the innermost open subtree. False when none is
    // open, which ends the reading.
    bool CloseSubTree(OpenList& open, const char* fileName, int line);
    // A node line of `tokenCount` tokens (in oTokens) at `line`: a directive,
    // a subtree opened into `open` or a leaf appended to the innermost open
    // subtree (or `root`).
    void ReadNodeLine(PTNSubTree* root, OpenList& open, size_t tokenCount,
                      const PTNSourceFile* source, int line);
    [[noreturn]] void ReportCorruptLine(const char* fileName, int line);
    void Warn(int code, const char* fileName, int line, const char* message) {
        PTNReadLogWriter::AddWarning(*poLog, code, SourceName(fileName), line, message);
    }
    // The warnings about a leaf line, which the log alone receives.
    void CheckLeaf(PTNKind kind, size_t tokenCount, bool blankName, const char* fileName, int line);
    // Trims the line of `length` bytes at `line`, cuts a glued ')' and splits
    // it in place, from `first`, its first non-white character. Returns the
    // number of tokens; oTokens holds them, null-terminated.
    size_t Split(char* line, size_t length, char* first);
    DWXParseTreeNode* BuildLeaf(PTNSubTree* parent, const char* name, PTNKind kind,
                                size_t tokenCount);
    void Include(PTNSubTree* target, const char* directive, const char* file, int line,
                 const PTNSourceFile* source, bool required);

    PTNReadLog* poLog;
    std::vector<char*> oTokens;  // the tokens of the current line, null-terminated
    std::vector<size_t> oLengths;
    std::string oJoined;
    std::vector<double> oDoubles;
};

// The end of the token that starts at `p`: a run of bytes up to white space or
// the end, where a quoted run goes on to its closing quote (or the end)
// whatever it holds.
inline char* TokenEnd(char* p) {
    for (;;) {
        unsigned char kind = ClassOf(*p);
        if (kind == dwxcore::internal::kPlain) {
            ++p;
        } else if (kind == dwxcore::internal::kQuote) {
            do {
                ++p;
            } while (*p != '"' && *p != '\0');
            if (*p == '"') {
                ++p;
            }
        } else {
            return p;
        }
    }
}

size_t TreeReader::Split(char* line, size_t length, char* first) {
    char* end = line + length;
    while (end > first && IsWhite(end[-1])) {
        --end;
    }
    // A final ')' glued to the last token closes the node line and is no
    // token; one that follows a blank stays a token of its own. Only the
    // blank counts here, a tab before ')' does not.
    if (end - line > 1 && end[-1] == ')' && end[-2] != ' ') {
        --end;
    }
    *end = '\0';

    // The arrays are used through local pointers: the bytes written into the line could
    // otherwise be taken to change the vectors, which would then be read
    // again for every token (about a tenth of the read's instructions).
    char** tokens = oTokens.data();
    size_t* lengths = oLengths.data();
    size_t room = oTokens.size();
    size_t count = 0;
    char* p = first;
    while (*p != '\0') {
        if (count + 2 > room) {
            oTokens.resize(2 * count + 8);
            oLengths.resize(oTokens.size());
            tokens = oTokens.data();
            lengths = oLengths.data();
            room = oTokens.size();
        }
        char* start = p;
        p = TokenEnd(p);
        tokens[count] = start;
        lengths[count] = static_cast<size_t>(p - start);
        ++count;
        if (*p == '\0') {
            break;
        }
        *p++ = '\0';
        while (IsWhite(*p)) {
            ++p;
        }
    }
    tokens[count] = nullptr;
    return count;
}

void TreeReader::Report(int code, int severity, const char* fileName, int line,
                        const char* message) {
    if (!poLog) {
        IMPError(code, severity, message);
    } else {
        PTNReadLogWriter::AddReport(*poLog, code, severity, SourceName(fileName), line, message);
    }
    if (severity == 1) {
        // Also a guard against a reporting service that returns after all.
        throw tzn::Exception(code, severity, message);
    }
}

void TreeReader::ReportReadError(const char* fileName, int line, int error) {
    std::string reason = std::generic_category().message(error);
    Report(3, 2, fileName, line,
           MkName(_("Read error in file '%s'\nafter line %d: %s.\nThe lines before it were "
                    "kept.\n"),
                  SourceName(fileName), line, reason.c_str()));
}

void TreeReader::ReportCorruptLine(const char* fileName, int line) {
    std::string message(MkName(_("Corrupt file %s\n at line %d ... missing tokens.\n"),
                               SourceName(fileName), line));
    Report(-1, 1, fileName, line, message.c_str());
    throw tzn::Exception(-1, 1, message.c_str());
}

void TreeReader::CheckLeaf(PTNKind kind, size_t tokenCount, bool blankName, const char* fileName,
                           int line) {
    const char* value = oTokens[2];
    switch (kind) {
        case PTNKind::kOther:
            if (!blankName) {
                Warn(PTNReadLog::kUnknownKeyword, fileName, line,
                     MkName(_("Type keyword '%s' builds no node; the line is skipped."),
                            oTokens[1]));
            }
            break;
        case PTNKind::kInteger:
            if (!IsIntegerText(value)) {
                Warn(PTNReadLog::kIntegerText, fileName, line,
                     MkName(_("Integer value '%s' is not a number that fits in int; read as %d."),
                            value, ScanInteger(value)));
            }
            break;
        case PTNKind::kDouble:
            if (!IsDoubleText(value)) {
                Warn(PTNReadLog::kDoubleText, fileName, line,
                     MkName(_("Double value '%s' is not a number; read as %s."), value,
                            MkName(ScanDouble(value), -1)));
            }
            break;
        case PTNKind::kString:
            if (tokenCount > 3 && oTokens[3][0] != ')') {
                Warn(PTNReadLog::kJoinedString, fileName, line,
                     _("String value of several tokens; they are joined without blanks."));
            }
            break;
        default:
            break;
    }
}

bool TreeReader::CloseSubTree(OpenList& open, const char* fileName, int line) {
    if (open.empty()) {
        if (poLog) {
            Warn(PTNReadLog::kTopLevelClose, fileName, line,
                 _("Closing line outside every subtree; the rest is not read."));
        }
        return false;
    }
    open.pop_back();
    return true;
}

void TreeReader::ReadNodeLine(PTNSubTree* root, OpenList& open, size_t tokenCount,
                              const PTNSourceFile* source, int line) {
    const char* fileName = source->name;
    if (tokenCount < 2 || oTokens[0][0] != '(') {
        ReportCorruptLine(fileName, line);
    }
    PTNSubTree* current = open.empty() ? root : open.back().first;
    const char* name = oTokens[0] + 1;
    bool blankName = false;
    if (poLog && oLengths[0] == 1) {
        blankName = true;
        Warn(PTNReadLog::kBlankAfterParen, fileName, line,
             MkName(_("Blank between '(' and the name: the name is empty and '%s' is "
                      "taken as the type keyword."),
                    oTokens[1]));
    }
    bool required = false;
    PTNKind kind = PTNKind::kOther;
    if (IsIncludeDirective(name, required)) {
        Include(current, name, oTokens[1], line, source, required);
    } else if ((kind = ClassifyKeyword(oTokens[1], oLengths[1])) == PTNKind::kSubTree) {
        auto subtree = std::make_unique<PTNSubTree>(name);
        PTNSubTree* raw = subtree.get();
        PTNSourceSetter::Set(raw, source, line);
        PTNTreeBuilder::Append(current, subtree.release());
        open.emplace_back(raw, line);
    } else if (tokenCount < 3) {
        ReportCorruptLine(fileName, line);
    } else {
        if (poLog) {
            CheckLeaf(kind, tokenCount, blankName, fileName, line);
        }
        if (DWXParseTreeNode* leaf = BuildLeaf(current, name, kind, tokenCount)) {
            PTNSourceSetter::Set(leaf, source, line);
        }
    }
}

template <typename Lines>
bool TreeReader::Read(PTNSubTree* root, Lines& lines, const PTNSourceFile* source, int& count) {
    // An error inside an open subtree ends the reading with the count at its
    // opening line, as the level that holds it would have kept.
    OpenList open;
    int counter = count;
    size_t length;
    while (char* line = lines.Next(&length)) {
        ++counter;
        // Empty and comment lines, as IsCommentOrEmptyLine decides.
        char* first = line;
        while (IsWhite(*first)) {
            ++first;
        }
        if (*first == '\0' || *first == '!' || *first == '#') {
            continue;
        }
        try {
            size_t tokenCount = Split(line, length, first);
            if (tokenCount > 0 && oTokens[0][0] == ')') {
                if (!CloseSubTree(open, source->name, counter)) {
                    break;
                }
                continue;
            }
            ReadNodeLine(root, open, tokenCount, source, counter);
        } catch (const tzn::Exception&) {
            // Outside every subtree the exception is the caller's; inside
            // one it ends the reading quietly, keeping what was read.
            if (open.empty()) {
                throw;
            }
            count = open.back().second;
            return false;
        }
    }
    count = counter;
    return true;
}

// The new leaf, appended to `parent`; null for a keyword it builds nothing for.
DWXParseTreeNode* TreeReader::BuildLeaf(PTNSubTree* parent, const char* name, PTNKind kind,
                                        size_t tokenCount) {
    // The value tokens run from the third token up to the first one that
    // begins with ')'.
    size_t valueEnd = 2;
    while (valueEnd < tokenCount && oTokens[valueEnd][0] != ')') {
        ++valueEnd;
    }
    const dwxcore::internal::LeafBuilder build =
        kind != PTNKind::kOther ? KindEntry(kind).build : nullptr;
    if (build == nullptr) {
        return nullptr;  // a keyword the reader builds nothing for
    }
    LeafTokens line{oTokens.data(), oLengths.data(), valueEnd, oJoined, oDoubles};
    DWXParseTreeNode* leaf = build(name, line);
    PTNTreeBuilder::Append(parent, leaf);
    return leaf;
}

void TreeReader::Include(PTNSubTree* target, const char* directive, const char* file, int line,
                         const PTNSourceFile* source, bool required) {
    const char* fileName = source->name;
    if (tzn::tracer::Debugger::moDebugLevel != 0) {
        tzn::tracer::Debugger::Debug(
            tzn::tracer::Debugger::FormatString("<%s %s>\n", directive, file), 2, "dwxcore",
            "base/dwxcore/dwxparse", 856);
    }
    HeapText path(HStringExpand(file));
    if (gSearchNextToIncluder.load(std::memory_order_relaxed)) {
        if (HeapText nearby{IMPFindFileNextTo(fileName, path.get())}) {
            path = std::move(nearby);
        }
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

    if (DKCheck(path.get())) {
        std::string canonical = CanonicalPath(path.get());
        if (IsOnChain(canonical)) {
            Report(3, 2, fileName, line,
                   MkName(_("Include cycle: file '%s'\nrequested in %s directive\non line %d of "
                            "file '%s'\nis already being read.\nIgnoring.\n"),
                          path.get(), directive, line, SourceName(fileName)));
            return;
        }
        if (tChain.depth >= kMaxIncludeDepth) {
            Report(3, 2, fileName, line,
                   MkName(_("Include depth limit of %d reached: file '%s'\nrequested in %s "
                            "directive\non line %d of file '%s'.\nIgnoring.\n"),
                          kMaxIncludeDepth, path.get(), directive, line, SourceName(fileName)));
            return;
        }
        // The file is opened once, by the line reader, which never waits on
        // a FIFO put in its place since the check. A file that DKCheck
        // accepted but that cannot be opened after all is handled as a
        // missing one.
        TextLineReader lines;
        if (lines.OpenFile(path.get())) {
            if (poLog) {
                PTNReadLogWriter::AddFile(*poLog, path.get(), canonical);
            }
            ChainEntry entry(std::move(canonical), true);
            int counter = 0;
            if (Read(target, lines, InternSource(path.get(), source, line), counter) &&
                lines.Failed()) {
                ReportReadError(path.get(), counter, lines.ErrorNumber());
            }
            return;
        }
    }
    if (required) {
        Report(3, 2, fileName, line,
               MkName(_("Unable to locate file '%s'\nrequested in @include directive\non line "
                        "%d of file '%s'.\nIgnoring.\n"),
                      path.get(), line, SourceName(fileName)));
    }
}

// Runs a whole read. With a log, the exception that ends a read on a corrupt
// line stays here; its report is in the log already.
template <typename Lines>
void ReadAll(PTNSubTree* tree, Lines& lines, const char* fileName, PTNReadLog* log,
             int streamError) {
    TreeReader reader(log);
    int counter = 0;
    const PTNSourceFile* source = InternSource(fileName, nullptr, 0);
    size_t reports = log ? PTNReadLogWriter::ReportCount(*log) : 0;
    try {
        if (reader.Read(tree, lines, source, counter)) {
            int error = lines.Failed() ? lines.ErrorNumber() : streamError;
            if (error != 0) {
                reader.ReportReadError(fileName, counter, error);
            }
        }
    } catch (const tzn::Exception& error) {
        if (!log) {
            throw;
        }
        // A read must not end without a report saying why.
        if (PTNReadLogWriter::ReportCount(*log) == reports) {
            PTNReadLogWriter::AddReport(*log, error.Code(), error.Severity(), SourceName(fileName),
                                        counter, error.what());
        }
    }
}

}  // namespace

void PTNSubTree::BuildFromFile(FILE* stream) {
    BuildFromFile(stream, nullptr);
}

void PTNSubTree::BuildFromFile(FILE* stream, PTNReadLog* log) {
    if (!stream) {
        return;
    }
    rewind(stream);
    const char* name = fp2filename(stream);
    TextLineReader lines;
    std::string content;
    int streamError = 0;
    if (!name || !lines.OpenFile(name)) {
        // A stream that DKOpen did not open (or whose file went away) is
        // read from its own content.
        content = ReadStream(stream, streamError);
        lines.OpenBuffer(content.c_str());
    }
    std::unique_ptr<ChainEntry> entry;
    if (name) {
        std::string canonical = CanonicalPath(name);
        if (log) {
            PTNReadLogWriter::AddFile(*log, name, canonical);
        }
        entry = std::make_unique<ChainEntry>(std::move(canonical), false);
    }
    ReadAll(this, lines, name, log, streamError);
}

void PTNSubTree::BuildFromString(const char* buffer) {
    BuildFromString(buffer, nullptr);
}

void PTNSubTree::BuildFromString(const char* buffer, PTNReadLog* log) {
    if (!buffer) {
        return;
    }
    TextLineReader lines;
    lines.OpenBuffer(buffer);
    ReadAll(this, lines, nullptr, log, 0);
}

void PTNSubTree::SetIncludeSearchNextToIncluder(bool on) {
    gSearchNextToIncluder.store(on, std::memory_order_relaxed);
}

char** PTNSubTree::AddChildrenFromStringList(char** lines, const char* fileName, int* lineCounter) {
    if (!lines) {
        return nullptr;
    }
    ListLines source(lines);
    TreeReader reader(nullptr);
    int counter = lineCounter ? *lineCounter : 0;
    bool finished = reader.Read(this, source, InternSource(fileName, nullptr, 0), counter);
    if (lineCounter) {
        *lineCounter = counter;
    }
    return finished ? source.Position() : nullptr;
}

int PTNSubTree::IsCommentOrEmptyLine(const char* line) {
    if (!line) {
        return 1;
    }
    unsigned char first = static_cast<unsigned char>(*LSCGetFirstNonWhiteSpace(line));
    return first == '\0' || first == '!' || first == '#';
}

int PTNSubTree::FindPossiblePTNTreeStart(const char** lines) {
    if (!lines) {
        return -1;
    }
    for (int i = 0; lines[i]; ++i) {
        if (!IsCommentOrEmptyLine(lines[i])) {
            return i;
        }
    }
    return -1;
}

PTNSubTree* PTNSubTree::BuildPTNSubTreeFromStringList(const char** lines) {
    FindPossiblePTNTreeStart(lines);
    return nullptr;
}
