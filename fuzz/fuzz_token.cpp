// The token syntax of string values: quoting then unquoting gives the value
// back unless reading expands it on purpose, a written token holds no quote
// mark but its own two and no line feed, and unquoting any token is safe.
#include "fuzz_expand.h"
#include "fuzz_input.h"
#include "internal/dwxparse_token.h"

#include <stdlib.h>
#include <string.h>

#include <string>

using namespace dwxcore::internal;  // NOLINT: the functions under test

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    const std::string value = input.CString();

    char* token = QuoteToken(value.c_str());
    const size_t length = strlen(token);
    FUZZ_CHECK(length >= 2 && token[0] == '"' && token[length - 1] == '"');
    FUZZ_CHECK(strchr(token + 1, '"') == token + length - 1);
    FUZZ_CHECK(strchr(token, '\n') == nullptr);
    if (!ExpandsOnReading(value)) {
        FUZZ_CHECK(UnquoteToken(token) == value);
    }
    free(token);

    // Whatever follows is a raw token and a raw value.
    const std::string raw = input.Rest();
    UnquoteToken(raw.c_str());
    std::string list(raw), call(raw);
    ExpandMkTokenString(list), ExpandTranslationCall(call);
    return 0;
}
