// dwxtree: reads, checks, queries, merges and converts configuration files
// in the parse tree text format, using the library the way a host does.
#include "arguments.h"
#include "commands.h"
#include "iofiles.h"
#include "treefile.h"

#include <dwxcore/dwxversion.h>

#include <services/portability.h>

#include <stdio.h>
#include <string.h>

#include <algorithm>
#include <string>
#include <vector>

namespace {

using dwxtree::Arguments;
using dwxtree::OptionRule;
using dwxtree::Takes;

const char kUsage[] =
    "usage: dwxtree SUBCOMMAND [OPTION]... OPERAND...\n"
    "\n"
    "  show FILE [-o OUT]                  the tree as the library writes it\n"
    "  check FILE [--name NAME]            reports, or a one-line summary\n"
    "  get FILE PATH [-o OUT]              the value at PATH (names separated by '/')\n"
    "  merge BASE OTHER [--except NAME]... [-o OUT]\n"
    "                                      OTHER's values merged into BASE\n"
    "  json FILE [-o OUT]                  the tree as JSON\n"
    "  base64 -e|-d [FILE] [-o OUT]        the Base64 codec\n"
    "\n"
    "  -h, --help     this text; after a subcommand, that subcommand's\n"
    "  --version      the version of dwxtree and its library\n"
    "\n"
    "Options and operands may come in any order. Each option has a single-\n"
    "hyphen spelling (-o, -name, -except, -e or -encode, -d or -decode, -h or\n"
    "-help) and a double-hyphen one (--output, --name, --except, --encode,\n"
    "--decode, --help); the double-hyphen one also takes its value after '='\n"
    "(--output=merged.cfg). '--' ends the options: every argument after it is\n"
    "an operand, whatever its first character. A FILE of '-' is standard\n"
    "input, an OUT of '-' standard output. File names are used byte for byte.\n"
    "\n"
    "-o OUT replaces OUT only when the command succeeds: the result goes to a\n"
    "temporary file in OUT's directory, which is then renamed over OUT, so OUT\n"
    "is never half-written and may be one of the input files. Without -o the\n"
    "result goes to standard output.\n"
    "\n"
    "Includes in FILE are found as the library finds them (as named, then in\n"
    "the directories of DWX_ETC_PATH, then DWX_PRO_PATH); dwxtree appends the\n"
    "directory of FILE to DWX_ETC_PATH while it reads FILE. A FILE must be a\n"
    "regular file, since the library reads it by name; use '-' for a pipe.\n"
    "\n"
    "Problems are reported on standard error as 'FILE:LINE: error: MESSAGE'\n"
    "(or 'warning'), followed by the text of that line.\n"
    "\n"
    "Exit status: 0 success; 1 the data had problems (a report from the reader,\n"
    "a path not found, a file that cannot be read or written); 2 usage errors.\n";

// Every option of every subcommand; a subcommand lists the keys it takes.
const std::vector<OptionRule> kOptions = {
    {"help", "-h -help --help", Takes::kNothing, true},
    {"version", "--version", Takes::kNothing, true},
    {"output", "-o --output", Takes::kOneValue, false},
    {"name", "-name --name", Takes::kOneValue, false},
    {"except", "-except --except", Takes::kValues, true},
    {"encode", "-e -encode --encode", Takes::kNothing, false},
    {"decode", "-d -decode --decode", Takes::kNothing, false},
};

struct Subcommand {
    const char* name;
    int operands;  // after the subcommand
    int optional;  // how many of them may be left out
    std::vector<const char*> options;
    int (*run)(const Arguments&);
    const char* help;
};

const Subcommand kSubcommands[] = {
    {"show",
     1,
     0,
     {"output"},
     dwxtree::RunShow,
     "usage: dwxtree show FILE [-o OUT]\n"
     "\n"
     "Reads FILE (includes followed) and writes the tree as the library writes\n"
     "it: a subtree as its opening line, its children indented by two blanks\n"
     "and its closing line; a node outside every subtree as one line. The\n"
     "output reads back to the same tree, except for the values the format\n"
     "does not keep. Reports go to standard error and make the exit status 1;\n"
     "what was read before a corrupt line is still written to standard output\n"
     "(an OUT file is then left unchanged). The written text indents two\n"
     "blanks per level, so its size grows with the square of the depth.\n"},
    {"check",
     1,
     0,
     {"name"},
     dwxtree::RunCheck,
     "usage: dwxtree check FILE [--name NAME]\n"
     "\n"
     "Reads FILE in full. With --name, also tests that the first line of FILE\n"
     "that is neither empty nor a comment opens a subtree named NAME (case\n"
     "ignored). Every report is printed on standard error with its file and\n"
     "line; when there is none, one line on standard output says\n"
     "  FILE: ok, N nodes, S subtrees, depth D, F files read\n"
     "where N counts every node (subtrees included), D is the number of levels\n"
     "(a node outside every subtree is at level 1) and F counts the distinct\n"
     "files read, FILE and its includes. Exit status 0 only when nothing was\n"
     "reported.\n"},
    {"get",
     2,
     0,
     {"output"},
     dwxtree::RunGet,
     "usage: dwxtree get FILE PATH [-o OUT]\n"
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
     {"except", "output"},
     dwxtree::RunMerge,
     "usage: dwxtree merge BASE OTHER [--except NAME]... [-o OUT]\n"
     "\n"
     "Reads both files and merges OTHER's values into BASE as the library's\n"
     "subtree merge does: every node of BASE whose name is not excepted\n"
     "takes its value from the first node of the same name at the same\n"
     "place in OTHER, when that node is of the same type (subtrees are merged\n"
     "name by name). Nothing is added, removed or renamed; an excepted name\n"
     "keeps nodes of that name, and everything below them, out of the merge\n"
     "at every depth. Writes the result to OUT, or to standard output; OUT may\n"
     "be BASE itself. Nothing is written when either file had problems.\n"
     "\n"
     "--except takes one NAME, or several separated by ',' or '|'\n"
     "(--except network,proxy), and may be repeated. Written after both files,\n"
     "it also takes the plain arguments that follow it (merge BASE OTHER\n"
     "-except network proxy); before them, it takes one argument only.\n"},
    {"json",
     1,
     0,
     {"output"},
     dwxtree::RunJson,
     "usage: dwxtree json FILE [-o OUT]\n"
     "\n"
     "Writes the tree as one JSON object: a SubTree as an object with its\n"
     "children in order; Integer, Double and Float as numbers (null for an\n"
     "infinite or undefined value); Bool as true or false; String, Char and\n"
     "Base64 (its text) as strings; StringList, DoubleList, IntegerList and\n"
     "Integer32List as arrays. Each level is indented by two blanks, up to the\n"
     "16th; deeper levels keep that indent.\n"
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
     {"encode", "decode", "output"},
     dwxtree::RunBase64,
     "usage: dwxtree base64 -e|--encode|-d|--decode [FILE] [-o OUT]\n"
     "\n"
     "Encodes the bytes of FILE (or standard input, also as '-') as one line\n"
     "of Base64 (RFC 4648, standard alphabet, '=' padding), or decodes Base64\n"
     "text back to bytes. Input streams through in blocks of 192 KiB, so any\n"
     "size runs in constant memory.\n"
     "\n"
     "Decoding is stricter than the library's base64_decode, which stops\n"
     "quietly at the first '=' or byte outside the alphabet and drops the\n"
     "rest. Here white space and line breaks are skipped anywhere; pad\n"
     "characters are optional; and the exit status is 1, with the offset of\n"
     "the byte, for any other byte outside the alphabet, a third '=', data\n"
     "after '=', or a last group of a single character. Nothing is written\n"
     "then, except, for a longer input, what was decoded more than 192 KiB\n"
     "before the fault; an OUT file is left unchanged.\n"},
};

int OperandLimit(const std::string& name) {
    for (const Subcommand& command : kSubcommands) {
        if (_stricmp(command.name, name.c_str()) == 0) {
            return command.operands;
        }
    }
    return 0;
}

const Subcommand* FindSubcommand(const std::string& name) {
    for (const Subcommand& command : kSubcommands) {
        if (_stricmp(command.name, name.c_str()) == 0) {
            return &command;
        }
    }
    return nullptr;
}

int UsageError(const std::string& message, const char* subcommand) {
    std::string prefix = subcommand ? std::string(" ") + subcommand : std::string();
    fprintf(stderr, "dwxtree%s: %s\n", prefix.c_str(), message.c_str());
    fprintf(stderr, "Try 'dwxtree%s --help'.\n", prefix.c_str());
    return dwxtree::kExitUsage;
}

}  // namespace

int main(int argc, char** argv) {
    dwxtree::InstallReportHandler();
    dwxtree::IgnoreFileSizeSignal();

    Arguments args;
    std::string error;
    bool parsed = args.Parse(argc, argv, kOptions, OperandLimit, error);
    const Subcommand* command =
        args.Operands().empty() ? nullptr : FindSubcommand(args.Operands()[0]);

    // Help and version answer whatever else the line holds.
    if (args.Has("help")) {
        fputs(command ? command->help : kUsage, stdout);
        return dwxtree::kExitOk;
    }
    if (args.Has("version")) {
        printf("dwxtree (dwxcore) %s\n", DWXCORE_VERSION_STRING);
        return dwxtree::kExitOk;
    }
    if (args.Operands().empty()) {
        if (!parsed) {
            return UsageError(error, nullptr);
        }
        fputs(kUsage, stderr);
        return dwxtree::kExitUsage;
    }
    if (!command) {
        return UsageError("unknown subcommand '" + args.Operands()[0] + "'", nullptr);
    }
    if (!parsed) {
        return UsageError(error, command->name);
    }
    for (const OptionRule& rule : kOptions) {
        bool allowed = std::find_if(command->options.begin(), command->options.end(),
                                    [&rule](const char* key) {
                                        return strcmp(key, rule.key) == 0;
                                    }) != command->options.end();
        if (args.Has(rule.key) && !allowed) {
            return UsageError("unknown option '" + args.Written(rule.key) + "'", command->name);
        }
    }
    int given = static_cast<int>(args.Operands().size()) - 1;
    if (given > command->operands || given < command->operands - command->optional) {
        return UsageError(given > command->operands ? "too many arguments" : "missing arguments",
                          command->name);
    }
    return command->run(args);
}
