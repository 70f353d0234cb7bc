// The command-line parser on arbitrary argument vectors and command strings,
// checked against the model in cmdline_model.h. Copies answer as their
// source after it is gone.
#include "cmdline_model.h"
#include "fuzz_input.h"

#include <algorithm>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    const bool vectorForm = input.Flag();
    const std::string probe = input.Text(16).c_str();  // a name ends at NUL
    const std::string rest = input.Rest();

    std::vector<std::string> args;
    DWXCmdLine* parser;
    if (vectorForm) {
        // Arguments separated by NUL bytes; empty arguments included.
        for (size_t start = 0; start <= rest.size() && !rest.empty();) {
            const size_t end = std::min(rest.find('\0', start), rest.size());
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
        args = cmdline_model::Split(command, ' ');
        parser = new DWXCmdLine(command.c_str());
    }
    const std::vector<cmdline_model::Option> model = cmdline_model::Model(args);
    auto check = [&](const DWXCmdLine& line) {
        const std::string mismatch = cmdline_model::Mismatch(line, model, probe);
        if (!mismatch.empty()) {
            fprintf(stderr, "parser and model differ at %s\n", mismatch.c_str());
            abort();
        }
    };
    check(*parser);

    DWXCmdLine copy(*parser);
    DWXCmdLine assigned("x -y z");
    assigned = *parser;
    delete parser;
    check(copy);
    check(assigned);
    return 0;
}
