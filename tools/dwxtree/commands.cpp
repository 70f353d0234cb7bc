#include "commands.h"

#include "base64stream.h"
#include "iofiles.h"
#include "json.h"
#include "treefile.h"

#include <dwxcore/dwxobject.h>
#include <dwxcore/dwxparse.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <errno.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <string>
#include <vector>

namespace dwxtree {

namespace {

std::string Quote(const std::string& name) {
    return "'" + name + "'";
}

// Opens the destination the -o option names (standard output without it).
bool OpenOutput(const Arguments& args, Output& output) {
    std::vector<std::string> paths = args.Values("output");
    std::string path = paths.empty() ? std::string() : paths[0];
    std::string error;
    if (!output.Open(path, error)) {
        Complain("cannot write " + Quote(path) + ": " + error);
        return false;
    }
    return true;
}

std::string OutputName(const Output& output) {
    return output.Stream() == stdout ? output.Name() : Quote(output.Name());
}

// Ends a subcommand that wrote to `output`: a file is replaced only when
// everything went well; a failed write is a problem too.
int Finish(int code, Output& output) {
    bool replacing = output.Replacing();
    if (code != kExitOk && replacing) {
        output.Discard();
        Complain(Quote(output.Name()) + " left unchanged");
        return code;
    }
    std::string error;
    if (!output.Commit(error)) {
        Complain("cannot write " + OutputName(output) + ": " + error);
        if (replacing) {
            Complain(Quote(output.Name()) + " left unchanged");
        }
        return kExitData;
    }
    return code;
}

int DataCode(const TreeFile& file) {
    return file.log.Ok() ? kExitOk : kExitData;
}

struct Shape {
    long nodes = 0;
    long subtrees = 0;
    long depth = 0;
};

// Counts the nodes below `root` with a stack of walks, one per open
// subtree, so any depth fits in memory rather than on the call stack.
Shape Measure(const PTNSubTree& root) {
    Shape shape;
    std::vector<DWXIter> walks;
    walks.emplace_back(root.GetChildren());
    while (!walks.empty()) {
        DWXObject* object = walks.back().Current();
        if (!object) {
            walks.pop_back();
            continue;
        }
        walks.back().Next();
        ++shape.nodes;
        shape.depth = std::max(shape.depth, static_cast<long>(walks.size()));
        if (auto* subtree = dynamic_cast<PTNSubTree*>(object)) {
            ++shape.subtrees;
            walks.emplace_back(subtree->GetChildren());
        }
    }
    return shape;
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

void PrintValue(FILE* stream, DWXParseTreeNode* node) {
    const PTNKind kind = PTNKindOf(node);
    if (kind == PTNKind::kSubTree) {
        static_cast<PTNSubTree*>(node)->WriteToFile(stream);
        return;
    }
    if (kind == PTNKind::kString) {
        const char* value = static_cast<PTNString*>(node)->GetValue();
        fprintf(stream, "%s\n", value ? value : "");
        return;
    }
    if (kind == PTNKind::kStringList) {
        for (char** entry = static_cast<PTNStringList*>(node)->GetValue(); entry && *entry;
             ++entry) {
            fprintf(stream, "%s\n", *entry);
        }
        return;
    }
    // Numbers, Bool, Char, Base64 and the numeric lists: the text the leaf
    // renders, a list with one element per line.
    HeapText text(node->GetAsString());
    std::string value = text ? text.get() : "";
    const bool list = kind == PTNKind::kDoubleList || kind == PTNKind::kIntegerList ||
                      kind == PTNKind::kInteger32List;
    if (list) {
        std::replace(value.begin(), value.end(), ' ', '\n');
    }
    if (!list || !value.empty()) {
        fprintf(stream, "%s\n", value.c_str());
    }
}

// The place the reader built `node` from, "FILE:LINE", then one line
// "  included from FILE:LINE" per include directive that led there, the
// innermost first. O(depth of the include chain).
void PrintWhere(FILE* stream, const TreeFile& file, const DWXParseTreeNode& node) {
    const PTNSourceFile* source = node.GetSourceFile();
    if (!source) {
        return;  // a node the reader did not build has no place
    }
    fprintf(stream, "%s:%d\n", SourceName(file, *source).c_str(), node.GetSourceLine());
    for (; source->includedBy; source = source->includedBy) {
        fprintf(stream, "  included from %s:%d\n", SourceName(file, *source->includedBy).c_str(),
                source->includedAtLine);
    }
}

// Reads the file named by the first operand and prints it with `print`.
int PrintTreeFile(const Arguments& args, void (*print)(FILE*, const PTNSubTree&)) {
    TreeFile file;
    if (!ReadTreeFile(args.Operands()[1], file)) {
        return kExitData;
    }
    Output output;
    if (!OpenOutput(args, output)) {
        return kExitData;
    }
    print(output.Stream(), *file.root);
    return Finish(DataCode(file), output);
}

// 1 when the first meaningful line of the file opens a subtree `name`.
bool OpensSubtree(const TreeFile& file, const std::string& path, const std::string& name) {
    FILE* stream = path == kStandardStream
                       ? fmemopen(const_cast<char*>(file.text.data()), file.text.size(), "r")
                       : DKOpen(path.c_str(), 4, "r");
    if (!stream) {
        return false;
    }
    bool opens = PTNSubTree::PTNValidateFile(stream, name.c_str()) == 1;
    if (path == kStandardStream) {
        fclose(stream);
    } else {
        DKClose(stream);
    }
    return opens;
}

}  // namespace

int RunShow(const Arguments& args) {
    return PrintTreeFile(args, WriteTopLevel);
}

int RunCheck(const Arguments& args) {
    const std::string& path = args.Operands()[1];
    TreeFile file;
    if (!ReadTreeFile(path, file)) {
        return kExitData;
    }
    int errors = 0;
    int warnings = static_cast<int>(file.log.Warnings().size());
    for (const PTNReadReport& report : file.log.Reports()) {
        ++(report.severity <= 1 ? errors : warnings);
    }
    if (args.Has("name")) {
        std::string name = args.Values("name")[0];
        if (!OpensSubtree(file, path, name)) {
            ++errors;
            Report(file.name, 0, Severity::kError,
                   "the first line that is not empty or a comment does not open a subtree "
                   "named " +
                       Quote(name));
        }
    }
    // A warning means the tree differs from the text (a line dropped, a
    // value read otherwise than it looks): such a file is not ok.
    Output output;
    OpenOutput(args, output);
    std::vector<std::string> files = FilesRead(file);
    bool ok = errors == 0 && warnings == 0;
    if (ok) {
        Shape shape = Measure(*file.root);
        printf("%s: ok, %ld nodes, %ld subtrees, depth %ld, %zu files read\n", file.name.c_str(),
               shape.nodes, shape.subtrees, shape.depth, files.size());
    } else {
        printf("%s: not ok, %d error%s, %d warning%s, %zu files read\n", file.name.c_str(), errors,
               errors == 1 ? "" : "s", warnings, warnings == 1 ? "" : "s", files.size());
    }
    for (const std::string& name : files) {
        printf("  %s\n", name.c_str());
    }
    return Finish(ok ? kExitOk : kExitData, output);
}

int RunGet(const Arguments& args) {
    const std::string& path = args.Operands()[2];
    std::vector<std::string> names;
    if (!SplitPath(path, names)) {
        fprintf(stderr, "dwxtree get: PATH '%s' must be names separated by single '/'\n",
                path.c_str());
        return kExitUsage;
    }
    TreeFile file;
    if (!ReadTreeFile(args.Operands()[1], file)) {
        return kExitData;
    }
    // One step at a time, so that a failure can say where the path ended.
    DWXParseTreeNode* node = file.root.get();
    std::string walked;
    for (const std::string& name : names) {
        auto* subtree = dynamic_cast<PTNSubTree*>(node);
        if (!subtree) {
            Report(file.name, 0, Severity::kError,
                   Quote(path) + " not found: " + Quote(walked) + " is a " +
                       PTNTypeKeyword(node->GetClassName()) + ", not a SubTree");
            return kExitData;
        }
        // "name[N]" is the N-th child of that name; a name that holds
        // brackets of its own is still found as written.
        node = subtree->Find(name.c_str());
        if (!node && name.find('[') != std::string::npos) {
            node = subtree->GetChild(name.c_str());
        }
        walked += (walked.empty() ? "" : "/") + name;
        if (!node) {
            Report(file.name, 0, Severity::kError, Quote(path) + " not found: no " + Quote(walked));
            return kExitData;
        }
    }
    Output output;
    if (!OpenOutput(args, output)) {
        return kExitData;
    }
    PrintValue(output.Stream(), node);
    if (args.Has("where")) {
        PrintWhere(output.Stream(), file, *node);
    }
    return Finish(DataCode(file), output);
}

int RunMerge(const Arguments& args) {
    const std::string& basePath = args.Operands()[1];
    const std::string& otherPath = args.Operands()[2];
    if (basePath == kStandardStream && otherPath == kStandardStream) {
        fprintf(stderr, "dwxtree merge: standard input can be only one of the two files\n");
        return kExitUsage;
    }
    TreeFile base;
    TreeFile other;
    if (!ReadTreeFile(basePath, base) || !ReadTreeFile(otherPath, other)) {
        return kExitData;
    }
    if (!base.log.Ok() || !other.log.Ok()) {
        // A merge of a partly read file would write a partial configuration.
        Complain("nothing written: the input had problems");
        return kExitData;
    }
    // Each -except value is one name or a list of names separated by ','
    // or '|'.
    ExceptionList exceptions;
    for (const std::string& value : args.Values("except")) {
        size_t start = 0;
        while (start <= value.size()) {
            size_t end = value.find_first_of(",|", start);
            std::string name = value.substr(start, end == std::string::npos ? end : end - start);
            if (!name.empty()) {
                exceptions.Add(name.c_str());
            }
            start = end == std::string::npos ? value.size() + 1 : end + 1;
        }
    }
    base.root->SetFrom(other.root.get(), exceptions);

    Output output;
    if (!OpenOutput(args, output)) {
        return kExitData;
    }
    WriteTopLevel(output.Stream(), *base.root);
    return Finish(kExitOk, output);
}

int RunJson(const Arguments& args) {
    return PrintTreeFile(args, WriteJson);
}

int RunBase64(const Arguments& args) {
    bool encode = args.Has("encode");
    if (encode == args.Has("decode")) {
        fprintf(stderr, "dwxtree base64: give exactly one of --encode and --decode\n");
        return kExitUsage;
    }
    std::string source = args.Operands().size() > 1 ? args.Operands()[1] : kStandardStream;
    std::string name = source == kStandardStream ? kStandardInputName : source;
    FILE* input = stdin;
    if (source != kStandardStream) {
        std::string reason = UnreadableReason(source, false);
        input = reason.empty() ? fopen(source.c_str(), "rb") : nullptr;
        if (!input) {
            Report(source, 0, Severity::kError,
                   "cannot read: " + (reason.empty() ? ErrorText(errno) : reason));
            return kExitData;
        }
    }
    Output output;
    if (!OpenOutput(args, output)) {
        if (input != stdin) {
            fclose(input);
        }
        return kExitData;
    }
    std::string error;
    StreamResult result = encode ? EncodeBase64Stream(input, output.Stream(), error)
                                 : DecodeBase64Stream(input, output.Stream(), error);
    if (input != stdin) {
        fclose(input);
    }
    switch (result) {
        case StreamResult::kOk:
            return Finish(kExitOk, output);
        case StreamResult::kBadInput:
            Report(name, 0, Severity::kError, error);
            break;
        case StreamResult::kReadFailed:
            Report(name, 0, Severity::kError, "cannot read: " + error);
            break;
        case StreamResult::kWriteFailed:
            Complain("cannot write " + OutputName(output) + ": " + error);
            break;
    }
    return Finish(kExitData, output);
}

}  // namespace dwxtree
