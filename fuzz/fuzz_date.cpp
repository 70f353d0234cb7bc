// Valid and arbitrary dates checked against day-number arithmetic.
#include "date_model.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static DateModel counting;  // counts the reports
    FuzzInput input(data, size);
    DateModel::Run(input);
    return 0;
}
