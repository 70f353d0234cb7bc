// The command-line parser on arbitrary argument vectors and command strings,
// checked against a plain model of the syntax: an argument that starts with
// one hyphen opens an option, every other one adds its "|"-separated pieces
// (a leading "--" written for "-") to the option opened last. Copies answer
// as their source.
#include <dwxcore/dwxcmdline.h>

#include "fuzz_input.h"

#include <math.h>
#include <stdlib.h>
#include <string.h>

#include <string>
#include <vector>

namespace {

struct Option {
    std::string name;
    std::vector<std::string> values;
};

std::vector<std::string> Split(const std::string& text, char separator) {
    std::vector<std::string> pieces;
    std::string piece;
    for (char c : text) {
        if (c == separator) {
            if (!piece.empty()) {
                pieces.push_back(piece);
            }
            piece.clear();
        } else {
            piece += c;
        }
    }
    if (!piece.empty()) {
        pieces.push_back(piece);
    }
    return pieces;
}

std::vector<Option> Model(const std::vector<std::string>& args) {
    std::vector<Option> options;
    if (args.empty()) {
        return options;
    }
    options.push_back({args[0], {}});
    for (size_t i = 1; i < args.size(); ++i) {
        const std::string& arg = args[i];
        if (arg.size() >= 1 && arg[0] == '-' && (arg.size() == 1 || arg[1] != '-')) {
            options.push_back({arg, {}});
            continue;
        }
        std::string value = arg.compare(0, 2, "--") == 0 ? arg.substr(1) : arg;
        for (const std::string& piece : Split(value, '|')) {
            options.back().values.push_back(piece);
        }
    }
    return options;
}

bool SameIgnoringCase(const std::string& a, const std::string& b) {
    if (a.size() != b.size()) {
        return false;
    }
    for (size_t i = 0; i < a.size(); ++i) {
        unsigned char x = static_cast<unsigned char>(a[i]);
        unsigned char y = static_cast<unsigned char>(b[i]);
        if ((x >= 'A' && x <= 'Z' ? x | 0x20 : x) != (y >= 'A' && y <= 'Z' ? y | 0x20 : y)) {
            return false;
        }
    }
    return true;
}

const Option* Find(const std::vector<Option>& options, const std::string& name) {
    for (const Option& option : options) {
        if (SameIgnoringCase(option.name, name)) {
            return &option;
        }
    }
    return nullptr;
}

bool SameFloat(float a, float b) {
    return a == b || (isnan(a) && isnan(b));
}

// Every lookup walks the option list, so a check of every value of every
// option would cost the square of the input. The probe name, up to `names`
// options spread over the list and the first and last values of each stand
// for the whole; the numeric readings are checked on the first value only,
// as they read the same text.
const int kEndValuesChecked = 3;

void Check(const DWXCmdLine& parser, const std::vector<Option>& model, const std::string& probe,
           size_t namesChecked) {
    static const char kDefault[] = "default";
    std::vector<std::string> names{probe};
    const size_t step = model.size() / namesChecked + 1;
    for (size_t i = 0; i < model.size(); i += step) {
        names.push_back(model[i].name);
    }
    if (!model.empty()) {
        names.push_back(model.back().name);
    }
    for (const std::string& name : names) {
        const Option* option = Find(model, name);
        const int count = option ? static_cast<int>(option->values.size()) : 0;
        FUZZ_CHECK(parser.Exist(name.c_str()) == (option ? 1 : 0));
        FUZZ_CHECK(parser.Count(name.c_str()) == count);
        FUZZ_CHECK(parser.GetString(name.c_str(), kDefault, count) == kDefault);
        FUZZ_CHECK(parser.GetString(name.c_str(), kDefault, -1) == kDefault);
        FUZZ_CHECK(parser.GetInt(name.c_str(), -77, count) == -77);
        for (int i = 0; i < count; ++i) {
            if (i == kEndValuesChecked && count > 2 * kEndValuesChecked) {
                i = count - kEndValuesChecked;
            }
            const std::string& value = option->values[static_cast<size_t>(i)];
            FUZZ_CHECK(value == parser.GetString(name.c_str(), kDefault, i));
        }
        if (count > 0) {
            const char* first = option->values[0].c_str();
            FUZZ_CHECK(parser.GetInt(name.c_str(), -77) == atoi(first));
            FUZZ_CHECK(
                SameFloat(parser.GetFloat(name.c_str(), 0.5f), static_cast<float>(atof(first))));
        }
    }
    FUZZ_CHECK(parser.Exist(nullptr) == 0);
    FUZZ_CHECK(parser.GetString(nullptr, kDefault) == kDefault);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    const bool vectorForm = input.Flag();
    const std::string probe = input.Text(16).c_str();  // a name ends at NUL
    const std::string rest = input.Rest();

    std::vector<std::string> args;
    DWXCmdLine* parser;
    if (vectorForm) {
        // Arguments separated by NUL bytes; empty arguments included.
        size_t start = 0;
        while (start <= rest.size() && !rest.empty()) {
            size_t end = rest.find('\0', start);
            if (end == std::string::npos) {
                end = rest.size();
            }
            args.push_back(rest.substr(start, end - start));
            start = end + 1;
        }
        std::vector<const char*> vector;
        for (const std::string& arg : args) {
            vector.push_back(arg.c_str());
        }
        parser = new DWXCmdLine(static_cast<int>(vector.size()), vector.data());
    } else {
        const std::string command(rest.c_str());
        args = Split(command, ' ');
        parser = new DWXCmdLine(command.c_str());
    }
    const std::vector<Option> model = Model(args);
    Check(*parser, model, probe, 8);

    DWXCmdLine copy(*parser);
    DWXCmdLine assigned("x -y z");
    assigned = *parser;
    delete parser;
    Check(copy, model, probe, 2);
    Check(assigned, model, probe, 2);
    return 0;
}
