#include "arguments.h"

#include <dwxcore/dwxcmdline.h>
#include <services/portability.h>

namespace dwxtree {

namespace {

// The name under which DWXCmdLine files the positional arguments that come
// before the first option. Options always begin with a hyphen, so it cannot
// clash with one.
const char kProgramEntry[] = "dwxtree";

const OptionRule* FindRule(const std::vector<OptionRule>& rules, const char* name) {
    for (const OptionRule& rule : rules) {
        if (_stricmp(rule.name, name) == 0) {
            return &rule;
        }
    }
    return nullptr;
}

std::vector<std::string> ValuesOf(const DWXCmdLine& line, const char* name) {
    std::vector<std::string> values;
    int count = line.Count(name);
    for (int i = 0; i < count; ++i) {
        values.emplace_back(line.GetString(name, "", i));
    }
    return values;
}

}  // namespace

bool OpensOption(const char* argument) {
    return argument[0] == '-' && argument[1] != '-';
}

bool Arguments::Parse(int argc, const char* const* argv, const std::vector<OptionRule>& rules,
                      std::string& error) {
    oGiven.clear();
    oPositional.clear();

    std::vector<const char*> vector;
    vector.push_back(kProgramEntry);
    for (int i = 1; i < argc; ++i) {
        vector.push_back(argv[i]);
    }
    DWXCmdLine line(static_cast<int>(vector.size()), vector.data());
    oPositional = ValuesOf(line, kProgramEntry);

    // DWXCmdLine answers for the first of repeated options only, so a
    // repetition is refused rather than silently dropped.
    for (size_t i = 1; i < vector.size(); ++i) {
        const char* written = vector[i];
        if (!OpensOption(written)) {
            continue;
        }
        const OptionRule* rule = FindRule(rules, written);
        if (!rule) {
            error = std::string("unknown option '") + written + "'";
            return false;
        }
        if (Has(rule->name)) {
            error = std::string("option ") + rule->name + " given more than once";
            return false;
        }
        std::vector<std::string> values = ValuesOf(line, written);
        size_t keep = rule->arity < 0 ? values.size() : static_cast<size_t>(rule->arity);
        if (values.size() < keep || (rule->arity < 0 && values.empty())) {
            error = std::string("option ") + rule->name + " needs a value";
            return false;
        }
        oPositional.insert(oPositional.end(), values.begin() + static_cast<long>(keep),
                           values.end());
        values.resize(keep);
        oGiven.push_back(Given{rule->name, std::move(values)});
    }
    return true;
}

bool Arguments::Has(const char* name) const {
    for (const Given& given : oGiven) {
        if (_stricmp(given.name.c_str(), name) == 0) {
            return true;
        }
    }
    return false;
}

std::vector<std::string> Arguments::Values(const char* name) const {
    for (const Given& given : oGiven) {
        if (_stricmp(given.name.c_str(), name) == 0) {
            return given.values;
        }
    }
    return {};
}

}  // namespace dwxtree
