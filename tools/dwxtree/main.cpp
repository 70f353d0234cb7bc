// dwxtree: reads, checks, queries, merges and converts configuration files
// in the parse tree text format, using the library the way a host does.
#include "arguments.h"
#include "commands.h"
#include "treefile.h"

#include <services/portability.h>

#include <stdio.h>

#include <string>
#include <vector>

namespace {

using dwxtree::Arguments;
using dwxtree::OptionRule;

const char kUsage[] =
    "usage: dwxtree SUBCOMMAND ARGUMENTS\n"
    "\n"
    "  show FILE                       the tree as the library writes it\n"
    "  check FILE [-name NAME]         reports, or a one-line summary\n"
    "  get FILE PATH                   the value at PATH (names separated by '/')\n"
    "  merge BASE OTHER [-except NAME ...] [-o OUT]\n"
    "                                  OTHER's values merged into BASE\n"
    "  json FILE                       the tree as JSON\n"
    "  base64 -encode|-decode [FILE]   the Base64 codec (standard input without FILE)\n"
    "\n"
    "dwxtree SUBCOMMAND -help describes a subcommand.\n"
    "\n"
    "Options begin with a single hyphen and take the arguments that follow\n"
    "them; a value that begins with a hyphen is written with two (--x is the\n"
    "value -x), and a '|' inside an argument splits it into two values.\n"
    "Includes in FILE are found as the library finds them (as named, then in\n"
    "the directories of DWX_ETC_PATH, then DWX_PRO_PATH); dwxtree appends the\n"
    "directory of FILE to DWX_ETC_PATH while it reads FILE.\n"
    "\n"
    "Exit status: 0 success; 1 the data had problems (a report from the reader,\n"
    "a path not found, a file that cannot be read or written); 2 usage errors.\n";

struct Subcommand {
    const char* name;
    int files;     // positional arguments after the subcommand
    int optional;  // how many of them may be left out
    std::vector<OptionRule> options;
    int (*run)(const Arguments&);
    const char* help;
};

const Subcommand kSubcommands[] = {
    {"show",
     1,
     0,
     {{"-help", 0}},
     dwxtree::RunShow,
     "usage: dwxtree show FILE\n"
     "\n"
     "Reads FILE (includes followed) and writes the tree as the library writes\n"
     "it: a subtree as its opening line, its children indented by two blanks\n"
     "and its closing line; a node outside every subtree as one line. The\n"
     "output reads back to the same tree, except for the values the format\n"
     "does not keep. Reports go to standard error and make the exit status 1;\n"
     "what was read before a corrupt line is still written.\n"},
    {"check",
     1,
     0,
     {{"-help", 0}, {"-name", 1}},
     dwxtree::RunCheck,
     "usage: dwxtree check FILE [-name NAME]\n"
     "\n"
     "With -name, first tests that the first line of FILE that is neither\n"
     "empty nor a comment opens a subtree named NAME (case ignored). Then reads\n"
     "FILE in full. Every report is printed on standard error with its file and\n"
     "line; when there is none, one line on standard output says\n"
     "  FILE: ok, N nodes, S subtrees, depth D, F files read\n"
     "where N counts every node (subtrees included), D is the number of levels\n"
     "(a node outside every subtree is at level 1) and F counts the distinct\n"
     "files read, FILE and its includes. Exit status 0 only when nothing was\n"
     "reported.\n"},
    {"get",
     2,
     0,
     {{"-help", 0}},
     dwxtree::RunGet,
     "usage: dwxtree get FILE PATH\n"
     "\n"
     "PATH is names separated by '/', starting from the top level of FILE, for\n"
     "example app/window/title. Each name is matched as the library matches\n"
     "names: whole, ASCII case ignored, the first child of that name wins.\n"
     "Prints the value: a String as its text without quotes, a StringList or a\n"
     "numeric list one entry per line, a SubTree as the library writes it,\n"
     "every other value as the text the file format uses. Exit status 1 when\n"
     "the path is not found.\n"},
    {"merge",
     2,
     0,
     {{"-help", 0}, {"-except", -1}, {"-o", 1}},
     dwxtree::RunMerge,
     "usage: dwxtree merge BASE OTHER [-except NAME ...] [-o OUT]\n"
     "\n"
     "Reads both files and merges OTHER's values into BASE as the library's\n"
     "subtree merge does: every node of BASE whose name is not in the -except\n"
     "list takes its value from the first node of the same name at the same\n"
     "place in OTHER, when that node is of the same type (subtrees are merged\n"
     "name by name). Nothing is added, removed or renamed; a name in the\n"
     "-except list keeps nodes of that name, and everything below them, out of\n"
     "the merge at every depth. Writes the result to OUT, or to standard\n"
     "output. Nothing is written when either file had problems.\n"},
    {"json",
     1,
     0,
     {{"-help", 0}},
     dwxtree::RunJson,
     "usage: dwxtree json FILE\n"
     "\n"
     "Writes the tree as one JSON object: a SubTree as an object with its\n"
     "children in order; Integer, Double and Float as numbers (null for an\n"
     "infinite or undefined value); Bool as true or false; String, Char and\n"
     "Base64 (its text) as strings; StringList, DoubleList, IntegerList and\n"
     "Integer32List as arrays.\n"
     "A name that occurs more than once in a subtree is kept: it is written\n"
     "once per occurrence, in order, as a repeated key (a JSON reader that\n"
     "keeps one value per key keeps only the last).\n"
     "Strings are written in ASCII: '\"' and '\\' are escaped, control bytes as\n"
     "\\n, \\t, \\r or \\u00XX, every valid UTF-8 sequence as \\uXXXX (a surrogate\n"
     "pair above U+FFFF), and every byte that is not part of valid UTF-8 as\n"
     "\\u00XX, the Latin-1 character of that byte.\n"},
    {"base64",
     1,
     1,
     {{"-help", 0}, {"-encode", 0}, {"-decode", 0}},
     dwxtree::RunBase64,
     "usage: dwxtree base64 -encode|-decode [FILE]\n"
     "\n"
     "Encodes the bytes of FILE (or standard input) as one line of Base64\n"
     "(RFC 4648, standard alphabet, '=' padding), or decodes Base64 text back\n"
     "to bytes on standard output. Decoding ignores white space and line\n"
     "breaks and refuses (exit status 1) text with any other byte outside the\n"
     "alphabet, data after the padding, or a last group of one character.\n"},
};

int UsageError(const std::string& message, const char* subcommand) {
    fprintf(stderr, "dwxtree%s%s: %s\n", subcommand ? " " : "", subcommand ? subcommand : "",
            message.c_str());
    fprintf(stderr, "Try 'dwxtree %s-help'.\n",
            subcommand ? (std::string(subcommand) + " ").c_str() : "");
    return dwxtree::kExitUsage;
}

}  // namespace

int main(int argc, char** argv) {
    dwxtree::InstallReportHandler();

    // The subcommand is the first positional argument; options decide the
    // rest, so a first pass accepts every option the subcommands know.
    Arguments args;
    std::string error;
    std::vector<OptionRule> all;
    for (const Subcommand& command : kSubcommands) {
        all.insert(all.end(), command.options.begin(), command.options.end());
    }
    if (!args.Parse(argc, argv, all, error) && args.Positional().empty()) {
        return UsageError(error, nullptr);
    }
    if (args.Positional().empty()) {
        if (args.Has("-help")) {
            fputs(kUsage, stdout);
            return dwxtree::kExitOk;
        }
        fputs(kUsage, stderr);
        return dwxtree::kExitUsage;
    }

    const std::string name = args.Positional()[0];
    for (const Subcommand& command : kSubcommands) {
        if (_stricmp(command.name, name.c_str()) != 0) {
            continue;
        }
        if (!args.Parse(argc, argv, command.options, error)) {
            return UsageError(error, command.name);
        }
        if (args.Has("-help")) {
            fputs(command.help, stdout);
            return dwxtree::kExitOk;
        }
        int given = static_cast<int>(args.Positional().size()) - 1;
        if (given > command.files || given < command.files - command.optional) {
            return UsageError(given > command.files ? "too many arguments" : "missing arguments",
                              command.name);
        }
        return command.run(args);
    }
    return UsageError("unknown subcommand '" + name + "'", nullptr);
}
