// The table of node kinds and the reader's builders of the leaves.
#include "internal/dwxparse_kinds.h"

#include "internal/dwxparse_token.h"

#include <services/portability.h>

#include <stdlib.h>
#include <string.h>

#include <memory>

using dwxcore::internal::UnquoteToken;
using dwxcore::internal::UnquoteTokenInto;
using dwxcore::internal::UnquoteTokenToHeap;

// Builds String leaves around values the reader has already allocated or
// unquotes into the leaf itself.
struct PTNStringAdopter {
    // Tokens shorter than this unquote to a value the leaf keeps in itself
    // (unquoting never lengthens a token; only the expansions of values that
    // begin with '@', 'M' or '_' may, and those the leaf copies as it needs).
    static constexpr size_t kInline = PTNString::kShortValue;

    // A new leaf with the value of `token`, shorter than kInline, unquoted
    // straight into the leaf: the reader's String lines mostly take this way.
    static PTNString* MakeShort(const char* name, const char* token) {
        auto node = std::make_unique<PTNString>(name, nullptr);
        if (UnquoteTokenInto(token, node->acShortValue) != nullptr) {
            node->pcValue = node->acShortValue;
        } else {
            node->SetValue(UnquoteToken(token).c_str());  // an expansion may apply
        }
        return node.release();
    }

    // A new leaf that owns `value` (a heap text), which is freed here if the
    // leaf cannot be built.
    static PTNString* Make(const char* name, char* value) {
        HeapText owned(value);
        PTNString* node = new PTNString(name, nullptr);
        node->pcValue = owned.release();
        return node;
    }
};

namespace dwxcore::internal {

namespace {

using dwxcore::internal::MakeKeyword;
using dwxcore::internal::Matches;

constexpr dwxcore::internal::KeywordPattern kTrue = MakeKeyword("true");
constexpr dwxcore::internal::KeywordPattern kYes = MakeKeyword("yes");
constexpr dwxcore::internal::KeywordPattern kOne = MakeKeyword("1");
constexpr dwxcore::internal::KeywordPattern kY = MakeKeyword("y");

// The value tokens joined without blanks, as one token.
DWXParseTreeNode* BuildString(const char* name, LeafTokens& line) {
    const char* token = line.tokens[2];
    size_t length = line.lengths[2];
    if (line.valueEnd != 3) {
        line.joined.clear();
        for (size_t i = 2; i < line.valueEnd; ++i) {
            line.joined.append(line.tokens[i], line.lengths[i]);
        }
        token = line.joined.c_str();
        length = line.joined.size();
    }
    if (length < PTNStringAdopter::kInline) {
        return PTNStringAdopter::MakeShort(name, token);
    }
    return PTNStringAdopter::Make(name, UnquoteTokenToHeap(token, length));
}

DWXParseTreeNode* BuildStringList(const char* name, LeafTokens& line) {
    auto list = std::make_unique<PTNStringList>(name, nullptr);
    line.tokens[line.valueEnd] = nullptr;  // the value tokens as a string list
    list->SetAsStringList(&line.tokens[2]);
    return list.release();
}

DWXParseTreeNode* BuildInteger(const char* name, LeafTokens& line) {
    return new PTNInteger(name, dwxcore::internal::ScanInteger(line.tokens[2]));
}

DWXParseTreeNode* BuildChar(const char* name, LeafTokens& line) {
    return new PTNChar(name, line.tokens[2][0]);
}

DWXParseTreeNode* BuildBool(const char* name, LeafTokens& line) {
    const char* value = line.tokens[2];
    const size_t length = line.lengths[2];
    return new PTNBool(name, Matches(value, length, kTrue) || Matches(value, length, kYes) ||
                                 Matches(value, length, kOne) || Matches(value, length, kY));
}

DWXParseTreeNode* BuildDouble(const char* name, LeafTokens& line) {
    return new PTNDouble(name, dwxcore::internal::ScanDouble(line.tokens[2]));
}

// No value tokens give a list without values (and without an array).
DWXParseTreeNode* BuildDoubleList(const char* name, LeafTokens& line) {
    line.doubles.clear();
    for (size_t i = 2; i < line.valueEnd; ++i) {
        line.doubles.push_back(dwxcore::internal::ScanDouble(line.tokens[i]));
    }
    return new PTNDoubleList(name, static_cast<int>(line.doubles.size()), line.doubles.data());
}

DWXParseTreeNode* BuildBase64(const char* name, LeafTokens& line) {
    auto data = std::make_unique<PTNBase64>(name, nullptr, 0u);
    data->SetAsString(line.tokens[2]);
    return data.release();
}

}  // namespace

// In the order of PTNKind. Float and the two integer lists are written but
// never read: their lines are skipped as keywords that build nothing.
const NodeKind kNodeKinds[] = {
    {"PTNSubTree", "SubTree", MakeKeyword("subtree"), Reading::kWhole, nullptr,
     WrittenForm::kNested, &typeid(PTNSubTree)},
    {"PTNString", "String", MakeKeyword("string"), Reading::kWhole, BuildString,
     WrittenForm::kQuoted, &typeid(PTNString)},
    {"PTNStringList", "StringList", MakeKeyword("stringlist"), Reading::kWhole, BuildStringList,
     WrittenForm::kAsString, &typeid(PTNStringList)},
    {"PTNInteger", "Integer", MakeKeyword("integer"), Reading::kWhole, BuildInteger,
     WrittenForm::kInteger, &typeid(PTNInteger)},
    {"PTNChar", "Char", MakeKeyword("char"), Reading::kWhole, BuildChar, WrittenForm::kChar,
     &typeid(PTNChar)},
    // A keyword that begins with "Bool" is a Bool whatever follows.
    {"PTNBool", "Bool", MakeKeyword("bool"), Reading::kPrefix, BuildBool, WrittenForm::kBool,
     &typeid(PTNBool)},
    {"PTNFloat", "Float", MakeKeyword("float"), Reading::kNever, nullptr, WrittenForm::kFixed,
     &typeid(PTNFloat)},
    {"PTNDouble", "Double", MakeKeyword("double"), Reading::kWhole, BuildDouble,
     WrittenForm::kShortest, &typeid(PTNDouble)},
    {"PTNDoubleList", "DoubleList", MakeKeyword("doublelist"), Reading::kWhole, BuildDoubleList,
     WrittenForm::kAsString, &typeid(PTNDoubleList)},
    {"PTNIntegerList", "IntegerList", MakeKeyword("integerlist"), Reading::kNever, nullptr,
     WrittenForm::kAsString, &typeid(PTNIntegerList)},
    {"PTNInteger32List", "Integer32List", MakeKeyword("integer32list"), Reading::kNever, nullptr,
     WrittenForm::kAsString, &typeid(PTNInteger32List)},
    {"PTNBase64", "Base64", MakeKeyword("base64"), Reading::kWhole, BuildBase64,
     WrittenForm::kAsString, &typeid(PTNBase64)},
};

PTNKind ClassifyKeyword(const char* keyword, size_t length) {
    const unsigned char first = static_cast<unsigned char>(keyword[0]) | 0x20;
    for (size_t i = 0; i < sizeof kNodeKinds / sizeof kNodeKinds[0]; ++i) {
        const NodeKind& kind = kNodeKinds[i];
        if (kind.match.lower[0] != first || kind.reading == Reading::kNever) {
            continue;
        }
        const bool matched = kind.reading == Reading::kPrefix
                                 ? dwxcore::internal::BeginsWith(keyword, length, kind.match)
                                 : Matches(keyword, length, kind.match);
        if (matched) {
            return static_cast<PTNKind>(i);
        }
    }
    return PTNKind::kOther;
}

// The writer asks this for every node. A full comparison of two types may
// compare their names; comparing the addresses first took about a tenth off
// the CPU time of the bench's TreeWrite/ours (0.80 ms to 0.71 ms), so the
// full comparison only runs for a class no address matched.
PTNKind ExactKindOf(const DWXParseTreeNode& node) {
    const std::type_info& type = typeid(node);
    constexpr size_t kCount = sizeof kNodeKinds / sizeof kNodeKinds[0];
    for (size_t i = 0; i < kCount; ++i) {
        if (&type == kNodeKinds[i].type) {
            return static_cast<PTNKind>(i);
        }
    }
    for (size_t i = 0; i < kCount; ++i) {
        if (type == *kNodeKinds[i].type) {
            return static_cast<PTNKind>(i);
        }
    }
    return PTNKind::kOther;
}

bool IsIncludeDirective(const char* name, bool& required) {
    if (name[0] != '@') {
        return false;
    }
    required = _stricmp(name, "@include") == 0;
    return required || _stricmp(name, "@try_include") == 0;
}

}  // namespace dwxcore::internal

PTNKind PTNKindOf(const DWXParseTreeNode* node) {
    return node != nullptr ? dwxcore::internal::ExactKindOf(*node) : PTNKind::kOther;
}

const char* PTNTypeKeyword(const char* className) {
    if (className == nullptr) {
        return "";
    }
    return strlen(className) >= 3 ? className + 3 : className;
}
