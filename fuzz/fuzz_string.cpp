// Random sequences of DWXString operations checked against a std::string
// model after every step.
#include "string_model.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    StringModel().Run(input, 64);
    return 0;
}
