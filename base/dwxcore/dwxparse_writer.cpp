// The writer: a subtree as indented lines of the text format.
#include <dwxcore/dwxparse.h>

#include <services/rtprim.h>
#include <services/utilhub.h>

#include <stdlib.h>
#include <string.h>

#include <string>
#include <vector>

namespace {

typedef std::vector<std::string> Lines;

const char* TextOrEmpty(const char* text) {
    return text != nullptr ? text : "";
}

// The type keyword of the text format: the class name without "PTN".
const char* TypeKeyword(const DWXParseTreeNode& node) {
    const char* name = TextOrEmpty(node.GetClassName());
    return strlen(name) >= 3 ? name + 3 : name;
}

void AppendFormatted(Lines& lines, char* text) {
    lines.emplace_back(text);
    free(text);
}

// Opening line, one line per leaf, nested subtrees one level deeper, closing
// line. A subtree sits at the indent of its level; its leaves two blanks in.
void WriteLines(const PTNSubTree& tree, int level, Lines& lines) {
    const std::string indent(2 * static_cast<size_t>(level), ' ');
    AppendFormatted(lines, HSPrintf("%s(%s %s", indent.c_str(), TextOrEmpty(tree.GetName()),
                                    TypeKeyword(tree)));
    DWXIter iter(tree.GetChildren());
    for (DWXObject* object = iter.Current(); object != nullptr; object = iter.Next()) {
        auto* child = static_cast<const DWXParseTreeNode*>(object);
        auto* subtree = dynamic_cast<const PTNSubTree*>(child);
        if (subtree != nullptr && _stricmp(child->GetClassName(), "PTNSubTree") == 0) {
            WriteLines(*subtree, level + 1, lines);
            continue;
        }
        char* value = child->GetAsString();
        AppendFormatted(lines,
                        HSPrintf("%s  (%s %s %s)", indent.c_str(), TextOrEmpty(child->GetName()),
                                 TypeKeyword(*child), TextOrEmpty(value)));
        free(value);
    }
    AppendFormatted(lines, HSPrintf("%s)", indent.c_str()));
}

}  // namespace

char** PTNSubTree::GetAsStringList(int level) const {
    Lines lines;
    WriteLines(*this, level > 0 ? level : 0, lines);
    char** list = static_cast<char**>(HCalloc(sizeof(char*), lines.size() + 1));
    for (size_t i = 0; i < lines.size(); ++i) {
        list[i] = HString(lines[i].c_str());
    }
    return list;
}

char* PTNSubTree::GetAsString() const {
    char** lines = GetAsStringList(0);
    char* text = StringListToBuffer(lines);
    DestroyStringList(lines);
    return text;
}

void PTNSubTree::WriteToFile(FILE* stream) const {
    if (stream == nullptr) {
        return;
    }
    Lines lines;
    WriteLines(*this, 0, lines);
    for (const std::string& line : lines) {
        fprintf(stream, "%s\n", line.c_str());
    }
}
