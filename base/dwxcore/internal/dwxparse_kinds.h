// The node kinds of the parse tree text format in one table: for each kind
// its class, its type keyword, how the reader recognises and builds it and
// how the writer renders it. Internal to the library.
//
// A new leaf kind is its class plus one entry here (and its PTNKind, in the
// same order): the reader, the writer, PTNKindOf and PTNTypeKeyword all take
// it from the table.
#pragma once

#include <dwxcore/dwxparse.h>

#include "dwxparse_scan.h"

#include <stddef.h>

#include <string>
#include <typeinfo>
#include <vector>

namespace dwxcore::internal {

// How the reader takes a keyword of the kind.
enum class Reading : unsigned char {
    kNever,   // the writer writes the keyword, the reader builds nothing for it
    kWhole,   // the whole keyword, ignoring ASCII case
    kPrefix,  // any keyword that begins with it, ignoring ASCII case
};

// How the writer renders a node of the kind.
enum class WrittenForm : unsigned char {
    kNested,    // a subtree: an opening line, its children, a closing line
    kInteger,   // "%d"
    kBool,      // BoolText
    kChar,      // the character itself
    kFixed,     // "%f"
    kShortest,  // the shortest text atof reads back
    kQuoted,    // the quoted token of the value
    kAsString,  // whatever the node's GetAsString renders
};

// The tokens of a leaf line as the reader split it: the value tokens are
// tokens[2] up to tokens[valueEnd], exclusive; `joined` and `doubles` are
// the reader's scratch, reused from line to line.
struct LeafTokens {
    char** tokens;
    const size_t* lengths;
    size_t valueEnd;
    std::string& joined;
    std::vector<double>& doubles;
};

// A new node named `name` with the value of the tokens, owned by the caller.
using LeafBuilder = DWXParseTreeNode* (*)(const char* name, LeafTokens& line);

struct NodeKind {
    const char* className;
    const char* keyword;                      // as the writer writes it
    dwxcore::internal::KeywordPattern match;  // the keyword in lower case
    Reading reading;
    LeafBuilder build;  // null for the subtree, which the reader nests itself
    WrittenForm form;
    const std::type_info* type;
};

// Indexed by PTNKind; PTNKind::kOther has no entry.
extern const NodeKind kNodeKinds[static_cast<size_t>(PTNKind::kOther)];

inline const NodeKind& KindEntry(PTNKind kind) {
    return kNodeKinds[static_cast<size_t>(kind)];
}

// The kind whose keyword the `length` bytes at `keyword` are, among the kinds
// the reader reads; kOther for every other keyword. O(number of kinds), one
// byte compared for most of them.
PTNKind ClassifyKeyword(const char* keyword, size_t length);

// The kind of the exact class of `node`; kOther for every other class.
// O(number of kinds): the type_info addresses decide almost always, a full
// comparison of the types is the fallback.
PTNKind ExactKindOf(const DWXParseTreeNode& node);

// Whether `name` is one of the include directives, "@include" (`required`
// set) or "@try_include", ignoring ASCII case.
bool IsIncludeDirective(const char* name, bool& required);

}  // namespace dwxcore::internal
