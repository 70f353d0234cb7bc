// Command-line handling of dwxtree on top of DWXCmdLine: the library parses
// the argument vector, this layer knows which options a subcommand accepts
// and how many values each takes.
#pragma once

#include <string>
#include <vector>

namespace dwxtree {

// An option a subcommand accepts. `arity` is the number of values it takes:
// 0 or 1, or -1 for one or more. Values beyond the arity are positional
// arguments, so "-o out.cfg base.cfg" gives -o the value out.cfg and leaves
// base.cfg positional.
struct OptionRule {
    const char* name;
    int arity;
};

class Arguments {
  public:
    // Parses argv[1..argc-1]. Returns false and sets `error` for an unknown
    // option, an option given twice or an option without its value.
    bool Parse(int argc, const char* const* argv, const std::vector<OptionRule>& rules,
               std::string& error);

    // The arguments that belong to no option, in command-line order.
    const std::vector<std::string>& Positional() const { return oPositional; }
    // Whether the option was given (names compare ignoring ASCII case).
    bool Has(const char* name) const;
    // The values the option took; empty when it was not given.
    std::vector<std::string> Values(const char* name) const;

  private:
    struct Given {
        std::string name;  // the rule's spelling
        std::vector<std::string> values;
    };
    std::vector<Given> oGiven;
    std::vector<std::string> oPositional;
};

// True for an argument that opens an option in the library's syntax: a
// hyphen followed by anything but a second hyphen.
bool OpensOption(const char* argument);

}  // namespace dwxtree
