#include "commands.h"

#include "json.h"
#include "treefile.h"

#include <dwxcore/dwxobject.h>
#include <dwxcore/dwxparse.h>
#include <services/utilhub.h>

#include <errno.h>
#include <limits.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <string>
#include <vector>

namespace dwxtree {

namespace {

// Ends a subcommand: a failed write to standard output is a problem too.
int Finish(int code) {
    if (fflush(stdout) != 0 || ferror(stdout)) {
        Complain(std::string("cannot write standard output: ") + strerror(errno));
        return kExitData;
    }
    return code;
}

int DataResult(const TreeFile& file) {
    return Finish(file.reports > 0 ? kExitData : kExitOk);
}

struct Shape {
    int nodes = 0;
    int subtrees = 0;
    int depth = 0;
};

void Measure(const PTNSubTree& tree, int level, Shape& shape) {
    DWXIter iter(tree.GetChildren());
    for (DWXObject* object = iter.Start(); object; object = iter.Next()) {
        ++shape.nodes;
        shape.depth = std::max(shape.depth, level);
        if (auto* subtree = dynamic_cast<PTNSubTree*>(object)) {
            ++shape.subtrees;
            Measure(*subtree, level + 1, shape);
        }
    }
}

// PATH split at '/'; false for an empty path or an empty name in it.
bool SplitPath(const std::string& path, std::vector<std::string>& names) {
    size_t start = 0;
    for (;;) {
        size_t slash = path.find('/', start);
        std::string name = path.substr(start, slash == std::string::npos ? slash : slash - start);
        if (name.empty()) {
            return false;
        }
        names.push_back(name);
        if (slash == std::string::npos) {
            return true;
        }
        start = slash + 1;
    }
}

void PrintValue(DWXParseTreeNode* node) {
    if (auto* subtree = dynamic_cast<PTNSubTree*>(node)) {
        subtree->WriteToFile(stdout);
    } else if (auto* string = dynamic_cast<PTNString*>(node)) {
        printf("%s\n", string->GetValue() ? string->GetValue() : "");
    } else if (auto* strings = dynamic_cast<PTNStringList*>(node)) {
        for (char** entry = strings->GetValue(); entry && *entry; ++entry) {
            printf("%s\n", *entry);
        }
    } else {
        // Numbers, Bool, Char, Base64 and the numeric lists: the text the
        // leaf renders, a list with one element per line.
        char* text = node->GetAsString();
        std::string value = text ? text : "";
        free(text);
        bool list = dynamic_cast<PTNDoubleList*>(node) || dynamic_cast<PTNIntegerList*>(node) ||
                    dynamic_cast<PTNInteger32List*>(node);
        if (list) {
            std::replace(value.begin(), value.end(), ' ', '\n');
        }
        if (!list || !value.empty()) {
            printf("%s\n", value.c_str());
        }
    }
}

std::string ReadAll(FILE* stream) {
    std::string content;
    char chunk[65536];
    size_t got;
    while ((got = fread(chunk, 1, sizeof chunk, stream)) > 0) {
        content.append(chunk, got);
    }
    return content;
}

bool IsBase64Character(unsigned char c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '+' ||
           c == '/';
}

// Input for the decoder: white space removed, then nothing but alphabet
// characters followed by at most two '='. The library's decoder stops
// quietly at the first other byte; the tool refuses such input instead of
// losing what follows it.
bool CleanBase64(const std::string& input, std::string& clean, std::string& error) {
    size_t pads = 0;
    for (size_t i = 0; i < input.size(); ++i) {
        auto c = static_cast<unsigned char>(input[i]);
        if (c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\v' || c == '\f') {
            continue;
        }
        if (c == '=' && pads < 2) {
            ++pads;
        } else if (!IsBase64Character(c) || pads > 0) {
            char text[80];
            snprintf(text, sizeof text, "not Base64: byte 0x%02x at offset %zu", c, i);
            error = text;
            return false;
        }
        clean.push_back(static_cast<char>(c));
    }
    // A lone character in the final group carries no whole byte.
    if ((clean.size() - pads) % 4 == 1) {
        error = "not Base64: the last group has a single character";
        return false;
    }
    return true;
}

// Reads the file named by the first operand and prints it with `print`.
int PrintTreeFile(const Arguments& args, void (*print)(FILE*, const PTNSubTree&)) {
    TreeFile file;
    if (!ReadTreeFile(args.Positional()[1].c_str(), file)) {
        return kExitData;
    }
    print(stdout, *file.root);
    return DataResult(file);
}

}  // namespace

int RunShow(const Arguments& args) {
    return PrintTreeFile(args, WriteTopLevel);
}

int RunCheck(const Arguments& args) {
    const char* path = args.Positional()[1].c_str();
    bool valid = true;
    if (args.Has("-name")) {
        std::string name = args.Values("-name")[0];
        FILE* stream = DKCheck(path) ? DKOpen(path, 4, "r") : nullptr;
        if (stream) {
            valid = PTNSubTree::PTNValidateFile(stream, name.c_str()) == 1;
            DKClose(stream);
            if (!valid) {
                Complain(std::string(path) + ": the first line that is not empty or a comment " +
                         "does not open a subtree named '" + name + "'");
            }
        }
    }
    TreeFile file;
    if (!ReadTreeFile(path, file, true)) {
        return kExitData;
    }
    if (!valid || file.reports > 0) {
        return Finish(kExitData);
    }
    Shape shape;
    Measure(*file.root, 1, shape);
    printf("%s: ok, %d nodes, %d subtrees, depth %d, %zu files read\n", path, shape.nodes,
           shape.subtrees, shape.depth, file.files.size());
    return Finish(kExitOk);
}

int RunGet(const Arguments& args) {
    const std::string& path = args.Positional()[2];
    std::vector<std::string> names;
    if (!SplitPath(path, names)) {
        fprintf(stderr, "dwxtree get: PATH '%s' must be names separated by single '/'\n",
                path.c_str());
        return kExitUsage;
    }
    TreeFile file;
    if (!ReadTreeFile(args.Positional()[1].c_str(), file)) {
        return kExitData;
    }
    DWXParseTreeNode* node = file.root.get();
    std::string walked;
    for (const std::string& name : names) {
        auto* subtree = dynamic_cast<PTNSubTree*>(node);
        if (!subtree) {
            Complain(args.Positional()[1] + ": '" + path + "' not found: '" + walked + "' is a " +
                     TypeKeyword(*node) + ", not a SubTree");
            return Finish(kExitData);
        }
        node = subtree->GetChild(name.c_str());
        walked += (walked.empty() ? "" : "/") + name;
        if (!node) {
            Complain(args.Positional()[1] + ": '" + path + "' not found: no '" + walked + "'");
            return Finish(kExitData);
        }
    }
    PrintValue(node);
    return DataResult(file);
}

int RunMerge(const Arguments& args) {
    TreeFile base;
    TreeFile other;
    if (!ReadTreeFile(args.Positional()[1].c_str(), base) ||
        !ReadTreeFile(args.Positional()[2].c_str(), other)) {
        return kExitData;
    }
    if (base.reports > 0 || other.reports > 0) {
        // A merge of a partly read file would write a partial configuration.
        Complain("nothing written: the input had problems");
        return kExitData;
    }
    ExceptionList exceptions;
    for (const std::string& name : args.Values("-except")) {
        exceptions.Add(name.c_str());
    }
    base.root->SetFrom(other.root.get(), exceptions);

    if (!args.Has("-o")) {
        WriteTopLevel(stdout, *base.root);
        return Finish(kExitOk);
    }
    std::string out = args.Values("-o")[0];
    FILE* stream = fopen(out.c_str(), "w");
    if (!stream) {
        Complain("cannot write '" + out + "': " + strerror(errno));
        return kExitData;
    }
    WriteTopLevel(stream, *base.root);
    bool failed = fflush(stream) != 0 || ferror(stream);
    if (fclose(stream) != 0 || failed) {
        Complain("cannot write '" + out + "': " + strerror(errno));
        return kExitData;
    }
    return Finish(kExitOk);
}

int RunJson(const Arguments& args) {
    return PrintTreeFile(args, WriteJson);
}

int RunBase64(const Arguments& args) {
    bool encode = args.Has("-encode");
    if (encode == args.Has("-decode")) {
        fprintf(stderr, "dwxtree base64: give exactly one of -encode and -decode\n");
        return kExitUsage;
    }
    std::string input;
    std::string source = "standard input";
    if (args.Positional().size() > 1) {
        source = args.Positional()[1];
        FILE* stream = fopen(source.c_str(), "rb");
        if (!stream) {
            Complain("cannot read '" + source + "': " + strerror(errno));
            return kExitData;
        }
        input = ReadAll(stream);
        fclose(stream);
    } else {
        input = ReadAll(stdin);
    }
    if (input.size() > UINT_MAX) {
        Complain(source + ": too large for the codec");
        return kExitData;
    }
    if (encode) {
        std::string text = base64_encode(reinterpret_cast<const unsigned char*>(input.data()),
                                         static_cast<unsigned int>(input.size()));
        printf("%s\n", text.c_str());
        return Finish(kExitOk);
    }
    std::string clean;
    std::string error;
    if (!CleanBase64(input, clean, error)) {
        Complain(source + ": " + error);
        return kExitData;
    }
    std::string bytes = base64_decode(clean);
    fwrite(bytes.data(), 1, bytes.size(), stdout);
    return Finish(kExitOk);
}

}  // namespace dwxtree
