// Valid and arbitrary dates checked against day-number arithmetic.
#include "date_model.h"

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    IMPSetErrorHandler(date_model::CountReport);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    date_model::Run(input);
    return 0;
}
