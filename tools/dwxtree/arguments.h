// Command-line handling of dwxtree: options and operands in any order, in
// the habits of the usual Unix tools.
//
// An argument that begins with '-' and is longer than "-" is an option;
// "-" alone is an operand (standard input or output); "--" ends the options,
// so every later argument is an operand, whatever its first byte. Options
// have a single-hyphen and a double-hyphen spelling ("-o", "--output");
// the double-hyphen one also takes its value after '=' ("--output=x.cfg").
// Spellings compare ignoring ASCII case. Arguments are kept byte for byte:
// no character splits or escapes them.
#pragma once

#include <string>
#include <vector>

namespace dwxtree {

enum class Takes {
    kNothing,
    kOneValue,
    // One value; while every operand of the subcommand is already given,
    // the plain arguments that follow are further values ("-except a b"
    // after both files of merge).
    kValues,
};

// An option: `key` names it in the program, `spellings` lists the accepted
// spellings separated by blanks ("-o --output").
struct OptionRule {
    const char* key;
    const char* spellings;
    Takes takes;
    bool repeatable;
};

class Arguments {
  public:
    // Parses argv[1..argc-1] against `rules`. `operandLimit`, called with
    // the first operand (the subcommand), gives how many operands may
    // follow it; it decides when a kValues option goes on taking values.
    // Returns false and sets `error` for an unknown option, a repeated one
    // that is not repeatable, or a value missing or given where none is
    // taken; parsing goes on past the error, so a help option anywhere
    // still counts.
    bool Parse(int argc, const char* const* argv, const std::vector<OptionRule>& rules,
               int (*operandLimit)(const std::string& first), std::string& error);

    // The arguments that are no option or option value, in order.
    const std::vector<std::string>& Operands() const { return oOperands; }
    bool Has(const char* key) const;
    // The values of every occurrence of the option, in order.
    std::vector<std::string> Values(const char* key) const;
    // The spelling under which the option was first given, for messages.
    std::string Written(const char* key) const;

  private:
    struct Given {
        const char* key;
        std::string written;
        std::vector<std::string> values;
    };
    // The whole command line and what Parse was given to read it with.
    struct Command {
        int argc;
        const char* const* argv;
        const std::vector<OptionRule>& rules;
        int (*operandLimit)(const std::string& first);
    };
    // Takes the option `argument`, argv[i], and the values that follow it;
    // returns the index of the last argument taken. Sets `error` unless set.
    int TakeOption(const std::string& argument, int i, const Command& command, std::string& error);
    Given* Find(const char* key);
    const Given* Find(const char* key) const;

    std::vector<Given> oGiven;
    std::vector<std::string> oOperands;
};

}  // namespace dwxtree
