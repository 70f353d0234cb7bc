#include "arguments.h"

#include <services/portability.h>

#include <string.h>

namespace dwxtree {

namespace {

bool IsSpelling(const char* spellings, const std::string& name) {
    const char* p = spellings;
    while (*p) {
        const char* end = strchr(p, ' ');
        size_t length = end ? static_cast<size_t>(end - p) : strlen(p);
        if (length == name.size() && _strnicmp(p, name.c_str(), length) == 0) {
            return true;
        }
        if (!end) {
            break;
        }
        p = end + 1;
    }
    return false;
}

const OptionRule* FindRule(const std::vector<OptionRule>& rules, const std::string& name) {
    for (const OptionRule& rule : rules) {
        if (IsSpelling(rule.spellings, name)) {
            return &rule;
        }
    }
    return nullptr;
}

bool IsOption(const std::string& argument) {
    return argument.size() > 1 && argument[0] == '-';
}

}  // namespace

bool Arguments::Parse(int argc, const char* const* argv, const std::vector<OptionRule>& rules,
                      int (*operandLimit)(const std::string& first), std::string& error) {
    oGiven.clear();
    oOperands.clear();
    error.clear();
    bool optionsEnded = false;
    for (int i = 1; i < argc; ++i) {
        std::string argument = argv[i];
        if (optionsEnded || !IsOption(argument)) {
            oOperands.push_back(argument);
        } else if (argument == "--") {
            optionsEnded = true;
        } else {
            i = TakeOption(argument, i, Command{argc, argv, rules, operandLimit}, error);
        }
    }
    return error.empty();
}

int Arguments::TakeOption(const std::string& argument, int i, const Command& command,
                          std::string& error) {
    // The first error is the one reported.
    auto fail = [&error](const std::string& message) {
        if (error.empty()) {
            error = message;
        }
    };
    // "--name=value" carries its value; a single-hyphen spelling never
    // does, so "-o=x" is the unknown option "-o=x", not a surprise.
    std::string name = argument;
    bool inlineValue = false;
    std::string value;
    size_t equals = argument.find('=');
    if (argument.compare(0, 2, "--") == 0 && equals != std::string::npos) {
        name = argument.substr(0, equals);
        value = argument.substr(equals + 1);
        inlineValue = true;
    }
    const OptionRule* rule = FindRule(command.rules, name);
    if (!rule) {
        fail("unknown option '" + name + "'");
        return i;
    }
    Given* given = Find(rule->key);
    if (given && !rule->repeatable) {
        fail("option " + name + " given more than once");
        return i;
    }
    if (!given) {
        oGiven.push_back(Given{rule->key, name, {}});
        given = &oGiven.back();
    }
    if (rule->takes == Takes::kNothing) {
        if (inlineValue) {
            fail("option " + name + " takes no value");
        }
        return i;
    }
    const int argc = command.argc;
    if (!inlineValue) {
        if (i + 1 >= argc) {
            fail("option " + name + " needs a value");
            return i;
        }
        value = command.argv[++i];
    }
    given->values.push_back(value);
    if (rule->takes != Takes::kValues || oOperands.empty()) {
        return i;
    }
    int limit = command.operandLimit(oOperands[0]);
    while (i + 1 < argc && !IsOption(command.argv[i + 1]) &&
           static_cast<int>(oOperands.size()) - 1 >= limit) {
        given->values.push_back(command.argv[++i]);
    }
    return i;
}

Arguments::Given* Arguments::Find(const char* key) {
    for (Given& given : oGiven) {
        if (strcmp(given.key, key) == 0) {
            return &given;
        }
    }
    return nullptr;
}

const Arguments::Given* Arguments::Find(const char* key) const {
    return const_cast<Arguments*>(this)->Find(key);
}

bool Arguments::Has(const char* key) const {
    return Find(key) != nullptr;
}

std::vector<std::string> Arguments::Values(const char* key) const {
    const Given* given = Find(key);
    return given ? given->values : std::vector<std::string>();
}

std::string Arguments::Written(const char* key) const {
    const Given* given = Find(key);
    return given ? given->written : std::string();
}

}  // namespace dwxtree
