// Random runs of operations on the four containers, each checked after every
// step against the plain models of container_model.h.
#include "container_model.h"
#include "fuzz_input.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    container_model::Run(input, 64);
    return 0;
}
