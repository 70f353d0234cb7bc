// Scanning helpers of the parse tree reader: byte classes of the tokenizer,
// keyword comparison and the numbers of Integer and Double lines. Internal to
// the library.
#pragma once

#include <services/rtprim.h>

#include <stddef.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>

namespace dwxcore::internal {

// What a byte means to the tokenizer: white space is the set that Tokenize
// splits at (space, tab, LF, VT, FF, CR); a double quote opens or closes a
// run in which white space does not split.
enum ByteClass : unsigned char { kPlain, kWhite, kQuote, kEnd };

struct ByteClasses {
    unsigned char of[256];
    constexpr ByteClasses() : of() {
        of[0] = kEnd;
        of[static_cast<unsigned char>(' ')] = kWhite;
        for (int c = '\t'; c <= '\r'; ++c) {
            of[c] = kWhite;
        }
        of[static_cast<unsigned char>('"')] = kQuote;
    }
};
constexpr ByteClasses kByteClasses;

inline unsigned char ClassOf(char c) {
    return kByteClasses.of[static_cast<unsigned char>(c)];
}

inline bool IsWhite(char c) {
    return ClassOf(c) == kWhite;
}

// A keyword of up to 16 bytes for comparisons ignoring ASCII case: its bytes
// in lower case, and the bit that folds each letter to lower case (none for
// other bytes, which must match exactly).
struct KeywordPattern {
    unsigned char lower[16];
    unsigned char fold[16];
    size_t length;
};

constexpr KeywordPattern MakeKeyword(const char* lower) {
    KeywordPattern keyword{};
    while (lower[keyword.length] != '\0') {
        char c = lower[keyword.length];
        keyword.lower[keyword.length] = static_cast<unsigned char>(c);
        keyword.fold[keyword.length] = (c >= 'a' && c <= 'z') ? 0x20 : 0;
        ++keyword.length;
    }
    return keyword;
}

template <typename Word>
inline bool WordMatches(const char* text, const KeywordPattern& keyword, size_t offset) {
    Word word, lower, fold;
    memcpy(&word, text + offset, sizeof word);
    memcpy(&lower, keyword.lower + offset, sizeof lower);
    memcpy(&fold, keyword.fold + offset, sizeof fold);
    return (word | fold) == lower;
}

// Whether the first keyword.length bytes of `text` (which has at least as
// many) are the keyword ignoring ASCII case. Every line's keyword passes
// here, so a keyword of 4 to 16 bytes is compared as two words that may
// overlap: its first and its last.
inline bool MatchesAt(const char* text, const KeywordPattern& keyword) {
    size_t length = keyword.length;
    if (length >= 8) {
        return WordMatches<uint64_t>(text, keyword, 0) &&
               WordMatches<uint64_t>(text, keyword, length - 8);
    }
    if (length >= 4) {
        return WordMatches<uint32_t>(text, keyword, 0) &&
               WordMatches<uint32_t>(text, keyword, length - 4);
    }
    for (size_t i = 0; i < length; ++i) {
        if ((static_cast<unsigned char>(text[i]) | keyword.fold[i]) != keyword.lower[i]) {
            return false;
        }
    }
    return true;
}

// Whether the `length` bytes at `text` are the keyword whole, ignoring ASCII case.
inline bool Matches(const char* text, size_t length, const KeywordPattern& keyword) {
    return length == keyword.length && MatchesAt(text, keyword);
}

// Whether the `length` bytes at `text` begin with the keyword, ignoring ASCII case.
inline bool BeginsWith(const char* text, size_t length, const KeywordPattern& keyword) {
    return length >= keyword.length && MatchesAt(text, keyword);
}

// atoi (text) in the "C" locale. A sign and up to nine digits that end the
// token are read here; anything else (long numbers with their overflow,
// leading white space, trailing text) goes to TZN_atoi, so results are the same.
inline int ScanInteger(const char* text) {
    const char* p = text;
    bool negative = *p == '-';
    if (negative || *p == '+') {
        ++p;
    }
    int value = 0;
    int digits = 0;
    for (; *p >= '0' && *p <= '9'; ++p) {
        if (++digits > 9) {
            return TZN_atoi(text);
        }
        value = value * 10 + (*p - '0');
    }
    if (digits == 0 || *p != '\0') {
        return TZN_atoi(text);
    }
    return negative ? -value : value;
}

// atof (text). A token that is a plain decimal, a sign, up to fifteen digits
// and a point, is read here: the digits as an exact integer divided by an
// exact power of ten is one correctly rounded operation, as strtod's result
// is, in every rounding mode. Anything else goes to TZN_atof.
inline double ScanDouble(const char* text) {
    static const double kPowersOfTen[] = {1e0, 1e1, 1e2,  1e3,  1e4,  1e5,  1e6,  1e7,
                                          1e8, 1e9, 1e10, 1e11, 1e12, 1e13, 1e14, 1e15};
    const char* p = text;
    bool negative = *p == '-';
    if (negative || *p == '+') {
        ++p;
    }
    int64_t mantissa = 0;
    int digits = 0;
    int fraction = 0;
    bool point = false;
    for (;; ++p) {
        if (*p >= '0' && *p <= '9') {
            if (++digits > 15) {
                return TZN_atof(text);
            }
            mantissa = mantissa * 10 + (*p - '0');
            fraction += point ? 1 : 0;
        } else if (*p == '.' && !point) {
            point = true;
        } else {
            break;
        }
    }
    if (digits == 0 || *p != '\0') {
        return TZN_atof(text);
    }
    double value = static_cast<double>(negative ? -mantissa : mantissa);
    if (negative && mantissa == 0) {
        value = -0.0;
    }
    return fraction ? value / kPowersOfTen[fraction] : value;
}

}  // namespace dwxcore::internal
