// A plain model of the command-line syntax, shared by the fuzz target and the
// unit test: an argument that starts with one hyphen opens an option, every
// other one adds its "|"-separated pieces (a leading "--" written for "-") to
// the option opened last; the first argument opens the first option.
#pragma once

#include <dwxcore/dwxcmdline.h>

#include <math.h>
#include <stdlib.h>

#include <sstream>
#include <string>
#include <vector>

namespace cmdline_model {

struct Option {
    std::string name;
    std::vector<std::string> values;
};

// The pieces of `text` between separators; empty ones only with `keepEmpty`.
inline std::vector<std::string> Split(const std::string& text, char separator,
                                      bool keepEmpty = false) {
    std::vector<std::string> pieces;
    std::istringstream stream(text);
    for (std::string piece; std::getline(stream, piece, separator);) {
        if (keepEmpty || !piece.empty()) {
            pieces.push_back(piece);
        }
    }
    return pieces;
}

inline std::vector<Option> Model(const std::vector<std::string>& args) {
    std::vector<Option> options;
    for (size_t i = 0; i < args.size(); ++i) {
        const std::string& arg = args[i];
        if (i == 0 || (arg[0] == '-' && arg[1] != '-')) {
            options.push_back({arg, {}});
            continue;
        }
        for (const std::string& piece : Split(arg.substr(arg[0] == '-' ? 1 : 0), '|')) {
            options.back().values.push_back(piece);
        }
    }
    return options;
}

// The first name for which `parser` answers otherwise than `model`, or "".
// Names compare ignoring the case of ASCII letters only, in any locale.
inline std::string Mismatch(const DWXCmdLine& parser, const std::vector<Option>& model,
                            const std::string& probe) {
    static const char kDefault[] = "default";
    auto folded = [](std::string name) {  // ASCII only, whatever the locale
        for (char& c : name)
            c = c >= 'A' && c <= 'Z' ? static_cast<char>(c | 0x20) : c;
        return name;
    };
    std::vector<std::string> names{probe};
    for (const Option& option : model) {
        names.push_back(option.name);
    }
    for (const std::string& name : names) {
        const Option* option = nullptr;
        for (size_t i = model.size(); i-- > 0;) {
            option = folded(model[i].name) == folded(name) ? &model[i] : option;
        }
        const char* n = name.c_str();
        const int count = option ? static_cast<int>(option->values.size()) : 0;
        bool same = parser.Exist(n) == (option ? 1 : 0) && parser.Count(n) == count &&
                    parser.GetString(n, kDefault, count) == kDefault &&
                    parser.GetString(n, kDefault, -1) == kDefault &&
                    parser.GetInt(n, -77, count) == -77 && parser.GetFloat(n, 0.5f, count) == 0.5f;
        for (int i = 0; same && i < count; ++i) {
            same = option->values[static_cast<size_t>(i)] == parser.GetString(n, kDefault, i);
        }
        if (same && count > 0) {
            const float number = static_cast<float>(atof(option->values[0].c_str()));
            const float read = parser.GetFloat(n, 0.5f);
            same = parser.GetInt(n, -77) == atoi(option->values[0].c_str()) &&
                   (read == number || (isnan(read) && isnan(number)));
        }
        if (!same) {
            return name;
        }
    }
    return parser.Exist(nullptr) || parser.GetString(nullptr, kDefault) != kDefault ? "(null)" : "";
}

}  // namespace cmdline_model
