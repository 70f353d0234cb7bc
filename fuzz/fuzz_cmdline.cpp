// The command-line parser on arbitrary argument vectors (NUL-separated, empty
// arguments included) and command strings, checked against the model in
// cmdline_model.h. Copies answer as their source after it is gone.
#include "cmdline_model.h"
#include "fuzz_input.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    const bool vectorForm = input.Flag();
    const std::string probe = input.Text(16).c_str();  // a name ends at NUL
    const std::string rest = input.Rest();
    const std::string command = rest.c_str();
    const std::vector<std::string> args =
        vectorForm ? cmdline_model::Split(rest, '\0', true) : cmdline_model::Split(command, ' ');
    std::vector<const char*> vector;
    for (const std::string& arg : args) {
        vector.push_back(arg.c_str());
    }
    DWXCmdLine* parser = vectorForm ? new DWXCmdLine(static_cast<int>(vector.size()), vector.data())
                                    : new DWXCmdLine(command.c_str());
    const std::vector<cmdline_model::Option> model = cmdline_model::Model(args);
    FUZZ_CHECK(cmdline_model::Mismatch(*parser, model, probe).empty());

    DWXCmdLine copy(*parser), assigned("x -y z");
    assigned = *parser;
    delete parser;
    FUZZ_CHECK(cmdline_model::Mismatch(copy, model, probe).empty());
    FUZZ_CHECK(cmdline_model::Mismatch(assigned, model, probe).empty());
    return 0;
}
