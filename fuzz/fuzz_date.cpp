// Valid and arbitrary dates checked against day-number arithmetic.
#include "date_model.h"

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    static DateModel counting;  // counts the reports for the whole run
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    DateModel::Run(input);
    return 0;
}
