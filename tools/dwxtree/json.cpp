#include "json.h"

#include "treefile.h"

#include <dwxcore/dwxobject.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <math.h>
#include <stdlib.h>

#include <algorithm>
#include <vector>

namespace dwxtree {

namespace {

void AppendEscape(std::string& out, unsigned code) {
    char text[8];
    snprintf(text, sizeof text, "\\u%04x", code);
    out += text;
}

// The length of the valid UTF-8 sequence at `p` (at most `left` bytes) and
// its code point; 0 when the bytes there are no valid sequence (overlong
// forms, surrogates and values above U+10FFFF included).
size_t DecodeUtf8(const unsigned char* p, size_t left, unsigned& code) {
    unsigned char lead = p[0];
    size_t length;
    unsigned minimum;
    if (lead >= 0xC2 && lead <= 0xDF) {
        length = 2, minimum = 0x80, code = lead & 0x1Fu;
    } else if (lead >= 0xE0 && lead <= 0xEF) {
        length = 3, minimum = 0x800, code = lead & 0x0Fu;
    } else if (lead >= 0xF0 && lead <= 0xF4) {
        length = 4, minimum = 0x10000, code = lead & 0x07u;
    } else {
        return 0;
    }
    if (left < length) {
        return 0;
    }
    for (size_t i = 1; i < length; ++i) {
        if ((p[i] & 0xC0) != 0x80) {
            return 0;
        }
        code = (code << 6) | (p[i] & 0x3Fu);
    }
    if (code < minimum || code > 0x10FFFF || (code >= 0xD800 && code <= 0xDFFF)) {
        return 0;
    }
    return length;
}

std::string Quoted(const char* text) {
    return text ? "\"" + JsonEscape(text) + "\"" : std::string("null");
}

// Two blanks per level up to kDeepestIndent levels; deeper levels keep that
// indent, so the output of a deep tree grows with its size, not with the
// square of its depth.
constexpr size_t kDeepestIndent = 16;

void Indent(FILE* stream, size_t level) {
    fprintf(stream, "%*s", static_cast<int>(2 * std::min(level, kDeepestIndent)), "");
}

template <class T, class Format>
void WriteArray(FILE* stream, const T* values, int count, Format format) {
    fputc('[', stream);
    for (int i = 0; i < count; ++i) {
        fprintf(stream, "%s%s", i ? ", " : "", format(values[i]).c_str());
    }
    fputc(']', stream);
}

std::string IntText(int value) {
    return std::to_string(value);
}

// A leaf's value; subtrees are written by WriteJson's walk.
void WriteLeaf(FILE* stream, DWXParseTreeNode* node) {
    int count = 0;
    switch (PTNKindOf(node)) {
        case PTNKind::kBool:
            fputs(static_cast<PTNBool*>(node)->GetValue() ? "true" : "false", stream);
            return;
        case PTNKind::kInteger:
            fputs(IntText(static_cast<PTNInteger*>(node)->GetValue()).c_str(), stream);
            return;
        case PTNKind::kFloat:
            fputs(JsonNumber(static_cast<PTNFloat*>(node)->GetValue()).c_str(), stream);
            return;
        case PTNKind::kDouble:
            fputs(JsonNumber(static_cast<PTNDouble*>(node)->GetValue()).c_str(), stream);
            return;
        case PTNKind::kChar: {
            char text[2] = {static_cast<PTNChar*>(node)->GetValue(), '\0'};
            fputs(Quoted(text).c_str(), stream);
            return;
        }
        case PTNKind::kString:
            fputs(Quoted(static_cast<PTNString*>(node)->GetValue()).c_str(), stream);
            return;
        case PTNKind::kStringList: {
            char** list = static_cast<PTNStringList*>(node)->GetValue();
            WriteArray(stream, list, CountStringList(list), Quoted);
            return;
        }
        case PTNKind::kIntegerList: {
            int* values = static_cast<PTNIntegerList*>(node)->GetValue(&count);
            WriteArray(stream, values, count, IntText);
            return;
        }
        case PTNKind::kInteger32List: {
            int* values = static_cast<PTNInteger32List*>(node)->GetValue(&count);
            WriteArray(stream, values, count, IntText);
            return;
        }
        case PTNKind::kDoubleList: {
            double* values = static_cast<PTNDoubleList*>(node)->GetValue(&count);
            WriteArray(stream, values, count, JsonNumber);
            return;
        }
        case PTNKind::kSubTree:
        case PTNKind::kBase64:
        case PTNKind::kOther:
            break;
    }
    // Base64 and any other leaf: the text the leaf renders.
    HeapText text(node->GetAsString());
    fputs(Quoted(text ? text.get() : "").c_str(), stream);
}

}  // namespace

std::string JsonEscape(const std::string& bytes) {
    std::string out;
    const auto* p = reinterpret_cast<const unsigned char*>(bytes.data());
    size_t left = bytes.size();
    while (left > 0) {
        unsigned char c = *p;
        size_t used = 1;
        unsigned code = 0;
        if (c == '"' || c == '\\') {
            out += '\\';
            out += static_cast<char>(c);
        } else if (c == '\n') {
            out += "\\n";
        } else if (c == '\t') {
            out += "\\t";
        } else if (c == '\r') {
            out += "\\r";
        } else if (c < 0x20 || c == 0x7F) {
            AppendEscape(out, c);
        } else if (c < 0x80) {
            out += static_cast<char>(c);
        } else if ((used = DecodeUtf8(p, left, code)) == 0) {
            used = 1;
            AppendEscape(out, c);
        } else if (code > 0xFFFF) {
            code -= 0x10000;
            AppendEscape(out, 0xD800 + (code >> 10));
            AppendEscape(out, 0xDC00 + (code & 0x3FF));
        } else {
            AppendEscape(out, code);
        }
        p += used;
        left -= used;
    }
    return out;
}

std::string JsonNumber(double value) {
    if (!isfinite(value)) {
        return "null";
    }
    char text[40];
    for (int digits = 1; digits <= 17; ++digits) {
        snprintf(text, sizeof text, "%.*g", digits, value);
        if (TZN_strtod(text, nullptr) == value) {
            break;
        }
    }
    return text;
}

void WriteJson(FILE* stream, const PTNSubTree& root) {
    // One walk per open object, so any depth fits in memory rather than on
    // the call stack.
    struct Level {
        DWXIter walk;
        bool first;
    };
    if (root.GetChildren()->IsEmpty()) {
        fputs("{}\n", stream);
        return;
    }
    fputs("{\n", stream);
    std::vector<Level> levels;
    levels.push_back(Level{DWXIter(root.GetChildren()), true});
    while (!levels.empty()) {
        Level& level = levels.back();
        auto* node = static_cast<DWXParseTreeNode*>(level.walk.Current());
        if (!node) {
            levels.pop_back();
            fputc('\n', stream);
            Indent(stream, levels.size());
            fputc('}', stream);
            continue;
        }
        level.walk.Next();
        fputs(level.first ? "" : ",\n", stream);
        level.first = false;
        Indent(stream, levels.size());
        fprintf(stream, "%s: ", Quoted(node->GetName()).c_str());
        auto* subtree = dynamic_cast<PTNSubTree*>(node);
        if (!subtree) {
            WriteLeaf(stream, node);
        } else if (subtree->GetChildren()->IsEmpty()) {
            fputs("{}", stream);
        } else {
            fputs("{\n", stream);
            levels.push_back(Level{DWXIter(subtree->GetChildren()), true});
        }
    }
    fputc('\n', stream);
}

}  // namespace dwxtree
