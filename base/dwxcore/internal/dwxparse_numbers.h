// Number texts of the parse tree format, written straight into a caller's
// buffer: the same texts as the printf formats that define them, without a
// format string to interpret. Internal to the library.
#pragma once

#include <stddef.h>

#include <charconv>

namespace dwxcore::internal {

// Room for every text below: "%f" of the largest double has 309 digits
// before the point, six after it, the point and a sign.
constexpr size_t kNumberTextMax = 328;

// "%d".
inline char* PutInteger(char* out, int value) {
    return std::to_chars(out, out + kNumberTextMax, value).ptr;
}

// "%f": fixed notation with six decimals; inf, -inf, nan and -nan as printf
// writes them.
inline char* PutFixed(char* out, double value) {
    return std::to_chars(out, out + kNumberTextMax, value, std::chars_format::fixed, 6).ptr;
}

// The shortest text that atof reads back to the same double, as MkName(value,
// -1) gives it.
inline char* PutShortest(char* out, double value) {
    return std::to_chars(out, out + kNumberTextMax, value).ptr;
}

// "%c": the character itself; 0 gives the empty text.
inline char* PutCharacter(char* out, char value) {
    if (value != '\0') {
        *out++ = value;
    }
    return out;
}

// "TRUE" for any value but 0, else "FALSE".
inline const char* BoolText(int value) {
    return value != 0 ? "TRUE" : "FALSE";
}

}  // namespace dwxcore::internal
