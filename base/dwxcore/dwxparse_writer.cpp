// The writer: a subtree as indented lines of the text format. The lines are
// built in one pass into one buffer, which a file receives in blocks and the
// string forms take whole; nested subtrees are walked with an explicit stack,
// so the depth of a tree costs neither stack nor copies of its lines.
#include <dwxcore/dwxparse.h>

#include <services/rtprim.h>

#include <stdlib.h>
#include <string.h>

#include <string>
#include <vector>

#include "internal/dwxparse_kinds.h"
#include "internal/dwxparse_numbers.h"
#include "internal/dwxparse_token.h"

namespace {

using namespace dwxcore::internal;

const char* TextOrEmpty(const char* text) {
    return text != nullptr ? text : "";
}

char* Put(char* at, const char* text, size_t size) {
    memcpy(at, text, size);
    return at + size;
}

// Text appended at the end of one buffer. Given a stream, the buffer is
// written to it whenever the next piece would not fit; otherwise it grows and
// is handed over whole.
class TextOut {
  public:
    static constexpr size_t kBlock = size_t{64} * 1024;

    // A stream receives blocks of kBlock bytes; without one the text starts
    // in a smaller buffer that grows.
    explicit TextOut(FILE* stream)
        : poStream(stream), nUsed(0), nCapacity(stream != nullptr ? kBlock : 1024) {
        pcData = static_cast<char*>(HMalloc(nCapacity));
    }
    TextOut(const TextOut&) = delete;
    TextOut& operator=(const TextOut&) = delete;
    ~TextOut() { free(pcData); }

    // Room for `size` more bytes; the caller writes there and commits.
    char* Room(size_t size) {
        if (size > nCapacity - nUsed) {
            MakeRoom(size);
        }
        return pcData + nUsed;
    }
    void Commit(const char* end) { nUsed = static_cast<size_t>(end - pcData); }

    const char* Data() const { return pcData; }
    size_t Size() const { return nUsed; }

    // Writes what the buffer holds to the stream.
    void Flush() {
        if (nUsed != 0) {
            fwrite(pcData, 1, nUsed, poStream);
            nUsed = 0;
        }
    }

    // The text as a heap C string; the buffer is empty afterwards.
    char* Release() {
        char* text = static_cast<char*>(HRealloc(pcData, nUsed + 1));
        text[nUsed] = '\0';
        pcData = nullptr;
        nUsed = nCapacity = 0;
        return text;
    }

  private:
    void MakeRoom(size_t size) {
        if (poStream != nullptr) {
            Flush();
        }
        if (size > nCapacity - nUsed) {
            size_t capacity = nCapacity;
            while (size > capacity - nUsed) {
                capacity *= 2;
            }
            pcData = static_cast<char*>(HRealloc(pcData, capacity));
            nCapacity = capacity;
        }
    }

    FILE* poStream;
    char* pcData;
    size_t nUsed;
    size_t nCapacity;
};

// The library's own node classes, by their exact class: the writer nests
// plain subtrees and renders the leaves in their written form; every other
// class, a host's subclass included, renders through its GetAsString.
const NodeKind* KindOf(const DWXParseTreeNode& node) {
    const PTNKind kind = ExactKindOf(node);
    return kind != PTNKind::kOther ? &KindEntry(kind) : nullptr;
}

// A node of another class is nested when its class name is PTNSubTree
// (ignoring case) and it is a subtree.
const PTNSubTree* AsNestedSubTree(const DWXParseTreeNode& node) {
    const char* className = node.GetClassName();
    if (className == nullptr || _stricmp(className, "PTNSubTree") != 0) {
        return nullptr;
    }
    return dynamic_cast<const PTNSubTree*>(&node);
}

// Writes the lines of a subtree: opening line, one line per leaf, nested
// subtrees one level deeper, closing line. A subtree sits at the indent of
// its level, its leaves two blanks further in. Every line ends in '\n'; when
// `lineEnds` is given, the offset after each line is recorded there.
class TreeWriter {
  public:
    TreeWriter(TextOut& out, std::vector<size_t>* lineEnds) : oOut(out), poLineEnds(lineEnds) {}

    void Write(const PTNSubTree& root, size_t level) {
        struct Open {
            const PTNSubTree* tree;
            int next;
            int top;
        };
        std::vector<Open> open;
        OpeningLine(root, level);
        open.push_back({&root, 0, root.GetChildren()->GetMaxIndex()});
        while (!open.empty()) {
            Open& current = open.back();
            const size_t depth = level + open.size() - 1;
            if (current.next >= current.top) {
                ClosingLine(depth);
                open.pop_back();
                continue;
            }
            const DWXArray& children = *current.tree->GetChildren();
            auto* child = static_cast<const DWXParseTreeNode*>(children[current.next++]);
            if (child == nullptr) {
                continue;
            }
            const NodeKind* kind = KindOf(*child);
            const PTNSubTree* subtree = nullptr;
            if (kind == nullptr) {
                subtree = AsNestedSubTree(*child);
            } else if (kind->form == WrittenForm::kNested) {
                subtree = static_cast<const PTNSubTree*>(child);
            }
            if (subtree != nullptr) {
                OpeningLine(*subtree, depth + 1);
                // `current` is not used after this.
                open.push_back({subtree, 0, subtree->GetChildren()->GetMaxIndex()});
            } else {
                Leaf(*child, kind, depth);
            }
        }
    }

  private:
    // 2 * level blanks, from a run of blanks kept long enough.
    const char* Blanks(size_t count) {
        if (oBlanks.size() < count) {
            oBlanks.append(count - oBlanks.size() + 64, ' ');
        }
        return oBlanks.data();
    }

    void EndLine(char* at) {
        *at++ = '\n';
        oOut.Commit(at);
        if (poLineEnds != nullptr) {
            poLineEnds->push_back(oOut.Size());
        }
    }

    // "%s(%s %s": indent, name, keyword.
    void OpeningLine(const PTNSubTree& tree, size_t level) {
        const size_t indent = 2 * level;
        const char* blanks = Blanks(indent);
        const char* name = TextOrEmpty(tree.GetName());
        const size_t nameSize = strlen(name);
        const char* keyword = PTNTypeKeyword(tree.GetClassName());
        const size_t keywordSize = strlen(keyword);
        char* at = oOut.Room(indent + nameSize + keywordSize + 3);
        at = Put(at, blanks, indent);
        *at++ = '(';
        at = Put(at, name, nameSize);
        *at++ = ' ';
        at = Put(at, keyword, keywordSize);
        EndLine(at);
    }

    // "%s)": indent.
    void ClosingLine(size_t level) {
        const size_t indent = 2 * level;
        const char* blanks = Blanks(indent);
        char* at = oOut.Room(indent + 2);
        at = Put(at, blanks, indent);
        *at++ = ')';
        EndLine(at);
    }

    // "%s  (%s %s " with room for `valueRoom` bytes of value and ")\n" after
    // it; returns where the value goes.
    char* LeafHead(size_t level, const DWXParseTreeNode& leaf, const char* keyword,
                   size_t valueRoom) {
        const size_t indent = 2 * level + 2;
        const char* blanks = Blanks(indent);
        const char* name = TextOrEmpty(leaf.GetName());
        const size_t nameSize = strlen(name);
        const size_t keywordSize = strlen(keyword);
        char* at = oOut.Room(indent + nameSize + keywordSize + valueRoom + 5);
        at = Put(at, blanks, indent);
        *at++ = '(';
        at = Put(at, name, nameSize);
        *at++ = ' ';
        at = Put(at, keyword, keywordSize);
        *at++ = ' ';
        return at;
    }

    void LeafTail(char* at) {
        *at++ = ')';
        EndLine(at);
    }

    // A leaf of the library's own `kind`, or null for another class.
    void Leaf(const DWXParseTreeNode& leaf, const NodeKind* kind, size_t level) {
        const WrittenForm form = kind != nullptr ? kind->form : WrittenForm::kAsString;
        const char* keyword = kind != nullptr ? kind->keyword : PTNTypeKeyword(leaf.GetClassName());
        switch (form) {
            case WrittenForm::kInteger:
                LeafTail(PutInteger(LeafHead(level, leaf, keyword, kNumberTextMax),
                                    static_cast<const PTNInteger&>(leaf).GetValue()));
                return;
            case WrittenForm::kBool: {
                const char* text = BoolText(static_cast<const PTNBool&>(leaf).GetValue());
                const size_t size = strlen(text);
                LeafTail(Put(LeafHead(level, leaf, keyword, size), text, size));
                return;
            }
            case WrittenForm::kChar:
                LeafTail(PutCharacter(LeafHead(level, leaf, keyword, 1),
                                      static_cast<const PTNChar&>(leaf).GetValue()));
                return;
            case WrittenForm::kFixed:
                LeafTail(
                    PutFixed(LeafHead(level, leaf, keyword, kNumberTextMax),
                             static_cast<double>(static_cast<const PTNFloat&>(leaf).GetValue())));
                return;
            case WrittenForm::kShortest:
                LeafTail(PutShortest(LeafHead(level, leaf, keyword, kNumberTextMax),
                                     static_cast<const PTNDouble&>(leaf).GetValue()));
                return;
            case WrittenForm::kQuoted:
                StringLeaf(level, leaf, keyword, static_cast<const PTNString&>(leaf).GetValue());
                return;
            case WrittenForm::kNested:
            case WrittenForm::kAsString:
                break;
        }
        HeapText value(leaf.GetAsString());
        const char* text = TextOrEmpty(value.get());
        const size_t size = strlen(text);
        LeafTail(Put(LeafHead(level, leaf, keyword, size), text, size));
    }

    // The value as PTNString::GetAsString renders it.
    void StringLeaf(size_t level, const DWXParseTreeNode& leaf, const char* keyword,
                    const char* value) {
        if (value == nullptr) {
            const size_t size = sizeof kNullValueToken - 1;
            LeafTail(Put(LeafHead(level, leaf, keyword, size), kNullValueToken, size));
            return;
        }
        LeafTail(PutQuotedToken(LeafHead(level, leaf, keyword, 2 * strlen(value) + 2), value));
    }

    TextOut& oOut;
    std::vector<size_t>* poLineEnds;
    std::string oBlanks;
};

}  // namespace

char** PTNSubTree::GetAsStringList(int level) const {
    TextOut out(nullptr);
    std::vector<size_t> lineEnds;
    TreeWriter(out, &lineEnds).Write(*this, level > 0 ? static_cast<size_t>(level) : 0);
    char** list = static_cast<char**>(HMalloc(sizeof(char*) * (lineEnds.size() + 1)));
    size_t start = 0;
    for (size_t i = 0; i < lineEnds.size(); ++i) {
        const size_t size = lineEnds[i] - 1 - start;  // without its '\n'
        list[i] = static_cast<char*>(HMalloc(size + 1));
        memcpy(list[i], out.Data() + start, size);
        list[i][size] = '\0';
        start = lineEnds[i];
    }
    list[lineEnds.size()] = nullptr;
    return list;
}

char* PTNSubTree::GetAsString() const {
    // The lines, each followed by '\n', as StringListToBuffer joins them.
    TextOut out(nullptr);
    TreeWriter(out, nullptr).Write(*this, 0);
    return out.Release();
}

void PTNSubTree::WriteToFile(FILE* stream) const {
    if (stream == nullptr) {
        return;
    }
    TextOut out(stream);
    TreeWriter(out, nullptr).Write(*this, 0);
    out.Flush();
}
