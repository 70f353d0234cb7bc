// Reading the text form of a parse tree into a PTNSubTree.
//
// Every line is visited once: empty and comment lines are skipped (but
// counted), every other line is copied into a reusable buffer, trimmed, cut
// and split in place, and the node it describes is appended at once, so that
// everything read before a failure stays in the tree. Nested subtrees are read
// with an explicit stack of open subtrees rather than by recursion, so the
// depth of nesting is bounded by memory, not by the call stack; includes
// recurse, bounded by the include depth limit.
#include <dwxcore/dwxparse.h>

#include "dwxparse_token.h"

#include <services/rtprim.h>
#include <services/tracer.h>
#include <services/utilhub.h>

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <filesystem>
#include <memory>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

namespace {

// Nested includes allowed below the file the reading started from.
constexpr int kMaxIncludeDepth = 64;

// Subtrees may nest this deep, counted from the outermost subtree of the tree
// being read into. Reading itself needs no stack for nesting, but writing,
// copying, merging and deleting a tree recurse once per level; the limit
// keeps every tree the reader builds within their reach.
constexpr int kMaxNesting = 1000;

struct StringListDeleter {
    void operator()(char** list) const { DestroyStringList(list); }
};
using StringListPtr = std::unique_ptr<char*, StringListDeleter>;

struct FreeDeleter {
    void operator()(char* text) const { free(text); }
};
using HeapText = std::unique_ptr<char, FreeDeleter>;

struct StreamCloser {
    void operator()(FILE* stream) const { DKClose(stream); }
};
using StreamPtr = std::unique_ptr<FILE, StreamCloser>;

// The white space that separates tokens and that trailing trimming removes;
// the same set as Tokenize splits at.
inline bool IsWhite(unsigned char c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\v' || c == '\f';
}

const char* SourceName(const char* fileName) {
    return fileName ? fileName : "Memory";
}

// The type keywords the reader builds nodes for, compared ignoring case; a
// keyword that begins with "Bool" is a Bool whatever follows.
enum class Keyword {
    SubTree,
    String,
    StringList,
    Integer,
    Char,
    Bool,
    Double,
    DoubleList,
    Base64,
    Other
};

// Every line passes here, so the first letter picks the few candidates
// before any whole comparison is made.
Keyword Classify(const char* keyword) {
    switch (keyword[0] | 0x20) {
        case 's':
            if (_stricmp(keyword, "SubTree") == 0)
                return Keyword::SubTree;
            if (_stricmp(keyword, "String") == 0)
                return Keyword::String;
            if (_stricmp(keyword, "StringList") == 0)
                return Keyword::StringList;
            break;
        case 'i':
            if (_stricmp(keyword, "Integer") == 0)
                return Keyword::Integer;
            break;
        case 'c':
            if (_stricmp(keyword, "Char") == 0)
                return Keyword::Char;
            break;
        case 'b':
            if (_strnicmp(keyword, "Bool", 4) == 0)
                return Keyword::Bool;
            if (_stricmp(keyword, "Base64") == 0)
                return Keyword::Base64;
            break;
        case 'd':
            if (_stricmp(keyword, "Double") == 0)
                return Keyword::Double;
            if (_stricmp(keyword, "DoubleList") == 0)
                return Keyword::DoubleList;
            break;
        default:
            break;
    }
    return Keyword::Other;
}

bool IsDirective(const char* name, bool& required) {
    if (name[0] != '@') {
        return false;
    }
    required = _stricmp(name, "@include") == 0;
    return required || _stricmp(name, "@try_include") == 0;
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

// Reports a corrupt line. The report raises tzn::Exception; the throw below
// only guards against a reporting service that returns after all.
[[noreturn]] void ReportCorruptLine(const char* fileName, int line) {
    const char* text =
        MkName(_("Corrupt file %s\n at line %d ... missing tokens.\n"), SourceName(fileName), line);
    std::string message(text);
    IMPError(-1, 1, message.c_str());
    throw tzn::Exception(-1, 1, message.c_str());
}

// Reports a subtree nested deeper than kMaxNesting, like a corrupt line.
[[noreturn]] void ReportNestingTooDeep(const char* fileName, int line) {
    const char* text = MkName(_("Corrupt file %s\n at line %d ... subtrees nested more than %d "
                                "levels deep.\n"),
                              SourceName(fileName), line, kMaxNesting);
    std::string message(text);
    IMPError(-1, 1, message.c_str());
    throw tzn::Exception(-1, 1, message.c_str());
}

// The number of subtrees from the outermost one down to `tree`, both included.
int Level(const PTNSubTree* tree) {
    int level = 0;
    for (; tree; tree = tree->GetParentRef()) {
        ++level;
    }
    return level;
}

// The whole content of a stream from its start, as lines; the stream is left
// at its start.
char** ReadStreamLines(FILE* stream) {
    rewind(stream);
    std::string content;
    char chunk[65536];
    size_t got;
    while ((got = fread(chunk, 1, sizeof chunk, stream)) > 0) {
        content.append(chunk, got);
    }
    rewind(stream);
    return BufferToStringList(content.c_str());
}

// Reads lines into a subtree. One reader serves a whole call, includes
// included, so that its scratch buffers are allocated once.
class TreeReader {
  public:
    // Reads from `lines` into `root` until a closing line at the outermost
    // level or the end of the list. `count` is the line counter, updated on
    // return. Returns the position after the closing line, the terminator's
    // position, or null for a null list and for a reading that an error inside
    // a nested subtree ended; an error at the outermost level propagates.
    char** Read(PTNSubTree* root, char** lines, const char* fileName, int& count);

  private:
    // Copies a line, trims it, cuts a glued ')' and splits it in place.
    // Returns the number of tokens; oTokens holds them, null-terminated.
    size_t Split(const char* line);
    void BuildLeaf(PTNSubTree* parent, const char* name, Keyword kind, size_t tokenCount);
    void Include(PTNSubTree* target, const char* directive, const char* file, int line,
                 const char* fileName, bool required);

    std::string oLine;
    std::vector<char*> oTokens;
    std::string oJoined;
    std::vector<double> oDoubles;
};

size_t TreeReader::Split(const char* line) {
    oLine.assign(line);
    size_t length = oLine.size();
    while (length > 0 && IsWhite(static_cast<unsigned char>(oLine[length - 1]))) {
        --length;
    }
    // A final ')' glued to the last token closes the node line and is no
    // token; one that follows a blank stays a token of its own. Only the
    // blank counts here, a tab before ')' does not.
    if (length > 1 && oLine[length - 1] == ')' && oLine[length - 2] != ' ') {
        --length;
    }
    oLine.resize(length);

    oTokens.clear();
    char* p = &oLine[0];
    for (;;) {
        while (IsWhite(static_cast<unsigned char>(*p))) {
            ++p;
        }
        if (*p == '\0') {
            break;
        }
        oTokens.push_back(p);
        bool quoted = false;
        while (*p != '\0' && (quoted || !IsWhite(static_cast<unsigned char>(*p)))) {
            if (*p == '"') {
                quoted = !quoted;
            }
            ++p;
        }
        if (*p == '\0') {
            break;
        }
        *p++ = '\0';
    }
    size_t count = oTokens.size();
    oTokens.push_back(nullptr);
    return count;
}

char** TreeReader::Read(PTNSubTree* root, char** lines, const char* fileName, int& count) {
    if (!lines) {
        return nullptr;
    }
    // The subtrees opened and not yet closed, each with the count at its
    // opening line: an error inside one ends the reading with that count, as
    // the level that holds it would have kept.
    std::vector<std::pair<PTNSubTree*, int>> open;
    const int rootLevel = Level(root);
    int counter = count;
    char** position = lines;
    while (*position) {
        ++counter;
        const char* text = *position++;
        if (PTNSubTree::IsCommentOrEmptyLine(text)) {
            continue;
        }
        try {
            size_t tokenCount = Split(text);
            if (tokenCount > 0 && oTokens[0][0] == ')') {
                if (open.empty()) {
                    break;
                }
                open.pop_back();
                continue;
            }
            if (tokenCount < 2 || oTokens[0][0] != '(') {
                ReportCorruptLine(fileName, counter);
            }
            PTNSubTree* current = open.empty() ? root : open.back().first;
            const char* name = oTokens[0] + 1;
            bool required = false;
            Keyword kind = Keyword::Other;
            if (IsDirective(name, required)) {
                Include(current, name, oTokens[1], counter, fileName, required);
            } else if ((kind = Classify(oTokens[1])) == Keyword::SubTree) {
                if (rootLevel + static_cast<int>(open.size()) >= kMaxNesting) {
                    ReportNestingTooDeep(fileName, counter);
                }
                auto subtree = std::make_unique<PTNSubTree>(name);
                PTNSubTree* raw = subtree.get();
                current->AddChild(subtree.release());
                open.emplace_back(raw, counter);
            } else if (tokenCount < 3) {
                ReportCorruptLine(fileName, counter);
            } else {
                BuildLeaf(current, name, kind, tokenCount);
            }
        } catch (const tzn::Exception&) {
            // Outside every subtree the exception is the caller's; inside
            // one it ends the reading quietly, keeping what was read.
            if (open.empty()) {
                throw;
            }
            count = open.back().second;
            return nullptr;
        }
    }
    count = counter;
    return position;
}

void TreeReader::BuildLeaf(PTNSubTree* parent, const char* name, Keyword kind, size_t tokenCount) {
    // The value tokens run from the third token up to the first one that
    // begins with ')'.
    size_t valueEnd = 2;
    while (valueEnd < tokenCount && oTokens[valueEnd][0] != ')') {
        ++valueEnd;
    }
    const char* third = oTokens[2];
    std::unique_ptr<DWXParseTreeNode> node;

    switch (kind) {
        case Keyword::String: {
            std::string value;
            if (valueEnd == 3) {
                value = UnquoteToken(third);
            } else {
                oJoined.clear();
                for (size_t i = 2; i < valueEnd; ++i) {
                    oJoined.append(oTokens[i]);
                }
                value = UnquoteToken(oJoined.c_str());
            }
            node = std::make_unique<PTNString>(name, value.c_str());
            break;
        }
        case Keyword::StringList: {
            auto list = std::make_unique<PTNStringList>(name, nullptr);
            oTokens[valueEnd] = nullptr;  // the value tokens as a string list
            list->SetAsStringList(&oTokens[2]);
            node = std::move(list);
            break;
        }
        case Keyword::Integer:
            node = std::make_unique<PTNInteger>(name, atoi(third));
            break;
        case Keyword::Char:
            node = std::make_unique<PTNChar>(name, third[0]);
            break;
        case Keyword::Bool: {
            int value = _stricmp(third, "TRUE") == 0 || _stricmp(third, "YES") == 0 ||
                        _stricmp(third, "1") == 0 || _stricmp(third, "Y") == 0;
            node = std::make_unique<PTNBool>(name, value);
            break;
        }
        case Keyword::Double:
            node = std::make_unique<PTNDouble>(name, atof(third));
            break;
        case Keyword::DoubleList:
            oDoubles.clear();
            for (size_t i = 2; i < valueEnd; ++i) {
                oDoubles.push_back(atof(oTokens[i]));
            }
            // No value tokens give a list without values (and without an array).
            node = std::make_unique<PTNDoubleList>(name, static_cast<int>(oDoubles.size()),
                                                   oDoubles.data());
            break;
        case Keyword::Base64: {
            auto data = std::make_unique<PTNBase64>(name, nullptr, 0u);
            data->SetAsString(third);
            node = std::move(data);
            break;
        }
        default:
            return;  // a keyword the reader builds nothing for
    }
    parent->AddChild(node.release());
}

void TreeReader::Include(PTNSubTree* target, const char* directive, const char* file, int line,
                         const char* fileName, bool required) {
    if (tzn::tracer::Debugger::moDebugLevel != 0) {
        tzn::tracer::Debugger::Debug(
            tzn::tracer::Debugger::FormatString("<%s %s>\n", directive, file), 2, "dwxcore",
            "base/dwxcore/dwxparse", 856);
    }
    HeapText path(HStringExpand(file));
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
            IMPError(3, 2,
                     MkName(_("Include cycle: file '%s'\nrequested in %s directive\non line %d of "
                              "file '%s'\nis already being read.\nIgnoring.\n"),
                            path.get(), directive, line, SourceName(fileName)));
            return;
        }
        if (tChain.depth >= kMaxIncludeDepth) {
            IMPError(3, 2,
                     MkName(_("Include depth limit of %d reached: file '%s'\nrequested in %s "
                              "directive\non line %d of file '%s'.\nIgnoring.\n"),
                            kMaxIncludeDepth, path.get(), directive, line, SourceName(fileName)));
            return;
        }
        // A file that DKCheck accepted but that cannot be opened or read
        // after all is handled as a missing one.
        StreamPtr stream(DKOpen(path.get(), 4, "r"));
        if (stream) {
            rewind(stream.get());
            const char* openedName = fp2filename(stream.get());
            StringListPtr lines(TextFileToStringList(openedName ? openedName : path.get()));
            if (lines) {
                ChainEntry entry(std::move(canonical), true);
                int counter = 0;
                Read(target, lines.get(), openedName ? openedName : path.get(), counter);
                return;
            }
        }
    }
    if (required) {
        IMPError(3, 2,
                 MkName(_("Unable to locate file '%s'\nrequested in @include directive\non line "
                          "%d of file '%s'.\nIgnoring.\n"),
                        path.get(), line, SourceName(fileName)));
    }
}

}  // namespace

void PTNSubTree::BuildFromFile(FILE* stream) {
    if (!stream) {
        return;
    }
    rewind(stream);
    const char* name = fp2filename(stream);
    StringListPtr lines(name ? TextFileToStringList(name) : nullptr);
    if (!lines) {
        // A stream that DKOpen did not open (or whose file went away) is
        // read from its own content.
        lines.reset(ReadStreamLines(stream));
    }
    std::unique_ptr<ChainEntry> entry;
    if (name) {
        entry = std::make_unique<ChainEntry>(CanonicalPath(name), false);
    }
    TreeReader reader;
    int counter = 0;
    reader.Read(this, lines.get(), name, counter);
}

void PTNSubTree::BuildFromString(const char* buffer) {
    if (!buffer) {
        return;
    }
    StringListPtr lines(BufferToStringList(buffer));
    TreeReader reader;
    int counter = 0;
    reader.Read(this, lines.get(), nullptr, counter);
}

char** PTNSubTree::AddChildrenFromStringList(char** lines, const char* fileName, int* lineCounter) {
    TreeReader reader;
    int counter = lineCounter ? *lineCounter : 0;
    char** position = reader.Read(this, lines, fileName, counter);
    if (lineCounter) {
        *lineCounter = counter;
    }
    return position;
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
