// The parse tree as JSON.
#pragma once

#include <dwxcore/dwxparse.h>

#include <stdio.h>

#include <string>

namespace dwxtree {

// Writes the children of `root` as one JSON object, indented by two blanks
// per level (levels below the 16th keep the 16th's indent): subtrees as objects in child order (a
// repeated name is written once per occurrence), Integer, Float and Double as numbers (null when
// not finite), Bool as true or false, Char, String and Base64 as strings (a null String as null),
// lists as arrays.
void WriteJson(FILE* stream, const PTNSubTree& root);

// `bytes` as the contents of a JSON string, ASCII only: '"', '\\' and control
// characters escaped, every valid UTF-8 sequence as \uXXXX (a surrogate pair
// above U+FFFF), and every byte that does not belong to a valid UTF-8
// sequence as \u00XX, the Latin-1 character of that byte.
std::string JsonEscape(const std::string& bytes);

// The shortest "%.*g" text that reads back to the same double.
std::string JsonNumber(double value);

}  // namespace dwxtree
