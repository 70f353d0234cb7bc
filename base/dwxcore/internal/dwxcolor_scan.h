// Private to the colour sources: reading colour components from text.
#pragma once

#include <services/rtprim.h>

namespace dwxcore::internal {

// The low 8 bits of the leading decimal number of `text`, read as atoi reads it
// (white space, sign, digits; 0 without digits), but defined for numbers beyond
// the range of int, where atoi is not.
inline int ComponentOf(const char* text) {
    return static_cast<unsigned char>(TZN_strtoll(text, nullptr, 10));
}

}  // namespace dwxcore::internal
